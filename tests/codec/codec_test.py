#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Compares the library (through codec_probe) with dvscodec.py.

    codec_test.py PROBE GOLDEN_DIR [--count N] [--seed N] [--write-golden]

Generates and mutates N buffers (default 3,000, or DVS_CODEC_COUNT) and checks that both sides agree: on accepting or
rejecting, on the status, on every entry and on single values. Then does the same for the checked-in golden files, and
checks that both sides still write those files byte for byte.
"""

import argparse
import json
import os
import random
import re
import struct
import subprocess
import sys

import dvscodec
from dvscodec import Entry, Refused

NAMES = [b"", b"a", b"com.orbeno.common.alias", b"com.orbeno.common.port.volatile.type", b"n" * 126, b"n" * 127,
         b"n" * 128, b"n" * 200, b"switchVersion", b"\xff\xfe\x80", "schaltfl\u00e4che".encode()]
TYPES = [0, 1, 3, 4, 0x10, 0x18, 0x20, 0x24, 0x40, 0x80, 0xFC, 0x103, 0x80000000, 0xFFFFFFFF]


def random_entry(rng):
    name = rng.choice(NAMES) if rng.random() < 0.7 else b"com.orbeno.%d" % rng.randrange(50)
    size = rng.choice([0, 1, 2, 3, 4, 5, 6, 7, 8, rng.randrange(300)])
    return Entry(name, rng.choice(TYPES), rng.randbytes(size))


def random_buffer(rng):
    entries = [random_entry(rng) for _ in range(rng.choice([0, 1, 1, 2, 3, 5, 40]))]
    if rng.random() < 0.2:
        entries.append(Entry(b"nested", 0x10, dvscodec.encode(entries[:3])))
    return dvscodec.encode(entries)


def entry_offsets(buffer):
    at = 12
    while at + 4 <= len(buffer):
        yield at
        size = struct.unpack_from("<I", buffer, at)[0]
        if size < 140 or at + size > len(buffer):
            return
        at += size


def mutate(rng, buffer):
    """Applies one kind of damage; recomputes the checksum half of the time."""
    buffer = bytearray(buffer)
    kind = rng.randrange(7)
    offsets = list(entry_offsets(buffer)) or [12]
    if kind == 0:
        del buffer[rng.randrange(len(buffer) + 1):]
        if len(buffer) >= 16 and rng.random() < 0.5:
            struct.pack_into("<I", buffer, 0, len(buffer))
    elif kind == 1:
        for _ in range(rng.choice([1, 1, 2, 8])):
            buffer[rng.randrange(len(buffer))] = rng.randrange(256)
    elif kind in (2, 3):
        at = rng.choice(offsets) + (0 if kind == 2 else 136)
        if at + 4 <= len(buffer):
            near = struct.unpack_from("<I", buffer, at)[0] + rng.randrange(-8, 9)
            lie = rng.choice([0, 1, 3, 100, 139, 140, 142, 143, near, rng.randrange(600), 0x80000000, 0xFFFFFFFF])
            struct.pack_into("<I", buffer, at, lie & 0xFFFFFFFF)
    elif kind == 4:
        struct.pack_into("<I", buffer, 0, rng.choice([0, 15, 16, 33, 35, len(buffer) - 1, len(buffer) + 1, 0xFFFFFFFF]))
    elif kind == 5:
        struct.pack_into("<HH", buffer, 8, rng.choice([1, 0, 2, 257]), rng.randrange(65536))
    else:
        at = rng.choice(offsets) + 4
        if at + 128 <= len(buffer):
            buffer[at:at + 128] = bytes(rng.choice([b"n" * 128, b"\0" * 128, rng.randbytes(128)]))
        if rng.random() < 0.3:
            buffer += rng.randbytes(rng.randrange(1, 30))
            struct.pack_into("<I", buffer, 0, len(buffer))
    if rng.random() < 0.6 and len(buffer) >= 16:
        length = min(struct.unpack_from("<I", buffer)[0], len(buffer))
        struct.pack_into("<I", buffer, 4, dvscodec.checksum(bytes(buffer[:length])))
    return bytes(buffer)


def to_hex(data):
    return data.hex() or "-"


def words(entries):
    return [word for e in entries for word in (to_hex(e.name), str(e.type), to_hex(e.value))]


def expect_decode(buffer, mask):
    try:
        return " ".join(["0"] + words(dvscodec.decode(buffer, mask)))
    except Refused as refused:
        return str(refused.status)


def expect_value(buffer, name, room):
    try:
        return "0 " + to_hex(dvscodec.get_value(buffer, name, room).ljust(room, b"\xee"))
    except Refused as refused:
        return str(refused.status)


def entries_of(buffer):
    """All entries, also those of type 0, which no mask keeps. Only for buffers that decode."""
    entries, at = [], 12
    while (size := struct.unpack_from("<I", buffer, at)[0]) != 0:
        _, name, kind, length = dvscodec.FIXED.unpack_from(buffer, at)
        entries.append(Entry(name[:127].split(b"\0")[0], kind, buffer[at + 140:at + 140 + length]))
        at += size
    return entries


def expect_view(buffer, answer):
    """Compares offsets only for valid buffers: the offset of a fault is specific to the view."""
    try:
        dvscodec.decode(buffer)
    except Refused as refused:
        return " ".join([str(refused.status)] + answer.split(" ")[1:2])
    return " ".join(["0", "0"] + words(entries_of(buffer)))


def requests_for(rng, buffer):
    """Pairs of a request line and its expected reply (a text, or a function of the reply)."""
    mask = rng.choice([dvscodec.DEFAULT_MASK, dvscodec.DEFAULT_MASK, 0xFFFFFFFF, 0x10, 0])
    name, room = rng.choice(NAMES), rng.choice([0, 4, 300])
    yield f"decode {mask} {to_hex(buffer)}", expect_decode(buffer, mask)
    yield f"value {room} {to_hex(name)} {to_hex(buffer)}", expect_value(buffer, name, room)
    yield f"view {to_hex(buffer)}", lambda answer: expect_view(buffer, answer)


def ask(probe, lines):
    result = subprocess.run([probe], input="\n".join(lines) + "\n", capture_output=True, text=True, check=False)
    answers = result.stdout.split("\n")[:-1]
    if result.returncode != 0 or len(answers) != len(lines):
        sys.exit(f"probe failed ({result.returncode}) after {len(answers)} answers: {result.stderr[-2000:]}")
    return answers


def compare(probe, pairs):
    for (line, expected), answer in zip(pairs, ask(probe, [line for line, _ in pairs])):
        expected = expected(answer) if callable(expected) else expected
        if answer != expected:
            sys.exit(f"disagreement on: {line}\n  library: {answer}\n  codec:   {expected}")


def check_random(probe, count, seed):
    rng = random.Random(seed)
    done, accepted, pairs = 0, 0, []
    while done < count:
        written = random_buffer(rng)
        entries = entries_of(written)
        pairs.append((" ".join(["encode"] + words(entries)), "0 " + to_hex(written)))
        for buffer in [written] + [mutate(rng, written) for _ in range(9)]:
            pairs += requests_for(rng, buffer)
            done += 1
            accepted += expect_decode(buffer, 0).startswith("0")
        if len(pairs) > 2000 or done >= count:
            compare(probe, pairs)
            pairs = []
    if not count // 10 < accepted < count - count // 10:
        sys.exit(f"the mutations are too harmless or too harsh: {accepted} of {done} accepted")
    print(f"{done} buffers agree, {accepted} of them accepted (seed {seed})")


# ---- Golden files ----

def to_entry(item):
    value = bytes.fromhex(item["hex"]) if "hex" in item else item["text"].encode()
    return Entry(item["name"].encode(), item["type"], value)


def to_list(items):
    return None if items is None else [to_entry(item) for item in items]


def golden_buffer(case):
    if "list" in case:
        return dvscodec.encode(to_list(case["list"]))
    return dvscodec.encode_state([(switch["id"].encode(), {
        "version": switch["version"], "class_name": switch["class"].encode(), "max_ports": switch["max_ports"],
        "global_props": to_list(switch.get("global")), "host_props": to_list(switch.get("host")),
        "ports": [(port["id"].encode(), to_list(port["props"])) for port in switch["ports"]],
    }) for switch in case["state"]])


def check_golden(probe, folder, write):
    with open(os.path.join(folder, "cases.json"), encoding="utf-8") as file:
        cases = json.load(file)
    rng = random.Random(1)
    pairs = []
    for name, case in cases.items():
        path = os.path.join(folder, name + ".bin")
        buffer = golden_buffer(case)
        if write:
            with open(path, "wb") as file:
                file.write(buffer)
        with open(path, "rb") as file:
            if file.read() != buffer:
                sys.exit(f"{path} is not what the codec writes")
        pairs.append((" ".join(["encode"] + words(entries_of(buffer))), "0 " + to_hex(buffer)))
        pairs += requests_for(rng, buffer)
        if "state" in case:
            state = dvscodec.decode_state(buffer)
            if dvscodec.encode_state(state) != buffer:
                sys.exit(f"{path} does not survive the codec")
            for _, switch in state:
                for props in [switch["global_props"], switch["host_props"]] + [p for _, p in switch["ports"]]:
                    if props is not None:
                        pairs += requests_for(rng, dvscodec.encode(props))
    compare(probe, pairs)
    print(f"{len(cases)} golden files agree")


def check_document(folder):
    """The hex lines of the document's worked example equal the golden file."""
    path = os.path.join(folder, "..", "..", "docs", "buffer-format.md")
    with open(path, encoding="utf-8") as file:
        rows = re.findall(r"^[0-9a-f]{8}  ((?:[0-9a-f]{2} ?)+)$", file.read(), re.MULTILINE)
    with open(os.path.join(folder, "worked_example.bin"), "rb") as file:
        if bytes.fromhex("".join(rows)) != file.read():
            sys.exit(f"{path}: the worked example is not the golden file")


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument("probe")
    parser.add_argument("golden")
    parser.add_argument("--count", type=int, default=int(os.environ.get("DVS_CODEC_COUNT", "3000")))
    parser.add_argument("--seed", type=int, default=1)
    parser.add_argument("--write-golden", action="store_true")
    args = parser.parse_args()
    check_golden(args.probe, args.golden, args.write_golden)
    check_document(args.golden)
    check_random(args.probe, args.count, args.seed)


if __name__ == "__main__":
    main()
