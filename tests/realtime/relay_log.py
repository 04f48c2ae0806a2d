# SPDX-License-Identifier: MIT
"""Runs a program under Wine with its log of DLL calls on, and looks at what was called between the marks around each block."""

import os
import pathlib
import re
import subprocess

BEGIN = "GetTapeStatus"
END = "GetMailslotInfo"

# The performance counter, and what Wine makes it of.
ALLOWED = {"QueryPerformanceCounter", "RtlQueryPerformanceCounter", "NtQueryPerformanceCounter"}

CALL = re.compile(r"^([0-9a-f]{4}):Call (?:window proc|driver|[\w.-]+?)?\.?(\w+)\(")


def calls_in_blocks(lines):
    """(blocks, calls): the number of marked blocks, and the DLL functions that their thread called in them."""
    blocks = 0
    inside = None
    calls = {}
    for line in lines:
        found = CALL.match(line)
        if not found:
            continue
        thread, function = found.groups()
        if function == BEGIN:
            inside = thread
        elif function == END:
            blocks += inside == thread
            inside = None
        elif thread == inside:
            calls[function] = calls.get(function, 0) + 1
    return blocks, calls


def run(program, library):
    """Whether no block called anything but the clock, and what was called."""
    wine = pathlib.Path(__file__).resolve().parents[2] / "scripts" / "wine"
    environment = dict(os.environ, WINEDEBUG="+relay")
    process = subprocess.Popen([str(wine), program, library], stdout=subprocess.DEVNULL, stderr=subprocess.PIPE, env=environment,
                               text=True, errors="replace")
    blocks, calls = calls_in_blocks(process.stderr)
    if process.wait(timeout=600) != 0 or blocks == 0:
        raise SystemExit(f"{program} {library}: the run failed after {blocks} blocks, status {process.returncode}")
    others = {name: count for name, count in calls.items() if name not in ALLOWED}
    listed = ", ".join(f"{name} ({count})" for name, count in sorted(calls.items())) or "nothing"
    return not others, f"{blocks} blocks called {listed}"
