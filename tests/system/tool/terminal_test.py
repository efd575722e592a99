"""Runs tarnctl on a terminal with a shell: keys, signals, jobs."""
import fcntl
import signal
import struct
import sys
import termios
import unittest

from harness import ToolTest


class TheToolOnATerminal(ToolTest):
    def setUp(self):
        super().setUp()
        self.enterContext(self.bus())
        self.running = self.enterContext(self.service())
        self.terminal = self.enterContext(self.shell())
        self.terminal.run("stty tostop rows 24 cols 100")  # the strict way: who writes in the background is stopped

    def play(self, *names):
        self.terminal.type(f"tarnctl play {' '.join(names)}\r")
        self.terminal.wait_for("q quit.*\r\n")
        self.terminal.wait_for(r"> .*long\.wav 0:00")

    def test_counts_every_key_of_a_burst(self):
        see = self.terminal.wait_for
        self.play("long.wav", "long.wav", "long.wav", "long.wav")
        for keys, shown in ((" ", r"\|\| 1/4 "), ("   ", r"> 1/4 "), ("  " "p", r"\|\| 1/4 "), ("]]", r"\|\| .* 1\.50x"), (" ", r"> .* 1\.50x"),
                            ("[", r"> .* 1\.25x"), ("\x1b[C" * 3, r" 0:3\d / 1:00"), ("ll\x1b[D", r" 0:4\d / 1:00"),
                            ("\x1b[A\x1b[3~\x1bOH" "nnn", r"> 4/4 ")):
            self.terminal.type(keys)
            see(shown)
        self.terminal.type("q")
        see(r"\r\x1b\[KStopped\.\r\n\$ ")
        self.assertIn("0", self.terminal.run("echo $?"))

    def test_gives_the_terminal_back_for_a_stop_and_an_end(self):
        self.play("long.wav")
        self.terminal.type("]\x1a")
        self.terminal.wait_for(r"Stopped +tarnctl.*\r\n\$ ")
        self.assertRegex(self.terminal.run("stty -a"), r" icanon.* echo ")
        self.terminal.type("fg\r")
        self.terminal.wait_for(r"> long\.wav .* 1\.25x")
        self.terminal.type("\x03")
        self.terminal.wait_for(r"Stopped\.\r\n\$ ")
        self.assertIn("130", self.terminal.run("echo $?"))
        self.assertRegex(self.terminal.run("stty -a"), r" icanon.* echo ")

    def test_is_quiet_in_the_background(self):
        self.play("long.wav", "empty.mp3")
        self.terminal.type("\x1a")
        self.terminal.wait_for(r"Stopped +tarnctl.*\r\n\$ ")
        self.terminal.type("bg\r")
        self.terminal.wait_for(r"\$ ")
        for command in ("pause", "play", "pause", "play"):
            self.assertEqual(self.terminal.run(f"tarnctl {command}"), "")
        self.assertIn("Running", self.terminal.run("jobs"))
        self.terminal.type("fg\r")
        self.terminal.wait_for(r"> 1/2 long\.wav")
        self.terminal.type("q")
        self.terminal.wait_for(r"Stopped\.")

    def test_fits_the_line_to_the_terminal(self):
        self.play("long.wav", "short.wav")
        self.terminal.type(" ")
        self.terminal.wait_for(r"\|\| 1/2 long\.wav 0:00 / 1:00 \[ +\]")
        for columns, shown in ((32, r"\r\x1b\[K\|\| 1/2 long\.wav 0:00 / 1:00(?! \[)"), (20, r"\|\| 0:00(?! /)")):
            fcntl.ioctl(self.terminal.terminal, termios.TIOCSWINSZ, struct.pack("HHHH", 24, columns, 0, 0))
            self.terminal.wait_for(shown)

    def test_hears_an_interrupt_while_the_service_stands_still(self):
        self.play("long.wav")
        self.running.send_signal(signal.SIGSTOP)
        self.terminal.type("n\x1b[C \x03")
        self.terminal.wait_for(r"Stopped\.\r\n\$ ")
        self.terminal.type("tarnctl play long.wav\r")
        self.terminal.wait_for("long.wav\r\n")
        self.terminal.type("\x03")
        self.terminal.wait_for(r"\$ ")

    def test_reads_keys_beside_a_list(self):
        self.terminal.type("printf '%s\\n' long.wav short.wav | tarnctl play -\r")
        self.terminal.wait_for(r"> 1/2 long\.wav")
        self.terminal.type("q")
        self.terminal.wait_for(r"Stopped\.\r\n\$ ")


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1] + sys.argv[3:])
