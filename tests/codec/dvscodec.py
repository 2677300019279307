# SPDX-License-Identifier: Apache-2.0
"""Serialized property lists in plain Python, written from docs/buffer-format.md independently of the library.

An independent implementation catches mistakes that the library and its tools share; codec_test.py compares the two.
It uses the standard library only.

A list is a Python list of Entry. `encode` returns the only form that the library writes. `decode` accepts and rejects
the same buffers as the library's deserializer, with the same status. `get_value` looks up one value.
"""

import struct
from collections import namedtuple

OK = 0
NOT_FOUND = 0x0BAD0003
LIMIT_EXCEEDED = 0x0BAD0006
BAD_PARAM = 0x0BAD0007
BAD_CHECKSUM = 0x0BAD003A

HEADER = struct.Struct("<IIHH")
FIXED = struct.Struct("<I128sII")
DEFAULT_MASK = 0x800000FC

Entry = namedtuple("Entry", "name type value")


class Refused(Exception):
    """The buffer is rejected; `status` says why."""

    def __init__(self, status, why):
        super().__init__(f"{why} (0x{status:08x})")
        self.status = status


def checksum(buffer):
    """The sum of all bytes after the first 32, for a whole buffer of the length in its header."""
    whole = len(buffer) // 4 * 4
    total = sum(word for (word,) in struct.iter_unpack("<I", buffer[32:whole])) if whole > 32 else 0
    total += sum(buffer[max(whole, 32):])
    return total & 0xFFFFFFFF


def entry_size(data_len):
    return (data_len + 146) & ~3


def encode_entry(entry):
    name = entry.name.split(b"\0")[0][:127]
    size = entry_size(len(entry.value))
    fixed = FIXED.pack(size, name, entry.type, len(entry.value))
    return (fixed + entry.value).ljust(size, b"\0")


def frame(body):
    """Header and end marker around the entries."""
    length = 12 + len(body) + 4
    buffer = bytearray(HEADER.pack(length, 0, 1, 0) + body + bytes(4))
    struct.pack_into("<I", buffer, 4, checksum(buffer))
    return bytes(buffer)


def encode(entries):
    return frame(b"".join(encode_entry(entry) for entry in entries))


def _lengths(buffer):
    if len(buffer) < 16:
        raise Refused(BAD_PARAM, "shorter than header and marker")
    length = struct.unpack_from("<I", buffer)[0]
    if length < 16:
        raise Refused(BAD_PARAM, "header length too small")
    if length > len(buffer):
        raise Refused(BAD_PARAM, "header length too large")
    return buffer[:length]


def _version(buffer):
    if struct.unpack_from("<H", buffer, 8)[0] != 1:
        raise Refused(BAD_PARAM, "unknown version")


def _checksum(buffer):
    if struct.unpack_from("<I", buffer, 4)[0] != checksum(buffer):
        raise Refused(BAD_CHECKSUM, "wrong checksum")


def decode(buffer, mask=DEFAULT_MASK):
    """The entries of a list read from the buffer. Raises Refused."""
    buffer = _lengths(bytes(buffer))
    _version(buffer)
    _checksum(buffer)
    entries = []
    at = 12
    while True:
        left = len(buffer) - at
        if left < 4:
            raise Refused(BAD_PARAM, "no end marker")
        (size,) = struct.unpack_from("<I", buffer, at)
        if size == 0:
            return entries
        if size > left:
            raise Refused(BAD_PARAM, "entry beyond the end")
        if size < 143:
            raise Refused(BAD_PARAM, "entry without its fixed part")
        _, name, kind, data_len = FIXED.unpack_from(buffer, at)
        if data_len > size or size - data_len < 143:
            raise Refused(BAD_PARAM, "entry size and value length disagree")
        if kind & mask:
            entries.append(Entry(name[:127].split(b"\0")[0], kind, buffer[at + 140:at + 140 + data_len]))
        at += size


def get_value(buffer, name, room):
    """The value of the first entry of that name, for a receiver of `room` bytes. Raises Refused."""
    buffer = _lengths(bytes(buffer))
    _checksum(buffer)
    _version(buffer)
    at = 12
    while True:
        left = len(buffer) - at
        if left < 4:
            raise Refused(BAD_PARAM, "no end marker")
        (size,) = struct.unpack_from("<I", buffer, at)
        if size == 0:
            raise Refused(NOT_FOUND, "no such name")
        if size > left:
            raise Refused(BAD_PARAM, "entry beyond the end")
        if left < 140:
            raise Refused(BAD_PARAM, "fixed part beyond the end")
        _, field, _, data_len = FIXED.unpack_from(buffer, at)
        if (field.split(b"\0")[0] if b"\0" in field else field) == name[:128]:
            if data_len > left - 140:
                raise Refused(BAD_PARAM, "value beyond the end")
            if data_len > room:
                raise Refused(LIMIT_EXCEEDED, "no room for the value")
            return buffer[at + 140:at + 140 + data_len]
        at += size


# ---- The nesting of a whole switch state ----

def encode_switch(switch):
    """`switch`: a dict of version, class_name, max_ports, global_props, host_props (None: absent), ports (id, entries)."""
    entries = [
        Entry(b"switchVersion", 0x10, struct.pack("<I", switch["version"])),
        Entry(b"className", 0x10, switch["class_name"].ljust(128, b"\0")),
        Entry(b"maxPorts", 0x10, struct.pack("<I", switch["max_ports"])),
    ]
    for name, key in ((b"globalPropList", "global_props"), (b"hostPropList", "host_props")):
        if switch[key] is not None:
            entries.append(Entry(name, 0x10, encode(switch[key])))
    entries += [Entry(port_id, 0x10, encode(props)) for port_id, props in switch["ports"]]
    return encode(entries)


def encode_state(switches):
    """`switches`: pairs of switch id and the dict of encode_switch."""
    return encode([Entry(switch_id, 0x10, encode_switch(switch)) for switch_id, switch in switches])


def decode_switch(buffer):
    switch = {"global_props": None, "host_props": None, "ports": []}
    fields = {b"switchVersion": "version", b"className": "class_name", b"maxPorts": "max_ports"}
    lists = {b"globalPropList": "global_props", b"hostPropList": "host_props"}
    for entry in decode(buffer):
        if fields.get(entry.name) == "class_name":
            switch["class_name"] = entry.value.split(b"\0")[0]
        elif entry.name in fields:
            switch[fields[entry.name]] = struct.unpack("<I", entry.value)[0]
        elif entry.name in lists:
            switch[lists[entry.name]] = decode(entry.value)
        else:
            switch["ports"].append((entry.name, decode(entry.value)))
    return switch


def decode_state(buffer):
    return [(entry.name, decode_switch(entry.value)) for entry in decode(buffer)]
