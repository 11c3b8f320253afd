import asyncio
import unittest
from typing import List

from korva_control import (
    AsyncClient,
    ClosedError,
    Event,
    NoConnectionError,
    ProtocolError,
    TimedOutError,
    UsageError,
)
from client_case import SHORT, ClientCase
from scripted_host import LIMIT, SERVER_INFORMATION, Peer, ScriptedHost, between, frame, parameter


def unused_port() -> int:
    with ScriptedHost() as host:
        return host.port


class Connecting(unittest.IsolatedAsyncioTestCase):
    async def test_waits_until_the_host_has_answered(self) -> None:
        with ScriptedHost(Peer.greet) as host:
            async with AsyncClient() as client:
                await client.connect("127.0.0.1", host.port)
                self.assertTrue(client.connected)

    async def test_says_why_there_is_no_connection(self) -> None:
        port = unused_port()
        with self.assertRaises(NoConnectionError) as caught:
            await AsyncClient().connect("127.0.0.1", port)
        self.assertEqual(
            f"no connection to 127.0.0.1:{port}: Connection refused", str(caught.exception)
        )

    async def test_says_that_no_computer_can_have_the_name(self) -> None:
        for name in ("a..b", "a" * 300, "\udcff"):
            with self.subTest(name=name), self.assertRaises(NoConnectionError) as caught:
                await AsyncClient().connect(name)
            self.assertIn(f"no connection to {name}:803: ", str(caught.exception))

    async def test_says_that_the_host_does_not_answer(self) -> None:
        with ScriptedHost(Peer.wait_for_end) as host:
            with self.assertRaises(TimedOutError) as caught:
                await AsyncClient().connect("127.0.0.1", host.port, SHORT)
        self.assertEqual(
            f"timed out after 0.05 s, waiting for the server information of 127.0.0.1:{host.port}",
            str(caught.exception),
        )

    async def test_refuses_another_version(self) -> None:
        def script(peer: Peer) -> None:
            peer.read()
            peer.send(SERVER_INFORMATION.replace('major="1"', 'major="2"'))

        with ScriptedHost(script) as host:
            with self.assertRaisesRegex(ProtocolError, r"version 2\.0 .* this client speaks 1\.0"):
                await AsyncClient().connect("127.0.0.1", host.port)

    async def test_refuses_wrong_usage(self) -> None:
        for host, port in (("", 803), ("a\0b", 803), ("localhost", 0), ("localhost", 65536)):
            with self.assertRaises(UsageError):
                await AsyncClient().connect(host, port)
        with self.assertRaisesRegex(UsageError, "a number of seconds above 0"):
            await AsyncClient().connect("localhost", 803, 0)

    async def test_requests_without_a_connection_are_refused(self) -> None:
        client = AsyncClient()
        with self.assertRaisesRegex(NoConnectionError, "there is no connection to a host"):
            await client.commands()

    async def test_what_listens_before_the_connection_misses_nothing(self) -> None:
        def script(peer: Peer) -> None:
            peer.event("Event.First")
            peer.greet()
            peer.event("Event.A")

        with ScriptedHost(script) as host:
            async with AsyncClient() as client:
                events = client.listen()
                await client.connect("127.0.0.1", host.port)
                names = [event.name async for event in events]
        self.assertEqual(["Event.First", "Event.A"], names)
        with self.assertRaisesRegex(ClosedError, "the host closed|this side closed"):
            await client.listen().next()


class Exchanging(ClientCase):
    async def test_a_time_out_says_what_was_waited_for_and_the_connection_goes_on(self) -> None:
        def script(peer: Peer) -> None:
            late = peer.read()
            request = peer.read()
            peer.reply(late, "late")
            peer.reply(request)

        await self.start(script)
        with self.assertRaises(TimedOutError) as caught:
            await self.client.execute("Slow", time_limit=SHORT)
        self.assertEqual(
            'timed out after 0.05 s, waiting for the reply to the command "Slow"',
            str(caught.exception),
        )
        self.assertTrue((await self.client.execute("Quick")).ok)

    async def test_a_host_that_closes_in_the_middle_of_a_frame(self) -> None:
        def script(peer: Peer) -> None:
            peer.read()
            peer.send_bytes(frame("<CommandReply>")[:9])

        await self.start(script)
        with self.assertRaises(ClosedError) as caught:
            await self.client.execute("A")
        self.assertEqual(
            "the host closed the connection; 5 of the 14 bytes of a frame had come",
            str(caught.exception),
        )
        self.assertFalse(self.client.connected)

    async def test_a_header_above_the_limit_ends_the_connection(self) -> None:
        def script(peer: Peer) -> None:
            peer.read()
            peer.send_bytes(b"\xff\xff\xff\xff")
            peer.wait_for_end()

        await self.start(script)
        with self.assertRaisesRegex(ProtocolError, "a frame of 4294967295 bytes, above the limit"):
            await self.client.execute("A")
        self.assertFalse(self.client.connected)

    async def test_garbage_in_a_frame_fails_what_waits_and_the_connection_goes_on(self) -> None:
        def script(peer: Peer) -> None:
            peer.read()
            peer.send("garbage")
            peer.reply(peer.read())

        await self.start(script)
        with self.assertRaisesRegex(ProtocolError, "cannot be read as XML"):
            await self.client.execute("A")
        self.assertTrue((await self.client.execute("A")).ok)

    async def test_requests_may_be_open_at_once_and_be_answered_in_any_order(self) -> None:
        def script(peer: Peer) -> None:
            for request in reversed([peer.read() for _ in range(3)]):
                peer.reply(request, parameters=parameter("Name", between(request, "Name")))

        await self.start(script)
        replies = await asyncio.gather(*(self.client.execute(name) for name in "ABC"))
        self.assertEqual(["A", "B", "C"], [reply.parameters["Name"] for reply in replies])

    async def test_an_event_between_a_request_and_its_reply_is_heard(self) -> None:
        def script(peer: Peer) -> None:
            request = peer.read()
            peer.event("Event.A", parameter("Id", "7"))
            peer.reply(request)

        await self.start(script)
        with self.client.listen("Event.A") as events:
            await self.client.execute("A")
            self.assertEqual(Event("Event.A", {"Id": "7"}), await events.next(LIMIT))

    async def test_nothing_is_sent_of_what_the_host_would_drop(self) -> None:
        received: List[str] = []

        def script(peer: Peer) -> None:
            received.append(peer.read())
            peer.reply(received[0])

        await self.start(script)
        with self.assertRaisesRegex(UsageError, "the name of the command is empty"):
            await self.client.execute("")
        with self.assertRaisesRegex(UsageError, "the name of a parameter is empty"):
            await self.client.execute_batch([("Good", {}), ("Bad", {"": "1"})])
        await self.client.execute("Good")
        self.assertEqual("Good", between(received[0], "Name"))

    async def test_a_closed_client_ends_what_waits(self) -> None:
        await self.start(Peer.wait_for_end)
        waiting = asyncio.ensure_future(self.client.execute("A"))
        listening = asyncio.ensure_future(self.client.listen().next())
        await asyncio.sleep(0)
        await self.client.close()
        for task in (waiting, listening):
            with self.assertRaisesRegex(ClosedError, "this side closed the connection"):
                await task
