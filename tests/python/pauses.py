"""The clock of a BackOff in the hands of a test."""

import asyncio

from scripted_host import LIMIT


class Pauses:
    """Stands for the clock of a BackOff: notes each pause and lets the test end it."""

    def __init__(self) -> None:
        self.lengths: "asyncio.Queue[float]" = asyncio.Queue()
        self._ends: "asyncio.Queue[None]" = asyncio.Queue()

    async def __call__(self, seconds: float) -> None:
        self.lengths.put_nowait(seconds)
        await self._ends.get()

    def end(self) -> None:
        """Ends a pause whose length was taken already."""
        self._ends.put_nowait(None)

    async def end_next(self) -> float:
        length = await asyncio.wait_for(self.lengths.get(), LIMIT)
        self.end()
        return length
