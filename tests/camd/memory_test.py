"""What is left in the service's memory. A sanitizer keeps freed memory as it was, so these run without one."""
from camd import PASSWORD, ServiceTest, blob_of, wait_until


class MemoryTest(ServiceTest):

    def setUp(self):
        super().setUp()
        self.assertEqual(self.service.create().code, 201)

    def testTextForTheJoinIsNotLeftInMemory(self):
        # The answer is wiped when it has been sent, which the client may see before that is so.
        wait_until(lambda: not self.service.memory_holds(blob_of("HOST2")[200:240].encode()))

    def testPasswordIsNotLeftInMemory(self):
        wait_until(lambda: not self.service.memory_holds(PASSWORD.encode()))

    def testWhatIsNoSecretIsFoundInMemory(self):
        self.assertTrue(self.service.memory_holds(b"/v1/computers"))


class TokenMemoryTest(ServiceTest):

    CHANGES = {"access": {"token-required": True}}

    def testTokenIsNotLeftInMemory(self):
        token = self.service.token()
        self.assertEqual(self.service.create(token=token).code, 201)
        secret = token.split(".")[1].encode()
        wait_until(lambda: not self.service.memory_holds(secret))
