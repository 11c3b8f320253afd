"""What keeps an operation of the client from being done.

Each text is a sentence without its full stop, to be shown to a person.
"""

from __future__ import annotations

from typing import Optional, Sequence

from .records import CommandReply


class ControlError(Exception):
    """The base of everything that the client raises by itself."""


class UsageError(ControlError):
    """The host would drop the message in silence, or change its content; nothing was sent."""


class NoConnectionError(ControlError):
    """No connection was made, or there is none any more."""


class ProtocolError(ControlError):
    """The host sent something that is not the control stream."""


class _UnfinishedError(ControlError):
    """Ended while replies were missing. `replies` is what a batch got until then, in its order."""

    def __init__(self, text: str, replies: Sequence[Optional[CommandReply]] = ()) -> None:
        super().__init__(text)
        self.replies = list(replies)


class TimedOutError(_UnfinishedError):
    """The time limit ran out; the text says what was waited for. The command may run yet."""


class ClosedError(_UnfinishedError):
    """The host, the network or this side ended the connection. The command may have run."""
