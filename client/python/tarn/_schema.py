"""Encodes and decodes the messages that the two .proto files declare, which it reads when the package is imported.

A message is a dictionary by field names; a field that is absent has no entry. Only what the files use is known:
proto2 without groups, extensions, enumerations or nested declarations.
"""

from __future__ import annotations

import re
import struct
from importlib import resources
from typing import Any, Mapping, NamedTuple

Message = dict[str, Any]

_DECLARATION = re.compile(r"message\s+(\w+)\s*\{([^}]*)\}")
_FIELD = re.compile(r"(optional|required|repeated)\s+(\w+)\s+(\w+)\s*=\s*(\d+)\s*;")
_VARINT, _DOUBLE, _TEXT, _FLOAT = 0, 1, 2, 5
_WIRE_TYPES = {"bool": _VARINT, "int32": _VARINT, "int64": _VARINT, "uint32": _VARINT, "uint64": _VARINT,
               "double": _DOUBLE, "float": _FLOAT}


class _Field(NamedTuple):
    number: int
    name: str
    type: str
    repeated: bool


def _declared() -> dict[str, list[_Field]]:
    found = {}
    for file in ("velmo.proto", "transport.proto"):
        text = resources.files(__package__).joinpath("proto", file).read_text(encoding="utf-8")
        for name, body in _DECLARATION.findall(re.sub(r"//.*", "", text)):
            found[name] = [_Field(int(number), field, kind, label == "repeated")
                           for label, kind, field, number in _FIELD.findall(body)]
    return found


_MESSAGES = _declared()


def _varint(value: int) -> bytes:
    value &= (1 << 64) - 1  # negative numbers are written as those of 64 bits
    parts = bytearray()
    while value > 127:
        parts.append(value & 127 | 128)
        value >>= 7
    parts.append(value)
    return bytes(parts)


def _value(kind: str, value: Any) -> bytes:
    if kind == "double":
        return struct.pack("<d", value)
    if kind == "float":
        return struct.pack("<f", value)
    if kind in _WIRE_TYPES:
        return _varint(int(value))
    data: bytes = value.encode() if kind == "string" else bytes(value) if kind == "bytes" else encode(kind, value)
    return _varint(len(data)) + data


def encode(name: str, message: Mapping[str, Any]) -> bytes:
    """The bytes of a message; a field whose value is None is absent. KeyError for a field that the message does not have."""
    fields = {field.name: field for field in _MESSAGES[name]}
    encoded = bytearray()
    for key, content in sorted(message.items(), key=lambda entry: fields[entry[0]].number):
        field = fields[key]
        for value in content if field.repeated else [content]:
            if value is not None:
                encoded += _varint(field.number << 3 | _WIRE_TYPES.get(field.type, _TEXT)) + _value(field.type, value)
    return bytes(encoded)


class _Reader:
    def __init__(self, data: bytes):
        self.data, self.place = data, 0

    def take(self, size: int) -> bytes:
        if size > len(self.data) - self.place:
            raise ValueError("the message is cut off")
        self.place += size
        return self.data[self.place - size:self.place]

    def varint(self) -> int:
        value = 0
        for shift in range(0, 70, 7):
            byte = self.take(1)[0]
            value |= (byte & 127) << shift
            if byte < 128:
                return value & (1 << 64) - 1
        raise ValueError("a number has no end")

    def raw(self, wire_type: int) -> Any:
        """A number as it stands, or bytes."""
        if wire_type == _VARINT:
            return self.varint()
        if wire_type == _TEXT:
            return self.take(self.varint())
        if wire_type in (_DOUBLE, _FLOAT):
            return self.take(8 if wire_type == _DOUBLE else 4)
        raise ValueError("a field has an unknown wire type")


def _meaning(kind: str, raw: Any) -> Any:
    if kind == "string":
        return raw.decode()
    if kind == "bytes":
        return raw
    if kind == "double" or kind == "float":
        return struct.unpack("<d" if kind == "double" else "<f", raw)[0]
    if kind == "bool":
        return raw != 0
    if kind.startswith("int"):
        bits = int(kind[3:])
        low = raw & (1 << bits) - 1
        return low - (1 << bits) if low >> bits - 1 else low
    if kind.startswith("uint"):
        return raw & (1 << int(kind[4:])) - 1
    return decode(kind, raw)


def decode(name: str, data: bytes) -> Message:
    """The message of these bytes; fields that are not known are passed over. ValueError when it is none."""
    fields = {field.number: field for field in _MESSAGES[name]}
    message: Message = {}
    reader = _Reader(data)
    while reader.place < len(data):
        key = reader.varint()
        raw = reader.raw(key & 7)
        field = fields.get(key >> 3)
        if field is None:
            continue
        if key & 7 != _WIRE_TYPES.get(field.type, _TEXT):
            raise ValueError(f"{name}.{field.name} is of another kind")
        value = _meaning(field.type, raw)
        if field.repeated:
            message.setdefault(field.name, []).append(value)
        else:
            message[field.name] = value
    return message
