"""A service, a session bus and a terminal of a test's own, for tests that run tarnctl as people and scripts do."""
import contextlib
import os
import pathlib
import pty
import re
import select
import signal
import socket
import subprocess
import sys
import tempfile
import unittest
import wave

SERVICE, TOOL = (os.path.abspath(argument) for argument in sys.argv[1:3])
DEADLINE = 30  # seconds


def make_song(path, seconds):
    with wave.open(str(path), "wb") as song:
        song.setnchannels(1)
        song.setsampwidth(2)
        song.setframerate(8000)
        song.writeframes(bytes(int(2 * 8000 * seconds)))


class Shell:
    """A shell with job control on a terminal, and what is shown there."""

    def __init__(self, environment, folder):
        self.process, self.terminal = pty.fork()
        if self.process == 0:
            os.chdir(folder)
            os.execvpe("bash", ["bash", "--norc", "--noprofile", "--noediting", "-i"], {**environment, "PS1": "$ "})
        self.shown = ""
        self.wait_for(r"\$ ")

    def type(self, keys):
        os.write(self.terminal, keys.encode())

    def wait_for(self, pattern):
        """Returns what was shown before, and goes on behind it."""
        while not (found := re.search(pattern, self.shown)):
            if not select.select([self.terminal], [], [], DEADLINE)[0]:
                raise AssertionError(f"no {pattern!r} in {self.shown[-2000:]!r}")
            self.shown += os.read(self.terminal, 65536).decode("utf-8", "replace")
        before, self.shown = self.shown[:found.start()], self.shown[found.end():]
        return before

    def run(self, line):
        """Runs a command, which must not be the last one to use the terminal, and returns what it printed."""
        self.type(f"{line}; echo 'do''ne'\r")
        self.wait_for(r"'do''ne'\r\n")
        output = self.wait_for("done\r\n")
        self.wait_for(r"\$ ")
        return output

    def close(self):
        os.kill(self.process, signal.SIGKILL)
        os.close(self.terminal)  # hangs up on what still runs there
        os.waitpid(self.process, 0)


class ToolTest(unittest.TestCase):
    def setUp(self):
        self.folder = pathlib.Path(self.enterContext(tempfile.TemporaryDirectory()))
        self.environment = {**os.environ, "XDG_RUNTIME_DIR": str(self.folder), "LC_ALL": "C.UTF-8",
                            "LANGUAGE": "en", "TARND_SOUND": "none", "TERM": "xterm", "NO_COLOR": "1",
                            "PATH": f"{os.path.dirname(TOOL)}:{os.environ['PATH']}"}
        make_song(self.folder / "short.wav", 0.3)
        make_song(self.folder / "long.wav", 60)
        (self.folder / "empty.mp3").touch()

    @contextlib.contextmanager
    def service(self):
        with tempfile.TemporaryDirectory() as folder, socket.socket(socket.AF_UNIX, socket.SOCK_DGRAM) as readiness:
            readiness.bind(folder + "/notify")
            readiness.settimeout(DEADLINE)
            process = subprocess.Popen([SERVICE], env={**self.environment, "NOTIFY_SOCKET": folder + "/notify"},
                                       stderr=subprocess.DEVNULL)
            try:
                self.assertIn(b"READY=1", readiness.recv(100))
                yield process
            finally:
                process.kill()
                process.wait()

    @contextlib.contextmanager
    def bus(self):
        """A session bus, from now on that of the service and the tool."""
        address = f"unix:path={self.folder}/bus"
        process = subprocess.Popen(["dbus-daemon", "--session", "--nofork", "--print-address", "--address", address],
                                   stdout=subprocess.PIPE, stderr=subprocess.DEVNULL)
        try:
            process.stdout.readline()  # it listens
            self.environment["DBUS_SESSION_BUS_ADDRESS"] = address
            yield
        finally:
            process.kill()
            process.communicate()

    @contextlib.contextmanager
    def shell(self):
        shell = Shell(self.environment, self.folder)
        try:
            yield shell
        finally:
            shell.close()

    @contextlib.contextmanager
    def start(self, *words, stdin=subprocess.DEVNULL, stdout=subprocess.PIPE, stderr=subprocess.STDOUT):
        with subprocess.Popen([TOOL, *words], env=self.environment, cwd=self.folder, stdin=stdin, stdout=stdout,
                              stderr=stderr) as tool:
            try:
                yield tool
            finally:
                tool.kill()  # it has ended, unless something has failed

    def run_tool(self, *words, **streams):
        """How it ended, and its output."""
        with self.start(*words, **streams) as tool:
            output = tool.communicate(timeout=DEADLINE)[0]
        return tool.returncode, output.decode("utf-8")
