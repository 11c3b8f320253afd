"""Captures that no host would make: a few packets of one connection with any bytes in them."""

from __future__ import annotations

import struct
from typing import Sequence, Tuple

DEVICE, HOST = 50000, 803
TO_HOST = (DEVICE, HOST)
TO_DEVICE = (HOST, DEVICE)
ACK, PUSH_ACK, SYN = 0x10, 0x18, 0x02

Payload = Tuple[Tuple[int, int], bytes]


def frame(text: bytes) -> bytes:
    return struct.pack("<I", len(text)) + text


def packet(ports: Tuple[int, int], sequence: int, acknowledged: int, data: bytes) -> bytes:
    """A raw IPv4 packet. Checksums are left 0: nobody looks at them."""
    tcp = struct.pack("!HHIIBBHHH", *ports, sequence, acknowledged, 5 << 4, PUSH_ACK, 65535, 0, 0)
    length = 20 + len(tcp) + len(data)
    address = bytes([127, 0, 0, 1])
    header = struct.pack("!BBHHHBBH4s4s", 0x45, 0, length, 0, 0, 64, 6, 0, address, address)
    return header + tcp + data


def capture(payloads: Sequence[Payload], limit: int = 1 << 18) -> bytes:
    """The content of a capture file. Long data are cut into packets.

    @param limit: how many bytes of a packet are captured
    """
    link_type_raw_ip = 101
    result = struct.pack("<IHHiIII", 0xA1B2C3D4, 2, 4, 0, 0, 1 << 18, link_type_raw_ip)
    sent = {TO_HOST: 1, TO_DEVICE: 1}
    seconds = 0
    for ports, data in payloads:
        for begin in range(0, max(len(data), 1), 30000):
            part = data[begin : begin + 30000]
            bytes_ = packet(ports, sent[ports], sent[ports[::-1]], part)
            kept = bytes_[:limit]
            result += struct.pack("<IIII", seconds, 0, len(kept), len(bytes_)) + kept
            sent[ports] += len(part)
            seconds += 1
    return result
