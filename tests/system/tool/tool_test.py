"""Runs tarnctl against a service of its own, as people and scripts do: what it says, and how it ends."""
import contextlib
import json
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


def wait_for_line(tool, beginning):
    while not tool.stdout.readline().startswith(beginning):
        if tool.poll() is not None:
            raise AssertionError(f"it ended without {beginning}")


class TheTool(unittest.TestCase):
    def setUp(self):
        self.folder = pathlib.Path(self.enterContext(tempfile.TemporaryDirectory()))
        self.environment = {**os.environ, "XDG_RUNTIME_DIR": str(self.folder), "LC_ALL": "C.UTF-8",
                            "LANGUAGE": "en", "PULSE_SERVER": "unix:/nonexistent", "TERM": "xterm"}
        make_song(self.folder / "short.wav", 0.3)
        make_song(self.folder / "long.wav", 60)
        (self.folder / "empty.mp3").touch()
        (self.folder / "folder").mkdir()
        os.mkfifo(self.folder / "pipe")

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
    def start(self, *words, stdin=subprocess.DEVNULL, stdout=subprocess.PIPE, stderr=subprocess.STDOUT):
        with subprocess.Popen([TOOL, *words], env=self.environment, cwd=self.folder, stdin=stdin, stdout=stdout,
                              stderr=stderr) as tool:
            try:
                yield tool
            finally:
                tool.kill()  # it has ended, unless something has failed

    def run_tool(self, *words):
        """How it ended, and its output."""
        with self.start(*words) as tool:
            output = tool.communicate(timeout=DEADLINE)[0]
        return tool.returncode, output.decode("utf-8")

    def test_says_what_played_and_ends_with_it(self):
        with self.service():
            self.assertEqual(self.run_tool("play", "short.wav", "short.wav"),
                             (0, "Playing short.wav (0:00)\nPlaying short.wav (0:00)\nPlayed everything.\n"))
            self.assertEqual(self.run_tool("play", "--rate", "-2", "short.wav"),
                             (0, "Playing short.wav (0:00)\nPlayed back to the start.\n"))
            status, output = self.run_tool("play", "missing.wav", "folder", "pipe", "short.wav", "empty.mp3")
            self.assertEqual(status, 1)
            for name in ("missing.wav", "folder", "pipe", "empty.mp3"):
                self.assertRegex(output, f"(?m)^tarnctl: {name}: .+$")
            self.assertIn("Playing short.wav", output)
            self.assertTrue(output.endswith("Stopped at the end.\n"), output)

    def test_refuses_what_it_cannot_do_before_it_connects(self):
        for words in ([], ["seek", "x"], ["rate", "-1"], ["volume", "loud"], ["play", "--rate", "0", "a"], ["play", "--rate", "nan", "a"],
                      ["play", "--rate", "8", "a"], ["play", "--rate", "-1", "a", "b"], ["play", "--from", "x", "a"],
                      ["sing"]):
            status, output = self.run_tool(*words)
            self.assertEqual(status, 2, words)
            self.assertNotEqual(output, "", words)
        status, output = self.run_tool("play", "short.wav")
        self.assertEqual(status, 1)
        self.assertIn("systemctl --user enable --now tarnd.socket", output)

    def test_writes_a_line_whatever_a_file_is_called(self):
        for name in (b"new\nline.wav", b"bytes\xff\xfe.wav", b"escape\x1b[2J.wav"):
            make_song(os.fsdecode(os.path.join(bytes(self.folder), name)), 0.1)
            with self.service():
                status, output = self.run_tool("info", "--json", name)
                self.assertEqual(status, 0)
                self.assertEqual(json.loads(output)["duration"], 0.1)
                for command in ("info", "play"):
                    status, output = self.run_tool(command, name)
                    self.assertEqual(status, 0)
                    self.assertEqual(len(output.splitlines()), 3 if command == "info" else 2, output)
                    self.assertIsNone(re.search("[\x00-\x09\x0b-\x1f]", output), output)

    def test_stops_when_it_is_told_to(self):
        with self.service() as service:
            for number in (signal.SIGINT, signal.SIGTERM):
                with self.start("play", "long.wav") as tool:
                    self.assertEqual(tool.stdout.readline(), b"Playing long.wav (1:00)\n")
                    tool.send_signal(number)
                    self.assertEqual(tool.communicate(timeout=DEADLINE)[0], b"Stopped.\n")
                self.assertEqual(tool.returncode, 128 + number)
            with self.start("play", "long.wav") as tool:
                tool.stdout.readline()
                service.kill()
                self.assertIn(b"connection to the service was lost", tool.communicate(timeout=DEADLINE)[0])
            self.assertEqual(tool.returncode, 1)

    def test_controls_what_plays_without_taking_over(self):
        def control(*words):
            status, output = self.run_tool(*words)
            self.assertEqual((status, output), (0, ""), words)

        def status():
            return json.loads(self.run_tool("status", "--json")[1])

        with self.bus(), self.service():
            self.assertEqual(self.run_tool("status"), (0, "Nothing plays.\n"))
            self.assertEqual(status(), {"type": "status", "state": "stopped"})
            for words in (["pause"], ["play"]):
                self.assertEqual(self.run_tool(*words),
                                 (1, "tarnctl: nothing plays\nStart something: tarnctl play FILE...\n"))
            with self.start("play", "long.wav", "long.wav") as player, \
                    self.start("status", "--follow") as follower:
                player.stdout.readline()
                wait_for_line(follower, b"Playing long.wav")
                self.assertLessEqual({"state": "playing", "title": "long.wav", "duration": 60}.items(), status().items())
                for words, state in ((["pause"], "paused"), (["play"], "playing"), (["toggle"], "paused"),
                                     (["toggle"], "playing"), (["stop"], "paused"), (["play"], "playing")):
                    control(*words)
                    self.assertEqual(status()["state"], state, words)
                control("next")
                wait_for_line(follower, b"Paused long.wav")
                player.send_signal(signal.SIGINT)
                self.assertEqual(player.communicate(timeout=DEADLINE)[0].count(b"Playing"), 1)
                wait_for_line(follower, b"Nothing plays.")

    def test_goes_on_when_the_one_before_it_leaves_late(self):
        with self.service(), self.start("play", "long.wav") as first:
            first.stdout.readline()
            # The first one sees that it was replaced, and its leaving makes the service forget the second one, too.
            self.assertRegex(self.run_tool("play", "--from", "57", "long.wav")[1],
                             r"\A(Playing long\.wav \(1:00\)\n)+Played everything\.\n\Z")
            self.assertIn(b"taken over", first.communicate(timeout=DEADLINE)[0])
            self.assertEqual(first.returncode, 1)

    def test_can_be_stopped_while_nothing_answers(self):
        with socket.socket(socket.AF_UNIX) as mute:
            mute.bind(str(self.folder / "ostrel.tarnd"))
            mute.listen()
            with self.start("play", "long.wav") as tool:
                mute.settimeout(DEADLINE)
                with mute.accept()[0] as connection:
                    connection.settimeout(DEADLINE)
                    connection.recv(1)  # it asks whether anybody is there
                    tool.send_signal(signal.SIGINT)
                    tool.communicate(timeout=DEADLINE)
            self.assertEqual(tool.returncode, -signal.SIGINT)

    def test_obeys_keys_on_a_terminal(self):
        with self.service():
            here, there = pty.openpty()
            with open(here, "r+b", buffering=0) as terminal, open(there, "r+b", buffering=0) as its_side, \
                    self.start("play", "long.wav", "short.wav", stdin=its_side, stdout=its_side,
                               stderr=its_side) as tool:
                shown = b""

                def wait_for(pattern):
                    nonlocal shown
                    while not re.search(pattern, shown):
                        self.assertTrue(select.select([terminal], [], [], DEADLINE)[0], shown)
                        shown += terminal.read(4096)
                    shown = b""

                wait_for(rb"> .*long\.wav")
                terminal.write(b" ")
                wait_for(rb"\|\| .*long\.wav")
                terminal.write(b"\x1b[A\x1b[3~\x1bOH")  # keys that mean nothing change nothing
                terminal.write(b"]")
                wait_for(rb"1\.25x")
                terminal.write(b"\x1b[C")
                wait_for(rb"0:1\d / 1:00")
                terminal.write(b"q")
                wait_for(rb"Stopped\.")
                self.assertEqual(tool.wait(DEADLINE), 0)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1] + sys.argv[3:])
