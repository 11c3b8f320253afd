"""What comes at an awkward moment: in one arrival with something else, or while another call waits."""

import asyncio
import struct
from typing import Callable, List

from client_case import ClientCase
from korva_control import (
    AsyncClient,
    BackOff,
    ClientOptions,
    ClosedError,
    Event,
    ProtocolError,
    State,
)
from pauses import Pauses
from scripted_host import (
    LIMIT,
    SERVER_INFORMATION,
    Peer,
    ScriptedHost,
    between,
    frame,
    parameter,
)


def greet_with_garbage(peer: Peer) -> None:
    peer.read()
    peer.send_bytes(frame(SERVER_INFORMATION) + struct.pack("<I", 0xFFFFFFFF))
    peer.wait_for_end()


def answer_all(peer: Peer) -> None:
    peer.greet()
    while True:
        peer.reply(peer.read())


class Connecting(ClientCase):
    async def connect_to(
        self, *scripts: Callable[[Peer], None], reconnect: bool = False
    ) -> None:
        self.pauses = Pauses()
        self.host = ScriptedHost(*scripts)
        self.client = AsyncClient(
            ClientOptions(
                time_limit=LIMIT,
                reconnect=BackOff(first=1, jitter=0, pause=self.pauses) if reconnect else None,
            )
        )
        await self.client.connect("127.0.0.1", self.host.port)

    async def test_garbage_in_one_arrival_with_the_greeting_is_no_connection(self) -> None:
        with self.assertRaisesRegex(ProtocolError, "above the limit"):
            await self.connect_to(greet_with_garbage)
        self.assertFalse(self.client.connected)

    async def test_such_garbage_does_not_end_the_attempts_to_reconnect(self) -> None:
        await self.connect_to(Peer.greet, greet_with_garbage, answer_all, reconnect=True)
        states: List[State] = []
        self.client.on_state(lambda state, text: states.append(state))
        await self.pauses.end_next()
        await self.pauses.end_next()
        self.assertTrue((await self.client.execute("A")).ok)
        self.assertEqual([State.LOST, State.ATTEMPT_FAILED, State.CONNECTED], states[-3:])

    async def test_a_request_goes_on_waiting_where_the_host_greets_and_goes(self) -> None:
        await self.connect_to(Peer.greet, Peer.greet, answer_all, reconnect=True)
        await asyncio.wait_for(self.pauses.lengths.get(), LIMIT)
        waiting = asyncio.ensure_future(self.client.execute("A"))
        await asyncio.sleep(0)
        self.pauses.end()
        await self.pauses.end_next()
        self.assertTrue((await waiting).ok)

    async def test_a_client_that_is_closed_meanwhile_stays_closed(self) -> None:
        asked = asyncio.Event()
        loop = asyncio.get_running_loop()

        def never_greet(peer: Peer) -> None:
            peer.read()
            loop.call_soon_threadsafe(asked.set)
            peer.wait_for_end()

        connecting = asyncio.ensure_future(self.connect_to(never_greet))
        await asyncio.wait_for(asked.wait(), LIMIT)
        await self.client.close()
        with self.assertRaisesRegex(ClosedError, "this side closed the connection"):
            await connecting
        self.assertFalse(self.client.connected)

    async def test_a_request_that_waits_for_a_connection_ends_with_the_client(self) -> None:
        await self.connect_to(Peer.greet, reconnect=True)
        await asyncio.wait_for(self.pauses.lengths.get(), LIMIT)
        waiting = asyncio.ensure_future(self.client.execute("A"))
        await asyncio.sleep(0)
        await self.client.close()
        with self.assertRaisesRegex(ClosedError, "this side closed the connection"):
            await waiting


class Cancelling(ClientCase):
    async def test_an_authorization_takes_the_request_back(self) -> None:
        names: List[str] = []

        def script(peer: Peer) -> None:
            peer.reply(peer.read(), parameters=parameter("Status", "Pending"))
            peer.event("Event.Told")  # what is heard behind the reply tells that it has come
            for _ in range(2):
                request = peer.read()
                names.append(between(request, "Name"))
                peer.reply(request)

        await self.start(script)
        told = self.client.listen("Event.Told")
        authorizing = asyncio.ensure_future(self.client.authorize("desk-7", "Light desk"))
        await told.next(LIMIT)
        for _ in range(3):  # and that it has been looked at
            await asyncio.sleep(0)
        authorizing.cancel()
        with self.assertRaises(asyncio.CancelledError):
            await authorizing
        await self.client.execute("A")
        self.assertEqual(["System.Authorize.Cancel", "A"], names)

    async def test_a_handler_that_is_cancelled_does_not_end_the_others(self) -> None:
        def script(peer: Peer) -> None:
            for name in ("Event.A", "Event.B"):
                request = peer.read()
                peer.event(name)
                peer.reply(request)
            peer.wait_for_end()

        called = asyncio.Event()
        heard = asyncio.Event()

        async def fail(event: Event) -> None:
            called.set()
            raise asyncio.CancelledError

        await self.start(script)
        self.client.on("Event.A", fail)
        self.client.on("Event.B", lambda event: heard.set())
        await self.client.execute("A")
        await asyncio.wait_for(called.wait(), LIMIT)
        await self.client.execute("B")
        await asyncio.wait_for(heard.wait(), LIMIT)
