"""One TCP connection with its requests."""

from __future__ import annotations

import asyncio
import os
from typing import Callable, Optional

from .errors import ClosedError, ControlError, ProtocolError
from .exchange import Exchange, Request
from .framing import FrameBuffer
from .records import Event


def reason_of(error: Exception) -> str:
    """The system's own words, without the numbers that the event loop puts around them."""
    number = getattr(error, "errno", None)
    if isinstance(number, int) and number > 0:
        return os.strerror(number)
    return getattr(error, "strerror", None) or str(error)


class Link(asyncio.Protocol):
    """Moves bytes between a socket and an Exchange. It reads while it writes: a host that cannot
    write takes nothing either."""

    def __init__(
        self, frame_limit: int, hear: Callable[[Event, int], None], lost: Callable[[Link], None]
    ) -> None:
        self.exchange = Exchange(hear)
        self.error: ControlError = ClosedError("this side closed the connection")
        self._lost = lost
        self._arrived = FrameBuffer(frame_limit)
        self._transport: Optional[asyncio.Transport] = None
        self._may_write = True
        self._gone = asyncio.Event()

    @property
    def open(self) -> bool:
        return self._transport is not None

    def connection_made(self, transport: asyncio.BaseTransport) -> None:
        assert isinstance(transport, asyncio.Transport)
        self._transport = transport

    def data_received(self, data: bytes) -> None:
        self._arrived.add(data)
        try:
            while self.open:
                text = self._arrived.take()
                if text is None:
                    break
                self.exchange.frame_arrived(text)
        except ProtocolError as error:
            self.close(error)
            return
        self.pump()

    def pause_writing(self) -> None:
        self._may_write = False

    def resume_writing(self) -> None:
        self._may_write = True
        self.pump()

    def connection_lost(self, exception: Optional[Exception]) -> None:
        self._gone.set()
        if not self.open:
            return
        rest = self._arrived.describe_rest()
        text = "the host closed the connection"
        if exception is not None:
            text = f"the connection broke: {reason_of(exception)}"
        self._end(ClosedError(f"{text}; {rest}" if rest else text))

    def pump(self) -> None:
        """Sends what may be sent."""
        if self._transport is not None and self._may_write:
            frames = self.exchange.take_sendable()
            if frames:
                self._transport.write(frames)

    def submit(self, request: Request) -> None:
        """Adds a request to those that wait for `pump`. On a lost connection it fails at once."""
        if self.open:
            self.exchange.submit(request)
        else:
            request.done = True
            request.complete(None, self.error)

    def give_up(self, request: Request, error: ControlError) -> None:
        self.exchange.give_up(request, error)
        self.pump()

    def close(self, error: ControlError) -> None:
        """Closes at once. What the host has not read yet may be lost."""
        if self._transport is not None:
            transport = self._transport
            self._end(error)
            transport.abort()

    async def wait_gone(self) -> None:
        """Waits until the socket of a closed connection has been given back."""
        await self._gone.wait()

    def _end(self, error: ControlError) -> None:
        self._transport = None
        self.error = error
        self.exchange.fail_all(error)
        self._lost(self)
