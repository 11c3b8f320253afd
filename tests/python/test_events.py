import asyncio
import threading
from typing import List

from client_case import SHORT, ClientCase
from korva_control import ClientOptions, ClosedError, Event, TimedOutError, UsageError
from scripted_host import LIMIT, Peer, parameter


class Events(ClientCase):
    async def test_handlers_by_name_are_called_in_order_and_may_make_requests(self) -> None:
        ready = threading.Event()

        def script(peer: Peer) -> None:
            ready.wait(LIMIT)
            peer.event("Event.A")
            peer.event("Event.B")
            peer.event("Event.C")
            peer.reply(peer.read())

        heard: List[str] = []
        finished = asyncio.Event()

        async def answer(event: Event) -> None:
            reply = await self.client.execute("A")
            heard.append(f"{event.name} {reply.result}")

        def last(event: Event) -> None:
            heard.append(f"* {event.name}")
            if event.name == "Event.C":
                finished.set()

        await self.start(script)
        self.client.on("Event.B", answer)
        self.client.on("*", last)
        ready.set()
        await asyncio.wait_for(finished.wait(), LIMIT)
        self.assertEqual(["* Event.A", "Event.B OK", "* Event.B", "* Event.C"], heard)

    async def test_a_handler_that_fails_is_reported_and_the_others_go_on(self) -> None:
        reports: List[str] = []
        asyncio.get_running_loop().set_exception_handler(
            lambda loop, context: reports.append(context["message"])
        )
        finished = asyncio.Event()
        ready = threading.Event()

        def script(peer: Peer) -> None:
            ready.wait(LIMIT)
            peer.event("Event.A")

        await self.start(script)

        def fail(event: Event) -> None:
            raise ValueError

        self.client.on("Event.A", fail)
        self.client.on("Event.A", lambda event: finished.set())
        ready.set()
        await asyncio.wait_for(finished.wait(), LIMIT)
        self.assertEqual(['korva_control: a handler of the event "Event.A" failed'], reports)

    async def test_a_handler_that_was_taken_away_hears_nothing(self) -> None:
        def script(peer: Peer) -> None:
            request = peer.read()
            peer.event("Event.A")
            peer.reply(request)
            peer.wait_for_end()

        heard: List[str] = []
        await self.start(script)
        remove = self.client.on("Event.A", lambda event: heard.append(event.name))
        finished = asyncio.Event()
        self.client.on("*", lambda event: finished.set())  # called behind those of the name
        remove()
        await self.client.execute("A")
        await asyncio.wait_for(finished.wait(), LIMIT)
        self.assertEqual([], heard)

    async def test_what_nobody_takes_is_dropped_from_the_oldest_and_counted(self) -> None:
        def script(peer: Peer) -> None:
            request = peer.read()
            for number in range(100):
                peer.event(f"Event.{number}", parameter("p", "x" * 100))
            peer.reply(request)

        await self.start(script, options=ClientOptions(kept_event_bytes=1000))
        events = self.client.listen()
        await self.client.execute("A")
        first = await events.next()
        self.assertGreater(events.dropped, 90)
        self.assertEqual(f"Event.{events.dropped}", first.name)

    async def test_the_newest_is_kept_whatever_its_size(self) -> None:
        def script(peer: Peer) -> None:
            request = peer.read()
            peer.event("Event.Old")
            peer.event("Event.Long", parameter("p", "x" * 1000))
            peer.reply(request)

        await self.start(script, options=ClientOptions(kept_event_bytes=1000))
        events = self.client.listen()
        await self.client.execute("A")
        self.assertEqual("Event.Long", (await events.next(LIMIT)).name)
        self.assertEqual(1, events.dropped)

    async def test_only_one_waits_for_the_next_event_of_a_stream(self) -> None:
        await self.start(Peer.wait_for_end)
        events = self.client.listen()
        first = asyncio.ensure_future(events.next())
        await asyncio.sleep(0)
        with self.assertRaisesRegex(UsageError, "somebody waits"):
            await events.next()
        await self.client.close()
        with self.assertRaises(ClosedError):
            await first

    async def test_waiting_for_an_event_tells_which(self) -> None:
        await self.start(Peer.wait_for_end)
        with self.assertRaises(TimedOutError) as caught:
            await self.client.listen("Event.B", "Event.A").next(SHORT)
        self.assertEqual(
            'timed out after 0.05 s, waiting for the event "Event.A" or "Event.B"',
            str(caught.exception),
        )

    async def test_a_lost_connection_ends_the_streams_after_what_was_kept(self) -> None:
        await self.start(lambda peer: (peer.reply(peer.read()), peer.event("Event.A")))
        events = self.client.listen()
        await self.client.execute("A")
        self.assertEqual(["Event.A"], [event.name async for event in events])
