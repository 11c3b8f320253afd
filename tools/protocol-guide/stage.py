"""A device without a library: bytes to and from a running host, kept as they were."""

from __future__ import annotations

import socket
import struct
from dataclasses import dataclass
from typing import List, Optional

LIMIT = 60.0
DECLARATION = '<?xml version="1.0" encoding="UTF-16" standalone="no"?>'
SERVER_INFORMATION = "<ServerInformation/>"


@dataclass(frozen=True)
class Frame:
    """The bytes of one frame."""

    header: bytes
    body: bytes

    @property
    def text(self) -> str:
        return self.body.decode()

    @property
    def hexadecimal(self) -> str:
        return self.header.hex(" ").upper()


@dataclass(frozen=True)
class Exchange:
    """A request with its reply; the request alone where the host is silent."""

    request: Frame
    reply: Optional[Frame]


class Surprise(Exception):
    """The running host does something else than the guide tells."""


def is_event(frame: Frame) -> bool:
    return frame.text.startswith(DECLARATION + "<Event>")


def event_name(frame: Frame) -> str:
    return frame.text.split("<Name>", 1)[1].split("</Name>", 1)[0]


class Device:
    """One connection to the host. Events that come meanwhile are kept for `event`."""

    def __init__(self) -> None:
        self._socket = socket.create_connection(("127.0.0.1", 803), LIMIT)
        self._socket.setsockopt(socket.IPPROTO_TCP, socket.TCP_NODELAY, 1)
        self._events: List[Frame] = []
        self.exchange(SERVER_INFORMATION)  # a host that answers has entered it among its devices

    def close(self) -> None:
        self._socket.close()

    def send(self, text: str) -> Frame:
        body = text.encode()
        frame = Frame(struct.pack("<I", len(body)), body)
        self.send_bytes(frame.header + frame.body)
        return frame

    def send_bytes(self, data: bytes) -> None:
        self._socket.sendall(data)

    def _read(self, count: int) -> bytes:
        data = b""
        while len(data) < count:
            part = self._socket.recv(count - len(data))
            if not part:
                raise Surprise("the host closed the connection")
            data += part
        return data

    def _receive(self) -> Frame:
        header = self._read(4)
        return Frame(header, self._read(struct.unpack("<I", header)[0]))

    def reply(self) -> Frame:
        """Returns the next frame that is no event."""
        while True:
            frame = self._receive()
            if not is_event(frame):
                return frame
            self._events.append(frame)

    def exchange(self, text: str) -> Exchange:
        return Exchange(self.send(text), self.reply())

    def expect_silence(self, text: str) -> Exchange:
        """Proves that nothing comes: the host answers in order, and the next request is answered."""
        request = self.send(text)
        self.send(SERVER_INFORMATION)
        reply = self.reply()
        if "<StreamVersion " not in reply.text:
            raise Surprise(f"{text} was to be met with silence, and got {reply.text}")
        return Exchange(request, None)

    def event(self, name: str) -> Frame:
        """Returns the oldest event of the name, waiting for it."""
        while True:
            for frame in self._events:
                if event_name(frame) == name:
                    self._events.remove(frame)
                    return frame
            frame = self._receive()
            if not is_event(frame):
                raise Surprise(f"waited for {name}, got {frame.text}")
            self._events.append(frame)
