"""The commands: what is sent, what the answer means, and what there is in the service afterwards."""

from __future__ import annotations

import dataclasses
import plistlib
from typing import Any, Callable, Generic, Iterable, TypeVar

from . import _schema
from ._mirror import Mirror, MirroredPlayer
from ._types import (AssetInfo, CommandFailed, CurrentItemChanged, Event, ItemFailedToPlayToEnd, ItemPlayedToEnd,
                     ItemStatusChanged, ItemTimeJumped, PlayerRateChanged, PlayerStatusChanged, State, Status)

Value = TypeVar("Value")


def _nothing(*_: Any) -> None:
    return None


@dataclasses.dataclass(frozen=True)
class Command(Generic[Value]):
    envelope: bytes
    value: Callable[[bytes | None], Value] = _nothing  # type: ignore[assignment]
    effect: Callable[[Mirror, Value], None] = _nothing


def _envelope(kind: str, name: str, payload: dict[str, Any]) -> bytes:
    return _schema.encode("VLProtoVelmoMessage", {"audioFilePlayerMessage": {kind: {name: payload}}})


def _contained(kind: str, name: str, identifier: str, other: str) -> bytes:
    return _envelope(kind, name, {"identifier": identifier, "containedIdentifier": other})


def _asset_info(data: bytes | None) -> AssetInfo | None:
    if data is None:
        return None
    answer = _schema.decode("VLProtoAudioFilePlayerAssetUpdateMetaData", data)
    return AssetInfo(answer.get("duration", 0.0), answer.get("title"), answer.get("albumTitle"), answer.get("artist"))


def _status(answer: _schema.Message) -> Status:
    error = None
    if "errorDomain" in answer:
        texts = plistlib.loads(answer["errorDict"]) if "errorDict" in answer else {}
        error = CommandFailed(answer["errorDomain"], answer.get("errorCode", 0), texts)
    state = answer.get("status", 0)
    return Status(State(state) if state in (0, 1, 2) else State.UNKNOWN, error, answer.get("identifier"))


def _status_answer(data: bytes | None) -> Status:
    return _status(_schema.decode("VLProtoAudioFilePlayerStatus", data or b""))


def upsert_asset(identifier: str, **texts: str | None) -> Command[AssetInfo | None]:
    payload: dict[str, str | None] = {"identifier": identifier, **texts}

    def remember(mirror: Mirror, _: AssetInfo | None) -> None:
        kept = {} if texts.get("URL") is not None else dict(mirror.assets.get(identifier, {}))
        for name, text in texts.items():
            if text is not None:
                kept[name] = text
        mirror.assets[identifier] = kept

    return Command(_envelope("asset", "upsertWithMetaData", payload), _asset_info, remember)


def destroy_asset(identifier: str) -> Command[None]:
    return Command(_envelope("asset", "destroy", {"identifier": identifier}),
                   effect=lambda mirror, _: _nothing(mirror.assets.pop(identifier, None)))


def upsert_item(identifier: str, asset: str) -> Command[Status]:
    def remember(mirror: Mirror, _: Status) -> None:
        mirror.items[identifier] = asset
        mirror.move(identifier, 0.0)

    return Command(_contained("playerItem", "upsertWithAsset", identifier, asset), _status_answer, remember)


def destroy_item(identifier: str) -> Command[None]:
    return Command(_envelope("playerItem", "destroy", {"identifier": identifier}),
                   effect=lambda mirror, _: mirror.forget_item(identifier))


def current_time(item: str) -> Command[float]:
    def seconds(data: bytes | None) -> float:
        return _schema.decode("VLProtoAudioFilePlayerCurrentTime", data or b"").get("currentTime", 0.0)

    return Command(_envelope("playerItem", "getCurrentTime", {"identifier": item}), seconds,
                   lambda mirror, value: mirror.move(item, value))


def set_current_time(item: str, seconds: float) -> Command[None]:
    return Command(_envelope("playerItem", "setItemCurrentTime", {"identifier": item, "currentTime": seconds}),
                   effect=lambda mirror, _: mirror.move(item, seconds))


def upsert_queue_player(identifier: str, items: Iterable[str]) -> Command[Status]:
    queue = list(items)

    def remember(mirror: Mirror, _: Status) -> None:
        mirror.players.pop(identifier, None)
        mirror.players[identifier] = MirroredPlayer(list(queue))

    payload = {"identifier": identifier, "playerItemIdentifiers": queue}
    return Command(_envelope("queuePlayer", "upsertWithItems", payload), _status_answer, remember)


def destroy_queue_player(identifier: str) -> Command[None]:
    return Command(_envelope("queuePlayer", "destroy", {"identifier": identifier}),
                   effect=lambda mirror, _: _nothing(mirror.players.pop(identifier, None)))


def set_rate(player: str, rate: float) -> Command[None]:
    return Command(_envelope("queuePlayer", "setRate", {"identifier": player, "rate": rate}))


def advance_to_next_item(player: str) -> Command[None]:
    return Command(_envelope("queuePlayer", "advanceToNextItem", {"identifier": player}))


def edit_queue(name: str, player: str, item: str) -> Command[None]:
    """appendItem, removeItem or replaceCurrentItem."""

    def remember(mirror: Mirror, _: None) -> None:
        if player not in mirror.players:
            return
        items = mirror.players[player].items
        if name == "removeItem":
            items[:] = [other for other in items if other != item]
        elif item not in items:
            items[:] = [*items, item] if name == "appendItem" else [item, *items[1:]]

    return Command(_contained("queuePlayer", name, player, item), effect=remember)


def remove_all_items(player: str) -> Command[None]:
    def remember(mirror: Mirror, _: None) -> None:
        if player in mirror.players:
            mirror.players[player].items.clear()

    return Command(_envelope("queuePlayer", "removeAllItems", {"identifier": player}), effect=remember)


def event_of(envelope: bytes) -> Event | None:
    """None for an event of a later version."""
    message = _schema.decode("VLProtoVelmoMessage", envelope).get("audioFilePlayerMessage", {})
    for kind, named in (("playerItem", _ITEM_EVENTS), ("queuePlayer", _PLAYER_EVENTS)):
        for name, payload in message.get(kind, {}).items():
            if name in named:
                return named[name](payload.get("identifier", ""), payload)
    return None


_ITEM_EVENTS: dict[str, Callable[[str, _schema.Message], Event]] = {
    "setStatus": lambda item, payload: ItemStatusChanged(item, _status(payload)),
    "notifyTimeJumped": lambda item, _: ItemTimeJumped(item),
    "notifyDidPlayToEndTime": lambda item, _: ItemPlayedToEnd(item),
    "notifyFailedToPlayToEndTime": lambda item, _: ItemFailedToPlayToEnd(item),
}
_PLAYER_EVENTS: dict[str, Callable[[str, _schema.Message], Event]] = {
    "setStatus": lambda player, payload: PlayerStatusChanged(player, _status(payload)),
    "setRate": lambda player, payload: PlayerRateChanged(player, payload.get("rate", 0.0)),
    "setCurrentItem": lambda player, payload: CurrentItemChanged(player, payload.get("containedIdentifier")),
}


def restoration(mirror: Mirror, granted: Callable[[str | None], str | None]) -> list[list[Command[Any]]]:
    """What makes the objects again: each list of commands is to be answered before the next one is sent. `granted` makes
    a new token in place of one that was used."""
    assets = [upsert_asset(name, **{**texts, "sandboxExtensionToken": granted(texts.get("sandboxExtensionToken"))})
              for name, texts in mirror.assets.items()]
    places = [(name, mirror.place(name)) for name in mirror.items]
    return [assets, [upsert_item(name, asset) for name, asset in mirror.items.items()],
            [set_current_time(name, seconds) for name, seconds in places if seconds > 0],
            [upsert_queue_player(name, player.items) for name, player in mirror.players.items()],
            [set_rate(name, player.rate) for name, player in mirror.players.items() if player.rate != 0]]
