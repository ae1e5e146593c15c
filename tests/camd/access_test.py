"""Who may ask, and for what."""
import sqlite3
import subprocess
import time

from camd import ServiceTest


class AllowListTest(ServiceTest):

    CHANGES = {"access": {"client-addresses": ["127.0.0.1", "127.1.0.0/16"],
                          "host-names": ["host*.corp.example", "web-?"]}}

    def testAddressOutsideTheListIsRefused(self):
        self.assertEqual(self.service.domain(source="127.0.0.2").outcome, (403, 5))
        self.assertEqual(self.service.create(source="127.2.0.1").outcome, (403, 5))

    def testAddressInARangeIsServed(self):
        self.assertEqual(self.service.domain(source="127.1.2.3").code, 200)

    def testNameOutsideTheListIsRefused(self):
        for name in ("other.corp.example", "host1.example", "host1", "web-12.corp.example"):
            with self.subTest(name=name):
                self.assertEqual(self.service.create(name).outcome, (403, 5))
        self.assertEqual(self.service.helper_requests(), [])

    def testNameOnTheListIsServed(self):
        for name in ("host7.corp.example", "HOST8.Corp.Example", "web-1.anywhere.example", "web-2"):
            with self.subTest(name=name):
                self.assertEqual(self.service.create(name).code, 201)

    def testImpossibleNameIsRefused(self):
        for name in ("", ".", "-", "host1-.corp.example", "a-name-of-16-chrs.corp.example", "123.corp.example",
                     "ho st.corp.example", "host$.corp.example", "host_1.corp.example", "höst.corp.example",
                     "host1..example", "host1.corp.example.", "host1)(cn=*.corp.example", "../host1.corp.example",
                     "host\n1.corp.example", "a" * 300):
            with self.subTest(name=name):
                self.assertEqual(self.service.create(name).outcome, (400, 1210))
        self.assertEqual(self.service.helper_requests(), [])


class RateTest(ServiceTest):

    CHANGES = {"access": {"requests-per-minute": 1}}

    def testClientThatAsksTooOftenHasToWait(self):
        self.assertEqual(self.service.domain().code, 200)
        refused = self.service.domain()
        self.assertEqual(refused.outcome, (429, 1816))
        self.assertIn(int(refused.headers["Retry-After"]), range(1, 61))

    def testOtherClientsDoNotHaveToWait(self):
        self.service.domain()
        self.assertEqual(self.service.domain(source="127.0.0.2").code, 200)


class QuotaTest(ServiceTest):

    CHANGES = {"access": {"accounts-per-day": 2}}

    def testClientGetsItsAccountsForTheDayAndNoMore(self):
        answers = [self.service.create(f"host{number}.corp.example") for number in range(3)]
        self.assertEqual([answer.outcome for answer in answers], [(201, 0), (201, 0), (429, 1816)])
        self.assertIn("Retry-After", answers[-1].headers)

    def testFailuresDoNotCount(self):
        self.service.behave(status=5)
        for _ in range(3):
            self.service.create()
        self.service.behave()
        self.assertEqual(self.service.create().code, 201)

    def testQuotaIsKeptOverARestart(self):
        self.service.create("host1.corp.example")
        self.service.create("host2.corp.example")
        self.service.stop()
        self.service.start()
        self.assertEqual(self.service.create("host3.corp.example").outcome, (429, 1816))

    def testQuotaIsForADay(self):
        self.service.create("host1.corp.example")
        self.service.create("host2.corp.example")
        self.service.change_ledger("UPDATE accounts SET requested = requested - 86401")
        self.assertEqual(self.service.create("host3.corp.example").code, 201)


class NetworkQuotaTest(ServiceTest):
    """IPv6 gives a host more addresses than anybody can count."""

    CHANGES = {"server": {"listen-address": "::"}, "access": {"accounts-per-day": 1, "client-addresses": ["::/0"]}}

    def setUp(self):
        for address in ("2001:db8:1::1", "2001:db8:1::2", "2001:db8:2::1"):
            subprocess.run(["ip", "address", "add", f"{address}/128", "dev", "lo", "nodad"], check=True)
        super().setUp()

    def testAddressesOfANetworkShareItsQuota(self):
        answers = [self.service.create(f"host{number}.corp.example", source=source, address=source)
                   for number, source in enumerate(("2001:db8:1::1", "2001:db8:1::2", "2001:db8:2::1"))]
        self.assertEqual([answer.code for answer in answers], [201, 429, 201])


class TokenTest(ServiceTest):

    CHANGES = {"access": {"token-required": True}}

    def testCreationWithoutTokenIsRefused(self):
        answer = self.service.create()
        self.assertEqual(answer.outcome, (401, 1326))
        self.assertEqual(answer.headers["WWW-Authenticate"], "Bearer")

    def testDomainNeedsNoToken(self):
        self.assertEqual(self.service.domain().code, 200)

    def testTokenAllowsOneCreation(self):
        token = self.service.token()
        self.assertEqual(self.service.create("host1.corp.example", token=token).code, 201)
        self.assertEqual(self.service.create("host2.corp.example", token=token).outcome, (401, 1326))

    def testWrongTokenIsRefused(self):
        token = self.service.token()
        for wrong in ("", "x", token[:-1], token[:-1] + ("0" if token[-1] != "0" else "1"), token + "0",
                      token.split(".", maxsplit=1)[0], "." + token.split(".")[1]):
            with self.subTest(length=len(wrong)):
                self.assertEqual(self.service.create(token=wrong).outcome, (401, 1326))

    def testTokenForAnotherNameIsRefused(self):
        token = self.service.token("--host-name", "host1.corp.example")
        self.assertEqual(self.service.create("host2.corp.example", token=token).outcome, (403, 5))
        self.assertEqual(self.service.create("host1.corp.example", token=token).code, 201)

    def testTokenOutOfDateIsRefused(self):
        token = self.service.token("--hours", "1")
        with sqlite3.connect(self.service.folder / "ledger.db") as database:
            database.execute("UPDATE tokens SET expires = ?", (int(time.time()) - 1,))
        self.assertEqual(self.service.create(token=token).outcome, (401, 1326))

    def testTokenIsNotUsedUpByAFailure(self):
        token = self.service.token()
        self.service.behave(status=1311)
        self.assertEqual(self.service.create(token=token).outcome, (502, 1311))
        self.service.behave()
        self.assertEqual(self.service.create(token=token).code, 201)

    def testTokenIsNotUsedUpWhenTheLedgerFails(self):
        token = self.service.token()
        self.service.change_ledger("CREATE TRIGGER full BEFORE INSERT ON accounts BEGIN SELECT RAISE(FAIL, 'full'); END")
        self.assertEqual(self.service.create(token=token).outcome, (500, 1359))
        self.service.change_ledger("DROP TRIGGER full")
        self.assertEqual(self.service.create(token=token).code, 201)

    def testTwoCreationsAtOnceWithOneTokenGiveOneAccount(self):
        token = self.service.token()
        self.service.behave(delay=0.5)
        first = self.service.later(self.service.create, "host1.corp.example", token=token)
        second = self.service.later(self.service.create, "host2.corp.example", token=token)
        self.assertEqual(sorted([first.result().code, second.result().code]), [201, 401])

    def testRemovedTokenIsRefused(self):
        token = self.service.token()
        self.assertEqual(self.service.command("token", "remove", token.split(".")[0]).returncode, 0)
        self.assertEqual(self.service.create(token=token).outcome, (401, 1326))

    def testUnknownTokenCannotBeRemoved(self):
        self.assertEqual(self.service.command("token", "remove", "0123456789abcdef").returncode, 1)

    def testListTellsOfTokensButNotTheirSecrets(self):
        token = self.service.token("--host-name", "host1.*")
        self.service.create("host1.corp.example", token=token)
        listed = self.service.command("token", "list").stdout
        self.assertIn(token.split(".", maxsplit=1)[0], listed)
        self.assertIn("host1.corp.example", listed)
        self.assertNotIn(token.split(".")[1], listed)

    def testTokenIsKeptAsADigestOnly(self):
        token = self.service.token()
        self.service.create(token=token)
        secret = token.split(".")[1].encode()
        for file in self.service.folder.iterdir():
            if file.is_file():
                self.assertNotIn(secret, file.read_bytes(), file.name)
