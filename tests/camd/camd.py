"""What the tests of velmor-camd share: the service with settings of its own, a helper that stands for the
directory, and clients that behave well or badly."""
import base64
import concurrent.futures
import http.client
import json
import os
import pathlib
import signal
import socket
import sqlite3
import ssl
import subprocess
import tempfile
import time
import typing
import unittest

SOURCE = pathlib.Path(__file__).resolve().parent
SERVICE = os.environ["VELMOR_CAMD"]
PASSWORD = "Directory-Passw0rd-of-the-service"
PORT = 8443
DOMAIN = "/v1/domain"
COMPUTERS = "/v1/computers"

SETTINGS = {
    "server": {"certificate-file": "{folder}/camd.pem", "key-file": "{folder}/camd.key",
               "ledger-file": "{folder}/ledger.db", "audit-file": "{folder}/audit.log",
               "listen-address": "127.0.0.1", "connections-per-client": 0},
    "directory": {"domain": "corp.example", "user": "camsvc", "password-file": "{folder}/password",
                  "helper": "{folder}/helper"},
    "access": {"host-names": ["*.corp.example"], "client-addresses": ["127.0.0.0/8"], "requests-per-minute": 0,
               "accounts-per-day": 0},
}


class Answer(typing.NamedTuple):
    code: int
    body: dict
    headers: dict

    @property
    def outcome(self):
        """The HTTP status, and the system error number that the body gives."""
        return self.code, self.body.get("status", 0)


def tls(version=None, **limits):
    """A client's settings; it takes any certificate, and with `version` speaks that one only."""
    context = ssl.SSLContext(ssl.PROTOCOL_TLS_CLIENT)
    context.check_hostname = False
    context.verify_mode = ssl.CERT_NONE
    if version is not None:
        context.set_ciphers("DEFAULT:@SECLEVEL=0")
        context.minimum_version = context.maximum_version = version
    return context


def connect(source="127.0.0.1", context=None):
    """An open TLS connection."""
    plain = socket.create_connection(("127.0.0.1", PORT), timeout=60, source_address=(source, 0))
    return (context or tls()).wrap_socket(plain)


def is_closed(connection, limit=20):
    """Whether the other side ends the connection within the limit."""
    connection.settimeout(limit)
    try:
        while connection.recv(65536):
            pass
        return True
    except TimeoutError:
        return False
    except OSError:
        return True


def status_of_next(connection):
    """Reads one answer of an open connection; returns its HTTP status, or None when there is none."""
    connection.settimeout(20)
    answer = http.client.HTTPResponse(connection)
    try:
        answer.begin()
    except http.client.BadStatusLine:
        return None
    answer.read()
    return answer.status


def raw(text, limit=20):
    """Sends bytes as they are; returns what comes back until the end of the connection."""
    with connect() as connection:
        connection.settimeout(limit)
        answer = b""
        try:
            connection.sendall(text)
            while part := connection.recv(65536):
                answer += part
        except TimeoutError:
            raise
        except OSError:
            pass
        return answer


class Service:
    """velmor-camd in a new folder, with a scripted helper beside it."""

    def __init__(self, **changes):
        self._temporary = tempfile.TemporaryDirectory()
        self.folder = pathlib.Path(self._temporary.name)
        self.process = None
        self.configuration = self.folder / "camd.conf"
        self.configure(**changes)
        self.write("password", PASSWORD + "\n", 0o600)
        self.write("helper", (SOURCE / "scripted_helper.py").read_text(encoding="utf-8"), 0o755)
        subprocess.run(["openssl", "req", "-x509", "-newkey", "ec", "-pkeyopt", "ec_paramgen_curve:prime256v1", "-nodes",
                        "-keyout", self.folder / "camd.key", "-out", self.folder / "camd.pem", "-days", "2", "-subj",
                        "/CN=camd"], check=True, capture_output=True)

    def write(self, name, text, mode=0o644):
        path = self.folder / name
        path.write_text(text, encoding="utf-8")
        path.chmod(mode)

    def configure(self, **changes):
        """Writes the configuration: the usual one with other sections' keys changed."""
        lines = []
        for section, values in SETTINGS.items():
            lines.append(f"[{section}]")
            for key, value in (values | changes.get(section, {})).items():
                lines.append(f"{key} = {json.dumps(value)}".replace("{folder}", str(self.folder)))
        self.write("camd.conf", "\n".join(lines) + "\n")

    def behave(self, **behaviour):
        """Tells the helper how to behave; see scripted_helper.py."""
        temporary = self.folder / "behaviour.new"
        temporary.write_text(json.dumps(behaviour), encoding="utf-8")
        temporary.rename(self.folder / "behaviour")

    def start(self, **variables):
        """Starts the service; `variables` are added to its environment."""
        environment = {"PATH": "/usr/bin:/bin", "ASAN_OPTIONS": "quarantine_size_mb=1",
                       "TSAN_OPTIONS": os.environ.get("TSAN_OPTIONS", "")} | variables
        self.process = subprocess.Popen([SERVICE, "--config", self.configuration], env=environment,
                                        stdin=subprocess.DEVNULL, stderr=subprocess.PIPE, text=True)
        while True:
            try:
                socket.create_connection(("127.0.0.1", PORT), timeout=20).close()
                return self
            except ConnectionRefusedError:
                if self.process.poll() is not None:
                    raise AssertionError(f"the service ended: {self.process.stderr.read()}") from None
                time.sleep(0.02)

    def stop(self):
        """Ends the service as an administrator does; returns its exit status."""
        self.process.send_signal(signal.SIGTERM)
        return self.wait()

    def wait(self):
        status = self.process.wait(timeout=40)
        self.process.stderr.close()
        self.process = None
        return status

    def kill(self):
        self.process.kill()
        self.wait()

    def close(self):
        if self.process is not None:
            self.kill()
        self._temporary.cleanup()

    def command(self, *arguments, **variables):
        return subprocess.run([SERVICE, "--config", self.configuration, *arguments], capture_output=True, text=True,
                              check=False, env=os.environ | variables)

    def token(self, *options):
        done = self.command("token", "add", *options)
        assert done.returncode == 0, done.stderr
        return done.stdout.strip()

    def ask(self, method, path, body=None, source="127.0.0.1", token=None, address="127.0.0.1"):
        connection = http.client.HTTPSConnection(address, PORT, timeout=40, context=tls(),
                                                 source_address=(source, 0))
        headers = {} if token is None else {"Authorization": f"Bearer {token}"}
        connection.request(method, path, body, headers)
        answer = connection.getresponse()
        text = answer.read()
        connection.close()
        return Answer(answer.status, json.loads(text), dict(answer.getheaders()))

    def domain(self, **options):
        return self.ask("GET", DOMAIN, **options)

    def create(self, name="host2.corp.example", container=None, **options):
        body = {"hostName": name} | ({} if container is None else {"container": container})
        return self.ask("POST", COMPUTERS, json.dumps(body), **options)

    def create_all(self, names):
        """Asks for all at once; returns the answers in the same order."""
        with concurrent.futures.ThreadPoolExecutor(len(names)) as pool:
            return list(pool.map(self.create, names))

    def later(self, call, *arguments, **options):
        """Starts a call on a thread of its own; `.result()` waits for it."""
        pool = concurrent.futures.ThreadPoolExecutor(1)
        future = pool.submit(call, *arguments, **options)
        pool.shutdown(wait=False)
        return future

    def read(self, name):
        path = self.folder / name
        return path.read_text(encoding="utf-8") if path.exists() else ""

    def audit(self):
        return [json.loads(line) for line in self.read("audit.log").splitlines()]

    def helper_requests(self, operation=None):
        requests = [json.loads(line) for line in self.read("helper.log").splitlines()]
        return [request for request in requests if operation in (None, request["operation"])]

    def ledger(self, columns="computer, state"):
        with sqlite3.connect(self.folder / "ledger.db") as database:
            return database.execute(f"SELECT {columns} FROM accounts ORDER BY id").fetchall()

    def change_ledger(self, statement):
        with sqlite3.connect(self.folder / "ledger.db") as database:
            database.execute(statement)

    def memory(self):
        """Resident memory in kilobytes."""
        for line in pathlib.Path(f"/proc/{self.process.pid}/status").read_text(encoding="ascii").splitlines():
            if line.startswith("VmRSS:"):
                return int(line.split()[1])
        raise AssertionError("the process has no memory")

    def memory_holds(self, text):
        """Whether these bytes are anywhere in the process's memory."""
        maps = pathlib.Path(f"/proc/{self.process.pid}/maps").read_text(encoding="utf-8").splitlines()
        with open(f"/proc/{self.process.pid}/mem", "rb", buffering=0) as memory:
            for line in maps:
                span, rights = line.split()[:2]
                if not rights.startswith("rw"):
                    continue
                begin, end = (int(part, 16) for part in span.split("-"))
                memory.seek(begin)
                try:
                    if text in memory.read(end - begin):
                        return True
                except OSError:
                    continue
        return False


def blob_of(computer):
    """The text for the join that the scripted helper gives."""
    return base64.b64encode(f"the machine password of {computer} ".encode() * 60).decode()


def wait_until(condition, limit=20):
    deadline = time.monotonic() + limit
    while not condition():
        assert time.monotonic() < deadline, "it did not come about in time"
        time.sleep(0.02)


class ServiceTest(unittest.TestCase):
    """A test with a service of its own; CHANGES are made to the usual settings."""

    CHANGES: dict = {}

    def setUp(self):
        self.service = Service(**self.CHANGES)
        self.addCleanup(self.service.close)
        self.service.start()
