"""Many commands at once, sent without waiting for each reply."""

from __future__ import annotations

import asyncio
from typing import List, Optional, Sequence, Tuple

from .errors import ClosedError, ControlError, TimedOutError
from .exchange import Request
from .link import Link
from .messages import Kind, Message
from .records import CommandReply
from .requests import Parameters, execute_command_request


class Batch:
    """The commands of one call of `execute_batch`.

    Its time limit runs from the last reply, so that a long batch may take long as long as the host
    answers. All of it is checked before any of it is sent.
    """

    def __init__(
        self, link: Link, commands: Sequence[Tuple[str, Parameters]], time_limit: float
    ) -> None:
        self._loop = asyncio.get_running_loop()
        self._link = link
        self._time_limit = time_limit
        self._replies: List[Optional[CommandReply]] = [None] * len(commands)
        self._left = len(commands)
        self._finished: asyncio.Future[None] = self._loop.create_future()
        self._last_reply = 0.0
        self._timer: asyncio.TimerHandle
        self._requests = [
            self._make_request(index, name, parameters)
            for index, (name, parameters) in enumerate(commands)
        ]

    def _make_request(self, index: int, name: str, parameters: Parameters) -> Request:
        correlation = self._link.exchange.next_correlation()
        text = execute_command_request(correlation, name, parameters).encode()

        def complete(message: Optional[Message], error: Optional[ControlError]) -> None:
            self._take(index, message, error)

        return Request(Kind.COMMAND_REPLY, correlation, text, f'the reply to "{name}"', complete)

    async def run(self) -> List[CommandReply]:
        """Raises TimedOutError and ClosedError, which bear the replies that came."""
        if not self._requests:
            return []
        for request in self._requests:
            self._link.submit(request)
        self._last_reply = self._loop.time()
        self._timer = self._loop.call_later(self._time_limit, self._check_time)
        self._link.pump()
        try:
            await self._finished
        finally:
            self._timer.cancel()
            self._give_up(ClosedError("the batch was given up"))
        return [reply for reply in self._replies if reply is not None]

    def _check_time(self) -> None:
        silent = self._loop.time() - self._last_reply
        if self._finished.done():
            return
        if silent < self._time_limit:
            self._timer = self._loop.call_later(self._time_limit - silent, self._check_time)
            return
        first = self._replies.index(None)
        text = (
            f"timed out after {self._time_limit:g} s without any reply, waiting for {self._left} "
            f"of {len(self._replies)} replies, the first of them {self._requests[first].what}"
        )
        self._finished.set_exception(TimedOutError(text, self._replies))

    def _take(self, index: int, message: Optional[Message], error: Optional[ControlError]) -> None:
        if self._finished.done():
            return
        if error is not None:
            self._finished.set_exception(self._failure(error))
            return
        assert message is not None and isinstance(message.content, CommandReply)
        self._replies[index] = message.content
        self._last_reply = self._loop.time()
        self._left -= 1
        if self._left == 0:
            self._finished.set_result(None)

    def _failure(self, error: ControlError) -> ControlError:
        if not isinstance(error, ClosedError):
            return error
        answered = len(self._replies) - self._left
        text = f"{error}; {answered} of the {len(self._replies)} commands had been answered"
        return ClosedError(text, self._replies)

    def _give_up(self, error: ControlError) -> None:
        if self._left:
            for request in self._requests:
                self._link.exchange.give_up(request, error)
            self._link.pump()
