"""Joining a real domain through the CAM service, with nobody's credentials on the host."""
import json
import signal
import subprocess
import time

from cam_service import ADDRESS, UNIT, CamService, settings
from lab import SOURCE, LabTest

CAM_CONF = "/etc/quenix/velmor/cam.conf"
CONFIG_STORE = "/var/lib/quenix/configstore.db"
OPTION = "UserVars.ActiveDirectoryVerifyCAMCertificate"
WRONG_FINGERPRINT = ":".join(["00"] * 32)
STALLING_HELPER = """#!/usr/bin/python3
import json, pathlib, subprocess, sys, time
line = sys.stdin.buffer.readline()
request = json.loads(line)
if request["operation"] == "create":
    pathlib.Path("FOLDER/creating").touch()
    time.sleep(60)
secret = sys.stdin.buffer.read(request["secretSize"])
sys.exit(subprocess.run(["/usr/libexec/velmor/velmor-camd-helper"], input=line + secret).returncode)
"""


class CamTest(LabTest):
    """A new host, and a service for it."""

    def service(self, **changes):
        service = CamService(self.lab, self.host, **changes)
        self.addCleanup(service.close)
        self.host.write(CAM_CONF, settings(service))
        return service.start()

    def make_new(self, service):
        self.host.make_new()
        self.host.write(CAM_CONF, settings(service))

    def trust(self):
        self.assert_exit(self.host.velmorctl("cam", "trust", ADDRESS, "--yes"), 0)

    def join(self, *more):
        return self.host.velmorctl("join", "--proxy", ADDRESS, *more)

    def assert_refused(self, done, *texts):
        """The proxy's own exit code, no member, and nothing recorded."""
        self.assert_exit(done, 12)
        for text in texts:
            self.assertIn(text, done.stderr)
        self.assertNotEqual(self.host.run("wbinfo", "--check-secret").returncode, 0)
        self.assertEqual(self.host.status()[1], 3)


class CamJoinTest(CamTest):

    def testHostIsAMemberWithItsAccountInTheUnit(self):
        self.service()
        self.trust()
        self.assert_exit(self.join(), 0)
        self.host.must("wbinfo", "--check-secret")
        account = self.directory.computer(self.host.account)
        self.assertEqual(account["dn"], f"CN={self.host.account},{UNIT}")

    def testContainerIsTakenInTheFormsOfAJoinWithCredentials(self):
        service = self.service()
        for container in ("Servers", "OU=Servers", "OU=Servers,DC=corp,DC=example"):
            with self.subTest(container=container):
                self.make_new(service)
                self.trust()
                self.assert_exit(self.join("--container", container), 0)
                self.assertEqual(self.directory.computer(self.host.account)["dn"],
                                 f"CN={self.host.account},OU=Servers,DC=corp,DC=example")

    def testStatusIsHealthyAndTheProxyRecorded(self):
        self.service()
        self.trust()
        self.assert_exit(self.join(), 0)
        status, exit_status = self.host.status()
        self.assertEqual((exit_status, status["domain"]["dnsName"]), (0, "corp.example"))
        self.assertEqual(json.loads(self.host.velmorctl("cam", "show", "--json").stdout)["joinedThrough"], ADDRESS)

    def testHostLeavesAndJoinsAgainWithTheSameCertificate(self):
        self.service(directory={"existing-accounts": "any"})
        self.trust()
        self.assert_exit(self.join(), 0)
        self.assert_exit(self.host.velmorctl("leave"), 0)
        self.assert_exit(self.join(), 0)

    def testWithVerificationOffNoCertificateIsNeeded(self):
        self.service()
        self.assert_exit(self.host.velmorctl("option", "set", OPTION, "0"), 0)
        self.assert_exit(self.join(), 0)
        self.host.must("wbinfo", "--check-secret")

    def testDiscoveryNamesTheDomainWithoutACertificate(self):
        self.service()
        done = self.host.velmorctl("cam", "discover", ADDRESS, "--json")
        self.assertEqual(json.loads(done.stdout)["domain"], "corp.example")

    def testOneUseTokenIsGoodForOneJoin(self):
        service = self.service(access={"token-required": True}, directory={"existing-accounts": "any"})
        token = service.must("setpriv", "--reuid=65534", "--regid=65534", "--clear-groups", "velmor-camd", "--config",
                             f"{service.folder}/camd.conf", "token", "add").strip()
        self.host.write(CAM_CONF, settings(service, token=token))
        self.host.must("chmod", "600", CAM_CONF)
        self.trust()
        self.assert_exit(self.join(), 0)
        self.assert_exit(self.host.velmorctl("leave"), 0)
        self.assert_refused(self.join(), "1326")

    def testNoSecretOfTheJoinIsInALog(self):
        service = self.service()
        self.trust()
        self.assert_exit(self.join(), 0)
        secret = self.host.must("tdbdump", "-k", "SECRETS/MACHINE_PASSWORD/CORP", "/var/lib/samba/private/secrets.tdb")
        password = secret.strip().removesuffix("\\00")
        self.assertGreater(len(password), 20)
        logs = service.audit() + self.host.must("sh", "-c", "cat /var/log/syslog /var/lib/quenix/samba/attempts.log")
        self.assertNotIn(password, logs)


class CamCertificateTest(CamTest):

    def testWithoutAnImportedCertificateNothingIsAsked(self):
        service = self.service()
        self.assert_refused(self.join(), "velmorctl cam trust")
        self.assertEqual(service.must("sh", "-c", f"cat {service.folder}/audit.log 2>/dev/null || true"), "")

    def testReplacedCertificateIsRefusedUntilItIsImported(self):
        service = self.service()
        self.trust()
        service.stop()
        service.make_certificate()
        service.start()
        self.assert_refused(self.join(), "certificate cannot be verified")
        self.assertIsNone(self.directory.computer(self.host.account))
        self.trust()
        self.assert_exit(self.join(), 0)

    def testOtherSha256IsRefusedThoughTheThumbprintMatches(self):
        service = self.service()
        self.trust()
        self.host.write(CAM_CONF, settings(service, sha256=WRONG_FINGERPRINT))
        self.assert_refused(self.join(), "certificate cannot be verified")
        self.assertIsNone(self.directory.computer(self.host.account))

    def testCertificatePastItsDateIsAcceptedWithAWarning(self):
        service = self.service()
        service.stop()
        service.make_certificate("faketime", "-f", "-10d")
        service.start()
        self.trust()
        self.assert_exit(self.join(), 0)
        self.assertIn("its certificate is past its date; accepted", self.host.read("/var/log/syslog"))

    def testFingerprintThatDiffersIsNotTrusted(self):
        self.service()
        self.assert_exit(self.host.velmorctl("cam", "trust", ADDRESS, "--sha256", WRONG_FINGERPRINT), 12)
        self.assertIsNone(json.loads(self.host.velmorctl("cam", "show", "--json").stdout)["certificate"])


class CamOutageTest(CamTest):

    def testStoppedServiceIsARefusedConnection(self):
        service = self.service()
        self.trust()
        service.stop()
        self.assert_refused(self.join(), "status:   1225")

    def testFrozenServiceEndsWithTheTimeOut(self):
        service = self.service()
        self.trust()
        self.host.write(CAM_CONF, settings(service, connect_timeout=2, request_timeout=2))
        service.send(signal.SIGSTOP)
        start = time.monotonic()
        self.assert_refused(self.join(), "status:   10060")
        self.assertLess(time.monotonic() - start, 30)

    def testAddressThatNobodyHasIsNoRoute(self):
        self.service()
        self.trust()
        self.assert_refused(self.host.velmorctl("join", "--proxy", "10.99.0.99"), "status:   1229")

    def testServiceThatIsKilledInTheMiddleLeavesTheHostAsItWas(self):
        service = self.service()
        self.trust()
        self.write_stalling_helper(service)
        before = self.host.files()
        join = subprocess.Popen([SOURCE / "lab/enter", self.host.name, "velmorctl", "join", "--proxy", ADDRESS,
                                 "--skip-hostname-check"], stderr=subprocess.PIPE, text=True)
        service.wait_for(f"test -e {service.folder}/creating")
        service.stop(signal.SIGKILL)
        _, errors = join.communicate(timeout=60)
        self.assertEqual(join.returncode, 12, errors)
        self.assertIn("status:   10054", errors)
        self.assertEqual(self.differences(before), set())

    def write_stalling_helper(self, service):
        """Stands before the helper: a creation begins and never ends."""
        service.write("helper", STALLING_HELPER.replace("FOLDER", service.folder), "700")
        service.stop()
        service.write("camd.conf", service.configuration({"directory": {"helper": f"{service.folder}/helper"}}))
        service.start()

    def differences(self, before):
        after = self.host.files()
        return {path for path in before.keys() | after.keys() if before.get(path) != after.get(path)
                and not path.startswith("/run/") and path != "/etc/quenix/velmor/authentication.conf"}


class CamRefusalTest(CamTest):

    def testPlaceOutsideTheDelegatedUnitIsRefused(self):
        self.service()
        self.trust()
        self.assert_refused(self.join("--container", "CN=Computers,DC=corp,DC=example"), "status:   5")
        self.assertIsNone(self.directory.computer(self.host.account))

    def testUnknownContainerIsRefused(self):
        self.service()
        self.trust()
        self.assert_refused(self.join("--container", "Nowhere"), "status:   267")

    def testNameThatIsNotOnTheAllowListIsRefused(self):
        self.service(access={"host-names": ["node*.corp.example"]})
        self.trust()
        self.assert_refused(self.join(), "status:   5")
        self.assertIsNone(self.directory.computer(self.host.account))

    def testAddressThatIsNotOnTheAllowListIsRefused(self):
        self.service(access={"client-addresses": ["10.99.0.200"]})
        self.trust()
        self.assert_refused(self.join(), "status:   5")

    def testExistingAccountIsRefusedAndLeftAsItIs(self):
        self.directory.create_computer(self.host.account, "elsewhere.corp.example")
        before = self.directory.computer(self.host.account)
        self.service()
        self.trust()
        self.assert_refused(self.join(), "status:   2224")
        self.assertEqual(self.directory.computer(self.host.account), before)


class CamRecordTest(CamTest):

    def testHostLeavesAgainWhenTheJoinCannotBeRecorded(self):
        self.service()
        self.assert_exit(self.host.velmorctl("option", "set", OPTION, "0"), 0)
        self.host.write(CONFIG_STORE, "no database")
        done = self.join()
        self.assertNotEqual(done.returncode, 0)
        self.assertIn(".Leaving Domain...", self.host.read("/var/log/syslog"))
        self.assertNotEqual(self.host.run("wbinfo", "--check-secret").returncode, 0)
