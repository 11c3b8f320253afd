"""The frames of the control stream: a 4-byte little-endian length, then so many bytes of UTF-8."""

from __future__ import annotations

import struct
from typing import Optional

from .errors import ProtocolError

_HEADER = struct.Struct("<I")


def encode_frame(text: bytes) -> bytes:
    """Header and text in one piece, so that they leave in one packet where they fit."""
    return _HEADER.pack(len(text)) + text


class FrameBuffer:
    """Cuts the stream that arrives into the texts of frames.

    Memory follows what has arrived, never what a header announces. A header above the limit is a
    ProtocolError, and stays one: where the next frame begins is not known any more.
    """

    def __init__(self, limit: int) -> None:
        self._limit = limit
        self._bytes = bytearray()
        self._begin = 0

    def add(self, data: bytes) -> None:
        if self._begin:
            del self._bytes[: self._begin]
            self._begin = 0
        self._bytes += data

    def take(self) -> Optional[bytes]:
        """Takes the oldest whole frame; None while there is none."""
        start = self._begin + _HEADER.size
        if len(self._bytes) < start:
            return None
        (length,) = _HEADER.unpack_from(self._bytes, self._begin)
        if length > self._limit:
            raise ProtocolError(
                f"the host announced a frame of {length} bytes, above the limit of {self._limit}"
            )
        if len(self._bytes) < start + length:
            return None
        self._begin = start + length
        return bytes(self._bytes[start : self._begin])

    def describe_rest(self) -> str:
        """Says for people how far the last frame has come; empty when nothing is missing of it."""
        rest = len(self._bytes) - self._begin
        if rest == 0:
            return ""
        if rest < _HEADER.size:
            return f"{rest} of the 4 bytes of a header had come"
        (length,) = _HEADER.unpack_from(self._bytes, self._begin)
        return f"{rest - _HEADER.size} of the {length} bytes of a frame had come"
