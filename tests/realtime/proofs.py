#!/usr/bin/env python3
# SPDX-License-Identifier: MIT
"""Runs one layer of the real-time proofs: the shipped library must come out clean, every library with a fault must be reported.

    proofs.py --library FILE --faults FOLDER [--program FILE] LAYER

Layers: walk reads the linked code; sanitizer, syscall and paging run every way through the block natively; relay does so under Wine.
"""

import argparse
import os
import pathlib
import subprocess
import sys
import tempfile

import relay_log
import walk_section

# Which layer sees which fault. What a layer may miss, and why:
#   walk       a page that is touched for the first time: the code is innocent
#   sanitizer  the same, and a bare call of write(), which this release of the runtime lets through
#   syscall    a small allocation, a lock that is free, a thread's object: all stay in user space
#   paging     whatever neither waits nor touches new memory
#   relay      a lock that is free, and new memory
SEES = {
    "walk": {"alloc", "lock", "write", "tls", "throw", "sleep"},
    "sanitizer": {"alloc", "lock", "tls", "throw", "sleep"},
    "syscall": {"write", "sleep"},
    "paging": {"page", "sleep"},
    "relay": {"alloc", "write", "tls", "throw", "sleep"},
}


def native_run(program, library):
    """Whether a run under a native watch was clean, and what it said."""
    with tempfile.TemporaryDirectory(prefix="vxcomn-realtime-") as machine:
        environment = dict(os.environ, VXCOMN_ROOT=machine, RTSAN_OPTIONS="symbolize=0")
        result = subprocess.run([program, library], capture_output=True, text=True, env=environment, timeout=600)
    said = (result.stdout + result.stderr).strip()
    if result.returncode == 2 or result.returncode < 0:
        raise SystemExit(f"{program} {library}: the run failed:\n{said}")
    return result.returncode == 0, said


def clean(layer, program, library):
    if layer == "walk":
        faults, summary = walk_section.walk(library)
        return not faults, "\n".join(faults[:5] + [summary])
    if layer == "relay":
        return relay_log.run(program, library)
    return native_run(program, library)


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument("--library", required=True)
    parser.add_argument("--faults", required=True)
    parser.add_argument("--program")
    parser.add_argument("layer", choices=SEES)
    options = parser.parse_args()

    failed = False
    is_clean, said = clean(options.layer, options.program, options.library)
    print(f"{options.library}: {'clean' if is_clean else 'NOT CLEAN'}\n{said}")
    failed |= not is_clean
    libraries = sorted(path for path in pathlib.Path(options.faults).glob("fault_*") if path.suffix in (".so", ".dll"))
    faults = {path.stem.removeprefix("fault_"): str(path) for path in libraries}
    for missing in sorted(SEES[options.layer] - set(faults)):
        print(f"no library with the fault {missing}")
        failed = True
    for fault, library in faults.items():
        is_clean, said = clean(options.layer, options.program, library)
        expected = fault in SEES[options.layer]
        verdict = "missed" if is_clean else "seen"
        if expected and is_clean:
            verdict = "MISSED"
            failed = True
        print(f"fault {fault}: {verdict}{'' if expected else ' (not asked of this layer)'}")
        if not is_clean:
            print("    " + "\n    ".join(said.splitlines()[:3]))
    return 1 if failed else 0


if __name__ == "__main__":
    sys.exit(main())
