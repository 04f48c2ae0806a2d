#!/usr/bin/env python3
# SPDX-License-Identifier: MIT
"""Builds the program of the README from the page itself and runs it against the built library.

    readme_program.py README INCLUDE BIN WORK COMPILER [LIBRARY [RUNNER]]

Takes the page's only C block, compiles it as C11, links it to the library in BIN (or to the import library LIBRARY), and runs it from
BIN, so that it finds the sample engine, through RUNNER if there is one.
"""

import os
import re
import subprocess
import sys


def main():
    readme, include, binaries, work, compiler, *rest = sys.argv[1:]
    library, runner = (rest + ["", ""])[:2]
    with open(readme, encoding="utf-8") as page:
        blocks = re.findall(r"^```c\n(.*?)^```", page.read(), re.MULTILINE | re.DOTALL)
    if len(blocks) != 1:
        sys.exit(f"{readme}: one C program was expected, {len(blocks)} were found")
    os.makedirs(work, exist_ok=True)
    source = os.path.join(work, "readme_program.c")
    with open(source, "w", encoding="utf-8") as out:
        out.write(blocks[0])
    program = os.path.join(binaries, "readme_program" + (".exe" if library else ""))
    link = [library, "-static"] if library else ["-L" + binaries, "-lVXCOMN64U", "-Wl,-rpath," + binaries]
    subprocess.run([compiler, "-std=c11", "-Wall", "-Wextra", "-Werror", "-I" + include, source, "-o", program, *link], check=True)
    ran = subprocess.run(([runner] if runner else []) + [program], cwd=binaries, check=False)
    if ran.returncode != 0:
        sys.exit(f"the README's program ended with status {ran.returncode}")
    print("the README's program builds and runs")


main()
