"""A domain with two controllers: which one a host uses, and where an account is made, removed and asked for.

The second controller stays in the lab once it has been added, so these tests are the last ones there. What one
controller knows reaches the other one only when the class says so. The joins are made once, and the tests look at
what was noted.
"""
import json
import re
import subprocess
import unittest

from cam_service import ADDRESS, NODE, CamService, settings
from lab import ADMINISTRATOR_PASSWORD, SOURCE, Directory, Host, Lab

FIRST, SECOND = "dc1", "dc3"
CONTROLLERS = (FIRST, SECOND)
ADDRESS_OF_SECOND = "10.99.0.11"


def full_name(node):
    return f"{node}.corp.example"


class TwoControllersTest(unittest.TestCase):

    @classmethod
    def setUpClass(cls):
        cls.lab = Lab()
        for node in (SECOND, NODE):
            if not (cls.lab.folder / "nodes" / node).exists():
                cls.lab.command("add", node)
        for node in CONTROLLERS:
            cls.replication("options", node, "--dsa-option=+DISABLE_INBOUND_REPL")
        cls.note_controllers_in_use()
        cls.note_failed_joins()
        cls.note_join_at_the_second_controller()
        cls.note_join_through_the_service()

    @classmethod
    def replication(cls, command, *arguments):
        done = cls.lab.enter(FIRST, "samba-tool", "drs", command, *arguments, "-U",
                             f"Administrator%{ADMINISTRATOR_PASSWORD}")
        assert done.returncode == 0, f"{command} {arguments}: {done.stdout}{done.stderr}"

    @classmethod
    def tell(cls, target, source):
        """Has one controller fetch what the other one knows."""
        cls.replication("replicate", full_name(target), full_name(source), "DC=corp,DC=example", "--sync-forced")

    @classmethod
    def new_host(cls, name):
        host = Host(cls.lab, name)
        cls.delete_account(host)
        host.make_new()
        return host

    @classmethod
    def delete_account(cls, host):
        for node in CONTROLLERS:
            Directory(cls.lab, node).delete_computer(host.account)

    @classmethod
    def controllers_that_know(cls, host):
        return [node for node in CONTROLLERS if Directory(cls.lab, node).computer(host.account) is not None]

    @staticmethod
    def prefer(host, *nodes):
        host.must("velmorctl", "dc", "prefer", *map(full_name, nodes))

    @staticmethod
    def preferred(host):
        return json.loads(host.must("velmorctl", "dc", "show", "--json"))["preferredDomainControllers"]

    @staticmethod
    def controller_in_use(host):
        """The controller that winbindd has its connection to, as its own client tells."""
        return re.search(r'dc connection to "([^"]*)"', host.must("wbinfo", "--ping-dc")).group(1).lower()

    @classmethod
    def note_controllers_in_use(cls):
        host = cls.new_host("host1")
        host.must_join()
        cls.tell(SECOND, FIRST)
        cls.tell(FIRST, SECOND)
        # One of the two is in use by itself, so each of them is preferred in turn, and the second one twice.
        cls.order = (SECOND, FIRST, SECOND)
        cls.used, cls.states = [], []
        for node in cls.order:
            cls.prefer(host, node)
            cls.used.append(cls.controller_in_use(host))
            cls.states.append(host.velmorctl("trust", "show").returncode)
        cls.lab.command("link", SECOND, "down")
        try:
            cls.prefer(host, SECOND)
            cls.used_in_outage = cls.controller_in_use(host)
        finally:
            cls.lab.command("link", SECOND, "up")

    @classmethod
    def note_failed_joins(cls):
        cls.left_behind = {}
        for node in CONTROLLERS:
            host = cls.new_host("host2")
            cls.prefer(host, node)
            host.must("cp", "/bin/false", "/usr/sbin/winbindd")
            assert host.join().returncode != 0
            cls.left_behind[node] = cls.controllers_that_know(host)

    @classmethod
    def note_join_at_the_second_controller(cls):
        host = cls.new_host("host2")
        cls.prefer(host, SECOND)
        cls.join = host.join()
        cls.made_at = cls.controllers_that_know(host)

    @classmethod
    def note_join_through_the_service(cls):
        """The service makes the account at one controller, and the host reaches the other one only, which is told of
        the account when the join has begun to wait for that."""
        host = cls.new_host("host2")
        host.must("ip", "route", "add", "blackhole", ADDRESS_OF_SECOND)
        service = CamService(cls.lab, host, directory={"controller": full_name(SECOND)}).start()
        try:
            host.write("/etc/quenix/velmor/cam.conf", settings(service))
            host.must("velmorctl", "cam", "trust", ADDRESS, "--yes")
            cls.progress, cls.known_before = "", None
            with subprocess.Popen([SOURCE / "lab/enter", host.name, "velmorctl", "join", "--proxy", ADDRESS],
                                  stdout=subprocess.DEVNULL, stderr=subprocess.PIPE, text=True) as join:
                for line in join.stderr:
                    cls.progress += line
                    if "waiting until the controller in use knows the account" in line:
                        cls.known_before = cls.controllers_that_know(host)
                        cls.tell(FIRST, SECOND)
            cls.join_through_the_service = join.returncode
        finally:
            service.close()

    def testPreferredControllerIsTheOneInUse(self):
        self.assertEqual(self.used, [full_name(node) for node in self.order])

    def testMemberIsHealthyWithEachController(self):
        self.assertEqual(self.states, [0] * len(self.order))

    def testOtherControllerIsUsedWhileThePreferredOneIsAway(self):
        self.assertEqual(self.used_in_outage, full_name(FIRST))

    def testFailedJoinRemovesTheAccountWhereItWasMade(self):
        self.assertEqual(self.left_behind, {FIRST: [], SECOND: []})

    def testAccountIsMadeAtThePreferredController(self):
        self.assertEqual(self.made_at, [SECOND])

    def testJoinIsVerifiedAtTheControllerThatMadeTheAccount(self):
        self.assertEqual(self.join.returncode, 0, f"{self.join.stdout}{self.join.stderr}")

    def testJoinThroughTheServiceWaitsForTheControllerInUse(self):
        self.assertEqual((self.join_through_the_service, self.known_before), (0, [SECOND]), self.progress)
