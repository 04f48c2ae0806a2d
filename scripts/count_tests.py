#!/usr/bin/env python3
# SPDX-License-Identifier: MIT
"""Counts the tests in the verbose log of one ctest run.

    count_tests.py LOG

Prints "passed failed skipped". A program of unit tests counts by the cases that it reports, any other test as one. A unit test program
that fails although none of its cases did (a crash, a leak, a time limit) is one failure more.
"""

import re
import sys

CASES = re.compile(r"^(\d+): \[doctest\] test cases:\s+\d+ \|\s+(\d+) passed \|\s+(\d+) failed \|\s+(\d+) skipped")
OUTCOME = re.compile(r"^\s*\d+/\d+ Test\s+#(\d+): \S+ \.*\s*(Passed|\*\*\*Skipped|\*\*\*\w+|Not Run)")


def count(lines):
    cases = {}
    totals = [0, 0, 0]
    for line in lines:
        line = re.sub(r"\x1b\[[0-9;]*m", "", line)
        reported = CASES.match(line)
        if reported:
            cases[reported[1]] = [int(number) for number in reported.groups()[1:]]
        outcome = OUTCOME.match(line)
        if not outcome:
            continue
        passed = outcome[2] == "Passed"
        if outcome[1] in cases:
            numbers = cases.pop(outcome[1])
            if not passed and numbers[1] == 0:
                numbers[1] = 1
        else:
            is_skipped = outcome[2] == "***Skipped"
            numbers = [passed, not passed and not is_skipped, is_skipped]
        totals = [total + number for total, number in zip(totals, numbers)]
    return totals


if __name__ == "__main__":
    with open(sys.argv[1], encoding="utf-8", errors="replace") as log:
        print(*map(int, count(log)))
