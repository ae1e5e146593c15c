"""Questions about a real domain, and each state of the trust with it produced for real."""
from lab import LabTest

HEALTHY, ACCOUNT_UNUSABLE, WRONG_PASSWORD, SERVICE_DOWN = 1, 3, 4, 8


class StatusTest(LabTest):

    def testStatusOfAMemberNamesItsDomainAccountAndController(self):
        self.host.must_join()
        status, exit_status = self.host.status()
        self.assertEqual(exit_status, 0)
        self.assertEqual(status["domain"]["dnsName"], "corp.example")
        self.assertEqual(status["machineAccount"], f"CN={self.host.account},CN=Computers,DC=corp,DC=example")
        self.assertEqual(status["domainController"], "dc1.corp.example")

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
        self.assertEqual(self.relationship("other.example"), 3)

    def testOwnDomainIsTheSameDomain(self):
        self.host.must_join()
        self.assertEqual(self.relationship("corp.example"), 1)

    def testUnknownDomainIsNotTrusted(self):
        self.host.must_join()
        self.assertEqual(self.relationship("nowhere.example"), 8)

    def relationship(self, domain):
        with self.host.questioner(30) as store:
            return int(store.ask(f"relationship {domain}").text)

    def testPreferredControllerIsRememberedAndUsed(self):
        self.host.must_join()
        self.assert_exit(self.host.velmorctl("dc", "prefer", "dc1.corp.example"), 0)
        self.assertIn("dc1.corp.example", self.host.must("velmorctl", "dc", "show"))
        self.host.must("wbinfo", "--check-secret")


class TrustStateTest(LabTest):

    def setUp(self):
        super().setUp()
        self.host.must_join()

    def assert_state(self, state):
        with self.host.questioner(60) as store:
            self.assertEqual(int(store.ask("trust-state").text), state)

    def testTrustIsHealthyAfterTheJoin(self):
        self.assert_state(HEALTHY)

    def testDisabledAccountIsUnusable(self):
        self.directory.disable_computer(self.host.account)
        self.assert_state(ACCOUNT_UNUSABLE)

    def testDeletedAccountIsUnusable(self):
        self.directory.delete_computer(self.host.account)
        self.assert_state(ACCOUNT_UNUSABLE)

    def testAccountWhosePasswordWasResetHasAnotherPassword(self):
        self.directory.reset_computer_password(self.host.account)
        self.assert_state(WRONG_PASSWORD)

    def testStoppedServiceIsDown(self):
        self.host.must("sh", "-c", "kill $(cat /run/samba/winbindd.pid); "
                       "while pgrep -x winbindd >/dev/null; do sleep 0.1; done")
        self.assert_state(SERVICE_DOWN)

    def testBrokenTrustHasAnExitStatusOfItsOwn(self):
        self.directory.disable_computer(self.host.account)
        self.assertEqual(self.host.status()[1], 4)

    def testAccountsNameIsStillKnownWhenItsPasswordWasReset(self):
        self.directory.reset_computer_password(self.host.account)
        self.assertEqual(self.host.status()[0]["machineAccount"],
                         f"CN={self.host.account},CN=Computers,DC=corp,DC=example")
