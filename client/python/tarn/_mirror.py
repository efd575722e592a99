"""What the client has made in the service, so that it can be made again."""

from __future__ import annotations

import dataclasses
import time

from . import _types


@dataclasses.dataclass
class MirroredPlayer:
    items: list[str]
    rate: float = 0.0


@dataclasses.dataclass
class _Place:
    """A position that moves on by itself."""

    seconds: float
    rate: float
    since: float

    def now(self) -> float:
        return max(0.0, self.seconds + self.rate * (time.monotonic() - self.since))


class Mirror:
    """The objects as commands that succeeded and events left them. Used by one session."""

    def __init__(self) -> None:
        self.assets: dict[str, dict[str, str]] = {}
        self.items: dict[str, str] = {}  # each with its asset
        self.players: dict[str, MirroredPlayer] = {}
        self._places: dict[str, _Place] = {}

    def place(self, item: str) -> float:
        """Where the item is, in seconds."""
        place = self._places.get(item)
        return place.now() if place else 0.0

    def move(self, item: str, seconds: float) -> None:
        rate = next((player.rate for player in self.players.values() if player.items[:1] == [item]), 0.0)
        self._places[item] = _Place(seconds, rate, time.monotonic())

    def forget_item(self, item: str) -> None:
        self.items.pop(item, None)
        self._places.pop(item, None)
        for player in self.players.values():
            if item in player.items:
                player.items.remove(item)

    def note(self, event: _types.Event) -> None:
        if isinstance(event, _types.PlayerRateChanged) and event.player in self.players:
            player = self.players[event.player]
            player.rate = event.rate
            if player.items:
                self.move(player.items[0], self.place(player.items[0]))
        elif isinstance(event, _types.CurrentItemChanged) and event.player in self.players:
            self._advance(self.players[event.player], event.item)

    def _advance(self, player: MirroredPlayer, item: str | None) -> None:
        if item is None:
            player.items.clear()
        elif item in player.items:
            for left in player.items[:player.items.index(item)]:
                player.items.remove(left)
                self._places.pop(left, None)
            self.move(item, self.place(item))

    def stop(self) -> None:
        """The service is gone: nothing moves until it is back."""
        for place in self._places.values():
            place.seconds, place.rate = place.now(), 0.0

    def go_on(self) -> None:
        for item in list(self._places):
            self.move(item, self.place(item))
