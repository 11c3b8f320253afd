from typing import List

from client_case import SHORT, ClientCase
from korva_control import ClosedError, TimedOutError
from korva_control.exchange import WINDOW
from scripted_host import Peer, between, parameter


class Batches(ClientCase):
    async def test_keep_at_most_the_window_unanswered_and_come_in_order(self) -> None:
        count = 200
        most = 0

        def script(peer: Peer) -> None:
            nonlocal most
            held: List[str] = []
            for number in range(count):
                held.append(peer.read())
                most = max(most, sum(map(len, held)))
                # A client that heeds the window sends no more now, and a greedy one would.
                if number == count - 1 or (most > WINDOW // 2 and not peer.has_more()):
                    for request in held:
                        echo = parameter("p", between(request, "Value"))
                        peer.reply(request, parameters=echo)
                    held.clear()

        await self.start(script)
        values = [f"{number} " + "v" * 1000 for number in range(count)]
        replies = await self.client.execute_batch([("A", {"p": value}) for value in values])
        self.assertEqual(values, [reply.parameters["p"] for reply in replies])
        self.assertLessEqual(most, WINDOW)
        self.assertGreater(most, WINDOW // 2)

    async def test_an_empty_batch_sends_nothing(self) -> None:
        await self.start(lambda peer: None)
        self.assertEqual([], await self.client.execute_batch([]))

    async def test_a_batch_that_gets_no_more_replies_says_so_and_gives_what_came(self) -> None:
        def script(peer: Peer) -> None:
            peer.reply(peer.read())
            peer.read()
            peer.read()
            peer.reply(peer.read())

        await self.start(script)
        with self.assertRaises(TimedOutError) as caught:
            await self.client.execute_batch([("A", {}), ("B", {}), ("C", {})], SHORT)
        self.assertEqual(
            "timed out after 0.05 s without any reply, waiting for 2 of 3 replies, the first of "
            'them the reply to "B"',
            str(caught.exception),
        )
        self.assertEqual([True, False, False], [r is not None for r in caught.exception.replies])
        self.assertTrue((await self.client.execute("D")).ok)

    async def test_a_connection_that_ends_meanwhile(self) -> None:
        await self.start(lambda peer: peer.reply(peer.read()))
        with self.assertRaises(ClosedError) as caught:
            await self.client.execute_batch([("A", {}), ("B", {})])
        self.assertRegex(str(caught.exception), "; 1 of the 2 commands had been answered$")
        self.assertIsNotNone(caught.exception.replies[0])

    async def test_goes_on_while_the_host_sends_more_than_the_socket_holds(self) -> None:
        flood = parameter("p", "x" * 100_000)

        def script(peer: Peer) -> None:
            for _ in range(300):
                peer.event("Event.Flood", flood)
                peer.reply(peer.read())

        await self.start(script)
        replies = await self.client.execute_batch([("A", {"p": "y" * 10_000})] * 300)
        self.assertEqual(300, len(replies))
