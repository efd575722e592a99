"""Plays audio files through the service tarnd.

    import tarn

    with tarn.Client(reconnect_limit=30) as client:
        client.upsert_asset("song", tarn.file_url("song.flac"))
        client.upsert_item("item", "song")
        client.upsert_queue_player("player,org.example.Play", ["item"])
        client.set_rate("player,org.example.Play", 1)
        for event in client.events():
            if isinstance(event, tarn.ItemPlayedToEnd):
                break

AsyncClient is the same on asyncio.
"""

from ._aio import AsyncClient
from ._client import Client
from ._session import default_socket_path, file_url
from ._types import (AssetInfo, CommandFailed, ConnectionLost, CurrentItemChanged, Disconnected, Error, Event,
                     ItemFailedToPlayToEnd, ItemPlayedToEnd, ItemStatusChanged, ItemTimeJumped, PlayerRateChanged,
                     PlayerStatusChanged, Reconnected, Reconnecting, ReplacedByAnother, State, Status, TakenOver)

__all__ = ["AssetInfo", "AsyncClient", "Client", "CommandFailed", "ConnectionLost", "CurrentItemChanged", "Disconnected",
           "Error", "Event", "ItemFailedToPlayToEnd", "ItemPlayedToEnd", "ItemStatusChanged", "ItemTimeJumped",
           "PlayerRateChanged", "PlayerStatusChanged", "Reconnected", "Reconnecting", "ReplacedByAnother", "State",
           "Status", "TakenOver", "default_socket_path", "file_url"]
