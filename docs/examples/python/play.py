#!/usr/bin/env python3
"""Plays a file through the service, with nothing but its published messages.

Make its two modules first, in this folder; Debian has what that takes in protobuf-compiler and python3-protobuf:
    protoc --python_out=. -I ../../../proto velmo.proto transport.proto
An installation has the messages in share/tarn/proto.
"""
import os
import pathlib
import socket
import struct
import sys

import transport_pb2
import velmo_pb2

CALL, REPLY, RELEASED, EVENT = 1, 3, 4, 5
HEADER = struct.Struct("<IB3xQ")


def receive(connection):
    """The next frame: its kind, its call id and its body."""
    def exactly(size):
        data = b""
        while len(data) < size:
            part = connection.recv(size - len(data))
            if not part:
                raise SystemExit("the service has ended the connection")
            data += part
        return data

    size, kind, call = HEADER.unpack(exactly(HEADER.size))
    return kind, call, exactly(size)


def call(connection, fill):
    """Sends a command and returns its answer; none when it has none."""
    envelope = velmo_pb2.VLProtoVelmoMessage()
    fill(envelope.audioFilePlayerMessage)
    body = envelope.SerializeToString()
    connection.sendall(HEADER.pack(len(body), CALL, 1) + body)
    while True:
        kind, _, body = receive(connection)
        if kind == RELEASED:
            return None
        if kind == REPLY:
            reply = transport_pb2.TransportReply.FromString(body)
            if reply.HasField("error"):
                raise SystemExit("; ".join(entry.value for entry in reply.error.userInfo))
            return reply.data


def make_asset(message):
    command = message.asset.upsertWithMetaData
    command.identifier = "file"
    command.URL = pathlib.Path(sys.argv[1]).resolve().as_uri()


def make_item(message):
    command = message.playerItem.upsertWithAsset
    command.identifier = "item"
    command.containedIdentifier = "file"


def make_player(message):
    command = message.queuePlayer.upsertWithItems
    command.identifier = "player,org.example.Play"
    command.playerItemIdentifiers.append("item")


def start(message):
    command = message.queuePlayer.setRate
    command.identifier = "player,org.example.Play"
    command.rate = 1


connection = socket.socket(socket.AF_UNIX)
connection.connect(os.path.join(os.environ.get("XDG_RUNTIME_DIR", "/run"), "ostrel.tarnd"))
for command in (make_asset, make_item, make_player, start):
    call(connection, command)
while True:
    kind, _, body = receive(connection)
    if kind != EVENT:
        continue
    item = velmo_pb2.VLProtoVelmoMessage.FromString(body).audioFilePlayerMessage.playerItem
    if item.HasField("notifyDidPlayToEndTime"):
        raise SystemExit(0)
    if item.HasField("notifyFailedToPlayToEndTime"):
        raise SystemExit("the file could not be played")
