# SPDX-License-Identifier: Apache-2.0
"""How a suite of Python tests ends for ctest, which sees nothing of a skip but the suite's status."""

import os
import sys
import unittest

# The programs were built under sanitizers: their memory and their calls are not theirs alone.
SANITIZED = os.environ.get("TOVI_SANITIZED") == "1"
SKIPPED = 77
ELSEWHERE = "left to another run: "


def left_unless(condition, why):
    """Leaves a test out that another run of ctest does."""
    return unittest.skipUnless(condition, ELSEWHERE + why)


def main():
    """Runs the tests of the main module. Status 1: one failed; 77: one was skipped that nothing else runs; else 0."""
    result = unittest.main(exit=False).result
    if not result.wasSuccessful():
        sys.exit(1)
    missing = [(str(test), why) for test, why in result.skipped if not why.startswith(ELSEWHERE)]
    for test, why in missing:
        print(f"skipped: {test}: {why}", file=sys.stderr)
    sys.exit(SKIPPED if missing or result.testsRun == 0 else 0)
