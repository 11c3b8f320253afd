"""The client for asyncio."""

from __future__ import annotations

import asyncio
import inspect
from typing import Awaitable, Callable, Dict, List, Optional, Sequence, Tuple, Type, TypeVar, Union

from . import requests
from .authorizing import Authorizer
from .batching import Batch
from .errors import (
    ClosedError,
    ControlError,
    NoConnectionError,
    TimedOutError,
    UsageError,
)
from .link import Link
from .listening import EventStream
from .messages import Kind, Message
from .options import ClientOptions, State
from .records import (
    DEFAULT_PORT,
    Authorization,
    CommandInformation,
    CommandReply,
    Event,
    EventInformation,
    ServerInformation,
)
from .requests import Parameters

EventHandler = Callable[[Event], Union[None, Awaitable[None]]]
StateHandler = Callable[[State, str], None]
_Content = TypeVar("_Content")
_CLOSED_HERE = "this side closed the connection"


class AsyncClient:
    """One device's connection to a host: requests with their replies, and the host's events.

    It belongs to the event loop in which `connect` is called. Any number of requests may be open at
    once, and events are heard meanwhile. Requests are checked before they are sent, since the host
    answers a faulty message with silence.
    """

    def __init__(self, options: ClientOptions = ClientOptions()) -> None:
        self._options = options
        self._address = ("", 0)
        self._link: Optional[Link] = None
        self._closed: ControlError = NoConnectionError("there is no connection to a host")
        self._ended: Optional[ClosedError] = None  # no event can come any more
        self._ready: Optional[asyncio.Event] = None
        self._streams: List[EventStream] = []
        self._handlers: Dict[str, List[EventHandler]] = {}
        self._state_handlers: List[StateHandler] = []
        self._handled: Optional[EventStream] = None
        self._handler_task: Optional[asyncio.Task[None]] = None
        self._opening: Optional[asyncio.Task[None]] = None
        self._reconnect_task: Optional[asyncio.Task[None]] = None
        self._last_attempt = ""
        self._authorizer = Authorizer(
            self, options.heartbeat_seconds, self._tell, self._post
        )

    # The connection.

    async def connect(
        self, host: str, port: int = DEFAULT_PORT, time_limit: Optional[float] = None
    ) -> None:
        """Connects, and waits until the host has answered: from then on no event is missed.

        The host is a name or an IPv4 address: hosts listen on IPv4 alone.
        """
        if not host or "\0" in host or not 0 < port < 65536:
            raise UsageError("a connection needs the name of a host and a port")
        if self._ready is not None:
            await self.close()
        self._ended = None
        self._address = (host, port)
        self._closed = NoConnectionError("there is no connection to a host")
        ready = self._ready = asyncio.Event()
        opening = self._opening = asyncio.ensure_future(self._open(ready, self._limit(time_limit)))
        try:
            await opening
        except BaseException:
            if self._ready is not ready:  # another task has closed this client meanwhile
                raise ClosedError(_CLOSED_HERE) from None
            self._ready = None
            raise

    async def _open(self, ready: asyncio.Event, limit: float) -> None:
        host, port = self._address
        link = Link(self._options.frame_limit, self._hear, self._link_lost)
        try:
            await link.connect(host, port, limit)
            if self._ready is not ready:
                raise ClosedError(_CLOSED_HERE)
        except BaseException as error:
            await link.discard(error)
            raise
        self._link = link
        ready.set()
        self._tell(State.CONNECTED, f"{host}:{port}")

    @property
    def connected(self) -> bool:
        return self._link is not None

    async def close(self) -> None:
        """Closes at once and ends whatever waits. What the host has not read yet may be lost."""
        ready = self._ready
        self._ready = None
        self._closed = ClosedError(_CLOSED_HERE)
        self._authorizer.forget()
        for task in (self._opening, self._reconnect_task, self._handler_task):
            if task is not None and task is not asyncio.current_task():
                task.cancel()
        self._reconnect_task = None
        link = self._link
        if link is not None:
            link.close(self._closed)
        self._end_streams(self._closed)
        if ready is not None:
            ready.set()  # for those who wait for a connection
            self._tell(State.CLOSED, str(self._closed))
        if link is not None:
            await link.wait_gone()

    async def __aenter__(self) -> AsyncClient:
        return self

    async def __aexit__(self, *_details: object) -> None:
        await self.close()

    def on_state(self, handler: StateHandler) -> None:
        """Calls a function at each change of the connection or authorization, with words on it."""
        self._state_handlers.append(handler)

    def _tell(self, state: State, text: str) -> None:
        for handler in list(self._state_handlers):
            try:
                handler(state, text)
            except Exception as error:
                self._report(f"the handler of the state {state.value} failed", error)

    @staticmethod
    def _report(message: str, error: Exception) -> None:
        asyncio.get_running_loop().call_exception_handler(
            {"message": f"korva_control: {message}", "exception": error}
        )

    def _link_lost(self, link: Link) -> None:
        if link is not self._link:
            return
        self._link = None
        self._authorizer.pause()
        if self._ready is None:
            return
        self._ready.clear()
        self._tell(State.LOST, str(link.error))
        if self._options.reconnect is None:
            self._closed = link.error
            self._ready = None
            self._end_streams(link.error)
            self._tell(State.CLOSED, str(link.error))
            return
        if self._reconnect_task is not None:
            self._reconnect_task.cancel()  # it may still be asking for the authorization
        self._reconnect_task = asyncio.get_running_loop().create_task(self._reconnect())

    def _end_streams(self, error: ControlError) -> None:
        self._ended = error if isinstance(error, ClosedError) else ClosedError(str(error))
        for stream in self._streams:
            stream.end(self._ended)
        self._streams.clear()
        self._handled = None

    async def _reconnect(self) -> None:
        back_off = self._options.reconnect
        ready = self._ready
        assert back_off is not None and ready is not None
        for pause in back_off.seconds():
            await back_off.pause(pause)
            try:
                await self._open(ready, self._options.time_limit)
                break
            except ControlError as error:
                self._last_attempt = str(error)
                self._tell(State.ATTEMPT_FAILED, str(error))
        await self._authorizer.resume(back_off)

    # Requests.

    def _limit(self, time_limit: Optional[float]) -> float:
        limit = self._options.time_limit if time_limit is None else time_limit
        if not limit > 0:
            raise UsageError("a time limit is a number of seconds above 0")
        return limit

    async def _require_link(self, limit: float, what: str) -> Link:
        loop = asyncio.get_running_loop()
        end = loop.time() + limit
        # Once more where a host greets and goes before this task comes to its turn.
        while self._link is None and self._ready is not None and self._options.reconnect:
            try:
                await asyncio.wait_for(self._ready.wait(), max(end - loop.time(), 0))
            except asyncio.TimeoutError:
                last = f"; the last attempt: {self._last_attempt}" if self._last_attempt else ""
                raise TimedOutError(
                    f"timed out after {limit:g} s, waiting for a connection to ask for {what}{last}"
                ) from None
        if self._link is None:
            raise self._closed
        return self._link

    async def _exchange(
        self,
        kind: Kind,
        make: Callable[[str], str],
        what: str,
        content: Callable[[Message], _Content],
        time_limit: Optional[float],
        correlated: bool = True,
    ) -> _Content:
        limit = self._limit(time_limit)
        make("1")  # refuses at once, connected or not
        loop = asyncio.get_running_loop()
        end = loop.time() + limit
        link = await self._require_link(limit, what)
        correlation = link.exchange.next_correlation() if correlated else ""
        left = max(end - loop.time(), 0.001)
        text = make(correlation).encode()
        message, _ = await link.ask(kind, correlation, text, what, left, limit)
        return content(message)

    async def server_information(self, time_limit: Optional[float] = None) -> ServerInformation:
        return await self._exchange(
            Kind.SERVER_INFORMATION,
            lambda _: requests.server_information_request(),
            "the server information",
            lambda message: _of_type(message, ServerInformation),
            time_limit,
            correlated=False,
        )

    async def commands(self, time_limit: Optional[float] = None) -> List[str]:
        """The names of all commands in the host's order."""
        return await self._exchange(
            Kind.COMMANDS, requests.commands_request, "the list of commands", _names, time_limit
        )

    async def command_information(
        self, name: str, time_limit: Optional[float] = None
    ) -> CommandInformation:
        """An unknown name is no failure, see CommandInformation."""
        return await self._exchange(
            Kind.COMMAND_INFORMATION,
            lambda correlation: requests.command_information_request(correlation, name),
            f'the description of the command "{name}"',
            lambda message: _of_type(message, CommandInformation),
            time_limit,
        )

    async def events(self, time_limit: Optional[float] = None) -> List[str]:
        """The names of all events in the host's order."""
        return await self._exchange(
            Kind.EVENTS,
            lambda _: requests.events_request(),
            "the list of events",
            _names,
            time_limit,
            correlated=False,
        )

    async def event_information(
        self, name: str, time_limit: Optional[float] = None
    ) -> EventInformation:
        """An unknown name is no failure, see EventInformation."""
        return await self._exchange(
            Kind.EVENT_INFORMATION,
            lambda _: requests.event_information_request(name),
            f'the description of the event "{name}"',
            lambda message: _of_type(message, EventInformation),
            time_limit,
            correlated=False,
        )

    async def execute(
        self, name: str, parameters: Parameters = (), time_limit: Optional[float] = None
    ) -> CommandReply:
        """Runs a command. A failure that the host reports is a reply like any other: see its `ok`.

        After TimedOutError the command may run yet, or have run.
        """
        fixed = list(requests.pairs(parameters))
        return await self._exchange(
            Kind.COMMAND_REPLY,
            lambda correlation: requests.execute_command_request(correlation, name, fixed),
            f'the reply to the command "{name}"',
            lambda message: _of_type(message, CommandReply),
            time_limit,
        )

    def _post(self, name: str, parameters: Parameters) -> None:
        """Runs a command whose reply nobody waits for, if there is a connection."""
        if self._link is not None:
            correlation = self._link.exchange.next_correlation()
            text = requests.execute_command_request(correlation, name, parameters).encode()
            self._link.post(Kind.COMMAND_REPLY, correlation, text, self._options.time_limit)

    async def execute_batch(
        self,
        commands: Sequence[Tuple[str, Parameters]],
        time_limit: Optional[float] = None,
    ) -> List[CommandReply]:
        """Runs commands one after the other without waiting for each reply; the replies come in the
        order of the commands. The time limit bounds the silence between two replies."""
        limit = self._limit(time_limit)
        link = await self._require_link(limit, f"{len(commands)} replies")
        return await Batch(link, commands, limit).run()

    async def exchange_raw(self, text: bytes, time_limit: Optional[float] = None) -> bytes:
        """Sends the bytes as one frame, unchecked, and returns the first frame after it that is
        neither an event nor the reply to another request.

        The host answers nothing to what it does not understand, so TimedOutError is common.
        """
        limit = self._limit(time_limit)
        what = "a reply to the raw frame; a host answers nothing to what it does not understand"
        link = await self._require_link(limit, what)
        _, frame = await link.ask(Kind.UNKNOWN, "", text, what, limit, limit)
        return frame

    # Events.

    def listen(self, *names: str) -> EventStream:
        """Keeps the events of these names, or all, from now on. Made before a command is run, it
        misses nothing that the command causes; made before `connect`, nothing at all."""
        stream = EventStream(names, self._options.kept_event_bytes)
        if self._ended is not None:
            stream.end(self._ended)
        else:
            self._streams = [other for other in self._streams if other.open]
            self._streams.append(stream)
        return stream

    def on(self, name: str, handler: EventHandler) -> Callable[[], None]:
        """Calls a function, or awaits a coroutine, with each event of the name, or "*" for all.

        Handlers are called one at a time, in the order of the events, and may make requests. What
        they raise goes to the loop's exception handler. The function returned takes the handler
        away. Handlers stay over `close` and `connect`.
        """
        handlers = self._handlers.setdefault(name, [])
        handlers.append(handler)

        def remove() -> None:
            if handler in handlers:
                handlers.remove(handler)

        return remove

    def _hear(self, event: Event, size: int) -> None:
        if event.name in self._handlers or "*" in self._handlers:
            self._hear_for_handlers(event, size)
        for stream in self._streams:
            stream.hear(event, size)

    def _hear_for_handlers(self, event: Event, size: int) -> None:
        if self._handled is None:
            self._handled = EventStream((), self._options.kept_event_bytes)
            self._streams.append(self._handled)
            self._handler_task = None
        if self._handler_task is None or self._handler_task.done():  # a handler may have ended it
            task = asyncio.get_running_loop().create_task(self._handle(self._handled))
            self._handler_task = task

    async def _handle(self, stream: EventStream) -> None:
        async for event in stream:
            for handler in [*self._handlers.get(event.name, ()), *self._handlers.get("*", ())]:
                try:
                    result = handler(event)
                    if inspect.isawaitable(result):
                        await result
                except Exception as error:
                    self._report(f'a handler of the event "{event.name}" failed', error)

    # Authorization.

    @property
    def authorization(self) -> Optional[Authorization]:
        """The last outcome of `authorize`, None before it and where the connection was lost."""
        return self._authorizer.current

    async def authorize(
        self,
        device_id: str,
        device_name: str,
        server_name: str = "",
        operator_time_limit: float = 120.0,
        heartbeat: bool = True,
    ) -> Authorization:
        """Asks to be let in, and waits for the operator where he is asked.

        Look at the status of what is returned; "Connected" means to try again later. An operator
        who closes the dialog gives no answer at all, and TimedOutError tells so after
        `operator_time_limit` seconds; the request is then taken back, as it is where the waiting is
        cancelled. Once authorized, the client sends its heartbeat by itself, and asks anew
        after each reconnection.
        """
        return await self._authorizer.authorize(
            device_id, device_name, server_name, operator_time_limit, heartbeat
        )

    async def cancel_authorization(self, device_id: str) -> None:
        """Takes a waiting request back. No event follows.

        The host closes whatever dialog is open, also another device's. It answers with a failure
        though it has done it, so that the reply tells nothing.
        """
        await self._authorizer.cancel(device_id)


def _of_type(message: Message, content_type: Type[_Content]) -> _Content:
    assert isinstance(message.content, content_type)
    return message.content


def _names(message: Message) -> List[str]:
    assert isinstance(message.content, list)
    return message.content
