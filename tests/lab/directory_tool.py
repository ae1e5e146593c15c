#!/usr/bin/python3
"""Looks at and changes the directory from the controller itself, for the tests. Prints its answer as JSON.

usage: directory_tool.py QUESTION ARGUMENT...        (inside the controller)
"""
import json
import secrets
import sys

import ldb
from samba.auth import system_session
from samba.param import LoadParm
from samba.samdb import SamDB

ACCOUNT_DISABLED = 0x2
CONTROLLERS_ACCOUNT = 0x82000

parameters = LoadParm()
parameters.load_default()
directory = SamDB(session_info=system_session(), lp=parameters)


def find(account):
    found = directory.search(directory.domain_dn(), expression=f"(sAMAccountName={account})",
                             attrs=["dNSHostName", "userAccountControl", "badPwdCount"])
    return found[0] if found else None


def computer(name):
    entry = find(f"{name}$")
    if entry is None:
        return None
    return {"dn": str(entry.dn), "dNSHostName": str(entry.get("dNSHostName", "")),
            "disabled": bool(int(str(entry["userAccountControl"])) & ACCOUNT_DISABLED)}


def delete_computer(name):
    entry = find(f"{name}$")
    if entry is not None:
        directory.delete(entry.dn, ["tree_delete:1"])


def disable_computer(name):
    directory.disable_account(f"(sAMAccountName={name}$)")


def reset_computer_password(name):
    directory.setpassword(f"(sAMAccountName={name}$)", secrets.token_urlsafe(24))


def set_computer_dns_name(name, dns_name):
    change = ldb.Message(find(f"{name}$").dn)
    change["dNSHostName"] = ldb.MessageElement(dns_name, ldb.FLAG_MOD_REPLACE, "dNSHostName")
    directory.modify(change)


def create_computer(name, dns_name, unit=None):
    directory.newcomputer(name, computerou=unit)
    set_computer_dns_name(name, dns_name)


def make_controllers_account(name):
    change = ldb.Message(find(f"{name}$").dn)
    change["userAccountControl"] = ldb.MessageElement(str(CONTROLLERS_ACCOUNT), ldb.FLAG_MOD_REPLACE,
                                                      "userAccountControl")
    directory.modify(change)


def bad_password_count(user):
    return int(str(find(user).get("badPwdCount", "0")))


answers = {function.__name__.replace("_", "-"): function for function in (
    computer, delete_computer, disable_computer, reset_computer_password, set_computer_dns_name, create_computer,
    make_controllers_account, bad_password_count)}
print(json.dumps(answers[sys.argv[1]](*sys.argv[2:])))
