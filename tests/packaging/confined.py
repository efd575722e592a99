"""Runs a program as its unit confines it, as far as that can be had without a service manager.

usage: confined.py UNIT PROGRAM      below `unshare --user --map-root-user --mount --net`

It takes the views of the file system, the filter of system calls, the families of sockets and the ban on memory that is both
writable and executable from the unit, and stops at a value that it cannot provide.
"""
import errno
import os
import socket
import subprocess
import sys

import seccomp

PROT_WRITE, PROT_EXEC = 2, 4


def settings(unit):
    """The unit's settings by name, each with all its values."""
    found = {}
    with open(unit, encoding="utf-8") as lines:
        for line in lines:
            name, sign, value = line.strip().partition("=")
            if sign and not line.startswith("#"):
                found.setdefault(name, []).append(value)
    return found


def system_calls(group):
    """The names in a group such as "@system-service", with those of the groups in it."""
    listed = subprocess.run(["systemd-analyze", "syscall-filter", group], text=True, check=True,
                            stdout=subprocess.PIPE, stderr=subprocess.DEVNULL).stdout
    names = set()
    for word in (line.strip() for line in listed.splitlines()[1:]):
        if word.startswith("@"):
            names |= system_calls(word)
        elif word and not word.startswith("#"):
            names.add(word)
    return names


def allowed_calls(filters):
    allowed = set()
    for value in filters:
        names = set().union(*(system_calls(group) for group in value.lstrip("~").split()))
        allowed = allowed - names if value.startswith("~") else allowed | names
    return allowed


def mount(*arguments):
    subprocess.run(["mount", *arguments], check=True)


def confine_files(unit):
    assert unit["ProtectSystem"] == ["strict"] and unit["PrivateTmp"] == ["yes"], "unknown view of the files"
    mount("--make-rprivate", "/")
    mount("--options", "remount,bind,ro", "/")
    mount("--types", "tmpfs", "tmpfs", "/tmp")


def confine_calls(unit):
    assert unit["SystemCallErrorNumber"] == ["EPERM"] and unit["MemoryDenyWriteExecute"] == ["yes"]
    assert unit["RestrictAddressFamilies"] == ["AF_UNIX"]
    refused = seccomp.ERRNO(errno.EPERM)
    rules = seccomp.SyscallFilter(refused)
    for name in allowed_calls(unit["SystemCallFilter"]) - {"mmap", "mprotect", "socket"}:
        try:
            rules.add_rule(seccomp.ALLOW, name)
        except (RuntimeError, ValueError):
            pass  # not of this machine's architecture
    rules.add_rule(seccomp.ALLOW, "socket", seccomp.Arg(0, seccomp.EQ, socket.AF_UNIX))
    rules.add_rule(seccomp.ALLOW, "mprotect", seccomp.Arg(2, seccomp.MASKED_EQ, PROT_EXEC, 0))
    for protection in (0, PROT_WRITE, PROT_EXEC):
        rules.add_rule(seccomp.ALLOW, "mmap", seccomp.Arg(2, seccomp.MASKED_EQ, PROT_WRITE | PROT_EXEC, protection))
    rules.load()


if __name__ == "__main__":
    confinement = settings(sys.argv[1])
    confine_files(confinement)
    confine_calls(confinement)
    os.execv(sys.argv[2], sys.argv[2:])
