"""A join whose account the directory refuses: one attempt, and the reason."""
from lab import USER_PASSWORD, LabTest


class RefusedAccountTest(LabTest):
    """Tests run side by side, so each wrong password belongs to a user of its own."""

    def assert_refused(self, user, password, status):
        self.assert_exit(self.host.join(user=user, password=password), 6)
        self.assertEqual(self.host.statuses(), [status])

    def assert_asked_once(self, user):
        name = user.split("@")[0]
        before = self.directory.bad_password_count(name), self.directory.refused_attempts(name)
        self.assert_refused(user, "not-the-password", 86)
        after = self.directory.bad_password_count(name), self.directory.refused_attempts(name)
        self.assertEqual((after[0] - before[0], after[1] - before[1]), (1, 1))

    def testWrongPasswordIsTriedExactlyOnce(self):
        self.assert_asked_once("bob")

    def testWrongPasswordOfAPrincipalNameIsTriedExactlyOnce(self):
        self.assert_asked_once("carol@CORP.EXAMPLE")

    def testWrongPasswordLeavesNoAccountAndNoMembership(self):
        self.assert_refused("dave", "not-the-password", 86)
        self.assertIsNone(self.directory.computer(self.host.account))
        self.assertFalse(self.host.status()[0]["joined"])

    def testUnknownUserIsToldApart(self):
        self.assert_refused("nobody-here", USER_PASSWORD, 1317)

    def testDisabledUserIsToldApart(self):
        self.assert_refused("disabled-user", USER_PASSWORD, 1331)

    def testExpiredUserIsToldApart(self):
        self.assert_refused("expired-user", USER_PASSWORD, 1331)

    def testPasswordThatMustBeChangedIsToldApart(self):
        self.assert_refused("must-change-user", USER_PASSWORD, 1330)
