"""What can be chosen about a client."""

from __future__ import annotations

import asyncio
import enum
import random
from dataclasses import dataclass, field
from typing import Awaitable, Callable, Iterator, Optional


@dataclass(frozen=True)
class BackOff:
    """How long to wait between attempts to reconnect, in seconds.

    Each pause is `factor` times the one before, up to `longest`, and up to the share `jitter` of it
    shorter by chance, so that a room full of devices does not come back at one instant.
    """

    first: float = 0.25
    factor: float = 2.0
    longest: float = 10.0
    jitter: float = 0.2
    pause: Callable[[float], Awaitable[object]] = field(default=asyncio.sleep, repr=False)

    def seconds(self) -> Iterator[float]:
        """The pauses, without end."""
        length = self.first
        while True:
            yield length * (1.0 - self.jitter * random.random())
            length = min(length * self.factor, self.longest)


@dataclass(frozen=True)
class ClientOptions:
    """The defaults suit a device on the stage's own network."""

    time_limit: float = 5.0
    """Seconds that connecting, or a request, may take from its making to its reply."""

    reconnect: Optional[BackOff] = None
    """Where one is given, a lost connection is made anew, and authorized anew where it was.

    Requests that were on their way fail with ClosedError all the same, as the host may have run
    them. Those made meanwhile wait for the connection within their time limit.
    """

    heartbeat_seconds: float = 1.0
    """The pause between two beats of an authorized device. After 3.5 s without one another device
    may take its place."""

    frame_limit: int = 64 << 20
    """The longest frame that is accepted from the host, in bytes."""

    kept_event_bytes: int = 16 << 20
    """How many bytes of events each listener keeps for a caller who does not take them. Beyond that
    the oldest are dropped, and counted; the newest is kept whatever its size."""


class State(enum.Enum):
    """Where a client stands; see `AsyncClient.on_state`."""

    CONNECTED = "connected"
    LOST = "lost"
    ATTEMPT_FAILED = "attempt failed"
    AUTHORIZED = "authorized"
    NOT_AUTHORIZED = "not authorized"
    HEARTBEAT_FAILED = "heartbeat failed"
    CLOSED = "closed"
