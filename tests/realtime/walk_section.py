#!/usr/bin/env python3
# SPDX-License-Identifier: MIT
"""Proves from the linked library that the block path stays in its section.

    walk_section.py LIBRARY

Looks at each instruction of RT_CODE: calls and jumps, every operand that names a place of the file, accesses to the thread's own
memory, system calls. What is reached by address is resolved: import slots by name, words of data by what they hold. Then at the tables
of kernels, whose entries must lie in the section, and at the functions that must be there. What an engine does behind its pointer, and
where a switch jumps inside its function, is not looked at. Exit status 1 and a line for each fault.
"""

import collections
import re
import sys

from linked_file import LinkedFile, demangle

SECTION = "RT_CODE"

# What the block path may call outside its section: the clock, and the handler of the stack guard, which is reached only with a
# smashed stack and ends the process.
ALLOWED_OUTSIDE = {"clock_gettime", "__imp_QueryPerformanceCounter", "QueryPerformanceCounter", "__stack_chk_fail"}

# Imported data: the stack guard's value, which a PE file keeps in memory.
ALLOWED_DATA = {"__stack_chk_guard"}

# The stack guard's value, which an ELF file finds in the thread's block.
ALLOWED_THREAD_OPERANDS = {"%fs:0x28"}

# The one function that reaches storage of its thread: the state of the pink noise's source. The loader has set that storage up together
# with the thread, so its place is the thread pointer and a constant, without a call and without an allocation.
THREAD_WORD = "_ZN6vxcomn16threadRandomWordEv"
THREAD_WORD_OPERANDS = {"%fs:0x0", "%gs:0x58"}

FORBIDDEN_INSTRUCTIONS = {"syscall", "sysenter", "int", "hlt", "in", "out"}

KERNEL_TABLE = r"k\w*Kernels(?:Sse2|Avx2|Avx512)E?$"

# Kernels that only control calls use: the analyser's readout.
CONTROL_KERNEL = r"8spectrumERKNS_11SpectrumJobE"

REQUIRED = [
    r"VXDSPAPI_Process",
    r"vxcomn::mixChannels\(",
    r"vxcomn::fixedPointProcess\(",
    r"vxcomn::passThroughProcess\(",
    r"vxcomn::generateTestSignals\(",
    r"vxcomn::fillWhite\(",
    r"PinkNoiseGenerator::generate\(",
    r"SineGenerator::generate\(",
    r"SweepGenerator::generate\(",
    r"PolarityToneGenerator::generate\(",
    r"RealTimeAnalyser::feed\(",
    r"FftFirFilter::process\(",
    r"FftFirFilter::clearOverlap\(",
    r"vxcomn::updatePeaks\(",
    r"vxcomn::anyAbove\(",
    r"vxcomn::runBiquad\(",
    r"vxcomn::performanceNanoseconds\(",
]


def plain(label):
    """A label without its offset and what the linker adds to imported names."""
    return re.sub(r"@plt$|\+0x[0-9a-f]+$", "", label)


class Walk:
    def __init__(self, library):
        self.library = library
        self.section = library.section(SECTION)
        self.faults = []
        self.outside = collections.Counter()

    def fault(self, instruction, text):
        function = demangle([instruction.function])[0]
        self.faults.append(f"{function}+{instruction.address:#x}: {text}: {instruction.text}")

    def look_at_target(self, instruction, address, label):
        if self.section.holds(address):
            return
        name = plain(label)
        if name in ALLOWED_OUTSIDE:
            self.outside[name] += 1
        else:
            self.fault(instruction, f"leaves the section for {demangle([name])[0] or 'no symbol'}")

    def look_at_word(self, instruction, address):
        """A word in memory that an instruction reads, calls or jumps through."""
        library = self.library
        kind, value = library.relocations.get(address, ("", ""))
        if kind == "TPOFF64" and instruction.function == THREAD_WORD:
            return None
        if kind in ("DTPMOD64", "DTPOFF64", "TPOFF64", "TLSDESC"):
            return self.fault(instruction, f"reaches thread-local storage through {value}")
        name = library.name_at(address)
        if kind in ("GLOB_DAT", "JUMP_SLOT", "64"):
            name = "__imp_" + re.sub(r"@.*$", "", value)
        if name.startswith("__imp_") or (library.is_pe and library.section_at(address).name == ".idata"):
            if name in ALLOWED_OUTSIDE:
                self.outside[name] += 1
            elif name.removeprefix("__imp_") not in ALLOWED_OUTSIDE | ALLOWED_DATA:
                self.fault(instruction, f"reads the import slot of {name.removeprefix('__imp_') or 'no symbol'}")
            return
        held = library.section_at(library.word(address))
        if held is not None and held.is_code and held.name != SECTION:
            name = library.name_at(library.word(address))
            self.fault(instruction, f"reads a word that points at {demangle([name])[0] or 'code outside'}")

    def look_at(self, instruction):
        mnemonic = instruction.text.split()[0]
        if mnemonic in FORBIDDEN_INSTRUCTIONS:
            self.fault(instruction, "calls the system")
        for operand in re.findall(r"%[fg]s:[^,\s]*", instruction.text):
            allowed = THREAD_WORD_OPERANDS if instruction.function == THREAD_WORD else ALLOWED_THREAD_OPERANDS
            if operand not in allowed:
                self.fault(instruction, "reaches thread-local storage")
        target = instruction.direct_target()
        if target:
            return self.look_at_target(instruction, *target)
        data = instruction.data_address()
        if not data:
            return
        section = self.library.section_at(data[0])
        if section is None:
            self.fault(instruction, "names a place outside the file")
        elif section.is_code and section.name != SECTION and not mnemonic.startswith("j") and mnemonic != "call":
            self.fault(instruction, f"takes the address of {demangle([plain(data[1])])[0] or 'code outside'}")
        else:
            self.look_at_word(instruction, data[0])

    def look_at_tables(self):
        """Kernel tables; the number of entries seen."""
        entries = 0
        for name, start in self.library.symbols:
            if not re.search(KERNEL_TABLE, name) or name.startswith("."):
                continue
            seen = 0
            for address in range(start, self.library.next_symbol(start), 8):
                target = self.library.word(address)
                section = self.library.section_at(target)
                if section is None or not section.is_code:
                    if seen == 0:
                        continue  # a table may begin with numbers
                    break
                seen += 1
                if not self.section.holds(target) and not re.search(CONTROL_KERNEL, self.library.name_at(target)):
                    self.faults.append(f"{name}: entry {seen} points at {self.library.name_at(target)} outside the section")
            if seen == 0:
                self.faults.append(f"{name}: no entries were found")
            entries += seen
        if entries == 0:
            self.faults.append("no table of kernels was found")
        return entries

    def look_at_names(self):
        inside = [name for name, address in self.library.symbols if self.section.holds(address)]
        names = demangle(inside)
        for pattern in REQUIRED:
            if not any(re.match(pattern, name) for name in names):
                self.faults.append(f"no function in the section matches {pattern}")
        return len(names)

    def look_at_relocations(self):
        for address, (kind, value) in self.library.relocations.items():
            if self.section.holds(address):
                self.faults.append(f"the loader writes into the section at {address:#x}: {kind} {value}")


def walk(path):
    """The faults of a library's section, and a summary."""
    library = LinkedFile(path)
    if library.section(SECTION) is None:
        return [f"no section {SECTION}"], ""
    walk = Walk(library)
    count = 0
    for instruction in library.instructions(SECTION):
        walk.look_at(instruction)
        count += 1
    if count == 0:
        walk.faults.append("the section has no code")
    walk.look_at_relocations()
    entries = walk.look_at_tables()
    functions = walk.look_at_names()
    outside = ", ".join(f"{name} ({times})" for name, times in sorted(walk.outside.items())) or "nothing"
    return walk.faults, f"{count} instructions, {functions} symbols, {entries} kernels; outside: {outside}"


def main(path):
    faults, summary = walk(path)
    print(*faults, sep="\n")
    print(f"{path}: {summary}; {len(faults)} faults")
    return 1 if faults else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
