"""A client for programs on asyncio: every call is awaited, and many may wait at a time."""

from __future__ import annotations

import asyncio
import os
import time
from typing import Any, AsyncIterator, Iterable, TypeVar

from . import _commands
from ._commands import Command
from ._session import Session
from ._types import AssetInfo, Error, Event, Status

Value = TypeVar("Value")


class AsyncClient:
    """The same as Client, for one event loop: `async with AsyncClient() as client`. Commands may be sent ahead of the
    answers to those before. Objects are put back after a loss by themselves.
    """

    def __init__(self, socket_path: str | None = None, *, reconnect_limit: float = 0.0):
        """Within a running event loop. Connects. OSError when nobody listens; PermissionError when it is somebody else's."""
        self._session = Session(socket_path, reconnect_limit)
        self._loop = asyncio.get_running_loop()
        self._news = asyncio.Event()
        self._watched: int | None = None
        self._timer: asyncio.TimerHandle | None = None
        self._watch()

    async def __aenter__(self) -> AsyncClient:
        return self

    async def __aexit__(self, *_: object) -> None:
        self.close()

    def close(self) -> None:
        self._unwatch()
        self._session.close()
        self._news.set()

    def reconnect(self) -> None:
        """Connects anew, also to take over again. OSError when that is not possible."""
        self._unwatch()
        self._session.reconnect()
        self._process()

    def grant_file(self, path: str | os.PathLike[str]) -> str:
        """As Client.grant_file()."""
        token = self._session.grant(os.fspath(path))
        self._watch()
        return token

    async def next_event(self) -> Event | None:
        """The next event; None when the connection is over and all was told."""
        session = self._session
        while not session.events and (session.socket or session.next_try is not None):
            self._news.clear()
            await self._news.wait()
        return session.events.popleft() if session.events else None

    async def events(self) -> AsyncIterator[Event]:
        """All events, as they come, to the end of the connection."""
        while (event := await self.next_event()) is not None:
            yield event

    async def upsert_asset(self, identifier: str, url: str | None = None, *, title: str | None = None,
                                 album_title: str | None = None, artist: str | None = None, token: str | None = None) -> AssetInfo | None:
        """Makes or replaces an asset, with a file: URL (see file_url()) or, without one, with other texts only. Texts that are
        absent are read from the file. `token` is that of grant_file()."""
        return await self._run(_commands.upsert_asset(
            identifier, URL=url, title=title, albumTitle=album_title, artist=artist, sandboxExtensionToken=token))

    async def destroy_asset(self, identifier: str) -> None:
        return await self._run(_commands.destroy_asset(identifier))

    async def upsert_item(self, identifier: str, asset: str) -> Status:
        """Makes or replaces an item that plays the asset."""
        return await self._run(_commands.upsert_item(identifier, asset))

    async def destroy_item(self, identifier: str) -> None:
        return await self._run(_commands.destroy_item(identifier))

    async def current_time(self, item: str) -> float:
        """The position that is heard, in seconds."""
        return await self._run(_commands.current_time(item))

    async def set_current_time(self, item: str, seconds: float) -> None:
        """Moves the position, to within 1/60 s; beyond the end is the end."""
        return await self._run(_commands.set_current_time(item, seconds))

    async def upsert_queue_player(self, identifier: str, items: Iterable[str]) -> Status:
        """Makes or replaces a queue player of these items, paused. The last part of its name, split at commas, names the
        program to the media controls: "music,org.example.Player"."""
        return await self._run(_commands.upsert_queue_player(identifier, items))

    async def destroy_queue_player(self, identifier: str) -> None:
        return await self._run(_commands.destroy_queue_player(identifier))

    async def set_rate(self, player: str, rate: float) -> None:
        """1 plays as recorded, 0 pauses, below 0 plays backwards. PlayerRateChanged tells when it is so."""
        return await self._run(_commands.set_rate(player, rate))

    async def advance_to_next_item(self, player: str) -> None:
        return await self._run(_commands.advance_to_next_item(player))

    async def append_item(self, player: str, item: str) -> None:
        return await self._run(_commands.edit_queue("appendItem", player, item))

    async def remove_item(self, player: str, item: str) -> None:
        return await self._run(_commands.edit_queue("removeItem", player, item))

    async def remove_all_items(self, player: str) -> None:
        return await self._run(_commands.remove_all_items(player))

    async def replace_current_item(self, player: str, item: str) -> None:
        return await self._run(_commands.edit_queue("replaceCurrentItem", player, item))

    async def _run(self, command: Command[Value]) -> Value:
        future: asyncio.Future[Value] = self._loop.create_future()

        def done(value: Any, error: Error | None) -> None:
            if future.cancelled():
                return
            if error:
                future.set_exception(error)
            else:
                future.set_result(value)

        self._unwatch()
        self._session.run(command, done)
        self._watch()
        return await future

    def _process(self) -> None:
        self._unwatch()  # the socket may become another one
        self._session.process()
        self._watch()

    def _unwatch(self) -> None:
        if self._watched is not None:
            self._loop.remove_reader(self._watched)
            self._loop.remove_writer(self._watched)
            self._watched = None
        if self._timer:
            self._timer.cancel()
            self._timer = None

    def _watch(self) -> None:
        self._unwatch()
        session = self._session
        if session.socket:
            self._watched = session.socket.fileno()
            self._loop.add_reader(self._watched, self._process)
            if session.wants_to_write():
                self._loop.add_writer(self._watched, self._process)
        elif session.next_try is not None:
            self._timer = self._loop.call_later(max(0.0, session.next_try - time.monotonic()), self._process)
        self._news.set()
