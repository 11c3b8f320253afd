"""Which reply belongs to which request, without any input or output.

Replies to commands and to the two requests that carry a correlation are matched by it. The other
three kinds bear nothing to match by; but the host answers in the order in which it was asked, so
that their replies belong to the oldest request of that kind. One that was given up leaves a reply
behind that may come late, or never. Before the next request of such a kind a `Commands` request is
therefore sent, whose reply tells that everything before it has passed.
"""

from __future__ import annotations

from collections import deque
from dataclasses import dataclass
from typing import Callable, Deque, Dict, List, Optional

from . import requests
from .errors import ControlError, ProtocolError
from .framing import encode_frame
from .messages import Kind, Message, parse_message
from .records import Event

WINDOW = 64 * 1024
"""How many bytes of requests may be unanswered. A host that cannot write a reply stops reading."""

Complete = Callable[[Optional[Message], Optional[ControlError]], None]


@dataclass(eq=False)
class Request:
    """One request on its way. It is completed once, by a message or by an error."""

    kind: Kind  # of the reply; UNKNOWN for whatever comes
    correlation: str
    text: bytes
    what: str  # is waited for, in words for people
    complete: Complete
    sent: bool = False
    done: bool = False

    @property
    def size(self) -> int:
        return len(self.text)


class Exchange:
    """The requests of one connection: some wait to be sent, the others for a reply."""

    def __init__(self, hear: Callable[[Event, int], None]) -> None:
        self._hear = hear
        self._correlations = 0
        self._waiting: Deque[Request] = deque()
        self._by_correlation: Dict[str, Request] = {}
        self._in_order: Deque[Request] = deque()  # those without a correlation, and what parts them
        self._unanswered = 0
        self._out_of_step = False
        self._raw_frame = b""

    @property
    def raw_frame(self) -> bytes:
        """The text of the frame that completes a request, for as long as it does so."""
        return self._raw_frame

    @property
    def unanswered(self) -> int:
        """How many bytes of requests are on their way."""
        return self._unanswered

    def next_correlation(self) -> str:
        self._correlations += 1
        return str(self._correlations)

    def submit(self, request: Request) -> None:
        """Adds a request to those that wait to be sent."""
        self._waiting.append(request)

    def take_sendable(self) -> bytes:
        """Takes the frames that may be sent now. A request above the window goes alone."""
        frames: List[bytes] = []
        while self._waiting:
            request = self._waiting[0]
            if self._unanswered and self._unanswered + request.size > WINDOW:
                break
            self._waiting.popleft()
            if self._out_of_step and not request.correlation:
                frames.append(self._parting_frame())
            frames.append(encode_frame(request.text))
            self._register(request)
        return b"".join(frames)

    def _register(self, request: Request) -> None:
        request.sent = True
        self._unanswered += request.size
        if request.correlation:
            self._by_correlation[request.correlation] = request
            return
        self._in_order.append(request)
        if request.kind is Kind.UNKNOWN:
            self._out_of_step = True  # nobody knows what it asks for

    def _parting_frame(self) -> bytes:
        correlation = self.next_correlation()
        parting = Request(
            Kind.COMMANDS,
            correlation,
            requests.commands_request(correlation).encode(),
            "the list of commands, which tells that late replies have passed",
            lambda message, error: None,
        )
        self._in_order.append(parting)
        self._register(parting)
        self._out_of_step = False
        return encode_frame(parting.text)

    def give_up(self, request: Request, error: ControlError) -> None:
        """Completes a request by an error. Its reply, should it come, is passed over."""
        if request.done:
            return
        request.done = True
        if not request.sent:
            self._waiting.remove(request)
        elif request.correlation:
            if self._by_correlation.pop(request.correlation, None) is not None:
                self._unanswered -= request.size
        else:
            self._unanswered -= request.size
            self._out_of_step = True
        request.complete(None, error)

    def fail_all(self, error: ControlError) -> None:
        """The connection has gone: completes every request by the error."""
        lost = list(self._by_correlation.values())
        lost += [r for r in self._in_order if not r.correlation and not r.done]
        lost += self._waiting
        self._by_correlation.clear()
        self._in_order.clear()
        self._waiting.clear()
        self._unanswered = 0
        for request in lost:
            request.done = True
            request.complete(None, error)

    def frame_arrived(self, text: bytes) -> None:
        """Takes the text of a frame: an event, or the reply to a request."""
        try:
            message = parse_message(text)
        except ProtocolError as error:
            self._unreadable(text, error)
            return
        if message.kind is Kind.EVENT and isinstance(message.content, Event):
            self._hear(message.content, len(text))
            return
        request = self._find(message)
        if request is not None:
            self._raw_frame = text
            self._answer(request, message)

    def _unreadable(self, text: bytes, error: ProtocolError) -> None:
        raw = self._take_in_order(Kind.UNKNOWN)
        if raw is not None and not raw.done:
            self._raw_frame = text
            self._answer(raw, Message(Kind.UNKNOWN, "", None))
            return
        # Whose reply it was cannot be told. The framing is whole, so that the connection is too.
        for request in [*self._by_correlation.values(), *self._in_order]:
            if not request.done:
                self.give_up(request, error)

    def _find(self, message: Message) -> Optional[Request]:
        request = self._by_correlation.get(message.correlation)
        if request is not None and request.kind is message.kind:
            del self._by_correlation[message.correlation]
            self._pass_parting(request)
            return request
        return self._take_in_order(message.kind)

    def _pass_parting(self, request: Request) -> None:
        """Whatever was asked before a parting request and has no reply yet never gets one."""
        if request.kind is Kind.COMMANDS and request in self._in_order:
            while self._in_order.popleft() is not request:
                pass

    def _take_in_order(self, kind: Kind) -> Optional[Request]:
        for request in self._in_order:
            if request.correlation:
                return None  # late: it belongs to something from before the parting
            if request.kind in (kind, Kind.UNKNOWN):
                self._in_order.remove(request)
                return request
        return None

    def _answer(self, request: Request, message: Message) -> None:
        if not request.done:
            request.done = True
            self._unanswered -= request.size
            request.complete(message, None)
