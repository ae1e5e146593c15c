"""What the tests against a real domain share: a lab, its hosts, and its directory seen from the controller.

A test takes a host for itself, which starts as new: nothing is installed but velmor, nothing is joined, and the
directory has no account of its name.
"""
import contextlib
import fcntl
import json
import os
import pathlib
import re
import subprocess
import time
import typing
import unittest

SOURCE = pathlib.Path(__file__).resolve().parent.parent.parent
ADMINISTRATOR_PASSWORD = "Adm1n-Passw0rd"
USER_PASSWORD = "Us3r-Passw0rd"
RECORD = "/var/lib/quenix/samba/attempts.log"


class Lab:
    """The lab whose state folder VELMOR_LAB_DIR names. All of its commands inherit that name."""

    def __init__(self):
        self.folder = pathlib.Path(os.environ["VELMOR_LAB_DIR"])

    def command(self, name, *arguments, **options):
        return subprocess.run([SOURCE / "lab" / name, *arguments], check=True, **options)

    def enter(self, node, *command, given="", limit=150):
        """Runs a command in a node. Returns its exit status, output and error output."""
        return subprocess.run([SOURCE / "lab/enter", node, "timeout", str(limit), *command], input=given, text=True,
                              capture_output=True, check=False)

    @contextlib.contextmanager
    def free_host(self):
        """Takes a host that no other test uses at this moment, made new."""
        names = sorted(file.name for file in (self.folder / "nodes").glob("host?"))
        while True:
            for name in names:
                with open(self.folder / f"{name}.busy", "w", encoding="ascii") as busy:
                    try:
                        fcntl.flock(busy, fcntl.LOCK_EX | fcntl.LOCK_NB)
                    except BlockingIOError:
                        continue
                    host = Host(self, name)
                    host.make_new()
                    yield host
                    return
            time.sleep(0.1)


class Answer(typing.NamedTuple):
    """What a store answered, and after how many seconds."""
    seconds: float
    text: str


class Questioner:
    """A process on a host that holds a store with a time-out of its own; see store_questioner.cc."""

    def __init__(self, host, timeout_seconds):
        self.process = subprocess.Popen(
            [SOURCE / "lab/enter", host.name, os.environ["VELMOR_QUESTIONER"], str(timeout_seconds)],
            stdin=subprocess.PIPE, stdout=subprocess.PIPE, text=True, bufsize=1)

    def ask(self, question):
        self.process.stdin.write(question + "\n")
        milliseconds, _, text = self.process.stdout.readline().rstrip("\n").partition(" ")
        return Answer(int(milliseconds) / 1000, text)

    def ask_until(self, question, text, limit):
        """Repeats a question until the answer is this one; returns how many seconds that took."""
        start = time.monotonic()
        while (answer := self.ask(question)).text != text:
            assert time.monotonic() - start < limit, f"{question}: still {answer} after {limit} s"
            time.sleep(0.2)
        return time.monotonic() - start

    def __enter__(self):
        return self

    def __exit__(self, *_):
        self.process.stdin.close()
        self.process.wait(timeout=90)
        self.process.stdout.close()


class Host:
    """A host of the lab."""

    def __init__(self, lab, name):
        self.lab = lab
        self.name = name
        self.full_name = f"{name}.corp.example"
        self.account = name.upper()

    def make_new(self):
        Directory(self.lab).delete_computer(self.account)
        self.lab.command("remove", self.name)
        self.lab.command("add", self.name)

    def run(self, *command, given="", limit=150):
        return self.lab.enter(self.name, *command, given=given, limit=limit)

    def must(self, *command, given=""):
        """Runs a command that has to succeed; returns its output."""
        done = self.run(*command, given=given)
        assert done.returncode == 0, f"{command} ended with {done.returncode}: {done.stdout}{done.stderr}"
        return done.stdout

    def velmorctl(self, *arguments, password=None, limit=150):
        """Runs velmorctl; a password goes to it through a descriptor."""
        extra = [] if password is None else ["--password-fd", "0"]
        return self.run("velmorctl", *arguments, *extra, given=password or "", limit=limit)

    def questioner(self, timeout_seconds):
        return Questioner(self, timeout_seconds)

    def join(self, domain="corp.example", user="Administrator", password=ADMINISTRATOR_PASSWORD):
        return self.velmorctl("join", domain, "-U", user, password=password)

    def must_join(self, domain="corp.example"):
        done = self.join(domain)
        assert done.returncode == 0, f"the join ended with {done.returncode}: {done.stdout}{done.stderr}"

    def status(self):
        """What `velmorctl status --json` says, and its exit status."""
        done = self.velmorctl("status", "--json")
        return json.loads(done.stdout), done.returncode

    def statuses(self):
        """The provider's outcome of each operation so far, from its record."""
        lines = self.run("cat", RECORD).stdout.splitlines()
        records = [json.loads(line) for line in lines]
        return [record["status"] for record in records if record["step"] == "result"]

    def write(self, path, text):
        self.must("dd", f"of={path}", "status=none", given=text)

    def read(self, path):
        return self.must("cat", path)

    def has(self, path):
        return self.run("test", "-e", path).returncode == 0

    def files(self):
        """Path, mode, owner and content of each file that a join might touch."""
        listing = self.must("sh", "-c", "find /etc /var/lib/samba /var/lib/quenix /run/samba -type f "
                            "-printf '%p %m %u:%g ' -exec sha256sum '{}' ';' | sort")
        return {line.split(" ", 1)[0]: line for line in listing.splitlines()}

    def changes_since(self, before):
        """The files that are not as they were in `before`, but for the provider's record, Samba's databases and
        what winbindd has in /run."""
        after = self.files()
        changed = {path for path in before.keys() | after.keys() if before.get(path) != after.get(path)}
        expected = re.compile(r"/var/lib/quenix/samba/(attempts\.log|lock)|/var/lib/samba/.*\.tdb|/run/samba/.*")
        return {path for path in changed if not expected.fullmatch(path)}


class Directory:
    """CORP.EXAMPLE as one of its controllers sees it, past all network protocols."""

    def __init__(self, lab, controller="dc1"):
        self.lab = lab
        self.controller = controller

    def _ask(self, *arguments):
        done = self.lab.enter(self.controller, "/usr/bin/python3", "-B", SOURCE / "tests/lab/directory_tool.py",
                              *arguments)
        assert done.returncode == 0, f"{arguments}: {done.stderr}"
        return json.loads(done.stdout)

    def computer(self, name):
        """The attributes of a computer account, or None."""
        return self._ask("computer", name)

    def delete_computer(self, name):
        self._ask("delete-computer", name)

    def disable_computer(self, name):
        self._ask("disable-computer", name)

    def reset_computer_password(self, name):
        self._ask("reset-computer-password", name)

    def set_computer_dns_name(self, name, dns_name):
        self._ask("set-computer-dns-name", name, dns_name)

    def create_computer(self, name, dns_name, *unit):
        """Makes an account; `unit` is where, without the domain's part, if not in the default place."""
        self._ask("create-computer", name, dns_name, *unit)

    def make_controllers_account(self, name):
        self._ask("make-controllers-account", name)

    def bad_password_count(self, user):
        return self._ask("bad-password-count", user)

    def refused_attempts(self, user):
        """How many log-ons as this user the controller has refused since it was started."""
        log = self.lab.enter(self.controller, "cat", "/var/log/samba/log.samba").stdout
        refused = 0
        for line in log.splitlines():
            text = line.strip()
            if text.startswith('{"timestamp"') and '"type": "Authentication"' in text:
                event = json.loads(text)["Authentication"]
                name = (event["clientAccount"] or "").split("@")[0]
                refused += name.lower() == user.lower() and event["status"] != "NT_STATUS_OK"
        return refused


class LabTest(unittest.TestCase):
    """A test that has a new host for itself."""

    def setUp(self):
        self.lab = Lab()
        self.directory = Directory(self.lab)
        self.host = self.enterContext(self.lab.free_host())

    def assert_exit(self, done, status):
        self.assertEqual(done.returncode, status, f"{done.stdout}{done.stderr}")
