"""The CAM service on a server of the lab, as its administrator would set it up."""
import json
import signal
import time

from lab import USER_PASSWORD

NODE = "server1"
ADDRESS = "10.99.0.41"
UNIT = "OU=Hosts,OU=Servers,DC=corp,DC=example"
# The service needs no privilege and must not have any.
NOBODY = "65534"


class CamService:
    """One velmor-camd on server1, in a folder and on a port of its own, so that several tests have one each. Its
    account in the directory may create computers below OU=Servers only."""

    def __init__(self, lab, host, **changes):
        self.lab = lab
        self.folder = f"/run/camd-{host.name}"
        self.port = 8440 + int(host.name.removeprefix("host"))
        self.process = None
        self.must("rm", "-rf", self.folder)
        self.must("install", "-d", "-o", NOBODY, "-m", "700", self.folder)
        self.write("password", USER_PASSWORD)
        self.write("camd.conf", self.configuration(changes))
        self.make_certificate()

    def must(self, *command, given=""):
        done = self.lab.enter(NODE, *command, given=given)
        assert done.returncode == 0, f"{command} ended with {done.returncode}: {done.stdout}{done.stderr}"
        return done.stdout

    def write(self, name, text, mode="600"):
        path = f"{self.folder}/{name}"
        self.must("dd", f"of={path}", "status=none", given=text)
        self.must("chmod", mode, path)
        self.must("chown", NOBODY, path)

    def configuration(self, changes):
        sections = {
            "server": {"port": self.port, "certificate-file": f"{self.folder}/camd.pem",
                       "key-file": f"{self.folder}/camd.key", "ledger-file": f"{self.folder}/ledger.db",
                       "audit-file": f"{self.folder}/audit.log"},
            "directory": {"domain": "corp.example", "user": "joiner", "password-file": f"{self.folder}/password",
                          "default-container": UNIT},
            "access": {"host-names": ["host*.corp.example"], "client-addresses": ["10.99.0.0/24"]},
        }
        lines = []
        for section, values in sections.items():
            lines.append(f"[{section}]")
            lines += [f"{key} = {json.dumps(value)}" for key, value in (values | changes.get(section, {})).items()]
        return "\n".join(lines) + "\n"

    def make_certificate(self, *clock):
        """A new key and certificate, valid for two days; `clock` is a command that sets the clock back."""
        self.must(*clock, "openssl", "req", "-x509", "-newkey", "ec", "-pkeyopt", "ec_paramgen_curve:P-256", "-nodes",
                  "-days", "2", "-subj", "/CN=server1.corp.example", "-keyout", f"{self.folder}/camd.key", "-out",
                  f"{self.folder}/camd.pem")
        self.must("chmod", "600", f"{self.folder}/camd.key")
        self.must("chown", NOBODY, f"{self.folder}/camd.key", f"{self.folder}/camd.pem")

    def start(self, ahead=""):
        """Starts it apart from the command that starts it, so that it can be frozen alone. With a time like "2h" its
        clock is that much ahead; its helpers have the right time."""
        clock = f"LD_PRELOAD=$(echo /usr/lib/*/faketime/libfaketimeMT.so.1) FAKETIME=+{ahead}" if ahead else ""
        self.must("setsid", "--fork", "setpriv", f"--reuid={NOBODY}", f"--regid={NOBODY}", "--clear-groups", "sh", "-c",
                  f"echo $$ >{self.folder}/pid; exec env {clock} velmor-camd --config {self.folder}/camd.conf "
                  f"</dev/null >/dev/null 2>{self.folder}/errors")
        self.wait_for(f"ss -Hltn 'sport = :{self.port}' | grep -q .")
        self.process = self.must("cat", f"{self.folder}/pid").strip()
        return self

    def wait_for(self, condition):
        """Waits until a shell on the server finds that it is so."""
        deadline = time.monotonic() + 30
        while self.lab.enter(NODE, "sh", "-c", condition).returncode != 0:
            assert time.monotonic() < deadline, f"{condition}: {self.must('cat', f'{self.folder}/errors')}"
            time.sleep(0.1)

    def send(self, number):
        self.must("kill", f"-{int(number)}", self.process)

    def stop(self, number=signal.SIGTERM):
        """Ends the service by the signal."""
        if self.process is not None:
            self.send(number)
            self.wait_for(f"! test -e /proc/{self.process}")
            self.process = None

    def close(self):
        self.stop(signal.SIGKILL)

    def audit(self):
        return self.must("cat", f"{self.folder}/audit.log")


def settings(service, **values):
    """The text of a host's cam.conf."""
    return "".join(f'{key.replace("_", "-")} = "{value}"\n' for key, value in ({"port": service.port} | values).items())
