#!/usr/bin/python3
"""Runs one test, or one class of tests, against the lab that VELMOR_LAB_DIR names.

usage: run_test.py MODULE CLASS[.METHOD]

Exits with 77, which the test runner reports as skipped, where namespaces cannot be made.
"""
import os
import sys
import unittest

if os.geteuid() != 0:
    print("skipped: a domain in network namespaces needs root; run it with sudo")
    sys.exit(77)
sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))
tests = unittest.defaultTestLoader.loadTestsFromName(f"{sys.argv[1]}.{sys.argv[2]}")
outcome = unittest.TextTestRunner(stream=sys.stdout, verbosity=2).run(tests)
sys.exit(0 if outcome.wasSuccessful() and outcome.testsRun else 1)
