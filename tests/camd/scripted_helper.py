#!/usr/bin/python3
"""Stands for the directory behind velmor-camd-helper. Works in the folder that it lies in.

`behaviour` there holds JSON: "delay" (seconds before the answer), "wait-for" (a file that must exist before the
answer), "status" and "text" (a failure), "crash", "garbage" or "silent"; with "only" for that computer alone. Each
request is noted in `helper.log` without its secret, and each account that was made is a file in `accounts`.
"""
import base64
import json
import os
import pathlib
import sys
import time

folder = pathlib.Path(sys.argv[0]).resolve().parent
request = json.loads(sys.stdin.buffer.readline())
secret = sys.stdin.buffer.read(request["secretSize"])
with open(folder / "helper.log", "a", encoding="utf-8") as log:
    log.write(json.dumps(request | {"rightPassword": secret == b"Directory-Passw0rd-of-the-service"}) + "\n")


def answer(blob=b"", **fields):
    fields = {"status": 0, "text": "", "secretSize": len(blob)} | fields
    sys.stdout.buffer.write(json.dumps(fields).encode() + b"\n" + blob)
    sys.stdout.buffer.flush()
    sys.exit(0)


try:
    behaviour = json.loads((folder / "behaviour").read_text(encoding="utf-8"))
except FileNotFoundError:
    behaviour = {}
if behaviour.get("only", request.get("computer")) != request.get("computer"):
    behaviour = {}
time.sleep(behaviour.get("delay", 0))
while "wait-for" in behaviour and not (folder / behaviour["wait-for"]).exists():
    time.sleep(0.01)
if behaviour.get("crash"):
    os.abort()
if behaviour.get("silent"):
    time.sleep(1000)
if behaviour.get("garbage"):
    print("this is no answer", flush=True)
    sys.exit(0)
if "status" in behaviour:
    answer(status=behaviour["status"], text=behaviour.get("text", "the directory says no"))

if request["operation"] == "domain":
    answer(netbiosDomainName="CORP", dnsDomainName=request["domain"], domainSid="S-1-5-21-1-2-3")
accounts = folder / "accounts"
accounts.mkdir(exist_ok=True)
account = accounts / request["computer"]
if request["operation"] == "create":
    if account.exists() and request["takeOver"] == "none":
        answer(status=2224, text="there is such an account")
    account.write_text("unused", encoding="ascii")
    name = request["computer"]
    answer(base64.b64encode(f"the machine password of {name} ".encode() * 60), accountName=name + "$",
           dn=f"CN={name},DC=corp,DC=example", sid=f"S-1-5-21-1-2-3-{sum(name.encode())}", recordedBy="dc1.corp.example",
           passwordSet=11, lastLogon=22, logonCount=3)
if request["operation"] == "remove-unused":
    if not account.exists():
        answer(status=1168, text="there is no such account")
    if account.read_text(encoding="ascii") != "unused":
        answer(status=2404, text="the account is in use")
    account.unlink()
    answer()
