"""Joining a real domain."""
import json

from lab import ADMINISTRATOR_PASSWORD, RECORD, SOURCE, USER_PASSWORD, LabTest

UNIT = "OU=Hosts,OU=Servers,DC=corp,DC=example"


class JoinTest(LabTest):

    def testGoodPasswordMakesTheHostAMember(self):
        self.assert_exit(self.host.join(), 0)
        # winbindd's own client says so too.
        self.host.must("wbinfo", "--check-secret")

    def testAccountInTheDirectoryHasTheHostsFullName(self):
        self.host.must_join()
        self.assertEqual(self.directory.computer(self.host.account)["dNSHostName"].lower(), self.host.full_name)

    def testAccountIsMadeInTheDefaultPlaceWithoutAUnit(self):
        self.host.must_join()
        self.assertEqual(self.directory.computer(self.host.account)["dn"],
                         f"CN={self.host.account},CN=Computers,DC=corp,DC=example")

    def testJoinMakesTheStoreActive(self):
        self.host.must_join()
        self.assertRegex(self.host.read("/etc/quenix/velmor/authentication.conf"),
                         r'remote-authentication-store *= *"Active Directory"')

    def testHostsKeytabOpensTheDirectory(self):
        self.host.must_join()
        self.host.must("kinit", "-k", f"{self.host.account}$@CORP.EXAMPLE")

    def testUserOfTheTrustedDomainIsKnownAfterwards(self):
        self.host.must_join()
        self.assertIn("S-1-5-21-", self.host.must("wbinfo", "--name-to-sid", r"OTHER\alice"))

    def testManagementAddressIsEnteredIntoTheHostsFile(self):
        self.host.must_join()
        entries = [line.split() for line in self.host.read("/etc/hosts").splitlines()
                   if line.startswith("10.99.0.3")]
        self.assertEqual([entry[1:] for entry in entries], [[self.host.full_name, self.host.name]])

    def testUserIsTakenInAllItsForms(self):
        for user in ("Administrator", r"CORP\Administrator", "Administrator@CORP.EXAMPLE"):
            with self.subTest(user=user):
                self.host.make_new()
                self.assert_exit(self.host.join(user=user), 0)

    def testDelegatedAccountJoinsIntoItsUnit(self):
        self.assert_exit(self.host.join("corp.example/Servers/Hosts", "joiner", USER_PASSWORD), 0)
        self.assertEqual(self.directory.computer(self.host.account)["dn"], f"CN={self.host.account},{UNIT}")

    def testNoPasswordIsLeftOnTheHost(self):
        self.host.must_join()
        found = self.host.run("grep", "-rlF", ADMINISTRATOR_PASSWORD, "/etc", "/var/lib", "/var/log", "/run", "/tmp")
        # The lab's own description may lie below /tmp, and it names the password.
        left = [path for path in found.stdout.splitlines() if not path.startswith(f"{SOURCE}/")]
        self.assertEqual(left, [])

    def testProgressIsToldWithTheProvidersRecord(self):
        done = self.host.join()
        self.assert_exit(done, 0)
        self.assertRegex(done.stderr, r"(?m)^\[ *\d+\.\d s\] samba: keytab: made /etc/krb5\.keytab$")

    def testStepsAreRecordedUpToTheResult(self):
        self.host.must_join()
        records = [json.loads(line) for line in self.host.read(RECORD).splitlines()]
        self.assertEqual((records[-1]["step"], records[-1]["status"]), ("result", 0))


class UnitTest(LabTest):
    """The organizational unit, in each way that it may be written."""

    def assert_joined_into_unit(self, domain):
        self.host.must_join(domain)
        self.assertEqual(self.directory.computer(self.host.account)["dn"], f"CN={self.host.account},{UNIT}")

    def testUnitIsTakenAsAFullName(self):
        self.assert_joined_into_unit(f"corp.example/{UNIT}")

    def testUnitIsTakenAsAPath(self):
        self.assert_joined_into_unit("corp.example/Servers/Hosts")

    def testUnitIsTakenAsAPathWithItsType(self):
        self.assert_joined_into_unit("corp.example/OU=Servers/OU=Hosts")

    def testUnknownUnitIsToldFromMissingRights(self):
        self.host.join("corp.example/Nowhere")
        self.host.join("corp.example/Servers", "alice", USER_PASSWORD)
        self.assertEqual(self.host.statuses(), [267, 5])

    def testUnknownUnitLeavesNoAccount(self):
        self.assertNotEqual(self.host.join("corp.example/Nowhere").returncode, 0)
        self.assertIsNone(self.directory.computer(self.host.account))


class ConflictTest(LabTest):

    def testSecondJoinIsRefused(self):
        self.host.must_join()
        self.assert_exit(self.host.join(), 10)

    def testRefusedSecondJoinLeavesTheFirstHealthy(self):
        self.host.must_join()
        self.host.join()
        self.host.must("wbinfo", "--check-secret")

    def testAccountOfAnotherHostIsRefused(self):
        self.directory.create_computer(self.host.account, "elsewhere.corp.example")
        self.assert_exit(self.host.join(), 10)
        self.assertEqual(self.host.statuses(), [2224])

    def testAccountOfAnotherHostIsLeftAsItIs(self):
        self.directory.create_computer(self.host.account, "elsewhere.corp.example")
        before = self.directory.computer(self.host.account)
        self.host.join()
        self.assertEqual(self.directory.computer(self.host.account), before)

    def testAccountOfAnotherHostIsTakenWhenTheSettingsSaySo(self):
        self.directory.create_computer(self.host.account, "elsewhere.corp.example")
        self.host.write("/etc/quenix/velmor/samba.conf", 'reuse-account = "yes"\n')
        self.assert_exit(self.host.join(), 0)

    def testAccountOfAControllerIsRefusedThoughItHasTheHostsName(self):
        self.directory.create_computer(self.host.account, self.host.full_name)
        self.directory.make_controllers_account(self.host.account)
        self.host.write("/etc/quenix/velmor/samba.conf", 'reuse-account = "yes"\n')
        self.assert_exit(self.host.join(), 10)
        self.assertEqual(self.host.statuses(), [2224])

    def testOwnAccountIsTakenAgain(self):
        self.host.must_join()
        self.host.lab.command("remove", self.host.name)
        self.host.lab.command("add", self.host.name)
        self.assert_exit(self.host.join(), 0)

    def testForeignSambaConfigurationIsNotOverwritten(self):
        own = "[global]\n\tworkgroup = FILES\n[data]\n\tpath = /srv\n"
        self.host.write("/etc/samba/smb.conf", own)
        self.assertNotEqual(self.host.join().returncode, 0)
        self.assertEqual((self.host.statuses(), self.host.read("/etc/samba/smb.conf")), ([1064], own))

    def testTwoJoinsAtOnceGiveOneMember(self):
        both = "for _ in 1 2; do velmorctl join corp.example -U Administrator --password-file /run/home/p " \
               ">/dev/null 2>&1 & done; wait -n; echo $?; wait -n; echo $?"
        self.host.must("sh", "-c", "umask 077; cat >/run/home/p", given=ADMINISTRATOR_PASSWORD)
        self.assertEqual(sorted(self.host.must("bash", "-c", both).split()), ["0", "10"])


class FailedJoinTest(LabTest):
    """Reasons to fail that are no matter of the password."""

    def testUnknownDomainIsNotReachable(self):
        self.assert_exit(self.host.join("nowhere.example"), 8)
        self.assertEqual(self.host.statuses(), [1355])

    def testNameOverFifteenCharactersIsRefused(self):
        name = "a-very-long-host-name"
        self.host.must("hostname", name)
        self.host.write("/etc/hosts", f"127.0.0.1 localhost\n127.0.1.1 {name}.corp.example {name}\n")
        self.assert_exit(self.host.join(), 7)
        self.assertEqual(self.host.statuses(), [1210])

    def testClockThatIsHoursAwayIsRefused(self):
        folder = "/usr/libexec/velmor"
        for program in ("velmor-samba-helper", "velmor-samba-precheck"):
            self.host.must("mv", f"{folder}/{program}", f"{folder}/{program}.real")
            self.host.write(f"{folder}/{program}", f'#!/bin/sh\nexec faketime -f +2h "{folder}/{program}.real" "$@"\n')
            self.host.must("chmod", "755", f"{folder}/{program}")
        self.assert_exit(self.host.join(), 7)
        self.assertEqual(self.host.statuses(), [1398])

    def testFilesAreAsBeforeWhenTheUnitIsUnknown(self):
        self.assert_nothing_left(lambda: self.host.join("corp.example/Nowhere"))

    def testFilesAreAsBeforeWhenTheServiceDoesNotStart(self):
        self.host.must("cp", "/bin/false", "/usr/sbin/winbindd")
        self.assert_nothing_left(self.host.join)

    def testAccountIsRemovedWhenTheServiceDoesNotStart(self):
        self.host.must("cp", "/bin/false", "/usr/sbin/winbindd")
        self.assertNotEqual(self.host.join().returncode, 0)
        self.assertIsNone(self.directory.computer(self.host.account))

    def assert_nothing_left(self, join):
        # A first refusal makes the files that a host keeps from then on: the record, locks, empty databases.
        self.host.join("nowhere.example")
        before = self.host.files()
        self.assertNotEqual(join().returncode, 0)
        self.assertEqual(self.host.changes_since(before), set())
        self.assertNotEqual(self.host.run("wbinfo", "--check-secret").returncode, 0)
