#!/usr/bin/env python3
# SPDX-License-Identifier: MIT
"""What the shipped Windows files may lean on and what they must carry.

    check_dlls.py FILE...

Every file imports DLLs of the system only. A DLL carries a version resource of 2.1.0.0 and no manifest: an embedded one keeps an
effect from loading in the protected audio process. Exit status 1 and a line for each fault.
"""

import struct
import subprocess
import sys

SYSTEM_DLLS = {"kernel32", "advapi32", "ole32", "oleaut32", "version", "shlwapi", "shell32", "user32", "msvcrt"}

# The programs are customers of the library.
OWN_DLLS = {"vxcomn64u"}

RT_VERSION = 16
RT_MANIFEST = 24
VERSION_SIGNATURE = struct.pack("<I", 0xFEEF04BD)
VERSION = (2, 1, 0, 0)


def imports(path):
    text = subprocess.run(["x86_64-w64-mingw32-objdump", "-p", path], check=True, capture_output=True, text=True).stdout
    return sorted({line.split(":", 1)[1].strip().lower().removesuffix(".dll") for line in text.splitlines() if "DLL Name:" in line})


class Image:
    """The parts of a PE file that this check looks at."""

    def __init__(self, path):
        with open(path, "rb") as file:
            self.bytes = file.read()
        header = struct.unpack_from("<I", self.bytes, 0x3C)[0]
        count, optional_size = struct.unpack_from("<H12xH", self.bytes, header + 6)
        optional = header + 24
        directory = optional + 112  # of a 64-bit image
        self.resources = struct.unpack_from("<II", self.bytes, directory + 2 * 8)
        self.sections = [struct.unpack_from("<8sIIII", self.bytes, optional + optional_size + 40 * i) for i in range(count)]

    def offset(self, address):
        for _, size, start, raw_size, raw in self.sections:
            if start <= address < start + max(size, raw_size):
                return raw + address - start
        raise ValueError(f"no section holds address {address:#x}")

    def resource_types(self):
        """The first level of the resource tree: the numbers of the types that are there."""
        if self.resources[0] == 0:
            return []
        at = self.offset(self.resources[0])
        named, numbered = struct.unpack_from("<HH", self.bytes, at + 12)
        return [struct.unpack_from("<I", self.bytes, at + 16 + 8 * (named + i))[0] for i in range(numbered)]

    def version(self):
        """The four parts of the fixed version record, or None."""
        start = self.offset(self.resources[0]) if self.resources[0] else 0
        at = self.bytes.find(VERSION_SIGNATURE, start, start + self.resources[1])
        if at < 0:
            return None
        high, low = struct.unpack_from("<II", self.bytes, at + 8)
        return high >> 16, high & 0xFFFF, low >> 16, low & 0xFFFF


def faults(path):
    for name in imports(path):
        if name not in SYSTEM_DLLS | (OWN_DLLS if path.endswith(".exe") else set()):
            yield f"imports {name}.dll, which is no system DLL of the list"
    image = Image(path)
    types = image.resource_types()
    if RT_MANIFEST in types:
        yield "has a manifest resource"
    if path.lower().endswith(".dll"):
        if RT_VERSION not in types:
            yield "has no version resource"
        elif image.version() != VERSION:
            yield f"has version {image.version()}, not {VERSION}"


def main(*paths):
    failed = not paths
    for path in paths:
        found = list(faults(path))
        for fault in found:
            print(f"{path}: {fault}")
        failed |= bool(found)
        print(f"{path}: imports {' '.join(imports(path))}")
    return 1 if failed else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
