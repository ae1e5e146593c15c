#!/usr/bin/python3
"""Holds connections to a TLS server of this machine whose requests never end: each sends a byte of its head now and
then. One that is cut off is opened anew. Runs until it is killed; prints a line when all are there for the first time.

usage: slow_clients.py PORT COUNT
"""
import selectors
import socket
import ssl
import sys
import time

PORT, COUNT = int(sys.argv[1]), int(sys.argv[2])
SECONDS_BETWEEN_BYTES = 1

context = ssl.SSLContext(ssl.PROTOCOL_TLS_CLIENT)
context.check_hostname = False
context.verify_mode = ssl.CERT_NONE


def opened():
    """A connection, or None when the server does not take one at once."""
    try:
        plain = socket.create_connection(("127.0.0.1", PORT), timeout=SECONDS_BETWEEN_BYTES)
    except OSError:
        return None
    connection = context.wrap_socket(plain, do_handshake_on_connect=False)
    connection.setblocking(False)
    return connection


def goes_on(connection):
    """Shakes hands, or sends a byte. False when the server has cut the client off."""
    try:
        connection.do_handshake()
        connection.send(b"x")
    except (ssl.SSLWantReadError, ssl.SSLWantWriteError, BlockingIOError):
        return True
    except OSError:
        return False
    return True


def cut_off(selector):
    """The connections that have come to their end."""
    ended = []
    for key, _ in selector.select(timeout=0):
        try:
            if key.fileobj.recv(4096) == b"":
                ended.append(key.fileobj)
        except (ssl.SSLWantReadError, ssl.SSLWantWriteError, BlockingIOError):
            continue
        except OSError:
            ended.append(key.fileobj)
    return ended


connections = set()
told = False
with selectors.DefaultSelector() as readable:
    while True:
        begin = time.monotonic()
        for connection in cut_off(readable) + [each for each in connections if not goes_on(each)]:
            if connection in connections:
                connections.discard(connection)
                readable.unregister(connection)
                connection.close()
        while len(connections) < COUNT and (new := opened()) is not None:
            connections.add(new)
            readable.register(new, selectors.EVENT_READ)
        if not told and len(connections) == COUNT:
            print("all are there", flush=True)
            told = True
        time.sleep(max(0.0, begin + SECONDS_BETWEEN_BYTES - time.monotonic()))
