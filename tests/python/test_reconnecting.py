import asyncio
import unittest
from typing import List, Tuple

from client_case import SHORT, ClientCase, hang_up
from korva_control import (
    BackOff,
    ClientOptions,
    ClosedError,
    State,
    TimedOutError,
)
from pauses import Pauses
from scripted_host import LIMIT, Peer


class BackingOff(unittest.TestCase):
    def test_grows_up_to_the_longest(self) -> None:
        pauses = BackOff(first=1, factor=2, longest=5, jitter=0).seconds()
        self.assertEqual([1, 2, 4, 5, 5], [next(pauses) for _ in range(5)])

    def test_is_shorter_by_chance_within_the_jitter(self) -> None:
        pauses = BackOff(first=10, factor=1, longest=10, jitter=0.2).seconds()
        lengths = [next(pauses) for _ in range(1000)]
        self.assertTrue(all(8 <= length <= 10 for length in lengths))
        self.assertGreater(len(set(lengths)), 100)


class Reconnecting(ClientCase):
    async def asyncSetUp(self) -> None:
        self.pauses = Pauses()
        self.options = ClientOptions(
            reconnect=BackOff(first=1, jitter=0, pause=self.pauses), heartbeat_seconds=1000
        )
        self.states: List[Tuple[State, str]] = []

    async def test_a_lost_connection_is_made_anew_and_handlers_stay(self) -> None:
        heard: "asyncio.Queue[str]" = asyncio.Queue()

        def second(peer: Peer) -> None:
            request = peer.read()
            peer.event("Event.A")
            peer.reply(request)
            peer.wait_for_end()

        await self.start(Peer.read, second, options=self.options)
        self.client.on("Event.A", lambda event: heard.put_nowait(event.name))
        events = self.client.listen()
        with self.assertRaisesRegex(ClosedError, "the host closed the connection"):
            await self.client.execute("Lost")
        waiting = asyncio.ensure_future(self.client.execute("Again"))
        await self.pauses.end_next()

        self.assertTrue((await waiting).ok)
        self.assertEqual("Event.A", await asyncio.wait_for(heard.get(), LIMIT))
        self.assertEqual("Event.A", (await events.next(LIMIT)).name)

    async def test_goes_on_after_failed_attempts_with_longer_pauses(self) -> None:
        connected = asyncio.Event()

        def note(state: State, text: str) -> None:
            self.states.append((state, text))
            if state is State.CONNECTED:
                connected.set()

        await self.start(Peer.read, hang_up, hang_up, Peer.wait_for_end, options=self.options)
        self.client.on_state(note)
        with self.assertRaises(ClosedError):
            await self.client.execute("A")
        lengths = [await self.pauses.end_next() for _ in range(3)]
        await asyncio.wait_for(connected.wait(), LIMIT)

        self.assertEqual([1, 2, 4], lengths)
        self.assertEqual(
            [
                (State.LOST, "the host closed the connection"),
                (State.ATTEMPT_FAILED, "the host closed the connection"),
                (State.ATTEMPT_FAILED, "the host closed the connection"),
                (State.CONNECTED, f"127.0.0.1:{self.host.port}"),
            ],
            self.states,
        )

    async def test_without_back_off_a_lost_connection_stays_lost(self) -> None:
        await self.start(Peer.read)
        with self.assertRaises(ClosedError):
            await self.client.execute("A")
        with self.assertRaisesRegex(ClosedError, "the host closed the connection"):
            await self.client.execute("A")

    async def test_a_request_tells_that_it_waited_for_a_connection(self) -> None:
        await self.start(Peer.read, options=self.options)
        with self.assertRaises(ClosedError):
            await self.client.execute("A")
        with self.assertRaises(TimedOutError) as caught:
            await self.client.execute("B", time_limit=SHORT)
        self.assertEqual(
            "timed out after 0.05 s, waiting for a connection to ask for the reply to the command "
            '"B"',
            str(caught.exception),
        )

    async def test_closing_ends_the_attempts(self) -> None:
        await self.start(Peer.read, options=self.options)
        with self.assertRaises(ClosedError):
            await self.client.execute("A")
        await asyncio.wait_for(self.pauses.lengths.get(), LIMIT)
        await self.client.close()
        with self.assertRaisesRegex(ClosedError, "this side closed the connection"):
            await self.client.execute("A")
