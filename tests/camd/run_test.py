#!/usr/bin/python3
"""Runs one test of the service: run_test.py MODULE CLASS.METHOD"""
import os
import sys
import unittest

sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))
tests = unittest.defaultTestLoader.loadTestsFromName(f"{sys.argv[1]}.{sys.argv[2]}")
outcome = unittest.TextTestRunner(stream=sys.stdout, verbosity=2).run(tests)
sys.exit(0 if outcome.wasSuccessful() and outcome.testsRun else 1)
