import asyncio
import threading
from typing import Callable, List, Tuple

from client_case import SHORT, ClientCase
from korva_control import (
    Authorization,
    BackOff,
    ClientOptions,
    ClosedError,
    ControlError,
    State,
    TimedOutError,
)
from pauses import Pauses
from scripted_host import LIMIT, Peer, between, parameter

UNKNOWN = "Error: Invalid command name or command not valid for the host application."


def answer(peer: Peer, status: str) -> str:
    """Answers System.Authorize. @return the request"""
    request = peer.read()
    assert between(request, "Name") == "System.Authorize", request
    peer.reply(
        request,
        parameters=parameter("ServerName", "Quorix on stage")
        + parameter("ServerVersion", "300")
        + parameter("Status", status),
    )
    return request


def decide(peer: Peer, status: str) -> None:
    peer.event(
        "Event.Authorize",
        parameter("ServerName", "Quorix on stage") + parameter("Status", status),
    )


class Asking(ClientCase):
    async def authorize(self, limit: float = LIMIT) -> Authorization:
        return await self.client.authorize("desk-7", "Light desk", operator_time_limit=limit)

    async def test_a_known_device_is_let_in_at_once_and_beats(self) -> None:
        requests: List[str] = []

        def script(peer: Peer) -> None:
            requests.append(answer(peer, "Authorized"))
            for _ in range(2):
                beat = peer.read()
                requests.append(beat)
                peer.reply(beat, parameters=parameter("BeatId", between(beat, "Value")))
            beaten.set()
            peer.wait_for_end()

        beaten = threading.Event()
        await self.start(script, options=ClientOptions(heartbeat_seconds=0.01))
        outcome = await self.authorize()
        await asyncio.get_running_loop().run_in_executor(None, beaten.wait, LIMIT)

        self.assertEqual(Authorization("Authorized", "Quorix on stage", "300"), outcome)
        self.assertEqual(outcome, self.client.authorization)
        self.assertIn(
            "<Parameter><Name>DeviceId</Name><Value>desk-7</Value></Parameter>"
            "<Parameter><Name>DeviceName</Name><Value>Light desk</Value></Parameter></Parameters>",
            requests[0],
        )
        for number, beat in enumerate(requests[1:], 1):
            self.assertEqual("System.Heartbeat", between(beat, "Name"))
            self.assertIn(f"<Name>BeatId</Name><Value>{number}</Value>", beat)

    async def test_an_unknown_device_waits_for_the_operator(self) -> None:
        for decision in ("Authorized", "Failed"):
            with self.subTest(decision=decision):

                def script(peer: Peer) -> None:
                    answer(peer, "Pending")
                    decide(peer, decision)
                    peer.wait_for_end()

                await self.start(script)
                outcome = await self.authorize()
                self.assertEqual(Authorization(decision, "Quorix on stage", "300"), outcome)
                self.assertEqual(decision == "Authorized", outcome.granted)
                await self.asyncTearDown()

    async def test_the_outcome_may_overtake_the_reply(self) -> None:
        def script(peer: Peer) -> None:
            request = peer.read()
            decide(peer, "Authorized")
            peer.reply(request, parameters=parameter("Status", "Pending"))
            peer.wait_for_end()

        await self.start(script)
        self.assertEqual("Authorized", (await self.authorize()).status)

    async def test_banned_and_taken_are_told_at_once_and_do_not_beat(self) -> None:
        for status in ("Failed", "Connected"):
            with self.subTest(status=status):
                received: List[str] = []

                def script(peer: Peer) -> None:
                    answer(peer, status)
                    received.append(peer.read())
                    peer.reply(received[0])
                    peer.wait_for_end()

                await self.start(script, options=ClientOptions(heartbeat_seconds=0.001))
                outcome = await self.authorize()
                self.assertEqual(status, outcome.status)
                self.assertFalse(outcome.granted)
                await self.client.execute("Next")
                self.assertEqual("Next", between(received[0], "Name"))
                await self.asyncTearDown()

    async def test_an_operator_who_gives_no_answer_and_the_request_is_taken_back(self) -> None:
        cancelled: List[str] = []

        def script(peer: Peer) -> None:
            answer(peer, "Pending")
            request = peer.read()
            cancelled.append(request)
            peer.reply(request, UNKNOWN)
            peer.wait_for_end()

        await self.start(script)
        with self.assertRaises(TimedOutError) as caught:
            await self.authorize(SHORT)
        self.assertEqual(
            "timed out after 0.05 s, waiting for the operator's answer; the request was taken back",
            str(caught.exception),
        )
        self.assertEqual("System.Authorize.Cancel", between(cancelled[0], "Name"))
        self.assertIn("<Name>DeviceId</Name><Value>desk-7</Value>", cancelled[0])

    async def test_a_cancellation_that_is_answered_by_a_failure_has_been_done(self) -> None:
        await self.start(lambda peer: (peer.reply(peer.read(), UNKNOWN), peer.wait_for_end()))
        await self.client.cancel_authorization("desk-7")

    async def test_a_host_without_authorizations_says_so(self) -> None:
        await self.start(lambda peer: (peer.reply(peer.read(), UNKNOWN), peer.wait_for_end()))
        with self.assertRaisesRegex(ControlError, "the host does not take authorizations: Error"):
            await self.authorize()

    async def test_a_connection_that_ends_while_the_operator_is_asked(self) -> None:
        await self.start(lambda peer: answer(peer, "Pending"))
        with self.assertRaises(ClosedError):
            await self.authorize()

    async def test_two_calls_at_once_have_one_heart(self) -> None:
        beats: List[str] = []

        def script(peer: Peer) -> None:
            for _ in range(2):
                answer(peer, "Authorized")
            while len(beats) < 20:
                request = peer.read()
                beats.append(between(request, "Value"))
                peer.reply(request, parameters=parameter("BeatId", beats[-1]))
            beaten.set()
            peer.wait_for_end()

        beaten = threading.Event()
        await self.start(script, options=ClientOptions(heartbeat_seconds=0.01))
        await asyncio.gather(self.authorize(), self.authorize())
        await asyncio.get_running_loop().run_in_executor(None, beaten.wait, LIMIT)
        later = beats[3:]  # the first of the two hearts may beat once
        self.assertEqual(len(later), len(set(later)))

    async def test_a_heartbeat_that_fails_is_told_and_goes_on(self) -> None:
        def script(peer: Peer) -> None:
            answer(peer, "Authorized")
            for _ in range(2):
                peer.reply(peer.read(), "Error: System Error")
            peer.wait_for_end()

        told: "asyncio.Queue[Tuple[State, str]]" = asyncio.Queue()
        await self.start(script, options=ClientOptions(heartbeat_seconds=0.01))
        self.client.on_state(lambda state, text: told.put_nowait((state, text)))
        await self.authorize()
        states = [await asyncio.wait_for(told.get(), LIMIT) for _ in range(3)]
        self.assertEqual(
            [(State.AUTHORIZED, "Quorix on stage")]
            + [(State.HEARTBEAT_FAILED, "Error: System Error")] * 2,
            states,
        )


class AskingAnew(ClientCase):
    async def asyncSetUp(self) -> None:
        self.pauses = Pauses()
        self.states: "asyncio.Queue[State]" = asyncio.Queue()

    async def begin(self, *scripts: Callable[[Peer], object]) -> None:
        def first(peer: Peer) -> None:
            answer(peer, "Authorized")
            peer.reply(peer.read())  # a beat

        options = ClientOptions(
            reconnect=BackOff(first=1, jitter=0, pause=self.pauses), heartbeat_seconds=1000
        )
        await self.start(first, *scripts, options=options)
        self.client.on_state(lambda state, text: self.states.put_nowait(state))
        await self.client.authorize("desk-7", "Light desk", "Named by the device")

    async def expect(self, *states: State) -> None:
        for state in states:
            self.assertEqual(state, await asyncio.wait_for(self.states.get(), LIMIT))

    async def test_after_a_reconnection_with_the_same_words(self) -> None:
        requests: List[str] = []

        def second(peer: Peer) -> None:
            requests.append(answer(peer, "Authorized"))
            requests.append(peer.read())
            peer.wait_for_end()

        await self.begin(second)
        await self.expect(State.AUTHORIZED, State.LOST)
        self.assertIsNone(self.client.authorization)
        await self.pauses.end_next()
        await self.expect(State.CONNECTED, State.AUTHORIZED)

        for value in ("desk-7", "Light desk", "Named by the device"):
            self.assertIn(f"<Value>{value}</Value>", requests[0])

    async def test_asks_again_while_something_is_in_the_way(self) -> None:
        def second(peer: Peer) -> None:
            answer(peer, "Connected")
            answer(peer, "Connected")
            answer(peer, "Pending")
            decide(peer, "Authorized")
            peer.wait_for_end()

        await self.begin(second)
        lengths = [await self.pauses.end_next() for _ in range(3)]
        await self.expect(State.AUTHORIZED, State.LOST, State.CONNECTED)
        await self.expect(State.NOT_AUTHORIZED, State.NOT_AUTHORIZED, State.AUTHORIZED)
        self.assertEqual([1, 1, 2], lengths)

    async def test_a_refusal_is_not_asked_about_again(self) -> None:
        def second(peer: Peer) -> None:
            answer(peer, "Failed")
            peer.reply(peer.read())
            peer.wait_for_end()

        await self.begin(second)
        await self.pauses.end_next()
        await self.expect(State.AUTHORIZED, State.LOST, State.CONNECTED, State.NOT_AUTHORIZED)
        self.assertTrue((await self.client.execute("Next")).ok)
