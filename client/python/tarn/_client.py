"""A client for programs that may wait: every call returns when the command has ended."""

from __future__ import annotations

import os
import select
import time
from typing import Callable, Iterable, Iterator, TypeVar

from . import _commands
from ._commands import Command
from ._session import Session
from ._types import AssetInfo, Error, Event, Status

Value = TypeVar("Value")


class Client:
    """A program's place in the service: it makes assets of files, items of assets and queue players of items, each under a
    name of its own, and follows the events.

    Every command raises CommandFailed, ConnectionLost or TakenOver when it does not succeed, and TimeoutError after
    `timeout` seconds. One thread at a time calls.

    With a `reconnect_limit` in seconds, a crash or an update of the service costs a short silence: the client connects
    anew for so long, puts all objects back with their positions, queues and rates, and carries out what was under way. It
    does so while a call or next_event() waits. Reconnecting and Reconnected tell of it. Otherwise a lost connection is
    told by Disconnected, and reconnect() begins anew, with nothing.
    """

    def __init__(self, socket_path: str | None = None, *, reconnect_limit: float = 0.0, timeout: float = 30.0):
        """Connects. OSError when nobody listens; PermissionError when it is somebody else's service."""
        self._session = Session(socket_path, reconnect_limit)
        self._timeout = timeout

    def __enter__(self) -> Client:
        return self

    def __exit__(self, *_: object) -> None:
        self.close()

    def close(self) -> None:
        self._session.close()

    def reconnect(self) -> None:
        """Connects anew, also to take over again. OSError when that is not possible."""
        self._session.reconnect()

    def grant_file(self, path: str | os.PathLike[str]) -> str:
        """Opens a file and hands it to the service, which may be unable to open it itself. Returns the token for the asset
        with this file's URL; it is good once."""
        return self._session.grant(os.fspath(path))

    def next_event(self, timeout: float | None = None) -> Event | None:
        """Waits for the next event; None when the time has passed, or when the connection is over and all was told."""
        session = self._session
        self._wait(lambda: session.events or not (session.socket or session.next_try is not None), timeout)
        return session.events.popleft() if session.events else None

    def events(self) -> Iterator[Event]:
        """All events, as they come, to the end of the connection."""
        while (event := self.next_event()) is not None:
            yield event

    def fileno(self) -> int:
        """For a main loop: readable when next_event(0) has something to do. -1 without a connection."""
        return self._session.socket.fileno() if self._session.socket else -1

    def upsert_asset(self, identifier: str, url: str | None = None, *, title: str | None = None,
                           album_title: str | None = None, artist: str | None = None, token: str | None = None) -> AssetInfo | None:
        """Makes or replaces an asset, with a file: URL (see file_url()) or, without one, with other texts only. Texts that are
        absent are read from the file. `token` is that of grant_file()."""
        return self._run(_commands.upsert_asset(
            identifier, URL=url, title=title, albumTitle=album_title, artist=artist, sandboxExtensionToken=token))

    def destroy_asset(self, identifier: str) -> None:
        return self._run(_commands.destroy_asset(identifier))

    def upsert_item(self, identifier: str, asset: str) -> Status:
        """Makes or replaces an item that plays the asset."""
        return self._run(_commands.upsert_item(identifier, asset))

    def destroy_item(self, identifier: str) -> None:
        return self._run(_commands.destroy_item(identifier))

    def current_time(self, item: str) -> float:
        """The position that is heard, in seconds."""
        return self._run(_commands.current_time(item))

    def set_current_time(self, item: str, seconds: float) -> None:
        """Moves the position, to within 1/60 s; beyond the end is the end."""
        return self._run(_commands.set_current_time(item, seconds))

    def upsert_queue_player(self, identifier: str, items: Iterable[str]) -> Status:
        """Makes or replaces a queue player of these items, paused. The last part of its name, split at commas, names the
        program to the media controls: "music,org.example.Player"."""
        return self._run(_commands.upsert_queue_player(identifier, items))

    def destroy_queue_player(self, identifier: str) -> None:
        return self._run(_commands.destroy_queue_player(identifier))

    def set_rate(self, player: str, rate: float) -> None:
        """1 plays as recorded, 0 pauses, below 0 plays backwards. PlayerRateChanged tells when it is so."""
        return self._run(_commands.set_rate(player, rate))

    def advance_to_next_item(self, player: str) -> None:
        return self._run(_commands.advance_to_next_item(player))

    def append_item(self, player: str, item: str) -> None:
        return self._run(_commands.edit_queue("appendItem", player, item))

    def remove_item(self, player: str, item: str) -> None:
        return self._run(_commands.edit_queue("removeItem", player, item))

    def remove_all_items(self, player: str) -> None:
        return self._run(_commands.remove_all_items(player))

    def replace_current_item(self, player: str, item: str) -> None:
        return self._run(_commands.edit_queue("replaceCurrentItem", player, item))

    def _run(self, command: Command[Value]) -> Value:
        ends: list[tuple[Value, Error | None]] = []
        self._session.run(command, lambda value, error: ends.append((value, error)))
        if not self._wait(lambda: ends, self._timeout):
            raise TimeoutError("the service did not answer in time")
        value, error = ends[0]
        if error:
            raise error
        return value

    def _wait(self, done: Callable[[], object], timeout: float | None) -> bool:
        end = None if timeout is None else time.monotonic() + timeout
        session = self._session
        session.process()
        while not done():
            moments = [moment for moment in (end, session.next_try) if moment is not None]
            limit = max(0.0, min(moments) - time.monotonic()) if moments else None
            watched = [session.socket] if session.socket else []
            select.select(watched, watched if session.wants_to_write() else [], [], limit)
            session.process()
            if end is not None and time.monotonic() >= end:
                return bool(done())
        return True
