# SPDX-License-Identifier: MIT
"""A linked library as the section walk sees it: sections, symbols, instructions, and what the words of its data point at.

Reads ELF shared objects and PE DLLs through binutils. Addresses are those of the file: relative for ELF, with the preferred base for
PE.
"""

import bisect
import re
import struct
import subprocess
from dataclasses import dataclass


@dataclass
class Section:
    name: str
    start: int
    size: int
    offset: int
    is_code: bool

    def holds(self, address):
        return self.start <= address < self.start + self.size


@dataclass
class Instruction:
    function: str
    address: int
    text: str

    def direct_target(self):
        """(address, label) of a direct call or jump, or None."""
        found = re.match(r"(?:(?:bnd|notrack|data16|rex\.W) )*(?:call|jmp|j[a-z]+)\s+([0-9a-f]+)(?:\s+<([^>]+)>)?\s*$", self.text)
        return (int(found[1], 16), found[2] or "") if found else None

    def data_address(self):
        """(address, label) of an operand that is relative to the instruction pointer, or None."""
        found = re.search(r"\(%rip\).*#\s+([0-9a-f]+)(?:\s+<([^>]+)>)?", self.text)
        return (int(found[1], 16), found[2] or "") if found else None


class LinkedFile:
    def __init__(self, path):
        self.path = path
        with open(path, "rb") as file:
            self.bytes = file.read()
        self.is_pe = self.bytes[:2] == b"MZ"
        self._prefix = "x86_64-w64-mingw32-" if self.is_pe else ""
        self.sections = self._read_sections()
        self.symbols = self._read_symbols()
        self._addresses = sorted((address, name) for name, address in self.symbols)
        self.relocations = {} if self.is_pe else self._read_relocations()

    def _run(self, tool, *arguments):
        command = [self._prefix + tool, *arguments, self.path]
        return subprocess.run(command, check=True, capture_output=True, text=True).stdout

    def _read_sections(self):
        pattern = r"^\s*\d+\s+(\S+)\s+([0-9a-f]+)\s+([0-9a-f]+)\s+[0-9a-f]+\s+([0-9a-f]+)\s+\S+\s*\n\s+(.*)$"
        return [Section(name, int(start, 16), int(size, 16), int(offset, 16), "CODE" in flags)
                for name, size, start, offset, flags in re.findall(pattern, self._run("objdump", "-h"), re.M)]

    def _read_symbols(self):
        """Pairs of plain name and address."""
        pattern = r"^([0-9a-f]+) \w (\S+)$"
        return [(name, int(address, 16)) for address, name in re.findall(pattern, self._run("nm", "--defined-only"), re.M)]

    def _read_relocations(self):
        """Address of each word that the loader fills, with the kind and what it is filled with."""
        pattern = r"^([0-9a-f]+) R_X86_64_(\S+)\s+(\S+)$"
        return {int(address, 16): (kind, value) for address, kind, value in re.findall(pattern, self._run("objdump", "-R"), re.M)}

    def section(self, name):
        return next((section for section in self.sections if section.name == name), None)

    def section_at(self, address):
        return next((section for section in self.sections if section.holds(address)), None)

    def name_at(self, address):
        """The symbol that begins at an address, or the empty text. An import slot's own name goes before that of its table."""
        at = bisect.bisect_left(self._addresses, (address, ""))
        names = []
        while at < len(self._addresses) and self._addresses[at][0] == address:
            names.append(self._addresses[at][1])
            at += 1
        # A PE file has a symbol for each section, too, at the address of the section's first function.
        names = [name for name in names if not name.startswith(".")] or names
        return next((name for name in names if name.startswith("__imp_")), names[0] if names else "")

    def next_symbol(self, address):
        at = bisect.bisect_right(self._addresses, (address, "\x7f"))
        return self._addresses[at][0] if at < len(self._addresses) else address

    def word(self, address):
        """What an 8-byte word holds once the file is loaded, where that is an address of the file; else 0."""
        if address in self.relocations:
            kind, value = self.relocations[address]
            return int(value.rpartition("+")[2], 16) if kind == "RELATIVE" else 0
        section = self.section_at(address)
        if not self.is_pe or section is None or section.name == ".bss" or section.offset == 0:
            return 0
        return struct.unpack_from("<Q", self.bytes, section.offset + address - section.start)[0]

    def instructions(self, section):
        function = ""
        for line in self._run("objdump", "-d", "--no-show-raw-insn", "-j", section).splitlines():
            head = re.match(r"^[0-9a-f]+ <(.+)>:$", line)
            if head:
                function = head[1]
                continue
            body = re.match(r"^\s*([0-9a-f]+):\t(.+)$", line)
            if body:
                yield Instruction(function, int(body[1], 16), body[2].strip())


def demangle(names):
    text = subprocess.run(["c++filt"], input="\n".join(names), check=True, capture_output=True, text=True).stdout
    return text.splitlines()
