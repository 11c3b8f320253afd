"""One TCP connection with its requests."""

from __future__ import annotations

import asyncio
import os
import socket
from typing import Callable, Optional, Tuple

from .errors import (
    ClosedError,
    ControlError,
    NoConnectionError,
    ProtocolError,
    TimedOutError,
)
from .exchange import Exchange, Request
from .framing import FrameBuffer
from .messages import Kind, Message
from .records import Event, ServerInformation
from .requests import server_information_request


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
        self._was_made = False
        self._gone = asyncio.Event()

    @property
    def open(self) -> bool:
        return self._transport is not None

    def connection_made(self, transport: asyncio.BaseTransport) -> None:
        assert isinstance(transport, asyncio.Transport)
        self._transport = transport
        self._was_made = True

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

    async def connect(self, host: str, port: int, limit: float) -> None:
        """Connects within the limit, and finds out whether a host is there. One that answers has
        also entered this connection among those that hear events."""
        loop = asyncio.get_running_loop()
        end = loop.time() + limit
        where = f"{host}:{port}"
        try:
            await asyncio.wait_for(
                loop.create_connection(lambda: self, host, port, family=socket.AF_INET), limit
            )
        except asyncio.TimeoutError:
            raise TimedOutError(f"timed out after {limit:g} s, connecting to {where}") from None
        except OSError as error:
            raise NoConnectionError(f"no connection to {where}: {reason_of(error)}") from None
        except UnicodeError as error:  # from the look-up: it is no name that a computer can have
            raise NoConnectionError(f"no connection to {where}: {error}") from None
        left = max(end - loop.time(), 0.001)
        await self._greet(f"the server information of {where}", left, limit)
        if not self.open:  # what came behind the answer has ended it
            raise self.error

    async def _greet(self, what: str, left: float, limit: float) -> None:
        text = server_information_request().encode()
        message, _ = await self.ask(Kind.SERVER_INFORMATION, "", text, what, left, limit)
        version = message.content
        assert isinstance(version, ServerInformation)
        if version.major != 1:
            raise ProtocolError(
                f"the host speaks version {version.major}.{version.minor} of the control stream, "
                "this client speaks 1.0"
            )

    async def discard(self, error: BaseException) -> None:
        """Gives back the socket of a connection that did not come about."""
        if self.open:
            self.close(ClosedError(f"the connection was given up: {error}"))
        if self._was_made:
            await self._gone.wait()

    async def ask(
        self, kind: Kind, correlation: str, text: bytes, what: str, left: float, limit: float
    ) -> Tuple[Message, bytes]:
        """Does one exchange. The time left may be less than the limit, of which the error tells.

        @return the reply and the text of its frame
        """
        loop = asyncio.get_running_loop()
        done: asyncio.Future[Tuple[Message, bytes]] = loop.create_future()

        def complete(message: Optional[Message], error: Optional[ControlError]) -> None:
            if done.done():
                return
            if message is not None:
                done.set_result((message, self.exchange.raw_frame))
            elif error is not None:
                done.set_exception(error)

        request = Request(kind, correlation, text, what, complete)
        self.submit(request)
        expired = TimedOutError(f"timed out after {limit:g} s, waiting for {what}")
        timer = loop.call_later(left, self.give_up, request, expired)
        self.pump()
        try:
            return await done
        finally:
            timer.cancel()
            if not request.done:
                self.give_up(request, ClosedError("the request was given up"))

    def post(self, kind: Kind, correlation: str, text: bytes, limit: float) -> None:
        """Sends a request whose reply nobody waits for. It counts as unanswered up to the limit."""
        request = Request(kind, correlation, text, "nothing", lambda message, error: None)
        self.submit(request)
        expired = TimedOutError("nobody waits for the reply")
        asyncio.get_running_loop().call_later(limit, self.give_up, request, expired)
        self.pump()

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
