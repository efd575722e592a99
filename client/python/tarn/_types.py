"""What the service tells: answers, events and errors."""

from __future__ import annotations

import dataclasses
import enum
import typing


class Error(Exception):
    """A command did not succeed."""


class CommandFailed(Error):
    """The service says that it could not carry out the command, or why an item cannot be played."""

    def __init__(self, domain: str, code: int, texts: dict[str, str]):
        self.domain, self.code, self.texts = domain, code, texts
        said = (texts.get("LocalizedDescription"), texts.get("LocalizedFailureReason"))
        super().__init__(" ".join(text for text in said if text) or f"{domain}, code {code}")


class ConnectionLost(Error):
    """The connection ended first: whether the command was carried out is not known."""


class TakenOver(Error):
    """Not carried out: another program has taken over the service."""


@dataclasses.dataclass(frozen=True)
class AssetInfo:
    """What the service knows about an audio file."""

    duration: float  #: seconds
    title: str | None = None
    album_title: str | None = None
    artist: str | None = None


class State(enum.IntEnum):
    UNKNOWN = 0
    READY_TO_PLAY = 1
    FAILED = 2


@dataclasses.dataclass(frozen=True)
class Status:
    """How an item or a queue player is."""

    state: State
    error: CommandFailed | None = None  #: why it failed, or why a queue player is not heard
    identifier: str | None = None  #: in the answer to a queue player's upsert: its current item


@dataclasses.dataclass(frozen=True)
class ItemStatusChanged:
    item: str
    status: Status


@dataclasses.dataclass(frozen=True)
class ItemTimeJumped:
    item: str


@dataclasses.dataclass(frozen=True)
class ItemPlayedToEnd:
    item: str


@dataclasses.dataclass(frozen=True)
class ItemFailedToPlayToEnd:
    item: str


@dataclasses.dataclass(frozen=True)
class PlayerStatusChanged:
    player: str
    status: Status


@dataclasses.dataclass(frozen=True)
class PlayerRateChanged:
    player: str
    rate: float  #: 1 is as recorded, 0 is paused, below 0 plays backwards


@dataclasses.dataclass(frozen=True)
class CurrentItemChanged:
    player: str
    item: str | None  #: None when the queue is empty


@dataclasses.dataclass(frozen=True)
class Disconnected:
    """The service is gone, or has forgotten all objects, and nothing is done about it: reconnect() begins anew."""


@dataclasses.dataclass(frozen=True)
class Reconnecting:
    """The same, but the client is about to connect anew and to put its objects back. Nothing sounds meanwhile."""


@dataclasses.dataclass(frozen=True)
class Reconnected:
    """The client is connected again, and its objects are back."""


@dataclasses.dataclass(frozen=True)
class ReplacedByAnother:
    """Another program has connected to the service, which has forgotten this client's objects."""


Event = typing.Union[ItemStatusChanged, ItemTimeJumped, ItemPlayedToEnd, ItemFailedToPlayToEnd, PlayerStatusChanged,
                     PlayerRateChanged, CurrentItemChanged, Disconnected, Reconnecting, Reconnected, ReplacedByAnother]
