#!/usr/bin/env python3
# SPDX-License-Identifier: MIT
"""Compiles each header of include/ by itself, as C11, C++17 and C++20, with every compiler that a customer may come with.

    check_headers.py INCLUDE_FOLDER

A header is included twice, so that a missing guard shows. Exit status 1 with the compiler's words for each that fails.
"""

import concurrent.futures
import os
import pathlib
import subprocess
import sys

COMPILERS = [
    ("gcc", "c", "c11"),
    ("clang-14", "c", "c11"),
    ("x86_64-w64-mingw32-gcc-posix", "c", "c11"),
    ("g++", "c++", "c++17"),
    ("g++", "c++", "c++20"),
    ("clang++-14", "c++", "c++17"),
    ("clang++-14", "c++", "c++20"),
    ("x86_64-w64-mingw32-g++-posix", "c++", "c++17"),
    ("x86_64-w64-mingw32-g++-posix", "c++", "c++20"),
]
# The second half of library_context.h, which says that it is not for use alone.
NOT_ALONE = {"vxcomn/library_context_layout.h"}
WARNINGS = ["-Wall", "-Wextra", "-Wpedantic", "-Werror", "-Wno-invalid-offsetof"]


def compile_alone(include, header, compiler, language, standard):
    warnings = WARNINGS if language == "c++" else WARNINGS[:-1]
    command = [compiler, "-x", language, f"-std={standard}", "-fsyntax-only", *warnings, "-I", str(include), "-"]
    source = f'#include "{header}"\n#include "{header}"\n'
    result = subprocess.run(command, input=source, capture_output=True, text=True)
    return None if result.returncode == 0 else f"{header} as {standard} with {compiler}:\n{result.stderr}"


def main(folder):
    include = pathlib.Path(folder)
    headers = sorted(path.relative_to(include).as_posix() for path in include.rglob("*.h"))
    headers = [header for header in headers if header not in NOT_ALONE]
    jobs = [(include, header, *compiler) for header in headers for compiler in COMPILERS]
    with concurrent.futures.ThreadPoolExecutor(os.cpu_count()) as pool:
        failures = [failure for failure in pool.map(lambda job: compile_alone(*job), jobs) if failure]
    print(*failures, sep="\n")
    print(f"{len(jobs)} compilations of {len(headers)} headers, {len(failures)} failed")
    return 1 if failures or not headers else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
