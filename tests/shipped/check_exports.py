#!/usr/bin/env python3
# SPDX-License-Identifier: MIT
"""Compares what built modules export with the lists of the tree.

    check_exports.py LIST MODULE...

LIST has one name a line, followed by "linux" or "windows" if it is that platform's alone; lines that begin with # are remarks. The
modules are shared objects or DLLs. Prints the names that one side lacks; exit status 1 if there are any.
"""

import re
import subprocess
import sys


def listed(path, platform):
    with open(path, encoding="utf-8") as lines:
        entries = [line.split() for line in lines if line.strip() and not line.startswith("#")]
    names = [name for name, *only in entries if only in ([], [platform])]
    if names != sorted(set(names)):
        sys.exit(f"{path}: names must be sorted, and stand there once")
    return names


def platform_of(path):
    with open(path, "rb") as file:
        return "windows" if file.read(2) == b"MZ" else "linux"


def exported(path):
    if platform_of(path) == "windows":
        text = subprocess.run(["x86_64-w64-mingw32-objdump", "-p", path], check=True, capture_output=True, text=True).stdout
        table = text.partition("[Ordinal/Name Pointer] Table")[2].partition("\n\n")[0]
        return sorted(re.findall(r"^\s*\[\s*\d+\]\s+(?:\+base\[\s*\d+\]\s+)?(?:[0-9a-f]+\s+)?(\S+)$", table, re.M))
    text = subprocess.run(["nm", "-D", "--defined-only", path], check=True, capture_output=True, text=True).stdout
    return sorted(line.split()[-1] for line in text.splitlines())


def main(list_path, *modules):
    failed = not modules
    for module in modules:
        wanted = listed(list_path, platform_of(module))
        found = exported(module)
        for name in sorted(set(wanted) - set(found)):
            print(f"{module}: lacks {name}")
        for name in sorted(set(found) - set(wanted)):
            print(f"{module}: exports {name}, which {list_path} does not have")
        failed |= found != wanted
        print(f"{module}: {len(found)} exports")
    return 1 if failed else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
