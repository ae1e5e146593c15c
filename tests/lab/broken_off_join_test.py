"""Joins that are broken off half way: the host is as before, and the next join works."""
import time

from lab import LabTest

PRECHECK = "/usr/libexec/velmor/velmor-samba-precheck"
NET = "/usr/bin/net"
WINBINDD = "/usr/sbin/winbindd"
KILL_HELPER = "kill -KILL $PPID"


class BrokenOffJoinTest(LabTest):
    """A program that the helper calls breaks the join off. `net` is called before smb.conf is written, and again
    for the keytab, when the machine's secrets are stored; the pre-check is called a second time at the very end."""

    def setUp(self):
        super().setUp()
        # A first refusal makes the files that a host keeps from then on: the record, locks, empty databases.
        self.host.join("nowhere.example")
        self.before = self.host.files()

    def at_call(self, number, program, work):
        """Has the program begin with this work when it is called for the number-th time."""
        self.host.must("mv", program, f"{program}.real")
        self.host.write(program, f'#!/bin/sh\necho >>/run/home/calls\n'
                        f'[ $(wc -l </run/home/calls) != {number} ] || {{ {work}; }}\nexec {program}.real "$@"\n')
        self.host.must("chmod", "755", program)

    def assert_as_before(self):
        self.assertEqual(self.host.changes_since(self.before), set())
        self.assertNotEqual(self.host.run("wbinfo", "--check-secret").returncode, 0)

    def assert_taken_back(self, status, exit_status):
        self.assert_exit(self.host.join(), exit_status)
        self.assertEqual(self.host.statuses()[-1], status)
        self.assert_as_before()
        self.assertIsNone(self.directory.computer(self.host.account))
        self.assert_exit(self.host.join(), 0)
        self.host.must("wbinfo", "--check-secret")

    def testHelperThatDiesBeforeItsFirstChange(self):
        self.at_call(1, NET, KILL_HELPER)
        self.assert_taken_back(1067, 7)

    def testHelperThatDiesWhenTheSecretsAreStored(self):
        self.at_call(2, NET, KILL_HELPER)
        self.assert_taken_back(1067, 7)

    def testHelperThatDiesWhenItStartsTheService(self):
        self.at_call(1, WINBINDD, KILL_HELPER)
        self.assert_taken_back(1067, 7)

    def testHelperThatDiesBeforeItRemembersTheDomain(self):
        self.at_call(2, PRECHECK, KILL_HELPER)
        self.assert_taken_back(1067, 7)

    def testHelperThatHangsIsEndedAtItsDeadline(self):
        # The short deadline is for this join only.
        settings = "/etc/quenix/velmor/samba.conf"
        self.host.write(settings, 'operation-timeout = "20"\n')
        self.at_call(2, NET, f"rm {settings}; exec sleep 600")
        self.assert_taken_back(10060, 8)

    def testKeytabThatCannotBeMade(self):
        self.at_call(2, NET, "exit 1")
        self.assert_taken_back(1359, 1)

    def testCallerThatIsKilled(self):
        self.at_call(2, NET, "pkill -KILL -x velmorctl")
        self.host.join()
        self.wait_for_status(1223)
        self.assert_as_before()
        self.assertIsNone(self.directory.computer(self.host.account))

    def wait_for_status(self, status):
        deadline = time.monotonic() + 60
        while self.host.statuses()[-1] != status:
            self.assertLess(time.monotonic(), deadline, self.host.statuses())
            time.sleep(0.1)

    def testPowerThatFails(self):
        self.at_call(2, NET, f"pkill -KILL -x velmorctl; {KILL_HELPER}; exit 1")
        self.host.join()
        # The next operation puts the host right, whatever it is.
        self.host.join("nowhere.example")
        self.assert_as_before()
        self.assert_exit(self.host.join(), 0)

    def testInterruptedJoinIsUndone(self):
        self.at_call(2, NET, "pkill -INT -x velmorctl")
        done = self.host.join()
        self.assert_exit(done, 130)
        self.assertIn("the host has left the domain again", done.stderr)
        self.assertEqual(self.host.statuses()[-2:], [0, 0])
        status, _ = self.host.status()
        self.assertEqual((status["joined"], status["recordedDomain"]), (False, None))
        self.assertTrue(self.directory.computer(self.host.account)["disabled"])


class KeytabTest(LabTest):
    """Each question for the trust keeps the keytab in step with the machine's password."""

    def setUp(self):
        super().setUp()
        self.host.must_join()

    def assert_keytab_opens_the_directory(self):
        self.assert_exit(self.host.velmorctl("trust", "show"), 0)
        self.host.must("kinit", "-k", f"{self.host.account}$@CORP.EXAMPLE")

    def testKeytabFollowsThePassword(self):
        before = self.host.must("klist", "-k")
        # winbindd itself does not think of the keytab.
        self.host.must("wbinfo", "--change-secret")
        self.assert_keytab_opens_the_directory()
        self.assertNotEqual(self.host.must("klist", "-k"), before)

    def testKeytabThatIsGoneIsMadeAnew(self):
        self.host.must("rm", "/etc/krb5.keytab")
        self.assert_keytab_opens_the_directory()

    def testKeytabIsForRootOnly(self):
        self.assertEqual(self.host.must("stat", "-c", "%a %U", "/etc/krb5.keytab"), "600 root\n")
