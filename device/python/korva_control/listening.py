"""Events on their way from the connection to those who listen."""

from __future__ import annotations

import asyncio
from collections import deque
from typing import Deque, FrozenSet, Iterable, Optional, Tuple

from .errors import ClosedError, ControlError, TimedOutError, UsageError
from .records import Event


def describe_names(names: Iterable[str]) -> str:
    quoted = " or ".join(f'"{name}"' for name in sorted(names))
    return f"the event {quoted}" if quoted else "an event"


class EventStream:
    """The events of some names, or all, from its making on, in their order.

    Take them with `next`, or with `async for`, which ends where the client is closed. It is a
    context manager; leaving it stops the keeping of events.
    """

    def __init__(self, names: Iterable[str], kept_bytes: int) -> None:
        self._names: FrozenSet[str] = frozenset(names)
        self._kept_bytes = kept_bytes
        self._kept: Deque[Tuple[Event, int]] = deque()
        self._bytes = 0
        self._waiter: Optional[asyncio.Future[None]] = None
        self._end: Optional[ControlError] = None
        self.dropped = 0
        """How many events were dropped since nobody took them."""

    @property
    def open(self) -> bool:
        return self._end is None

    def hear(self, event: Event, size: int) -> None:
        """Keeps an event that came, if it is one of the names."""
        if not self.open or (self._names and event.name not in self._names):
            return
        self._kept.append((event, size))
        self._bytes += size
        while self._bytes > self._kept_bytes and len(self._kept) > 1:
            self._take()
            self.dropped += 1
        self._wake()

    def end(self, error: ControlError) -> None:
        """Nothing more will come. What is kept can still be taken."""
        if self._end is None:
            self._end = error
            self._wake()

    def close(self) -> None:
        self.end(ClosedError("nobody listens any more"))
        self._kept.clear()
        self._bytes = 0

    async def next(self, time_limit: Optional[float] = None) -> Event:
        """Returns the next event, waiting for it if none is kept.

        Raises TimedOutError after so many seconds, and ClosedError where none can come any more.
        One caller at a time; a second one meets UsageError.
        """
        while not self._kept:
            if self._end is not None:
                raise self._end
            await self._wait(time_limit)
        return self._take()

    async def _wait(self, time_limit: Optional[float]) -> None:
        if self._waiter is not None:
            raise UsageError("somebody waits for the next of these events already")
        self._waiter = asyncio.get_running_loop().create_future()
        try:
            await asyncio.wait_for(self._waiter, time_limit)
        except asyncio.TimeoutError:
            raise TimedOutError(
                f"timed out after {time_limit:g} s, waiting for {describe_names(self._names)}"
            ) from None
        finally:
            self._waiter = None

    def _take(self) -> Event:
        event, size = self._kept.popleft()
        self._bytes -= size
        return event

    def _wake(self) -> None:
        if self._waiter is not None and not self._waiter.done():
            self._waiter.set_result(None)

    def __aiter__(self) -> EventStream:
        return self

    async def __anext__(self) -> Event:
        try:
            return await self.next()
        except ClosedError:
            raise StopAsyncIteration from None

    def __enter__(self) -> EventStream:
        return self

    def __exit__(self, *_details: object) -> None:
        self.close()
