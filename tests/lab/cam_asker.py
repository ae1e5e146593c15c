#!/usr/bin/python3
"""Asks a CAM service for what it reads as JSON from its standard input: a list of [METHOD, PATH, BODY], all at once.
Prints the answers as [HTTP STATUS, BODY] in the same order.

usage: cam_asker.py ADDRESS PORT        (inside a node)
"""
import concurrent.futures
import http.client
import json
import ssl
import sys

context = ssl.SSLContext(ssl.PROTOCOL_TLS_CLIENT)
context.check_hostname = False
context.verify_mode = ssl.CERT_NONE


def ask(request):
    method, path, body = request
    try:
        connection = http.client.HTTPSConnection(sys.argv[1], int(sys.argv[2]), timeout=120, context=context)
        connection.request(method, path, None if body is None else json.dumps(body))
        answer = connection.getresponse()
        return [answer.status, json.loads(answer.read())]
    except OSError as error:
        return [0, {"text": str(error)}]


requests = json.load(sys.stdin)
with concurrent.futures.ThreadPoolExecutor(len(requests)) as pool:
    print(json.dumps(list(pool.map(ask, requests))))
