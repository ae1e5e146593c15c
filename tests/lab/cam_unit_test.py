"""The CAM service as systemd runs it from the installed unit, with all that the unit forbids it."""
import json

from cam_service import ADDRESS, NODE, UNIT
from lab import SOURCE, USER_PASSWORD, LabTest

SETTINGS = "/etc/quenix/velmor"
CONFIGURATION = f"""[server]
certificate-file = "{SETTINGS}/camd.pem"
key-file = "camd-key"
audit-file = "/var/log/velmor-camd/audit.log"

[directory]
domain = "corp.example"
user = "joiner"
password-file = "camd-password"
default-container = "{UNIT}"

[access]
host-names = ["host*.corp.example"]
client-addresses = ["10.99.0.0/24"]
"""


class CamUnitTest(LabTest):

    def setUp(self):
        super().setUp()
        self.must("systemd-sysusers", "velmor-camd.conf")
        self.write("camd.conf", CONFIGURATION)
        self.write("camd.password", USER_PASSWORD)
        self.must("openssl", "req", "-x509", "-newkey", "ec", "-pkeyopt", "ec_paramgen_curve:P-256", "-nodes", "-days",
                  "2", "-subj", "/CN=server1", "-keyout", f"{SETTINGS}/camd.key", "-out", f"{SETTINGS}/camd.pem")
        self.manager("start")
        self.addCleanup(self.manager, "stop")

    def must(self, *command, given=""):
        done = self.lab.enter(NODE, *command, given=given)
        self.assertEqual(done.returncode, 0, f"{command}: {done.stdout}{done.stderr}")
        return done.stdout

    def write(self, name, text):
        self.must("dd", f"of={SETTINGS}/{name}", "status=none", given=text)
        self.must("chmod", "600" if name.endswith("password") else "644", f"{SETTINGS}/{name}")

    def manager(self, *arguments):
        return self.must(SOURCE / "tests/lab/system_manager.sh", *arguments)

    def systemctl(self, *arguments):
        return self.lab.enter(NODE, SOURCE / "tests/lab/system_manager.sh", "run", "systemctl", *arguments)

    def testHostJoinsThroughTheServiceAsItIsShipped(self):
        self.assert_exit(self.systemctl("start", "velmor-camd"), 0)
        self.assert_exit(self.host.velmorctl("cam", "trust", ADDRESS, "--yes"), 0)
        self.assert_exit(self.host.velmorctl("join", "--proxy", ADDRESS), 0)
        self.host.must("wbinfo", "--check-secret")
        self.assertEqual(self.directory.computer(self.host.account)["dn"], f"CN={self.host.account},{UNIT}")
        events = [json.loads(line) for line in self.must("cat", "/var/log/velmor-camd/audit.log").splitlines()]
        self.assertIn(self.host.full_name, [event.get("hostName") for event in events])

    def testStartThatFailsIsReported(self):
        self.write("camd.conf", CONFIGURATION.replace("corp.example", "corp example"))
        self.assertNotEqual(self.systemctl("start", "velmor-camd").returncode, 0)

    def testServiceIsReloadedAndStopped(self):
        self.assert_exit(self.systemctl("start", "velmor-camd"), 0)
        self.assert_exit(self.systemctl("reload", "velmor-camd"), 0)
        self.assert_exit(self.systemctl("is-active", "velmor-camd"), 0)
        self.assert_exit(self.systemctl("stop", "velmor-camd"), 0)
        self.assertIn("Result=success", self.systemctl("show", "--property=Result", "velmor-camd").stdout)
