#!/usr/bin/python3
"""Runs the HTTP-level suites named, else all but those of pushes, against the server given as the first argument."""

import pathlib
import sys
import unittest

sys.path.insert(0, str(pathlib.Path(__file__).parent))
sys.dont_write_bytecode = True
import harness  # noqa: E402

if __name__ == "__main__":
    harness.PROGRAM = sys.argv.pop(1)
    suites = ["refusals_suite", "shares_suite", "joined_suite", "uploads_suite", "downloads_suite",
              "connections_suite", "expiry_suite", "commands_suite",
              "space_suite", "registration_suite", "monitoring_suite", "checking_suite", "moving_suite.Moving"]
    names = sys.argv[1:] or suites
    tests = unittest.defaultTestLoader.loadTestsFromNames(names)
    result = unittest.TextTestRunner(verbosity=2).run(tests)
    sys.exit(0 if result.wasSuccessful() and result.testsRun > 0 else 1)
