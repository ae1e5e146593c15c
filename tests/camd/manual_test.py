"""What the manual page of velmor-camd tells, beside what the service does."""
import re
import unittest

from camd import SOURCE

PAGE = SOURCE.parent.parent / "docs/man/velmor-camd.8"
SERVICE_SOURCES = SOURCE.parent.parent / "services/camd/service"


class ManualTest(unittest.TestCase):

    def testMessagesAreThoseOfTheService(self):
        calls = set()
        for file in SERVICE_SOURCES.glob("*.cc"):
            source = file.read_text(encoding="utf-8")
            calls |= set(re.findall(r'[^v]syslog\(LOG_([A-Z]+),\s*"([^"]*)"', source))
        listed = re.findall(r'^\.It Qq "(.*)"\n\.Sy ([a-z]+) \.$', PAGE.read_text(encoding="utf-8"), re.MULTILINE)
        self.assertEqual({(priority.lower(), text) for priority, text in calls},
                         {(priority, text) for text, priority in listed})
