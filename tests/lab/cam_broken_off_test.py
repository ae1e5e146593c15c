"""Joins with a machine account from the CAM service that are broken off, or whose network is gone by then."""
import time

from cam_join_test import CamTest

NET = "/usr/bin/net"
WINBINDD = "/usr/sbin/winbindd"
# Hands out a text that no directory made.
GARBAGE_HELPER = """#!/usr/bin/python3
import json, os, subprocess, sys
line = sys.stdin.buffer.readline()
request = json.loads(line)
secret = sys.stdin.buffer.read(request["secretSize"])
if request["operation"] == "create":
    print(json.dumps({"status": 0, "text": "", "secretSize": 4, "accountName": request["computer"] + "$"}))
    print("eA==", end="")
else:
    sys.exit(subprocess.run(["/usr/libexec/velmor/velmor-camd-helper"], input=line + secret).returncode)
"""


class CamBrokenOffJoinTest(CamTest):

    def setUp(self):
        super().setUp()
        self.cam = self.service(directory={"existing-accounts": "any"})
        self.trust()
        # A first refusal makes the files that a host keeps from then on: the record, locks, empty databases.
        self.host.join("nowhere.example")
        self.before = self.host.files()

    def begin_with(self, program, work):
        """Has the program do this first."""
        self.host.must("mv", program, f"{program}.real")
        self.host.write(program, f'#!/bin/sh\n{work}\nexec {program}.real "$@"\n')
        self.host.must("chmod", "755", program)

    def restore(self, program):
        self.host.must("mv", f"{program}.real", program)

    def assert_taken_back(self, status):
        done = self.join()
        self.assertNotEqual(done.returncode, 0)
        self.assertEqual(self.host.statuses()[-1], status, done.stderr)
        self.assertEqual(self.host.changes_since(self.before), set())
        self.assertNotEqual(self.host.run("wbinfo", "--check-secret").returncode, 0)

    def testHelperThatDiesWhenItStartsTheService(self):
        self.begin_with(WINBINDD, "kill -KILL $PPID")
        self.assert_taken_back(1067)
        self.restore(WINBINDD)
        self.assert_exit(self.join(), 0)

    def testServiceThatDoesNotStart(self):
        self.begin_with(WINBINDD, "exit 1")
        self.assert_taken_back(1062)

    def testTextForTheJoinThatIsNone(self):
        self.cam.stop()
        self.cam.write("helper", GARBAGE_HELPER, "700")
        self.cam.write("camd.conf", self.cam.configuration({"directory": {"helper": f"{self.cam.folder}/helper"}}))
        self.cam.start()
        self.assert_taken_back(2710)

    def testProviderJoinsWithoutTheNetwork(self):
        # The first that the helper starts, when the service has handed the account out.
        self.begin_with(NET, "ip link set dev eth0 down")
        before = len(self.host.statuses())
        done = self.join("--skip-hostname-check")
        self.assertEqual(self.host.statuses()[before], 0, done.stderr)
        self.assertIn("trust state: no-domain-controller", done.stderr)
        self.restore(NET)
        self.host.must("ip", "link", "set", "dev", "eth0", "up")
        deadline = time.monotonic() + 60
        while self.host.run("wbinfo", "--check-secret").returncode != 0:
            self.assertLess(time.monotonic(), deadline)
            time.sleep(0.2)
