"""Starting, reloading and stopping the service, and what it remembers."""
import signal
import socket
import subprocess
import unittest

from camd import PORT, Service, ServiceTest, connect, status_of_next, wait_until


class StopTest(ServiceTest):

    def testRequestUnderWayIsFinished(self):
        self.service.behave(**{"wait-for": "go"})
        creation = self.service.later(self.service.create)
        wait_until(self.service.helper_requests)
        self.service.process.send_signal(signal.SIGTERM)
        wait_until(lambda: not self.accepts())
        self.service.write("go", "")
        self.assertEqual(creation.result().code, 201)
        self.assertEqual(self.service.wait(), 0)

    def testNewRequestOnAnOpenConnectionIsRefusedMeanwhile(self):
        self.service.behave(**{"wait-for": "go"})
        with connect() as connection:
            creation = self.service.later(self.service.create)
            wait_until(self.service.helper_requests)
            self.service.process.send_signal(signal.SIGTERM)
            wait_until(lambda: not self.accepts())
            connection.sendall(b"GET /v1/domain HTTP/1.1\r\nHost: a\r\n\r\n")
            self.assertEqual(status_of_next(connection), 503)
        self.service.write("go", "")
        self.assertEqual(creation.result().code, 201)

    def testIdleConnectionDoesNotHoldItUp(self):
        with connect():
            self.assertEqual(self.service.stop(), 0)

    def accepts(self):
        try:
            connect().close()
            return True
        except OSError:
            return False


class LongStopTest(ServiceTest):
    """Requests wait for a helper that answers none."""

    CHANGES = {"server": {"helpers": 1}, "directory": {"helper-timeout-seconds": 2}}

    def testRequestThatWouldHoldUpTheEndIsToldToComeAgain(self):
        # A shell, which has begun long before its time is over.
        self.service.write("helper", f"#!/bin/sh\necho begun >>{self.service.folder}/begun\nexec sleep 1000\n", 0o755)
        creations = [self.service.later(self.service.create, f"host{number}.corp.example") for number in range(8)]
        # The first two are with the directory then, one after the other, and all others wait.
        wait_until(lambda: len(self.service.read("begun").splitlines()) >= 2)
        self.service.process.send_signal(signal.SIGTERM)
        outcomes = [creation.result().outcome for creation in creations]
        self.assertEqual(self.service.wait(), 0)
        self.assertEqual(set(outcomes), {(504, 1460), (503, 170)})
        self.assertLess(outcomes.count((504, 1460)), 6)


class SystemManagerTest(unittest.TestCase):
    """systemd is told when the service answers, and when it ends."""

    def setUp(self):
        self.service = Service()
        self.addCleanup(self.service.close)

    def assert_told(self, place):
        manager = socket.socket(socket.AF_UNIX, socket.SOCK_DGRAM)
        self.addCleanup(manager.close)
        manager.settimeout(20)
        manager.bind(place.replace("@", "\0") if place.startswith("@") else place)
        self.service.start(NOTIFY_SOCKET=place)
        self.assertEqual(manager.recv(4096), b"READY=1")
        self.assertEqual(self.service.domain().code, 200)
        self.assertEqual(self.service.stop(), 0)
        self.assertEqual(manager.recv(4096), b"STOPPING=1")

    def testSocketInTheFileSystemIsTold(self):
        self.assert_told(str(self.service.folder / "manager"))

    def testSocketWithoutAFileIsTold(self):
        self.assert_told("@velmor-camd-test")

    def testSocketThatIsNotThereKeepsNobodyFromWorking(self):
        self.service.start(NOTIFY_SOCKET=str(self.service.folder / "absent"))
        self.assertEqual(self.service.domain().code, 200)


class LedgerTest(ServiceTest):

    def testAccountThatWasGivenOutIsRememberedAfterAKill(self):
        self.service.create()
        self.service.kill()
        self.assertEqual(self.service.ledger(), [("HOST2", "given")])
        self.service.start()
        self.assertEqual(self.service.create("host3.corp.example").code, 201)

    def testRequestCutShortByAKillIsMarkedAtTheNextStart(self):
        self.service.behave(silent=True)
        creation = self.service.later(self.service.create)
        wait_until(self.service.helper_requests)
        self.service.kill()
        self.assertIsInstance(creation.exception(), OSError)
        self.assertEqual(self.service.ledger(), [("HOST2", "requested")])
        self.service.start()
        self.assertEqual(self.service.ledger(), [("HOST2", "interrupted")])

    def testLedgerBelongsToItsOwnerOnly(self):
        self.assertEqual((self.service.folder / "ledger.db").stat().st_mode & 0o777, 0o600)


class UnusedAccountTest(ServiceTest):

    CHANGES = {"directory": {"remove-unused-after-hours": 2}}

    def restart_later(self, hours):
        """Makes all accounts older, and starts the service anew, which then looks for unused ones."""
        self.service.stop()
        self.service.change_ledger(f"UPDATE accounts SET requested = requested - {hours * 3600}")
        self.service.start()

    def testUnusedAccountIsRemovedAfterItsTime(self):
        self.service.create()
        self.restart_later(3)
        wait_until(lambda: self.service.ledger() == [("HOST2", "removed")])
        self.assertFalse((self.service.folder / "accounts/HOST2").exists())

    def testRecordGoesToTheDirectoryWithTheRequest(self):
        self.service.create()
        self.restart_later(3)
        wait_until(lambda: self.service.helper_requests("remove-unused"))
        request = self.service.helper_requests("remove-unused")[0]
        self.assertEqual((request["computer"], request["sid"], request["lastLogon"], request["logonCount"]),
                         ("HOST2", f"S-1-5-21-1-2-3-{sum(b'HOST2')}", 22, 3))

    def testAccountIsNotLookedAtBeforeItsTime(self):
        self.service.create("host1.corp.example")
        self.restart_later(3)
        self.service.create("host2.corp.example")
        self.restart_later(1)
        wait_until(lambda: ("HOST1", "removed") in self.service.ledger())
        self.assertEqual([request["computer"] for request in self.service.helper_requests("remove-unused")], ["HOST1"])

    def testAccountInUseIsKeptForGood(self):
        self.service.create()
        self.service.write("accounts/HOST2", "used")
        self.restart_later(3)
        wait_until(lambda: self.service.ledger() == [("HOST2", "kept")])
        self.service.create("host3.corp.example")
        self.restart_later(3)
        wait_until(lambda: self.service.ledger() == [("HOST2", "kept"), ("HOST3", "removed")])
        self.assertEqual([request["computer"] for request in self.service.helper_requests("remove-unused")],
                         ["HOST2", "HOST3"])

    def testAccountStaysWhenTheDirectoryDoesNotAnswer(self):
        self.service.create()
        self.service.behave(status=1311)
        self.restart_later(3)
        wait_until(lambda: self.service.helper_requests("remove-unused"))
        wait_until(lambda: any(event.get("outcome") == "not looked at" for event in self.service.audit()))
        self.assertEqual(self.service.ledger(), [("HOST2", "given")])

    def testAccountThatCannotBeLookedAtDoesNotKeepOthersFromIt(self):
        self.service.create("host1.corp.example")
        self.service.create("host2.corp.example")
        self.service.behave(only="HOST1", status=1359)
        self.restart_later(3)
        wait_until(lambda: self.service.ledger() == [("HOST1", "given"), ("HOST2", "removed")])

    def testNameIsNotGivenOutWhileItsAccountIsRemoved(self):
        self.service.create()
        self.service.behave(**{"wait-for": "go"})
        self.restart_later(3)
        wait_until(lambda: self.service.helper_requests("remove-unused"))
        creation = self.service.later(self.service.create)
        wait_until(lambda: creation.done() or len(self.service.helper_requests("create")) == 2)
        self.service.write("go", "")
        self.assertEqual(creation.result().outcome, (409, 1061))
        wait_until(lambda: self.service.ledger() == [("HOST2", "removed")])
        self.assertEqual(self.service.create().code, 201)

    def testRemovalIsInTheAuditLog(self):
        self.service.create()
        self.restart_later(3)
        wait_until(lambda: any(event.get("outcome") == "removed" for event in self.service.audit()))


class ReloadTest(ServiceTest):

    def reload(self):
        self.service.process.send_signal(signal.SIGHUP)

    def reload_for_another_client(self, **changes):
        """Has the service read changed settings, which allow 127.0.0.9 only. Asks the directory for nothing."""
        self.service.configure(access={"client-addresses": ["127.0.0.9"]}, **changes)
        self.reload()
        wait_until(lambda: self.service.create("-").code == 403)

    def testNewSettingsAreInForce(self):
        self.assertEqual(self.service.domain().code, 200)
        self.service.configure(access={"client-addresses": ["127.0.0.9"]})
        self.reload()
        wait_until(lambda: self.service.domain().code == 403)
        self.assertEqual(self.service.domain(source="127.0.0.9").code, 200)

    def testOldSettingsStayWhenTheNewOnesAreWrong(self):
        self.service.configure(access={"client-addresses": ["127.0.0.9"], "colour": "blue"})
        self.reload()
        wait_until(lambda: any(event.get("event") == "reload" for event in self.service.audit()))
        self.assertEqual(self.service.domain().code, 200)
        self.assertEqual(self.service.domain(source="127.0.0.9").code, 200)

    def testFaultIsReportedWithItsPlace(self):
        self.service.configure(access={"colour": "blue"})
        self.reload()
        wait_until(lambda: any(event.get("event") == "reload" for event in self.service.audit()))
        text = next(event["text"] for event in self.service.audit() if event.get("event") == "reload")
        self.assertRegex(text, r"camd\.conf:\d+: .*colour")

    def testRequestUnderWayIsNotDisturbed(self):
        self.service.behave(**{"wait-for": "go"})
        creation = self.service.later(self.service.create)
        wait_until(self.service.helper_requests)
        self.reload_for_another_client()
        self.service.write("go", "")
        self.assertEqual(creation.result().code, 201)

    def testDomainOfTheOldSettingsIsNotTold(self):
        self.service.behave(**{"wait-for": "go"})
        old = self.service.later(self.service.domain)
        wait_until(self.service.helper_requests)
        self.reload_for_another_client(directory={"domain": "other.example"})
        self.service.write("go", "")
        self.assertEqual(old.result().body["dnsDomainName"], "corp.example")
        self.assertEqual(self.service.domain(source="127.0.0.9").body["dnsDomainName"], "other.example")

    def testAuditFileThatWasMovedAwayGetsASuccessor(self):
        self.service.domain()
        (self.service.folder / "audit.log").rename(self.service.folder / "audit.log.1")
        self.reload()
        wait_until(lambda: (self.service.folder / "audit.log").exists())
        self.service.domain()
        self.assertEqual(len(self.service.audit()), 1)

    def testRefusedPasswordIsTriedAgain(self):
        self.service.behave(status=1069)
        self.service.create()
        self.service.behave()
        self.assertEqual(self.service.create().outcome, (500, 1069))
        self.reload()
        wait_until(lambda: self.service.create().code == 201)

    def testRefusalOfThePasswordBeforeDoesNotCount(self):
        self.service.behave(status=1069, **{"wait-for": "go"})
        refused = self.service.later(self.service.create)
        wait_until(self.service.helper_requests)
        self.reload_for_another_client()
        self.service.write("go", "")
        self.assertEqual(refused.result().outcome, (500, 1069))
        self.service.behave()
        self.assertEqual(self.service.create(source="127.0.0.9").code, 201)


class ConfigurationTest(unittest.TestCase):

    def setUp(self):
        self.service = Service()
        self.addCleanup(self.service.close)

    def assert_refused(self, pattern):
        checked = self.service.command("--check")
        self.assertEqual(checked.returncode, 1)
        self.assertRegex(checked.stderr, pattern)
        self.assertEqual(self.service.command().returncode, 1)

    def testGoodConfigurationPassesTheCheck(self):
        checked = self.service.command("--check")
        self.assertEqual((checked.returncode, checked.stderr), (0, ""))

    def testUnknownKeyIsNamedWithItsLine(self):
        self.service.configure(server={"colour": "blue"})
        self.assert_refused(r"camd\.conf:\d+: unknown key \"colour\" in section \[server\]")

    def testUnknownSectionIsNamedWithItsLine(self):
        self.service.write("camd.conf", self.service.read("camd.conf") + "[kitchen]\n")
        self.assert_refused(r"camd\.conf:\d+: unknown section \[kitchen\]")

    def testTextThatIsNoSettingIsNamedWithItsLine(self):
        self.service.write("camd.conf", "[server]\nport 8443\n")
        self.assert_refused(r"camd\.conf:2: ")

    def testMissingFileIsNamed(self):
        self.service.configuration.unlink()
        self.assert_refused(r"camd\.conf: ")

    def testValueOfAnotherTypeIsRefused(self):
        for section, key, value in (("server", "port", "8443"), ("server", "port", 0), ("server", "port", 65536),
                                    ("server", "helpers", 1.5), ("directory", "domain", 7),
                                    ("access", "host-names", "all"), ("access", "host-names", [7]),
                                    ("access", "client-addresses", ["10.0.0.0/33"]),
                                    ("access", "client-addresses", ["10.0.0.1/24"]),
                                    ("access", "client-addresses", ["everywhere"]),
                                    ("access", "token-required", "yes"),
                                    ("directory", "existing-accounts", "keep")):
            with self.subTest(key=key, value=value):
                self.service.configure(**{section: {key: value}})
                self.assert_refused(rf"camd\.conf:\d+: ")

    def testValueThatMeansNothingIsNamedWithItsLine(self):
        for section, key, value in (("server", "listen-address", "everywhere"), ("server", "ledger-file", ""),
                                    ("server", "ledger-file", ":memory:"), ("server", "ledger-file", "ledger.db"),
                                    ("server", "audit-file", "audit.log"),
                                    ("server", "certificate-file", "certs/camd.pem"),
                                    ("server", "key-file", "certs/camd.key"),
                                    ("directory", "password-file", "./password"),
                                    ("directory", "domain", "corp example"),
                                    ("directory", "controller", "dc1/x"), ("directory", "user", "CORP\\camsvc"),
                                    ("directory", "user", "camsvc@corp.example"), ("directory", "helper", ""),
                                    ("directory", "helper", "velmor-camd-helper")):
            with self.subTest(key=key, value=value):
                self.service.configure(**{section: {key: value}})
                self.assert_refused(r"camd\.conf:\d+: ")

    def testMissingKeyIsNamed(self):
        text = self.service.read("camd.conf").replace('user = "camsvc"\n', "")
        self.service.write("camd.conf", text)
        self.assert_refused(r"key \"user\" of section \[directory\] is missing")

    def testPasswordThatOthersCanReadIsRefused(self):
        (self.service.folder / "password").chmod(0o640)
        self.assert_refused("password is open to others than its owner")

    def testKeyThatOthersCanReadIsRefused(self):
        (self.service.folder / "camd.key").chmod(0o644)
        self.assert_refused("camd.key is open to others than its owner")

    def testMissingPasswordIsRefused(self):
        (self.service.folder / "password").unlink()
        self.assert_refused("cannot open .*password")

    def testCredentialOfTheSystemManagerIsWanted(self):
        self.service.configure(directory={"password-file": "camd-password"})
        started = self.service.command()
        self.assertEqual(started.returncode, 1)
        self.assertIn("handed over no credential 'camd-password'", started.stderr)

    def testCheckNamesTheCredentialsThatItCannotSee(self):
        self.service.configure(server={"key-file": "camd-key"}, directory={"password-file": "camd-password"})
        checked = self.service.command("--check")
        self.assertEqual((checked.returncode, checked.stdout, checked.stderr),
                         (0, "not looked at: the credential 'camd-key'\nnot looked at: the credential 'camd-password'\n",
                          ""))

    def testCheckLooksAtTheCredentialsThatItIsHanded(self):
        self.service.configure(server={"key-file": "camd.key"}, directory={"password-file": "camd-password"})
        checked = self.service.command("--check", CREDENTIALS_DIRECTORY=str(self.service.folder))
        self.assertEqual(checked.returncode, 1)
        self.assertRegex(checked.stderr, "cannot open .*/camd-password")

    def testCertificateThatIsNoneIsRefused(self):
        self.service.write("camd.pem", "no certificate\n")
        self.assert_refused("the certificate and its key cannot be used: ")

    def testKeyOfAnotherCertificateIsRefused(self):
        subprocess.run(["openssl", "ecparam", "-name", "prime256v1", "-genkey", "-noout", "-out",
                        self.service.folder / "camd.key"], check=True, capture_output=True)
        self.assert_refused("the certificate and its key cannot be used: ")

    def testPortThatIsTakenIsReported(self):
        self.service.start()
        done = self.service.command()
        self.assertEqual(done.returncode, 1)
        self.assertIn("Address already in use", done.stderr)

    def testUnknownOptionIsAUsageError(self):
        self.assertEqual(self.service.command("--colour").returncode, 2)
