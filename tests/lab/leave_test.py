"""Leaving a real domain."""
import json

from lab import ADMINISTRATOR_PASSWORD, LabTest


class LeaveTest(LabTest):

    def leave_with_account(self, password=ADMINISTRATOR_PASSWORD):
        return self.host.velmorctl("leave", "-U", "Administrator", password=password)

    def testLeaveWithoutCredentialsEndsTheMembership(self):
        self.host.must_join()
        self.assert_exit(self.host.velmorctl("leave"), 0)
        self.assertEqual(self.host.status()[1], 3)
        self.assertNotEqual(self.host.run("wbinfo", "--check-secret").returncode, 0)

    def testLeaveWithoutCredentialsKeepsTheAccount(self):
        self.host.must_join()
        self.assert_exit(self.host.velmorctl("leave"), 0)
        self.assertFalse(self.directory.computer(self.host.account)["disabled"])

    def testLeaveWithCredentialsDisablesTheAccount(self):
        self.host.must_join()
        self.assert_exit(self.leave_with_account(), 0)
        account = self.directory.computer(self.host.account)
        self.assertTrue(account is None or account["disabled"], account)

    def testLeaveWithCredentialsRemovesTheIdentityRecords(self):
        self.host.must_join()
        self.assert_exit(self.leave_with_account(), 0)
        status, exit_status = self.host.status()
        self.assertEqual((exit_status, status["recordedDomain"]), (3, None))

    def testLeaveWithAWrongPasswordKeepsTheMembership(self):
        self.host.must_join()
        self.assert_exit(self.leave_with_account("not-the-password"), 6)
        self.host.must("wbinfo", "--check-secret")

    def testLeaveRemovesTheKeytab(self):
        self.host.must_join()
        self.assert_exit(self.host.velmorctl("leave"), 0)
        self.assertFalse(self.host.has("/etc/krb5.keytab"))

    def testLeaveForgetsThePreferredControllers(self):
        self.host.must_join()
        self.assert_exit(self.host.velmorctl("dc", "prefer", "dc1.corp.example"), 0)
        self.assert_exit(self.host.velmorctl("leave"), 0)
        state = json.loads(self.host.read("/var/lib/quenix/samba/state.json"))
        self.assertEqual(state["preferredDomainControllers"], [])

    def testLeaveOfAHostThatIsNoMemberSaysSo(self):
        self.assert_exit(self.host.velmorctl("leave"), 3)

    def testHostJoinsAgainAfterALeave(self):
        self.host.must_join()
        self.assert_exit(self.host.velmorctl("leave"), 0)
        self.assert_exit(self.host.join(), 0)
        self.host.must("wbinfo", "--check-secret")

    def testHostJoinsAgainAfterALeaveWithCredentials(self):
        self.host.must_join()
        self.assert_exit(self.leave_with_account(), 0)
        self.assert_exit(self.host.join(), 0)
        self.host.must("wbinfo", "--check-secret")
