"""The three players behind one interface: start, load, play, pause, rate, ask for the position."""

import json
import pathlib
import socket
import struct
import subprocess
import time

from sound import SoundServer, wait_until


def connected(path: pathlib.Path) -> socket.socket:
    connection = socket.socket(socket.AF_UNIX)
    connection.connect(str(path))
    return connection


def can_connect(path: pathlib.Path) -> bool:
    try:
        connected(path).close()
        return True
    except OSError:
        return False


class Player:
    """A process with a socket. `position()` asks once; `positions(n)` asks n times before it reads an answer."""

    def __init__(self, command: list, path: pathlib.Path, server: SoundServer, log=subprocess.DEVNULL):
        begin = time.monotonic()
        self.process = subprocess.Popen(command, env=server.environment, stdout=subprocess.DEVNULL,
                                        stderr=log, stdin=subprocess.DEVNULL)
        wait_until(lambda: can_connect(path), command[0])
        self.socket = connected(path)
        self.unread = b""
        self.first_answer()
        self.start_time = time.monotonic() - begin

    def position(self):
        self.positions(1)

    def line(self) -> bytes:
        while b"\n" not in self.unread:
            self.unread += self.socket.recv(65536)
        line, self.unread = self.unread.split(b"\n", 1)
        return line

    def stop(self):
        self.socket.close()
        self.process.terminate()
        self.process.wait()


class Mpd(Player):
    name = "mpd"

    def __init__(self, folder: pathlib.Path, server: SoundServer):
        path = folder / "mpd.socket"
        configuration = folder / "mpd.conf"
        configuration.write_text(
            f'bind_to_address "{path}"\nmusic_directory "{folder}"\ndb_file "{folder}/mpd.db"\n'
            f'log_file "/dev/null"\nauto_update "no"\n'
            f'audio_output {{\ntype "pulse"\nname "out"\nserver "unix:{folder}/native"\n}}\n')
        super().__init__(["mpd", "--no-daemon", str(configuration)], path, server)

    def ask(self, command: str):
        self.socket.sendall(command.encode() + b"\n")
        while not (line := self.line()).startswith(b"OK"):
            if line.startswith(b"ACK"):
                raise RuntimeError(line.decode())

    def first_answer(self):
        self.line()  # the greeting

    def load(self, path: pathlib.Path):
        self.ask("clear")
        self.ask(f'add "file://{path}"')

    def play(self):
        self.ask("play")

    def resume(self):
        self.ask("pause 0")

    def pause(self):
        self.ask("pause 1")

    def positions(self, count: int):
        self.socket.sendall(b"status\n" * count)
        while count > 0:
            count -= self.line().startswith(b"OK")


class Mpv(Player):
    name = "mpv"

    def __init__(self, folder: pathlib.Path, server: SoundServer):
        super().__init__(["mpv", "--no-config", "--idle", "--no-video", "--ao=pulse", "--pause",
                          f"--input-ipc-server={folder}/mpv.socket"], folder / "mpv.socket", server)

    def ask(self, *command):
        self.socket.sendall(json.dumps({"command": command}).encode() + b"\n")
        while b'"error"' not in self.line():
            pass

    def first_answer(self):
        self.ask("get_property", "pid")

    def load(self, path: pathlib.Path):
        self.ask("set_property", "pause", True)
        self.ask("loadfile", str(path))

    def play(self):
        self.ask("set_property", "pause", False)

    resume = play

    def pause(self):
        self.ask("set_property", "pause", True)

    def rate(self, rate: float):
        self.ask("set_property", "speed", rate)

    def positions(self, count: int):
        self.socket.sendall(b'{"command":["get_property","time-pos"]}\n' * count)
        while count > 0:
            count -= b'"error"' in self.line()


def field(number: int, content) -> bytes:
    """A field of a message: bytes or text, or a float."""
    if isinstance(content, float):
        return bytes([number << 3 | 5]) + struct.pack("<f", content)
    if isinstance(content, str):
        content = content.encode()
    length, prefix = len(content), b""
    while length > 127:
        prefix += bytes([length & 127 | 128])
        length >>= 7
    return bytes([number << 3 | 2]) + prefix + bytes([length]) + content


class Tarn(Player):
    name = "tarnd"
    ASSET, ITEM, PLAYER = 1, 2, 3

    def __init__(self, program: pathlib.Path, server: SoundServer, log=subprocess.DEVNULL):
        self.call = 0
        super().__init__([str(program)], server.folder / "ostrel.tarnd", server, log)
        self.query = self.frame(self.ITEM, field(4, field(1, "item")))

    def frame(self, kind: int, command: bytes, call: int = 1) -> bytes:
        envelope = field(2, field(kind, command))
        return struct.pack("<IBxxxQ", len(envelope), 1, call) + envelope

    def next_frame(self) -> tuple:
        """Its kind and body. `call` is then what it answers."""
        while len(self.unread) < 16 or len(self.unread) < 16 + struct.unpack_from("<I", self.unread)[0]:
            if not (piece := self.socket.recv(65536)):
                raise ConnectionError("the service is gone")
            self.unread += piece
        length, kind, self.call = struct.unpack_from("<IBxxxQ", self.unread)
        body, self.unread = self.unread[16:16 + length], self.unread[16 + length:]
        return kind, body

    def answers(self, count: int):
        """Reads on until so many calls were answered or released."""
        while count > 0:
            count -= self.next_frame()[0] in (3, 4)

    def wait_for_end(self):
        """The event that the item was played to its end."""
        end = field(2, field(self.ITEM, field(6, field(1, "item"))))
        while self.next_frame() != (5, end):
            pass

    def ask(self, kind: int, command: bytes):
        self.socket.sendall(self.frame(kind, command))
        self.answers(1)

    def first_answer(self):
        self.ask(self.ITEM, field(4, field(1, "nothing")))

    def load(self, path: pathlib.Path):
        self.ask(self.ASSET, field(1, field(1, "asset") + field(2, f"file://{path}")))
        self.ask(self.ITEM, field(1, field(1, "item") + field(2, "asset")))
        self.ask(self.PLAYER, field(1, field(1, "player,bench") + field(2, "item")))

    def rate(self, rate: float):
        self.ask(self.PLAYER, field(3, field(1, "player,bench") + field(2, float(rate))))

    def play(self):
        self.rate(1)

    resume = play

    def pause(self):
        self.rate(0)

    def positions(self, count: int):
        self.socket.sendall(self.query * count)
        self.answers(count)
