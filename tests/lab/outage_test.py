"""What a member notices of a controller that does not answer.

An outage costs minutes of waiting, so each class makes one outage, notes what happens in it, and its tests look
at the notes. This lab has no other tests beside it.
"""
import concurrent.futures
import time

from lab import ADMINISTRATOR_PASSWORD, Directory, Host, Lab, unittest

HEALTHY, TIMED_OUT, NO_CONTROLLER = "1", "2", "5"
STORE_TIMEOUT = 3
# How much later than its time-out an answer may come on a machine that is busy with other things.
LATE = 4


def timed(call):
    start = time.monotonic()
    return call(), time.monotonic() - start


class Outage(unittest.TestCase):
    """Makes host1 a member and host2 not, and brings the controller back whatever happens."""

    @classmethod
    def setUpClass(cls):
        cls.lab = Lab()
        cls.directory = Directory(cls.lab)
        cls.member, cls.stranger = Host(cls.lab, "host1"), Host(cls.lab, "host2")
        for host in (cls.member, cls.stranger):
            host.make_new()
        cls.member.must_join()
        cls.note_outage()

    def assert_exit(self, done, status):
        self.assertEqual(done.returncode, status, f"{done.stdout}{done.stderr}")


class FrozenControllerTest(Outage):
    """Every process of the controller is stopped: connections stay open, and nothing is answered."""

    @classmethod
    def note_outage(cls):
        with cls.member.questioner(STORE_TIMEOUT) as store:
            store.ask_until("trust-state", HEALTHY, 120)
            cls.domains_before = store.ask("trusted-domains")
            cls.state_before = store.ask("trust-state")
            cls.lab.command("freeze", "dc1")
            try:
                with concurrent.futures.ThreadPoolExecutor() as others:
                    join = others.submit(timed, cls.stranger.join)
                    status = others.submit(timed, lambda: cls.member.velmorctl("status"))
                    cls.domains_in_outage = store.ask("trusted-domains")
                    cls.state_in_outage = store.ask("trust-state")
                    # winbindd knows the trusted domains by heart; only its own silence makes them late.
                    cls.member.must("pkill", "-STOP", "-x", "winbindd")
                    cls.domains_in_silence = store.ask("trusted-domains")
                    cls.member.must("pkill", "-CONT", "-x", "winbindd")
                    cls.join, cls.join_seconds = join.result()
                    cls.status, cls.status_seconds = status.result()
            finally:
                cls.lab.command("thaw", "dc1")
            cls.seconds_to_recover = store.ask_until("trust-state", HEALTHY, 120)
            cls.domains_after = store.ask("trusted-domains")
        cls.log = cls.member.read("/var/log/syslog")

    def testAnswersComeFromTheDirectoryBefore(self):
        self.assertEqual((self.state_before.text, self.domains_before.text), (HEALTHY, "other.example"))

    def testTrustedDomainsAreAnsweredInTime(self):
        self.assertEqual(self.domains_in_outage.text, "other.example")
        self.assertLess(self.domains_in_outage.seconds, STORE_TIMEOUT + LATE)

    def testTrustedDomainsAreAnsweredFromTheCacheWhenNothingElseAnswers(self):
        self.assertEqual(self.domains_in_silence.text, "other.example")
        self.assertGreaterEqual(self.domains_in_silence.seconds, STORE_TIMEOUT)
        self.assertLess(self.domains_in_silence.seconds, STORE_TIMEOUT + LATE)
        self.assertIn("GetTrustedDomains call timedout. Returning cached value.", self.log)

    def testTrustStateSaysInTimeThatItIsLate(self):
        self.assertEqual(self.state_in_outage.text, TIMED_OUT)
        # Asks for the trusted domains first, with a wait of their own.
        self.assertLess(self.state_in_outage.seconds, 2 * STORE_TIMEOUT + LATE)

    def testTrustIsHealthyAgainWhenTheControllerGoesOn(self):
        self.assertLess(self.seconds_to_recover, 120)

    def testTrustedDomainsComeFromTheDirectoryAgain(self):
        self.assertEqual(self.domains_after.text, "other.example")
        self.assertLess(self.domains_after.seconds, STORE_TIMEOUT)

    def testJoinEndsAndSaysThatNoControllerAnswers(self):
        self.assert_exit(self.join, 8)
        self.assertEqual(self.stranger.statuses(), [1311])

    def testJoinThatFoundNoControllerLeavesNoAccount(self):
        self.assertIsNone(self.directory.computer(self.stranger.account))

    def testStatusDoesNotHang(self):
        self.assertNotEqual(self.status.returncode, 0)
        self.assertLess(self.status_seconds, 130)


class UnpluggedControllerTest(Outage):
    """The controller's network is gone, and comes back."""

    @classmethod
    def note_outage(cls):
        cls.stranger.must_join()
        with cls.member.questioner(60) as store:
            store.ask_until("trust-state", HEALTHY, 120)
            cls.state_before = store.ask("trust-state")
            cls.lab.command("link", "dc1", "down")
            try:
                with concurrent.futures.ThreadPoolExecutor() as others:
                    state = others.submit(store.ask, "trust-state")
                    cls.leave = cls.stranger.velmorctl("leave")
                    cls.status_after_leave = cls.stranger.velmorctl("status")
                    cls.state_in_outage = state.result()
                # A winbindd that is started now has nobody to ask which domains are trusted.
                cls.member.must("sh", "-c", "kill $(cat /run/samba/winbindd.pid); while pgrep -x winbindd; "
                                "do sleep 0.1; done; exec winbindd -D </dev/null >/dev/null 2>&1")
                cls.list_in_outage = cls.member.velmorctl("trust", "list")
                cls.relationship_in_outage = cls.member.velmorctl("trust", "show", "other.example")
            finally:
                cls.lab.command("link", "dc1", "up")
            cls.seconds_to_recover = store.ask_until("trust-state", HEALTHY, 120)

    def testTrustStateSaysMeanwhileThatNoControllerAnswers(self):
        self.assertEqual((self.state_before.text, self.state_in_outage.text), (HEALTHY, NO_CONTROLLER))

    def testUnknownTrustedDomainsAreNotCalledNone(self):
        self.assert_exit(self.list_in_outage, 8)
        self.assertIn("status:   1311", self.list_in_outage.stderr)

    def testUnknownRelationshipIsNotCalledNone(self):
        self.assertEqual(self.relationship_in_outage.stdout, "unknown\n")

    def testTrustIsHealthyAgainAfterwards(self):
        self.assertLess(self.seconds_to_recover, 120)

    def testLeaveWithoutCredentialsNeedsNoController(self):
        self.assert_exit(self.leave, 0)
        self.assert_exit(self.status_after_leave, 3)


class StoppedControllerTest(Outage):
    """The controller of another domain cannot be reached, while DNS still knows it."""

    @classmethod
    def note_outage(cls):
        # dc1 forwards nothing about other.example while its own controller is away, so its records are served
        # by the name server of the lab instead; only then do "unknown" and "silent" look different.
        cls.member.write("/etc/resolv.conf", "nameserver 10.99.0.31\n")
        cls.member.must("sh", "-c", "exec dnsmasq --conf-file=/dev/null --no-resolv --no-hosts --user=root "
                        "--pid-file=/run/dnsmasq.pid --listen-address=10.99.0.31 --bind-interfaces "
                        "--srv-host=_ldap._tcp.other.example,dc2.other.example,389 "
                        "--srv-host=_ldap._tcp.dc._msdcs.other.example,dc2.other.example,389 "
                        "--srv-host=_kerberos._tcp.other.example,dc2.other.example,88 "
                        "--srv-host=_kerberos._udp.other.example,dc2.other.example,88 "
                        "--host-record=dc2.other.example,10.99.0.20 --cache-size=0 </dev/null >/dev/null 2>&1")
        cls.member.velmorctl("leave")
        cls.lab.command("link", "dc2", "down")
        try:
            cls.silent, cls.silent_seconds = timed(lambda: cls.member.join("other.example"))
            cls.unknown = cls.member.velmorctl("join", "nowhere.example", "-U", "Administrator",
                                               password=ADMINISTRATOR_PASSWORD)
        finally:
            cls.lab.command("link", "dc2", "up")

    def testSilentAndUnknownDomainAreToldApart(self):
        self.assertEqual(self.member.statuses()[-2:], [1311, 1355])

    def testBothAreNotReachable(self):
        self.assert_exit(self.silent, 8)
        self.assert_exit(self.unknown, 8)

    def testSilentDomainDoesNotHangTheJoin(self):
        self.assertLess(self.silent_seconds, 130)
