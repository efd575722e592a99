"""Runs a program as its unit confines it, as far as that can be had without a service manager.

usage: confined.py UNIT PROGRAM      below `unshare --user --map-root-user --mount --net --ipc --uts`

Every setting of the unit's [Service] section has its place below: how it is had here, or why it cannot be. One that has none, or
a value that is not provided for, ends the program.
"""
import ctypes
import errno
import os
import pathlib
import resource
import socket
import subprocess
import sys

import seccomp

PROT_WRITE, PROT_EXEC = 2, 4
PR_CAPBSET_DROP = 24
SET_ID_BITS = (0o4000, 0o2000)
NAMESPACES = {"mount": 0x20000, "cgroup": 0x2000000, "uts": 0x4000000, "ipc": 0x8000000, "user": 0x10000000,
              "pid": 0x20000000, "net": 0x40000000}

# The part of the service manager, or of cgroups, which a process cannot give itself.
NOT_HERE = {"Type", "NotifyAccess", "ExecStart", "Restart", "RestartSec", "TimeoutStopSec", "Slice", "MemoryMax", "TasksMax",
            "KeyringMode"}


def settings(unit):
    """The settings of the unit's service by name, each with all its values."""
    found = {}
    section = ""
    for line in pathlib.Path(unit).read_text(encoding="utf-8").splitlines():
        name, sign, value = line.strip().partition("=")
        if line.startswith("["):
            section = line
        elif sign and section == "[Service]" and not line.startswith("#"):
            found.setdefault(name, []).append(value)
    return found


class Unit:
    """Hands out the settings, and knows which were never asked for."""

    def __init__(self, path):
        self.settings = settings(path)
        self.unseen = set(self.settings) - NOT_HERE

    def __getitem__(self, name):
        self.unseen.discard(name)
        return self.settings[name]

    def expect(self, value, *names):
        for name in names:
            assert self[name] == [value], f"{name} has another value than {value}: {self[name]}"


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
    subprocess.run(["mount", *map(str, arguments)], check=True)


def mount_points():
    return [line.split()[4].encode().decode("unicode_escape") for line in open("/proc/self/mountinfo", encoding="utf-8")]


def confine_files(unit):
    unit.expect("strict", "ProtectSystem")
    unit.expect("read-only", "ProtectHome")
    unit.expect("yes", "PrivateTmp", "PrivateDevices", "ProtectControlGroups", "ProtectKernelTunables",
                "ProtectKernelLogs")
    unit.expect("closed", "DevicePolicy")  # cgroups would also refuse devices that have a file elsewhere
    mount("--make-rprivate", "/")
    make_devices()
    hide_system_information(unit)
    mount("--types", "tmpfs", "tmpfs", "/tmp")
    for place in mount_points():  # this covers homes, /sys, its cgroups and /proc/sys
        if not place.startswith(("/dev", "/tmp", "/proc")):
            mount("--options", "remount,bind,ro", place)


def make_devices():
    """Those that a service with PrivateDevices sees, and nothing else: not /dev/kmsg, not the sound cards."""
    new = pathlib.Path("/tmp")
    mount("--types", "tmpfs", "tmpfs", new)
    for name in ("null", "zero", "full", "random", "urandom", "tty"):
        (new / name).touch()
        mount("--bind", f"/dev/{name}", new / name)
    (new / "shm").mkdir()
    mount("--types", "tmpfs", "tmpfs", new / "shm")
    mount("--rbind", new, "/dev")
    subprocess.run(["umount", "--recursive", new], check=True)


def hide_system_information(unit):
    """ProcSubset=pid without mounting /proc anew, which needs a process namespace: what it hides is empty."""
    unit.expect("pid", "ProcSubset")
    unit.expect("invisible", "ProtectProc")  # other users' processes: this user namespace has none
    for entry in pathlib.Path("/proc").iterdir():
        if entry.name.isdigit() or entry.is_symlink():
            continue
        if entry.is_dir():
            mount("--types", "tmpfs", "--options", "ro", "tmpfs", entry)
        else:
            mount("--bind", "/dev/null", entry)


def confine_process(unit):
    """The namespaces come from `unshare`."""
    unit.expect("yes", "PrivateUsers", "PrivateNetwork", "ProtectHostname", "RemoveIPC")
    unit.expect("any", "IPAddressDeny")
    os.umask(int(*unit["UMask"], 8))
    files = int(*unit["LimitNOFILE"])
    resource.setrlimit(resource.RLIMIT_NOFILE, (min(files, resource.getrlimit(resource.RLIMIT_NOFILE)[1]),) * 2)
    unit.expect("", "CapabilityBoundingSet", "AmbientCapabilities")
    last = int(pathlib.Path("/proc/sys/kernel/cap_last_cap").read_text())
    return lambda: [ctypes.CDLL(None).prctl(PR_CAPBSET_DROP, number, 0, 0, 0) for number in range(last + 1)]


def confine_calls(unit):
    unit.expect("EPERM", "SystemCallErrorNumber")
    unit.expect("native", "SystemCallArchitectures")  # as the filter does by itself
    unit.expect("AF_UNIX", "RestrictAddressFamilies")
    unit.expect("yes", "NoNewPrivileges", "MemoryDenyWriteExecute", "LockPersonality", "RestrictNamespaces",
                "RestrictRealtime", "RestrictSUIDSGID", "ProtectClock", "ProtectKernelModules")
    allowed = allowed_calls(unit["SystemCallFilter"])
    assert allowed.isdisjoint({"clock_settime", "settimeofday", "init_module", "finit_module", "sethostname", "syslog"})
    filtered = {"mmap", "mprotect", "pkey_mprotect", "shmat", "socket", "personality", "unshare", "setns", "clone", "clone3",
                "sched_setscheduler", "sched_setattr", "chmod", "fchmod", "fchmodat"}
    rules = seccomp.SyscallFilter(seccomp.ERRNO(errno.EPERM))  # sets "no new privileges"
    rules.add_rule(seccomp.ERRNO(errno.ENOSYS), "clone3")  # its flags are out of the filter's sight: libc takes clone
    for name in allowed - filtered:
        try:
            rules.add_rule(seccomp.ALLOW, name)
        except (RuntimeError, ValueError):
            pass  # not of this machine's architecture
    rules.add_rule(seccomp.ALLOW, "socket", seccomp.Arg(0, seccomp.EQ, socket.AF_UNIX))
    rules.add_rule(seccomp.ALLOW, "mprotect", seccomp.Arg(2, seccomp.MASKED_EQ, PROT_EXEC, 0))
    for protection in (0, PROT_WRITE, PROT_EXEC):
        rules.add_rule(seccomp.ALLOW, "mmap", seccomp.Arg(2, seccomp.MASKED_EQ, PROT_WRITE | PROT_EXEC, protection))
    rules.add_rule(seccomp.ALLOW, "clone", seccomp.Arg(0, seccomp.MASKED_EQ, sum(NAMESPACES.values()), 0))
    for policy in (os.SCHED_OTHER, os.SCHED_BATCH, os.SCHED_IDLE):
        rules.add_rule(seccomp.ALLOW, "sched_setscheduler", seccomp.Arg(1, seccomp.EQ, policy))
    for name, position in (("chmod", 1), ("fchmod", 1), ("fchmodat", 2)):
        rules.add_rule(seccomp.ALLOW, name, seccomp.Arg(position, seccomp.MASKED_EQ, sum(SET_ID_BITS), 0))
    return rules.load


if __name__ == "__main__":
    confinement = Unit(sys.argv[1])
    load_filter = confine_calls(confinement)
    drop_capabilities = confine_process(confinement)
    confine_files(confinement)
    assert not confinement.unseen, f"not provided for: {confinement.unseen}"
    drop_capabilities()
    load_filter()
    os.execv(sys.argv[2], sys.argv[2:])
