"""The accounts that the CAM service makes in a real domain, seen past any client plug-in."""
import json
import signal
import time

from cam_service import ADDRESS, NODE, UNIT, CamService
from lab import SOURCE, LabTest

SMB_CONF = """[global]
workgroup = CORP
realm = CORP.EXAMPLE
security = ADS
server role = member server
disable netbios = yes
"""

# Makes the account and keeps the answer for itself.
SILENT_HELPER = """#!/usr/bin/python3
import json, pathlib, subprocess, sys, time
line = sys.stdin.buffer.readline()
request = json.loads(line)
secret = sys.stdin.buffer.read(request["secretSize"])
answer = subprocess.run(["/usr/libexec/velmor/velmor-camd-helper"], input=line + secret, stdout=subprocess.PIPE).stdout
if request["operation"] == "create":
    pathlib.Path("FOLDER/made").touch()
    time.sleep(1000)
sys.stdout.buffer.write(answer)
"""
# The helper, which sees another program in the place of the one that makes accounts; that one is FOLDER/real.
HELPER_WITH_OTHER_PROVISION = """#!/bin/sh
touch FOLDER/real
exec unshare --map-root-user --mount sh -ec '
  mount --bind /usr/libexec/velmor/velmor-camd-provision FOLDER/real
  mount --bind FOLDER/provision /usr/libexec/velmor/velmor-camd-provision
  exec /usr/libexec/velmor/velmor-camd-helper'
"""
# Makes the account and cuts the helper's connection to the controller before the answer.
CUTTING_PROVISION = """#!/usr/bin/python3
import ctypes, json, os, socket, subprocess, sys
PIDFD_GETFD = 438
line = sys.stdin.buffer.readline()
secret = sys.stdin.buffer.read(json.loads(line)["secretSize"])
answer = subprocess.run(["FOLDER/real"], input=line + secret, stdout=subprocess.PIPE).stdout
helper = os.pidfd_open(os.getppid())
for number in map(int, os.listdir(f"/proc/{os.getppid()}/fd")):
    descriptor = ctypes.CDLL(None).syscall(PIDFD_GETFD, helper, number, 0)
    try:
        connection = socket.socket(fileno=descriptor)
    except OSError:
        continue
    if connection.family == socket.AF_INET:
        connection.shutdown(socket.SHUT_RDWR)
sys.stdout.buffer.write(answer)
"""
# Says that it made an account.
LYING_PROVISION = """#!/bin/sh
printf '{"status": 0, "text": "", "secretSize": 4}\\nblob'
"""


class CamAccountsTest(LabTest):
    """A service, and a host that asks it. Names of other hosts begin with this host's, so that tests that run beside
    each other do not meet."""

    def service(self, **changes):
        service = CamService(self.lab, self.host, **changes)
        self.addCleanup(service.close)
        return service.start()

    def name(self, suffix):
        name = f"{self.host.name}-{suffix}"
        self.directory.delete_computer(name.upper())
        self.addCleanup(self.directory.delete_computer, name.upper())
        return name

    def create_all(self, service, names, container=None):
        """Asks for all at once; the answers as (HTTP status, body) in the same order."""
        body = {} if container is None else {"container": container}
        requests = [["POST", "/v1/computers", body | {"hostName": f"{name}.corp.example"}] for name in names]
        return json.loads(self.host.must("/usr/bin/python3", "-B", str(SOURCE / "tests/lab/cam_asker.py"), ADDRESS,
                                         str(service.port), given=json.dumps(requests)))

    def create(self, service, name, container=None):
        return self.create_all(service, [name], container)[0]

    def outcome(self, service, name, container=None):
        code, body = self.create(service, name, container)
        return code, body.get("status", 0)

    def ledger(self, service):
        program = ("import json, sqlite3, sys; database = sqlite3.connect(sys.argv[1], timeout=10); print(json.dumps("
                   "database.execute('SELECT computer, state FROM accounts ORDER BY computer, id').fetchall()))")
        rows = json.loads(service.must("/usr/bin/python3", "-c", program, f"{service.folder}/ledger.db"))
        return [tuple(row) for row in rows]

    def look_for_unused_ones(self, service):
        """Has the service look when two hours have gone by; returns the ledger when it has."""
        service.stop()
        service.start(ahead="2h")
        deadline = time.monotonic() + 60
        while '"unused account"' not in service.audit():
            assert time.monotonic() < deadline, "the service did not look at the account"
            time.sleep(0.2)
        return self.ledger(service)


class CamCreationTest(CamAccountsTest):

    def testTwentyHostsGetTwentyAccounts(self):
        service = self.service()
        names = [self.name(f"n{number}") for number in range(20)]
        answers = self.create_all(service, names)
        self.assertEqual([answer[0] for answer in answers], [201] * 20, answers)
        self.assertEqual([answer[1]["accountName"] for answer in answers], [f"{name.upper()}$" for name in names])
        self.assertEqual(len({answer[1]["joinBlob"] for answer in answers}), 20)
        self.assertEqual([self.directory.computer(name.upper())["dn"] for name in names],
                         [f"CN={name.upper()},{UNIT}" for name in names])
        self.assertEqual(self.ledger(service), sorted((name.upper(), "given") for name in names))

    def testOneNameAskedForByManyAtOnceIsGivenOnce(self):
        service = self.service()
        answers = self.create_all(service, [self.name("n1")] * 8)
        self.assertEqual(sorted(answer[0] for answer in answers), [201] + [409] * 7)

    def testPlaceOutsideTheDelegatedUnitIsRefused(self):
        service = self.service()
        name = self.name("n1")
        self.assertEqual(self.outcome(service, name, "CN=Computers"), (403, 5))
        self.assertIsNone(self.directory.computer(name.upper()))

    def testDefaultPlaceOfTheDirectoryIsRefusedToo(self):
        service = self.service(directory={"default-container": ""})
        name = self.name("n1")
        self.assertEqual(self.outcome(service, name), (403, 5))
        self.assertIsNone(self.directory.computer(name.upper()))

    def testUnknownContainerIsTold(self):
        self.assertEqual(self.outcome(self.service(), self.name("n1"), "OU=Nowhere"), (400, 267))

    def testContainerIsTakenInItsForms(self):
        service = self.service(directory={"default-container": ""})
        for number, form in enumerate((UNIT, "OU=Hosts,OU=Servers", "Servers/Hosts", "OU=Servers/OU=Hosts")):
            name = self.name(f"f{number}")
            with self.subTest(form=form):
                self.assertEqual(self.outcome(service, name, form), (201, 0))
                self.assertEqual(self.directory.computer(name.upper())["dn"], f"CN={name.upper()},{UNIT}")

    def testExistingAccountIsRefusedAndLeftAsItIs(self):
        service = self.service()
        name = self.name("n1")
        self.directory.create_computer(name.upper(), "elsewhere.corp.example")
        before = self.directory.computer(name.upper())
        self.assertEqual(self.outcome(service, name), (409, 2224))
        self.assertEqual(self.directory.computer(name.upper()), before)

    def testNameThatIsNotOnTheListIsRefused(self):
        service = self.service(access={"host-names": ["other*"]})
        name = self.name("n1")
        self.assertEqual(self.outcome(service, name), (403, 5))
        self.assertIsNone(self.directory.computer(name.upper()))

    def testWrongPasswordIsTriedOnce(self):
        service = self.service()
        service.write("password", "no-password-of-anybody")
        self.addCleanup(service.close)
        before = self.directory.refused_attempts("joiner")
        for number in range(3):
            self.assertEqual(self.outcome(service, self.name(f"n{number}")), (500, 1069))
        self.assertEqual(self.directory.refused_attempts("joiner") - before, 1)

    def testControllerThatDoesNotAnswerIsTold(self):
        service = self.service(directory={"controller": f"{NODE}.corp.example"})
        self.assertEqual(self.outcome(service, self.name("n1")), (502, 1311))


class CamUnusedAccountTest(CamAccountsTest):

    SETTINGS = {"remove-unused-after-hours": 1}

    def testAccountThatNobodyUsedIsRemoved(self):
        service = self.service(directory=self.SETTINGS)
        name = self.name("n1")
        self.assertEqual(self.outcome(service, name), (201, 0))
        self.assertEqual(self.look_for_unused_ones(service), [(name.upper(), "removed")])
        self.assertIsNone(self.directory.computer(name.upper()))

    def testAccountWhosePasswordWasChangedIsKept(self):
        service = self.service(directory=self.SETTINGS)
        name = self.name("n1")
        self.create(service, name)
        self.directory.reset_computer_password(name.upper())
        self.assertEqual(self.look_for_unused_ones(service), [(name.upper(), "kept")])
        self.assertIsNotNone(self.directory.computer(name.upper()))

    def testAccountThatHasLoggedOnIsKept(self):
        service = self.service(directory=self.SETTINGS)
        _, body = self.create(service, self.host.name)
        self.host.write("/etc/samba/smb.conf", SMB_CONF)
        self.host.write("/run/blob", body["joinBlob"])
        self.host.must("net", "offlinejoin", "requestodj", "loadfile=/run/blob")
        self.host.must("net", "ads", "testjoin", "-P")
        self.assertEqual(self.look_for_unused_ones(service), [(self.host.account, "kept")])
        self.host.must("net", "ads", "testjoin", "-P")

    def testServiceThatIsKilledInTheMiddleLeavesNothingForGood(self):
        service = self.service()
        service.stop()
        service.write("helper", SILENT_HELPER.replace("FOLDER", service.folder), "700")
        service.write("camd.conf", service.configuration(
            {"directory": self.SETTINGS | {"helper": f"{service.folder}/helper"}}))
        service.start()
        name = self.name("n1")
        body = json.dumps([["POST", "/v1/computers", {"hostName": f"{name}.corp.example"}]])
        self.host.must("sh", "-c", f'cat >/run/requests; /usr/bin/python3 -B {SOURCE}/tests/lab/cam_asker.py {ADDRESS} '
                       f"{service.port} </run/requests >/run/answers 2>&1 &", given=body)
        service.wait_for(f"test -e {service.folder}/made")
        service.stop(signal.SIGKILL)
        self.assertEqual(self.ledger(service), [(name.upper(), "requested")])
        self.assertIsNotNone(self.directory.computer(name.upper()))
        self.assertEqual(self.look_for_unused_ones(service), [(name.upper(), "removed")])
        self.assertIsNone(self.directory.computer(name.upper()))


class CamUnknownOutcomeTest(CamAccountsTest):
    """A request whose outcome nobody learnt, and an account of its name that is not what it left."""

    SETTINGS = {"remove-unused-after-hours": 1, "existing-accounts": "own-unused", "helper-timeout-seconds": 1}

    def interrupted(self, name):
        """A service that asked for the name in vain, and works from then on."""
        service = self.service()
        service.stop()
        service.write("helper", "#!/bin/sh\nexec sleep 100\n", "700")
        service.write("camd.conf", service.configuration(
            {"directory": self.SETTINGS | {"helper": f"{service.folder}/helper"}}))
        service.start()
        self.assertEqual(self.outcome(service, name), (504, 1460))
        service.stop()
        service.write("camd.conf", service.configuration(
            {"directory": self.SETTINGS | {"helper-timeout-seconds": 60}}))
        return service.start()

    def testAccountThatSomebodyElseMadeMeanwhileIsKept(self):
        name = self.name("n1")
        service = self.interrupted(name)
        self.directory.create_computer(name.upper(), f"{name}.corp.example", "OU=Hosts,OU=Servers")
        self.assertEqual(self.look_for_unused_ones(service), [(name.upper(), "kept")])
        self.assertIsNotNone(self.directory.computer(name.upper()))

    def testAccountThatSomebodyElseMadeMeanwhileIsNotTakenOver(self):
        name = self.name("n1")
        service = self.interrupted(name)
        self.directory.create_computer(name.upper(), f"{name}.corp.example", "OU=Hosts,OU=Servers")
        self.assertEqual(self.outcome(service, name), (409, 2224))

    def testAccountThatTheNextRequestGaveOutIsKeptWhenItHasLoggedOn(self):
        service = self.interrupted(self.host.name)
        code, body = self.create(service, self.host.name)
        self.assertEqual(code, 201, body)
        self.host.write("/etc/samba/smb.conf", SMB_CONF)
        self.host.write("/run/blob", body["joinBlob"])
        self.host.must("net", "offlinejoin", "requestodj", "loadfile=/run/blob")
        self.host.must("net", "ads", "testjoin", "-P")
        self.assertEqual(self.look_for_unused_ones(service),
                         [(self.host.account, "interrupted"), (self.host.account, "kept")])
        self.host.must("net", "ads", "testjoin", "-P")


class CamLostSightTest(CamAccountsTest):
    """An account that was made, so they say, and cannot be looked at."""

    def lost(self, name, provision):
        """A service with another program that makes accounts, which has been asked for one."""
        service = self.service()
        service.stop()
        service.write("provision", provision.replace("FOLDER", service.folder), "700")
        service.write("helper", HELPER_WITH_OTHER_PROVISION.replace("FOLDER", service.folder), "700")
        service.write("camd.conf", service.configuration(
            {"directory": {"helper": f"{service.folder}/helper", "remove-unused-after-hours": 1}}))
        service.start()
        self.assertEqual(self.outcome(service, name), (500, 1067))
        self.assertEqual(self.ledger(service), [(name.upper(), "interrupted")])
        return service

    def testAccountThatCannotBeReadIsRemovedInItsTime(self):
        name = self.name("n1")
        service = self.lost(name, CUTTING_PROVISION)
        self.assertIsNotNone(self.directory.computer(name.upper()))
        self.assertEqual(self.look_for_unused_ones(service), [(name.upper(), "removed")])
        self.assertIsNone(self.directory.computer(name.upper()))

    def testAccountThatIsNotThereIsLookedForLater(self):
        self.lost(self.name("n1"), LYING_PROVISION)


class CamTakeOverTest(CamAccountsTest):

    SETTINGS = {"existing-accounts": "own-unused"}

    def testOwnAccountThatNobodyUsedIsGivenOutAgain(self):
        service = self.service(directory=self.SETTINGS)
        name = self.name("n1")
        first = self.create(service, name)
        second = self.create(service, name)
        self.assertEqual((first[0], second[0]), (201, 201), second)
        self.assertNotEqual(first[1]["joinBlob"], second[1]["joinBlob"])
        self.assertEqual(self.ledger(service), [(name.upper(), "kept"), (name.upper(), "given")])

    def testOwnAccountThatIsInUseIsRefused(self):
        service = self.service(directory=self.SETTINGS)
        name = self.name("n1")
        self.create(service, name)
        self.directory.reset_computer_password(name.upper())
        self.assertEqual(self.outcome(service, name), (409, 2224))

    def testAccountOfAnotherIsRefused(self):
        service = self.service(directory=self.SETTINGS)
        name = self.name("n1")
        self.directory.create_computer(name.upper(), f"{name}.corp.example")
        self.assertEqual(self.outcome(service, name), (409, 2224))
