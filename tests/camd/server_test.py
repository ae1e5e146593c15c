"""The HTTPS server, and clients that do not behave."""
import os
import socket
import ssl
import subprocess
import threading
import time

from camd import COMPUTERS, DOMAIN, PORT, ServiceTest, connect, is_closed, raw, status_of_next, tls, wait_until

MALFORMED_BODIES = ["", "{", "[]", "7", "null", '"host2"', "{}", '{"hostName": 7}', '{"hostName": null}',
                    '{"hostName": ["host2.corp.example"]}', '{"container": "OU=Hosts"}',
                    '{"hostName": "host2.corp.example", "container": 7}',
                    '{"hostName": "host2.corp.example", "container": "a\\u0000b"}', "\xff\xfe", "[" * 5000,
                    '{"hostName": "host2.corp.example"} {"hostName": "host3.corp.example"}']
NO_HTTP = [b"GET\r\n\r\n", b"GET /v1/domain HTTP/9.9\r\n\r\n",
           b"POST /v1/computers HTTP/1.1\r\nHost: a\r\nContent-Length: -5\r\n\r\n",
           b"POST /v1/computers HTTP/1.1\r\nHost: a\r\nContent-Length: 99999999999999999999999\r\n\r\n",
           b"POST /v1/computers HTTP/1.1\r\nHost: a\r\nTransfer-Encoding: chunked\r\n\r\nZZZ\r\n\r\n",
           b"GET /v1/domain HTTP/1.1\r\n" + b"X: y\r\n" * 10000 + b"\r\n",
           b"GET /" + b"a" * 100000 + b" HTTP/1.1\r\nHost: a\r\n\r\n"]


class ServerTestCase(ServiceTest):

    def assert_broken_off(self):
        wait_until(self.service.audit)
        event = self.service.audit()[0]
        self.assertEqual((event["client"], event["request"], event["text"]),
                         ("127.0.0.1", "POST /v1/computers", "the request did not come whole"))


class ServerTest(ServerTestCase):

    def assert_serving(self):
        self.assertEqual(self.service.domain().code, 200)

    def testDomainIsTold(self):
        answer = self.service.domain()
        self.assertEqual((answer.code, answer.body),
                         (200, {"netbiosDomainName": "CORP", "dnsDomainName": "corp.example",
                                "domainSid": "S-1-5-21-1-2-3"}))

    def testDomainIsAskedOfTheDirectoryOnce(self):
        for _ in range(3):
            self.service.domain()
        self.assertEqual(len(self.service.helper_requests("domain")), 1)

    def testPlainHttpIsRefused(self):
        with socket.create_connection(("127.0.0.1", PORT), timeout=20) as connection:
            connection.sendall(b"GET /v1/domain HTTP/1.1\r\nHost: camd\r\n\r\n")
            connection.settimeout(20)
            try:
                answer = connection.recv(65536)
            except ConnectionResetError:
                answer = b""
        self.assertNotIn(b"HTTP/", answer)
        self.assert_serving()

    def testOldTlsIsRefused(self):
        for version in (ssl.TLSVersion.TLSv1, ssl.TLSVersion.TLSv1_1):
            with self.subTest(version=version), self.assertRaises((ssl.SSLError, ConnectionError)):
                connect(context=tls(version))

    def testNewTlsIsServed(self):
        for version, name in ((ssl.TLSVersion.TLSv1_2, "TLSv1.2"), (ssl.TLSVersion.TLSv1_3, "TLSv1.3")):
            with self.subTest(version=version), connect(context=tls(version)) as connection:
                self.assertEqual(connection.version(), name)

    def testMalformedBodyIsRefused(self):
        for body in MALFORMED_BODIES:
            with self.subTest(body=body[:60]):
                answer = self.service.ask("POST", COMPUTERS, body.encode("latin-1"))
                self.assertEqual(answer.outcome, (400, 87))
        self.assertEqual(self.service.helper_requests("create"), [])

    def testMalformedRequestsDoNotStopTheService(self):
        for request in NO_HTTP:
            with self.subTest(request=request[:60]):
                self.assertNotIn(b" 200 ", raw(request).split(b"\r\n")[0])
        self.assert_serving()

    def testAnnouncedOversizedBodyIsRefused(self):
        self.assertEqual(self.service.ask("POST", COMPUTERS, b"x" * 9000).outcome, (413, 87))

    def testOversizedBodyInChunksIsRefused(self):
        head = b"POST /v1/computers HTTP/1.1\r\nHost: a\r\nConnection: close\r\nTransfer-Encoding: chunked\r\n\r\n"
        body = b"1000\r\n" + b"x" * 4096 + b"\r\n"
        self.assertIn(b" 413 ", raw(head + body * 3 + b"0\r\n\r\n").split(b"\r\n")[0])

    def testEndlessBodyIsCutOff(self):
        head = b"POST /v1/computers HTTP/1.1\r\nHost: a\r\nTransfer-Encoding: chunked\r\n\r\n"
        with connect() as connection:
            connection.settimeout(20)
            connection.sendall(head)
            with self.assertRaises((ssl.SSLError, OSError)):
                for _ in range(10000):
                    connection.sendall(b"1000\r\n" + b"x" * 4096 + b"\r\n")
        self.assert_broken_off()
        self.assert_serving()

    def testUnknownPathIsRefused(self):
        for path in ("/", "/v1", "/v2/domain", "/v1/domain/", "/v1/computers/HOST2"):
            with self.subTest(path=path):
                self.assertEqual(self.service.ask("GET", path).outcome, (404, 50))

    def testOtherMethodIsRefused(self):
        for method, path in (("POST", DOMAIN), ("GET", COMPUTERS), ("DELETE", COMPUTERS)):
            with self.subTest(method=method, path=path):
                self.assertEqual(self.service.ask(method, path).outcome, (405, 50))

    def testNewNegotiationIsNotForTheClientToAskFor(self):
        """Each would cost the service far more than the client."""
        asked = subprocess.run(["openssl", "s_client", "-connect", f"127.0.0.1:{PORT}", "-tls1_2"], input="R\n" * 20,
                               capture_output=True, text=True, check=False, timeout=60)
        self.assertLessEqual(asked.stderr.count("RENEGOTIATING"), 1, asked.stderr)
        self.assert_serving()

    def testOneConnectionTakesSeveralRequests(self):
        with connect() as connection:
            for _ in range(3):
                connection.sendall(b"GET /v1/domain HTTP/1.1\r\nHost: a\r\n\r\n")
                self.assertEqual(status_of_next(connection), 200)


class ImpatientServerTest(ServerTestCase):
    """Clients that take too long, which is seen soon."""

    CHANGES = {"server": {"request-timeout-seconds": 2}}

    def testClientThatSendsAByteNowAndThenIsCutOff(self):
        with connect() as connection:
            begin = time.monotonic()
            with self.assertRaises((ssl.SSLError, OSError)):
                for byte in b"GET /v1/domain HTTP/1.1\r\nHost: a-very-long-name-of-a-host-that-takes-time\r\n\r\n" * 3:
                    connection.sendall(bytes([byte]))
                    time.sleep(0.2)
            self.assertLess(time.monotonic() - begin, 15)

    def testClientThatSendsItsBodySlowlyIsCutOff(self):
        with connect() as connection:
            connection.sendall(b"POST /v1/computers HTTP/1.1\r\nHost: a\r\nContent-Length: 1000\r\n\r\n{")
            self.assertTrue(is_closed(connection))
        self.assert_broken_off()

    def testConnectionWithoutHandshakeIsCutOff(self):
        with socket.create_connection(("127.0.0.1", PORT), timeout=20) as connection:
            self.assertTrue(is_closed(connection))

    def testConnectionWithHalfAHandshakeIsCutOff(self):
        with socket.create_connection(("127.0.0.1", PORT), timeout=20) as connection:
            connection.sendall(b"\x16\x03\x01\x02\x00\x01\x00\x01\xfc\x03\x03")
            self.assertTrue(is_closed(connection))

    def testConnectionWithoutRequestIsCutOff(self):
        with connect() as connection:
            self.assertTrue(is_closed(connection))

    def testBytesThatBecomeNoRequestAreCutOff(self):
        for text in (b"\r\n\r\n", b"\0" * 1000 + b"\r\n\r\n"):
            with self.subTest(text=text[:60]):
                self.assertEqual(raw(text), b"")


class CrowdTest(ServiceTest):
    """Two hundred connections at once."""

    # So long that nobody is cut off while the crowd gathers, however busy the machine is.
    CHANGES = {"server": {"request-timeout-seconds": 600}}
    COUNT = 200

    def ask_all_at_once(self):
        codes = []
        gate = threading.Barrier(self.COUNT)

        def ask():
            with connect() as connection:
                gate.wait(60)
                connection.sendall(b"GET /v1/domain HTTP/1.1\r\nHost: a\r\nConnection: close\r\n\r\n")
                codes.append(connection.recv(65536).split(b" ")[1])

        threads = [threading.Thread(target=ask) for _ in range(self.COUNT)]
        for thread in threads:
            thread.start()
        for thread in threads:
            thread.join()
        self.assertEqual(codes, [b"200"] * self.COUNT)

    def testAllAreAnswered(self):
        self.service.domain()
        self.ask_all_at_once()

    def assert_served_beside(self, crowd):
        self.assertEqual(self.service.domain().code, 200)
        for connection in crowd:
            self.assertFalse(is_closed(connection, limit=0.001))
            connection.close()

    def testOthersAreServedBesideIdleOnes(self):
        self.assert_served_beside([socket.create_connection(("127.0.0.1", PORT)) for _ in range(self.COUNT)])

    def testOthersAreServedBesideSlowOnes(self):
        slow = [connect() for _ in range(self.COUNT)]
        for connection in slow:
            connection.sendall(b"POST /v1/computers HTTP/1.1\r\nContent-Length: 100\r\n")
        self.assert_served_beside(slow)

    def testMemoryStaysFlat(self):
        self.service.domain()
        for _ in range(2):
            self.ask_all_at_once()
        before = self.service.memory()
        for _ in range(5):
            self.ask_all_at_once()
        self.assertLess(self.service.memory() - before, 8 * 1024)

    def testMemoryStaysFlatUnderThoseWhoDoNotBehave(self):
        self.service.domain()
        for _ in range(2):
            self.misbehave_all_at_once()
        before = self.service.memory()
        for _ in range(5):
            self.misbehave_all_at_once()
        self.assertLess(self.service.memory() - before, 8 * 1024)
        self.assertEqual(self.service.domain().code, 200)

    def misbehave_all_at_once(self):
        """Half of the crowd stops in the handshake, and half in a request; then all go away."""
        crowd = [socket.create_connection(("127.0.0.1", PORT), timeout=20) for _ in range(self.COUNT // 2)]
        for connection in crowd:
            connection.sendall(b"\x16\x03\x01\x02\x00\x01\x00\x01\xfc\x03\x03")
        crowd += [connect() for _ in range(self.COUNT // 2)]
        for connection in crowd[self.COUNT // 2:]:
            connection.sendall(b"POST /v1/computers HTTP/1.1\r\nContent-Length: 8000\r\n\r\n" + b"x" * 7000)
        for connection in crowd:
            connection.close()

    def testDescriptorsAreGivenBack(self):
        self.service.domain()
        folder = f"/proc/{self.service.process.pid}/fd"
        before = len(os.listdir(folder))
        self.ask_all_at_once()
        wait_until(lambda: len(os.listdir(folder)) <= before)


class ConnectionLimitTest(ServiceTest):

    CHANGES = {"server": {"connections-per-client": 3}}

    def testOneClientCannotTakeAllConnections(self):
        held = [connect() for _ in range(3)]
        with self.assertRaises((ssl.SSLError, OSError)):
            connect()
        self.assertEqual(self.service.domain(source="127.0.0.2").code, 200)
        for connection in held:
            connection.close()
