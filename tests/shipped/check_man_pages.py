#!/usr/bin/env python3
# SPDX-License-Identifier: MIT
"""Holds the man pages against the programs: every verb and every option that --help names stands in its page, and the pages are
those that scripts/man-pages makes.

    check_man_pages.py SOURCE BIN

Exit status 1 and a line for each thing that is missing.
"""

import pathlib
import re
import subprocess
import sys

SECTIONS = ["NAME", "SYNOPSIS", "EXIT STATUS", "FILES", "ENVIRONMENT", "EXAMPLES", "SEE ALSO"]


def said(*command):
    return subprocess.run(command, capture_output=True, text=True, check=True).stdout


def plain(path):
    text = path.read_text(encoding="utf-8")
    return text.replace("\\-", "-").replace("\\e", "\\").replace("\\(dq", '"').replace("\\&", "")


def verbs_of(help_text):
    block = re.search(r"^Subcommands:\n((?:  .*\n)+)", help_text, re.MULTILINE)
    return re.findall(r"^  ([a-z][\w-]*)", block[1], re.MULTILINE) if block else []


def options_of(help_text):
    """Options by the first column, whatever the layout of the second."""
    lines = [line for line in help_text.splitlines() if line.startswith("  -")]
    return {name for line in lines for name in re.findall(r"(?:^  |,)(--?[A-Za-z][\w-]*)", line)}


def main(source, binaries):
    man = pathlib.Path(source) / "docs/man"
    vx, vxreg = f"{binaries}/vx", f"{binaries}/vxreg"
    wanted = {}  # page: what has to stand in it
    top = said(vx, "--help")
    wanted["vx"] = {*verbs_of(top), *options_of(top)}
    for verb in verbs_of(top):
        own = said(vx, verb, "--help")
        wanted[f"vx-{verb}"] = options_of(own)
        for inner in verbs_of(own):
            wanted[f"vx-{verb}"] |= {f"vx {verb} {inner}", *options_of(said(vx, verb, inner, "--help"))}
    verbs = re.findall(r"^  vxreg (\w+) ", said(vxreg, "--help"), re.MULTILINE)
    wanted["vxreg"] = {f"vxreg {verb}" for verb in verbs}
    for verb in verbs:
        wanted["vxreg"] |= set(re.findall(r"^  (/\w+)", said(vxreg, verb, "--help"), re.MULTILINE))

    faults, checked = [], 0
    for name, words in wanted.items():
        path = man / f"{name}.1"
        text = plain(path) if path.exists() else ""
        for word in sorted(words):
            checked += 1
            if not re.search(rf"(?<![\w-]){re.escape(word)}(?![\w-])", text):
                faults.append(f"{name}.1: lacks {word}")
        faults += [f"{name}.1: lacks the section {section}" for section in SECTIONS if f"\n.SH {section}\n" not in text]
    print(*faults, f"{len(wanted)} pages, {checked} verbs and options", sep="\n")
    fresh = subprocess.run([sys.executable, f"{source}/scripts/man-pages", "--check", binaries], check=False).returncode
    return 1 if faults or fresh != 0 or checked < 100 else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
