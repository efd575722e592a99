"""One client of the service: a socket, the calls that wait for their ends, and what is put back after a loss.

It never waits. Whoever has it watches the socket and the clock, and calls process() when either has something.
"""

from __future__ import annotations

import collections
import dataclasses
import os
import secrets
import socket
import struct
import time
import urllib.parse
from typing import Any, Callable

from . import _schema
from ._commands import Command, event_of, restoration
from ._mirror import Mirror
from ._types import (CommandFailed, ConnectionLost, Disconnected, Error, Event, ItemFailedToPlayToEnd, Reconnected,
                     Reconnecting, ReplacedByAnother, TakenOver)

_HEADER = struct.Struct("<IB3xQ")
_CALL, _EXTENSION, _REPLY, _RELEASED, _EVENT, _TAKEN_OVER, _FORGOTTEN = range(1, 8)
_LARGEST_BODY = 1 << 20
_MOST_EVENTS = 4096
_NEWS = b"\x78\x01"  # asks to be told when another client takes over
_NO_CONNECTION = ("ostrel.pellion.errors", 25)
_FIRST_PAUSE, _LONGEST_PAUSE = 0.02, 0.5  # seconds between two tries to connect anew

Done = Callable[[Any, "Error | None"], None]


@dataclasses.dataclass
class _Call:
    command: Command[Any]
    done: Done


def default_socket_path() -> str:
    """Where the service listens: "ostrel.tarnd" in XDG_RUNTIME_DIR, or in /run without it."""
    return os.path.join(os.environ.get("XDG_RUNTIME_DIR") or "/run", "ostrel.tarnd")


def file_url(path: str | os.PathLike[str]) -> str:
    """The URL of a file; a relative path is taken from the current folder."""
    return "file://" + urllib.parse.quote(os.fsencode(os.path.abspath(path)))


class Session:
    def __init__(self, path: str | None, reconnect_limit: float):
        self.path = path or default_socket_path()
        self.events: collections.deque[Event] = collections.deque(maxlen=_MOST_EVENTS)
        self.socket: socket.socket | None = None
        self.next_try: float | None = None  # by the monotonic clock, while there is no connection but may be again
        self._limit = reconnect_limit
        self._give_up = 0.0
        self._pause = _FIRST_PAUSE
        self._mirror = Mirror()
        self._files: dict[str, str] = {}  # the path of each token
        self._calls: dict[int, _Call] = {}
        self._later: list[_Call] = []  # to be sent when all objects are back
        self._steps: list[list[Command[Any]]] | None = None  # while objects are put back
        self._replaced = False
        self._last_id = 0
        self._outgoing: collections.deque[tuple[bytes, int | None]] = collections.deque()
        self._incoming = bytearray()
        self._connect()

    # What a client asks for.

    def run(self, command: Command[Any], done: Done) -> None:
        """Sends a command; `done` gets its value or an error, at once or within a later process()."""
        if len(command.envelope) > _LARGEST_BODY:
            raise ValueError("the command is longer than 1 MiB")
        call = _Call(command, done)
        if self._replaced:
            done(None, TakenOver("another program has taken over the service"))
        elif self._steps is not None or self.next_try is not None:
            self._later.append(call)
        elif self.socket is None:
            done(None, ConnectionLost("there is no connection to the service"))
        else:
            self._send(call)
            self.process()

    def grant(self, path: str) -> str:
        """Announces the open file to the service and returns the token for it."""
        token = secrets.token_hex(16)
        extension = _schema.encode("TransportExtension", {"token": token, "path": os.path.abspath(path)})
        self._files[token] = os.path.abspath(path)
        self._frame(_EXTENSION, 0, extension, os.open(path, os.O_RDONLY | os.O_CLOEXEC))
        self.process()
        return token

    def reconnect(self) -> None:
        """Connects anew, also to take over again. OSError when that is not possible."""
        self._drop()
        self._set_aside()
        self._mirror.stop()
        self._connect()
        self._begin_again()

    def close(self) -> None:
        """Ends the connection, and every call with ConnectionLost."""
        self._limit = 0
        self.next_try = None
        self._drop()
        self._fail_all(ConnectionLost("the connection was closed"))

    def wants_to_write(self) -> bool:
        return bool(self._outgoing)

    def process(self) -> None:
        """Does all that can be done now."""
        if self.socket is None:
            if self.next_try is not None and time.monotonic() >= self.next_try:
                self._try_again()
            return
        try:
            self._flush()
            self._read()
        except (OSError, ValueError):
            self._lost()

    # The connection.

    def _connect(self) -> None:
        connection = socket.socket(socket.AF_UNIX)
        try:
            connection.connect(self.path)
            _, user, _ = struct.unpack("3i", connection.getsockopt(socket.SOL_SOCKET, socket.SO_PEERCRED, 12))
            if user not in (0, os.geteuid()):
                raise PermissionError(f"{self.path} is served by another user")
        except OSError:
            connection.close()
            raise
        connection.setblocking(False)
        self.socket, self._replaced = connection, False
        self._send(_Call(Command(_NEWS), lambda *_: None))

    def _drop(self) -> None:
        if self.socket:
            self.socket.close()
        self.socket, self._steps = None, None
        self._incoming.clear()
        for _, descriptor in self._outgoing:
            if descriptor is not None:
                os.close(descriptor)
        self._outgoing.clear()

    def _lost(self) -> None:
        """The service has forgotten all objects, or is gone."""
        began = self._steps is None
        self._drop()
        if self._limit <= 0:
            self._fail_all(ConnectionLost("the service has ended the connection"))
            self.events.append(Disconnected())
            return
        if began:
            self._mirror.stop()
            self._give_up = time.monotonic() + self._limit
            self._pause = _FIRST_PAUSE
            self.events.append(Reconnecting())
        self._set_aside()
        self.next_try = time.monotonic()
        self._try_again()

    def _try_again(self) -> None:
        now = time.monotonic()
        try:
            self._connect()
        except OSError:
            self.next_try = now + self._pause
            self._pause = min(2 * self._pause, _LONGEST_PAUSE)
            if now > self._give_up:
                self.next_try = None
                self._fail_all(ConnectionLost("the service did not come back"))
                self.events.append(Disconnected())
            return
        self.next_try = None
        self._begin_again()

    def _set_aside(self) -> None:
        """What waits for an answer is asked again when all objects are back, or fails."""
        self._later[:0] = self._calls.values()
        self._calls.clear()
        if self._limit <= 0:
            self._fail_all(ConnectionLost("the connection has ended"))

    def _fail_all(self, error: Error) -> None:
        calls = [*self._calls.values(), *self._later]
        self._calls.clear()
        self._later.clear()
        for call in calls:
            call.done(None, error)

    # Putting objects back.

    def _begin_again(self) -> None:
        if self._limit <= 0:
            self._mirror = Mirror()
            return
        self._steps = restoration(self._mirror, self._granted_anew)
        self._go_on()

    def _granted_anew(self, token: str | None) -> str | None:
        path = self._files.pop(token or "", None)
        try:
            return self.grant(path) if path else None
        except OSError:
            return None  # the asset's item will say so

    def _go_on(self) -> None:
        """Sends the next commands that put objects back, when those before have been answered."""
        while self._steps is not None and not self._calls:
            if not self._steps:
                self._steps = None
                self._mirror.go_on()
                self.events.append(Reconnected())
                later, self._later = self._later, []
                for call in later:
                    self.run(call.command, call.done)
                return
            for command in self._steps.pop(0):
                self._send(_Call(dataclasses.replace(command, effect=lambda *_: None), lambda *_: None))

    # Frames.

    def _send(self, call: _Call) -> None:
        self._last_id += 1
        self._calls[self._last_id] = call
        self._frame(_CALL, self._last_id, call.command.envelope)

    def _frame(self, kind: int, call: int, body: bytes, descriptor: int | None = None) -> None:
        self._outgoing.append((_HEADER.pack(len(body), kind, call) + body, descriptor))

    def _flush(self) -> None:
        while self._outgoing and self.socket:
            data, descriptor = self._outgoing[0]
            try:
                sent = socket.send_fds(self.socket, [data], [descriptor] if descriptor is not None else [])
            except BlockingIOError:
                return
            if descriptor is not None:
                os.close(descriptor)
            if sent < len(data):
                self._outgoing[0] = data[sent:], None
            else:
                self._outgoing.popleft()

    def _read(self) -> None:
        while self.socket:
            try:
                data = self.socket.recv(65536)
            except BlockingIOError:
                return
            if not data:
                raise ConnectionResetError
            self._incoming += data
            while self.socket and len(self._incoming) >= _HEADER.size:
                size, kind, call = _HEADER.unpack_from(self._incoming)
                if size > _LARGEST_BODY:
                    raise ConnectionAbortedError
                end = _HEADER.size + size
                if len(self._incoming) < end:
                    break
                body = bytes(self._incoming[_HEADER.size:end])
                del self._incoming[:end]
                self._take(kind, call, body)

    def _take(self, kind: int, call: int, body: bytes) -> None:
        if kind == _EVENT:
            self._take_event(event_of(body))
        elif kind in (_REPLY, _RELEASED) and call in self._calls:
            self._end(self._calls.pop(call), _schema.decode("TransportReply", body))
            self._go_on()
        elif kind == _TAKEN_OVER:
            self._replaced = True
            self._fail_all(TakenOver("another program has taken over the service"))
            self.events.append(ReplacedByAnother())
        elif kind == _FORGOTTEN:
            self._lost()

    def _take_event(self, event: Event | None) -> None:
        if event is None:
            return
        if self._steps is None:
            self._mirror.note(event)
            self.events.append(event)
        elif isinstance(event, ItemFailedToPlayToEnd):  # what else is told meanwhile is no news
            self.events.append(event)

    def _end(self, call: _Call, reply: _schema.Message) -> None:
        if "error" not in reply:
            value = call.command.value(reply.get("data"))
            call.command.effect(self._mirror, value)
            call.done(value, None)
            return
        error = reply["error"]
        if (error["domain"], error["code"]) == _NO_CONNECTION and self._limit > 0:
            self._later.append(call)  # news of the reason follow
            return
        texts = {entry["key"]: entry["value"] for entry in error.get("userInfo", [])}
        call.done(None, CommandFailed(error["domain"], error["code"], texts))
