"""Runs tarnctl against a service of its own, as people and scripts do: what it says, and how it ends."""
import contextlib
import json
import os
import re
import signal
import socket
import sys
import unittest

from harness import DEADLINE, ToolTest, make_song


def wait_for_line(tool, beginning):
    while not tool.stdout.readline().startswith(beginning):
        if tool.poll() is not None:
            raise AssertionError(f"it ended without {beginning}")


class TheTool(ToolTest):
    def setUp(self):
        super().setUp()
        (self.folder / "folder").mkdir()
        os.mkfifo(self.folder / "pipe")

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

    def test_plays_folders_and_lists(self):
        album = self.folder / "album"
        for name in ("CD 2/Song 10.wav", "CD 2/song 9.wav", "CD 10/x.wav", "CD 2/.hidden.wav", "intro.wav"):
            (album / name).parent.mkdir(parents=True, exist_ok=True)
            make_song(album / name, 0.05)
        for name in ("cover.jpg", "CD 2/notes.txt"):
            (album / name).touch()
        (album / "list.m3u8").write_text("\ufeff#EXTM3U\r\nCD 2\\song 9.wav\r\nfile://%s/intr%%6f.wav\nhttp://x/y\nnone\n"
                                         % album)
        (album / "list.pls").write_text("[playlist]\nFile10=intro.wav\nFile9=CD 10\nNumberOfEntries=2\n")
        (album / "itself.m3u").write_text("intro.wav\nitself.m3u\n")
        everything = ["song 9.wav", "Song 10.wav", "x.wav", "intro.wav"]
        for words, names, refused in ((["album"], everything, []),
                                      (["album/list.m3u8"], ["song 9.wav", "intro.wav"], ["http://x/y", "album/none"]),
                                      (["album/list.pls"], ["x.wav", "intro.wav"], []),
                                      (["album/itself.m3u"], ["intro.wav"], ["album/itself.m3u"]),
                                      (["folder", f"file://{album}/intro.wav"], ["intro.wav"], ["folder"])):
            with self.subTest(words), self.service():
                status, output = self.run_tool("play", *words)
                self.assertEqual(re.findall(r"Playing (.*) \(", output), names)
                self.assertEqual(re.findall(r"(?m)^tarnctl: (.*?): .+$", output), refused)
                self.assertEqual(status, 1 if refused else 0)
        with self.service(), open(album / "list.m3u8", "rb") as names:
            output = self.run_tool("play", "-", stdin=names)[1]  # taken from the current folder
            self.assertEqual(re.findall(r"Playing (.*) \(", output), ["intro.wav"])
            output = self.run_tool("play", "--shuffle", "album")[1]
            self.assertEqual(sorted(re.findall(r"Playing (.*) \(", output)), sorted(everything))
            with self.start("play", "--loop", "album") as tool:
                for name in 2 * everything:
                    wait_for_line(tool, f"Playing {name}".encode())

    def test_plays_in_the_background(self):
        with self.bus(), self.service():
            status, output = self.run_tool("play", "--detach", "empty.mp3", "long.wav", "short.wav")
            self.assertEqual(status, 0)
            self.assertRegex(output, r"tarnctl: empty\.mp3: .*\nPlaying long\.wav.*\nIn the background: .*\n")
            first = json.loads(self.run_tool("status", "--json")[1])["background"]
            self.assertEqual((first["track"], first["tracks"], len(first["problems"])), (2, 3, 1))
            self.assertEqual(self.run_tool("play", "--detach", "long.wav")[0], 0)
            self.assertNotEqual(json.loads(self.run_tool("status", "--json")[1])["background"]["process"], first["process"])
            self.assertRegex(self.run_tool("status")[1], r"Playing long\.wav .*\nIn the background, track 1 of 1;.*\n")
            with self.start("status", "--follow") as follower:
                self.assertEqual(self.run_tool("stop"), (0, ""))
                wait_for_line(follower, b"Nothing plays.")
            self.assertEqual(self.run_tool("play", "--detach", "empty.mp3")[0], 1)
            self.assertEqual(self.run_tool("stop")[0], 1)

    def test_keeps_the_rate_when_others_let_it_go_on(self):
        with self.bus(), self.service(), self.start("play", "--rate", "1.5", "long.wav") as tool, \
                self.start("status", "--follow") as follower:
            wait_for_line(follower, b"Playing long.wav (0:00 of 1:00, 1.50x)")
            for words in (["pause"], ["play"]):
                self.assertEqual(self.run_tool(*words), (0, ""))
            wait_for_line(follower, b"Paused")
            wait_for_line(follower, b"Playing long.wav (0:00 of 1:00, 1.50x)")
            tool.send_signal(signal.SIGTERM)

    def test_refuses_what_it_cannot_do_before_it_connects(self):
        for words in ([], ["seek", "x"], ["rate", "-1"], ["volume", "loud"], ["play", "--rate", "0", "a"], ["play", "--rate", "nan", "a"],
                      ["play", "--rate", "8", "a"], ["play", "--rate", "-1", "long.wav", "short.wav"],
                      ["play", "--from", "x", "a"], ["sing"]):
            status, output = self.run_tool(*words)
            self.assertEqual(status, 2, words)
            self.assertNotEqual(output, "", words)
        status, output = self.run_tool("play", "short.wav")
        self.assertEqual(status, 1)
        self.assertIn("systemctl --user enable --now tarnd.socket", output)

    def test_writes_a_line_whatever_a_file_is_called(self):
        for name in (b"new\nline.wav", b"bytes\xff\xfe.wav", b"escape\x1b[2J.wav"):
            make_song(os.fsdecode(os.path.join(bytes(self.folder), name)), 0.1)
            status, output = self.run_tool("info", "--json", name)
            self.assertEqual((status, json.loads(output)["duration"]), (0, 0.1), "which needs no service")
            with self.service():
                for command in ("info", "play"):
                    status, output = self.run_tool(command, name)
                    self.assertEqual(status, 0)
                    self.assertEqual(len(output.splitlines()), 2, output)
                    self.assertIsNone(re.search("[\x00-\x09\x0b-\x1f]", output), output)

    def test_stops_when_it_is_told_to(self):
        with self.service():
            for number in (signal.SIGINT, signal.SIGTERM):
                with self.start("play", "long.wav") as tool:
                    self.assertEqual(tool.stdout.readline(), b"Playing long.wav (1:00)\n")
                    tool.send_signal(number)
                    self.assertEqual(tool.communicate(timeout=DEADLINE)[0], b"Stopped.\n")
                self.assertEqual(tool.returncode, 128 + number)

    def test_goes_on_when_the_service_comes_back(self):
        with contextlib.ExitStack() as services:
            service = services.enter_context(self.service())
            with self.start("play", "--from", "59", "long.wav") as tool:
                wait_for_line(tool, b"Playing long.wav")
                service.kill()
                service.wait()
                wait_for_line(tool, b"The service is gone")
                services.enter_context(self.service())
                wait_for_line(tool, b"The service is back.")
                wait_for_line(tool, b"Played everything.")
                self.assertEqual(tool.wait(DEADLINE), 0)

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



if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1] + sys.argv[3:])
