"""The creation of computer accounts."""
import os
import socket
import struct

from camd import COMPUTERS, PASSWORD, ServiceTest, blob_of, connect, wait_until


class CreationTest(ServiceTest):

    def testAccountAndTextForTheJoinAreHandedOut(self):
        answer = self.service.create("host2.corp.example")
        self.assertEqual((answer.code, answer.body), (201, {"accountName": "HOST2$", "joinBlob": blob_of("HOST2")}))

    def testContainerReachesTheDirectory(self):
        self.service.create(container="OU=Hosts,OU=Servers")
        self.assertEqual(self.service.helper_requests("create")[0]["container"], "OU=Hosts,OU=Servers")

    def testHelperGetsThePassword(self):
        self.service.create()
        self.assertTrue(self.service.helper_requests("create")[0]["rightPassword"])

    def testExistingAccountIsRefused(self):
        self.assertEqual(self.service.create().code, 201)
        self.assertEqual(self.service.create().outcome, (409, 2224))

    def testFailuresOfTheDirectoryAreHandedOn(self):
        for status, code in ((5, 403), (267, 400), (2224, 409), (1311, 502), (1069, 500), (31, 500)):
            with self.subTest(status=status):
                self.service.kill()
                self.service.start()
                self.service.behave(status=status, text="the directory's reason")
                answer = self.service.create()
                self.assertEqual((answer.outcome, answer.body["text"]), ((code, status), "the directory's reason"))

    def testHelperThatCrashesIsAFailure(self):
        self.service.behave(crash=True)
        self.assertEqual(self.service.create().outcome, (500, 1067))
        self.assertEqual(self.service.domain().outcome, (500, 1067))

    def testHelperThatTalksNonsenseIsAFailure(self):
        self.service.behave(garbage=True)
        self.assertEqual(self.service.create().outcome, (500, 1067))

    def testRefusedPasswordIsNotTriedAgain(self):
        self.service.behave(status=1069)
        for _ in range(3):
            self.assertEqual(self.service.create().outcome, (500, 1069))
        self.assertEqual(len(self.service.helper_requests("create")), 1)

    def testSecondCreationOfANameWaitsForNothing(self):
        self.service.behave(**{"wait-for": "go"})
        first = self.service.later(self.service.create)
        wait_until(self.service.helper_requests)
        self.assertEqual(self.service.create("HOST2.corp.example").outcome, (409, 1061))
        self.service.write("go", "")
        self.assertEqual(first.result().code, 201)

    def testNameIsFreeAgainAfterAFailure(self):
        self.service.behave(status=1311)
        self.service.create()
        self.service.behave()
        self.assertEqual(self.service.create().code, 201)

    def testManyNamesAtOnceGetAnAccountEach(self):
        names = [f"host{number}.corp.example" for number in range(20)]
        answers = self.service.create_all(names)
        self.assertEqual([answer.body.get("accountName") for answer in answers],
                         [f"HOST{number}$" for number in range(20)])
        self.assertEqual(len({answer.body["joinBlob"] for answer in answers}), 20)
        self.assertEqual(sorted(self.service.ledger()), sorted((f"HOST{number}", "given") for number in range(20)))

    def testDomainIsToldWhileAccountsAreMade(self):
        self.service.domain()
        self.service.behave(**{"wait-for": "go"})
        creations = [self.service.later(self.service.create, f"host{number}.corp.example") for number in range(8)]
        wait_until(lambda: len(self.service.helper_requests("create")) == 4)
        self.assertEqual(self.service.domain().code, 200)
        self.service.write("go", "")
        self.assertEqual([creation.result().code for creation in creations], [201] * 8)

    def testLedgerTellsWhoGotWhat(self):
        self.service.create(container="Servers/Hosts")
        self.assertEqual(self.service.ledger("computer, hostName, container, client, state, accountName, dn, sid"),
                         [("HOST2", "host2.corp.example", "Servers/Hosts", "127.0.0.1", "given", "HOST2$",
                           "CN=HOST2,DC=corp,DC=example", f"S-1-5-21-1-2-3-{sum(b'HOST2')}")])

    def testAuditLogTellsOfEachRequest(self):
        self.service.create()
        self.service.create()
        self.service.domain()
        events = [{key: event.get(key) for key in ("client", "request", "hostName", "result", "status")}
                  for event in self.service.audit()]
        self.assertEqual(events, [
            {"client": "127.0.0.1", "request": "POST /v1/computers", "hostName": "host2.corp.example", "result": 201,
             "status": None},
            {"client": "127.0.0.1", "request": "POST /v1/computers", "hostName": "host2.corp.example", "result": 409,
             "status": 2224},
            {"client": "127.0.0.1", "request": "GET /v1/domain", "hostName": None, "result": 200, "status": None}])

    def testAuditLogIsNotForgedByNames(self):
        self.service.create('x"}\n{"client": "forged')
        events = self.service.audit()
        self.assertEqual([event["client"] for event in events], ["127.0.0.1"])

    def testClientThatDoesNotWaitIsNoted(self):
        self.service.behave(**{"wait-for": "go"})
        body = b'{"hostName": "host2.corp.example"}'
        with connect() as connection:
            connection.sendall(b"POST /v1/computers HTTP/1.1\r\nHost: a\r\nContent-Length: %d\r\n\r\n%s" %
                               (len(body), body))
            wait_until(lambda: self.service.helper_requests("create"))
            # The end is told at once, rather than that nothing more will be sent.
            connection.setsockopt(socket.SOL_SOCKET, socket.SO_LINGER, struct.pack("ii", 1, 0))
        self.service.write("go", "")
        wait_until(lambda: [event["text"] for event in self.service.audit() if "text" in event] ==
                   ["the client did not wait for the answer"])
        self.assertEqual(self.service.ledger(), [("HOST2", "given")])


class SecretTest(ServiceTest):
    """Passwords, and the text that holds one."""

    def setUp(self):
        super().setUp()
        self.assertEqual(self.service.create().code, 201)

    def testNothingSecretIsOnTheDisk(self):
        self.service.stop()
        for file in self.service.folder.iterdir():
            if file.is_file() and file.name not in ("password", "helper"):
                content = file.read_bytes()
                self.assertNotIn(blob_of("HOST2")[:40].encode(), content, file.name)
                self.assertNotIn(PASSWORD.encode(), content, file.name)


class DeadlineTest(ServiceTest):

    CHANGES = {"directory": {"helper-timeout-seconds": 1}}

    def testHelperThatHangsIsEnded(self):
        self.service.behave(silent=True)
        self.assertEqual(self.service.create().outcome, (504, 1460))
        processes = [pid for pid in os.listdir("/proc") if pid.isdigit()]
        command_lines = []
        for pid in processes:
            try:
                with open(f"/proc/{pid}/cmdline", "rb") as file:
                    command_lines.append(file.read())
            except FileNotFoundError:
                continue
        self.assertFalse([line for line in command_lines if str(self.service.folder / "helper").encode() in line])

    def testRequestWithUnknownOutcomeIsMarked(self):
        self.service.behave(silent=True)
        self.service.create()
        self.assertEqual(self.service.ledger(), [("HOST2", "interrupted")])


class QueueTest(ServiceTest):

    CHANGES = {"server": {"helpers": 1, "queue-length": 1}}

    def testRequestBehindAFullQueueIsToldToComeAgain(self):
        self.service.behave(**{"wait-for": "go"})
        requests = [self.service.later(self.service.create, f"host{number}.corp.example") for number in range(4)]
        wait_until(lambda: sum(request.done() for request in requests) == 2)
        refused = [request.result() for request in requests if request.done()]
        self.assertEqual([answer.outcome for answer in refused], [(503, 170)] * 2)
        self.assertGreaterEqual(int(refused[0].headers["Retry-After"]), 1)
        self.service.write("go", "")
        self.assertEqual(sorted(request.result().code for request in requests), [201, 201, 503, 503])

    def testNameOfARefusedRequestIsFreeAgain(self):
        self.service.behave(**{"wait-for": "go"})
        requests = [self.service.later(self.service.create, f"host{number}.corp.example") for number in range(4)]
        wait_until(lambda: sum(request.done() for request in requests) == 2)
        self.service.write("go", "")
        codes = [request.result().code for request in requests]
        for number, code in enumerate(codes):
            if code == 503:
                self.assertEqual(self.service.create(f"host{number}.corp.example").code, 201)


class TakeOverTest(ServiceTest):

    CHANGES = {"directory": {"existing-accounts": "own-unused"}}

    def testHelperLearnsHowTheAccountWasGivenOut(self):
        self.service.create()
        self.service.create()
        request = self.service.helper_requests("create")[1]
        self.assertEqual({key: request[key] for key in ("takeOver", "sid", "recordedBy", "passwordSet", "lastLogon",
                                                        "logonCount")},
                         {"takeOver": "own-unused", "sid": f"S-1-5-21-1-2-3-{sum(b'HOST2')}",
                          "recordedBy": "dc1.corp.example", "passwordSet": 11, "lastLogon": 22, "logonCount": 3})

    def testUnknownAccountComesWithoutARecord(self):
        self.service.create()
        self.assertNotIn("sid", self.service.helper_requests("create")[0])


class DefaultContainerTest(ServiceTest):

    CHANGES = {"directory": {"default-container": "OU=Hosts"}}

    def testHostWithoutContainerGetsTheDefaultOne(self):
        self.service.ask("POST", COMPUTERS, '{"hostName": "host1.corp.example", "container": ""}')
        self.service.ask("POST", COMPUTERS, '{"hostName": "host2.corp.example", "container": null}')
        self.service.create("host3.corp.example", container="OU=Other")
        self.assertEqual([request["container"] for request in self.service.helper_requests("create")],
                         ["OU=Hosts", "OU=Hosts", "OU=Other"])


