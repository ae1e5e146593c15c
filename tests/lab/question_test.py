"""Questions about a real domain, and each state of the trust with it produced for real."""
import json

from lab import LabTest


class StatusTest(LabTest):

    def testStatusOfAMemberNamesItsDomainAccountAndController(self):
        self.host.must_join()
        status, exit_status = self.host.status()
        self.assertEqual(exit_status, 0)
        self.assertEqual(status["domain"]["dnsName"], "corp.example")
        self.assertEqual(status["domain"]["machineAccountDN"], f"CN={self.host.account},CN=Computers,DC=corp,DC=example")
        self.assertEqual(status["domain"]["domainController"], "dc1.corp.example")

    def testStatusOfAHostThatIsNoMemberSaysSo(self):
        self.assertEqual(self.host.status()[1], 3)

    def testTrustedDomainIsListedWithBothNames(self):
        self.host.must_join()
        done = self.host.velmorctl("trust", "list")
        self.assert_exit(done, 0)
        self.assertIn("other.example", done.stdout)
        self.assertIn("OTHER", done.stdout)

    def testTrustWithTheOtherForestIsTwoWay(self):
        self.host.must_join()
        self.assertEqual(self.relationship("other.example"), "two-way")

    def testOwnDomainIsTheSameDomain(self):
        self.host.must_join()
        self.assertEqual(self.relationship("corp.example"), "same-domain")

    def testUnknownDomainIsNotTrusted(self):
        self.host.must_join()
        self.assertEqual(self.relationship("nowhere.example"), "none")

    def relationship(self, domain):
        return json.loads(self.host.must("velmorctl", "trust", "show", domain, "--json"))["relationship"]

    def testPreferredControllersAreRememberedInTheirOrder(self):
        self.host.must_join()
        names = ["dc9.corp.example", "dc1.corp.example"]
        self.assert_exit(self.host.velmorctl("dc", "prefer", *names), 0)
        shown = json.loads(self.host.must("velmorctl", "dc", "show", "--json"))
        self.assertEqual(shown["preferredDomainControllers"], names)

    def testPreferredControllerThatIsNotThereIsPassedOver(self):
        self.host.must_join()
        self.assert_exit(self.host.velmorctl("dc", "prefer", "dc9.corp.example"), 0)
        self.assertIn("dc9.corp.example", self.host.read("/etc/samba/smb.conf"))
        self.host.must("wbinfo", "--ping-dc")


class TrustStateTest(LabTest):

    def setUp(self):
        super().setUp()
        self.host.must_join()

    def assert_state(self, state, exit_status):
        done = self.host.velmorctl("trust", "show", "--json")
        self.assertEqual((json.loads(done.stdout)["state"], done.returncode), (state, exit_status))

    def testTrustIsHealthyAfterTheJoin(self):
        self.assert_state("healthy", 0)

    def testDisabledAccountIsUnusable(self):
        self.directory.disable_computer(self.host.account)
        self.assert_state("account-unusable", 4)

    def testDeletedAccountIsUnusable(self):
        self.directory.delete_computer(self.host.account)
        self.assert_state("account-unusable", 4)

    def testAccountWhosePasswordWasResetHasAnotherPassword(self):
        self.directory.reset_computer_password(self.host.account)
        self.assert_state("wrong-password", 4)

    def testStoppedServiceIsDown(self):
        self.host.must("sh", "-c", "kill $(cat /run/samba/winbindd.pid); "
                       "while pgrep -x winbindd >/dev/null; do sleep 0.1; done")
        self.assert_state("service-down", 7)

    def testStatusEndsWithTheSameExitStatus(self):
        self.directory.disable_computer(self.host.account)
        self.assertEqual(self.host.status()[1], 4)

    def testAccountsNameIsStillKnownWhenItsPasswordWasReset(self):
        self.directory.reset_computer_password(self.host.account)
        self.assertEqual(self.host.status()[0]["domain"]["machineAccountDN"],
                         f"CN={self.host.account},CN=Computers,DC=corp,DC=example")
