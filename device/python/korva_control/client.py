"""The client for programs without an event loop."""

from __future__ import annotations

import asyncio
import contextlib
import functools
import inspect
import threading
from concurrent.futures import CancelledError, ThreadPoolExecutor
from typing import Callable, Coroutine, Iterator, List, Optional, Sequence, Tuple, TypeVar

from .aio import AsyncClient
from .errors import ClosedError, UsageError
from .listening import EventStream
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

_Result = TypeVar("_Result")


def _closed_here() -> ClosedError:
    return ClosedError("this side closed the connection")


def _guarded(handler: Callable[..., None], *arguments: object) -> None:
    """Calls a handler. One that leaves by sys.exit() would end the client's own thread with it."""
    try:
        handler(*arguments)
    except (SystemExit, KeyboardInterrupt) as error:
        raise RuntimeError(f"the handler raised {type(error).__name__}") from error


class _LoopThread:
    """An event loop on a thread of its own, so that events are heard and the heart beats while the
    program does something else."""

    def __init__(self) -> None:
        self.loop = asyncio.new_event_loop()
        self.handlers = ThreadPoolExecutor(1, "korva-control handlers")
        self.open = True
        self._ordering = threading.Lock()  # what is handed to the loop comes before its stop
        self._thread = threading.Thread(target=self._run, name="korva-control", daemon=True)
        self._thread.start()

    def _run(self) -> None:
        asyncio.set_event_loop(self.loop)
        self.loop.run_forever()
        tasks = asyncio.all_tasks(self.loop)
        for task in tasks:
            task.cancel()
        self.loop.run_until_complete(asyncio.gather(*tasks, return_exceptions=True))
        self.loop.close()

    def call(self, work: Coroutine[object, object, _Result]) -> _Result:
        if threading.current_thread() is self._thread:
            work.close()
            raise UsageError("a handler of states must not make requests")
        with self._ordering:
            if not self.open:
                work.close()
                raise _closed_here()
            future = asyncio.run_coroutine_threadsafe(work, self.loop)
        try:
            return future.result()
        except CancelledError:
            raise _closed_here() from None
        except BaseException:
            future.cancel()
            raise

    def soon(self, work: Callable[[], None]) -> None:
        with self._ordering:
            if self.open:
                self.loop.call_soon_threadsafe(work)

    def stop(self) -> None:
        with self._ordering:
            if not self.open:
                return
            self.open = False
            self.loop.call_soon_threadsafe(self.loop.stop)
        self.handlers.shutdown(wait=False)
        self._thread.join()


class Listener:
    """The events of some names, or all, from its making on, in their order; see Client.listen."""

    def __init__(self, thread: _LoopThread, stream: EventStream) -> None:
        self._thread = thread
        self._stream = stream

    def next(self, time_limit: Optional[float] = None) -> Event:
        """Returns the next event, waiting for it if none is kept.

        Raises TimedOutError after so many seconds, and ClosedError where none can come any more.
        One thread at a time; a second one meets UsageError.
        """
        return self._thread.call(self._stream.next(time_limit))

    @property
    def dropped(self) -> int:
        """How many events were dropped since nobody took them."""
        return self._stream.dropped

    def close(self) -> None:
        self._thread.soon(self._stream.close)

    def __iter__(self) -> Iterator[Event]:
        return self

    def __next__(self) -> Event:
        try:
            return self.next()
        except ClosedError:
            raise StopIteration from None

    def __enter__(self) -> Listener:
        return self

    def __exit__(self, *_details: object) -> None:
        self.close()


class Client:
    """One device's connection to a host, with blocking calls.

    The work is done by an AsyncClient on a thread of its own: events are heard, the heart beats and
    a lost connection is made anew while the program does something else. May be used from any
    number of threads. Handlers of events are called on another thread, one at a time, and may make
    requests.
    """

    def __init__(self, options: ClientOptions = ClientOptions()) -> None:
        self._thread = _LoopThread()
        self._client = AsyncClient(options)

    def _call(self, work: Coroutine[object, object, _Result]) -> _Result:
        return self._thread.call(work)

    def connect(
        self, host: str, port: int = DEFAULT_PORT, time_limit: Optional[float] = None
    ) -> None:
        """Connects, and waits until the host has answered: from then on no event is missed."""
        self._call(self._client.connect(host, port, time_limit))

    @property
    def connected(self) -> bool:
        return self._client.connected

    def close(self) -> None:
        """Closes at once and for good. What the host has not read yet may be lost."""
        if self._thread.open:
            with contextlib.suppress(ClosedError):  # another thread may close at the same time
                self._call(self._client.close())
            self._thread.stop()

    def __enter__(self) -> Client:
        return self

    def __exit__(self, *_details: object) -> None:
        self.close()

    def server_information(self, time_limit: Optional[float] = None) -> ServerInformation:
        return self._call(self._client.server_information(time_limit))

    def commands(self, time_limit: Optional[float] = None) -> List[str]:
        """The names of all commands in the host's order."""
        return self._call(self._client.commands(time_limit))

    def command_information(
        self, name: str, time_limit: Optional[float] = None
    ) -> CommandInformation:
        """An unknown name is no failure, see CommandInformation."""
        return self._call(self._client.command_information(name, time_limit))

    def events(self, time_limit: Optional[float] = None) -> List[str]:
        """The names of all events in the host's order."""
        return self._call(self._client.events(time_limit))

    def event_information(self, name: str, time_limit: Optional[float] = None) -> EventInformation:
        """An unknown name is no failure, see EventInformation."""
        return self._call(self._client.event_information(name, time_limit))

    def execute(
        self, name: str, parameters: Parameters = (), time_limit: Optional[float] = None
    ) -> CommandReply:
        """Runs a command, see AsyncClient.execute."""
        return self._call(self._client.execute(name, parameters, time_limit))

    def execute_batch(
        self, commands: Sequence[Tuple[str, Parameters]], time_limit: Optional[float] = None
    ) -> List[CommandReply]:
        """Runs commands without waiting for each reply, see AsyncClient.execute_batch."""
        return self._call(self._client.execute_batch(commands, time_limit))

    def exchange_raw(self, text: bytes, time_limit: Optional[float] = None) -> bytes:
        """Sends the bytes as one frame, unchecked, see AsyncClient.exchange_raw."""
        return self._call(self._client.exchange_raw(text, time_limit))

    def listen(self, *names: str) -> Listener:
        """Keeps the events of these names, or all, from now on. Made before a command is run, it
        misses nothing that the command causes; made before `connect`, nothing at all."""

        async def make() -> EventStream:
            return self._client.listen(*names)

        return Listener(self._thread, self._call(make()))

    def on(self, name: str, handler: Callable[[Event], None]) -> Callable[[], None]:
        """Calls a function with each event of the name, or "*" for all, see AsyncClient.on."""
        if inspect.iscoroutinefunction(handler):
            raise UsageError("a coroutine can be a handler of an AsyncClient only")
        thread = self._thread

        async def hand_over(event: Event) -> None:
            await thread.loop.run_in_executor(thread.handlers, _guarded, handler, event)

        async def add() -> Callable[[], None]:
            return self._client.on(name, hand_over)

        remove = self._call(add())

        return lambda: thread.soon(remove)

    def on_state(self, handler: Callable[[State, str], None]) -> None:
        """Calls a function at each change of the connection or authorization, with words on it.

        It is called on the client's own thread and must not make requests.
        """
        self._client.on_state(functools.partial(_guarded, handler))

    @property
    def authorization(self) -> Optional[Authorization]:
        return self._client.authorization

    def authorize(
        self,
        device_id: str,
        device_name: str,
        server_name: str = "",
        operator_time_limit: float = 120.0,
        heartbeat: bool = True,
    ) -> Authorization:
        """Asks to be let in, see AsyncClient.authorize."""
        return self._call(
            self._client.authorize(
                device_id, device_name, server_name, operator_time_limit, heartbeat
            )
        )

    def cancel_authorization(self, device_id: str) -> None:
        """Takes a waiting request back, see AsyncClient.cancel_authorization."""
        self._call(self._client.cancel_authorization(device_id))
