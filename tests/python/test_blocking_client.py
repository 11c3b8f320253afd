import dataclasses
import sys
import threading
import unittest
from typing import Callable, List

from client_case import SHORT
from korva_control import (
    BackOff,
    Client,
    ClientOptions,
    ClosedError,
    Event,
    NoConnectionError,
    State,
    TimedOutError,
    UsageError,
)
from scripted_host import LIMIT, Peer, ScriptedHost, between, parameter


class BlockingClient(unittest.TestCase):
    def start(
        self, *scripts: Callable[[Peer], object], options: ClientOptions = ClientOptions()
    ) -> None:
        def greeting(script: Callable[[Peer], object]) -> Callable[[Peer], None]:
            def whole(peer: Peer) -> None:
                peer.greet()
                script(peer)

            return whole

        self.host = ScriptedHost(*map(greeting, scripts))
        self.client = Client(dataclasses.replace(options, time_limit=LIMIT))
        self.all_events = self.client.listen()
        self.client.connect("127.0.0.1", self.host.port)

    def tearDown(self) -> None:
        if hasattr(self, "host"):
            self.client.close()
            self.host.close()

    def test_runs_commands_from_many_threads_at_once(self) -> None:
        def script(peer: Peer) -> None:
            for request in [peer.read() for _ in range(8)]:
                peer.reply(request, parameters=parameter("Name", between(request, "Name")))

        self.start(script)
        results: List[bool] = []

        def ask(name: str) -> None:
            results.append(self.client.execute(name).parameters["Name"] == name)

        threads = [threading.Thread(target=ask, args=(f"N{i}",)) for i in range(8)]
        for thread in threads:
            thread.start()
        for thread in threads:
            thread.join(LIMIT)
        self.assertEqual([True] * 8, results)

    def test_a_batch(self) -> None:
        self.start(lambda peer: [peer.reply(peer.read()) for _ in range(3)])
        replies = self.client.execute_batch([("A", {}), ("B", {"p": "1"}), ("C", {})])
        self.assertEqual(["OK"] * 3, [reply.result for reply in replies])

    def test_a_handler_is_called_on_another_thread_and_may_make_requests(self) -> None:
        def script(peer: Peer) -> None:
            peer.reply(peer.read())
            peer.event("Event.A", parameter("Id", "7"))
            peer.reply(peer.read())
            peer.wait_for_end()

        heard: List[str] = []
        finished = threading.Event()

        def handle(event: Event) -> None:
            reply = self.client.execute("B")
            on_own_thread = threading.current_thread() is not threading.main_thread()
            heard.append(f"{event.parameters['Id']} {reply.result} {on_own_thread}")
            finished.set()

        self.start(script)
        self.client.on("Event.A", handle)
        self.client.execute("A")
        self.assertTrue(finished.wait(LIMIT))
        self.assertEqual(["7 OK True"], heard)

    def test_a_handler_that_exits_ends_nothing_but_itself(self) -> None:
        def script(peer: Peer) -> None:
            for name in ("Event.A", "Event.B"):
                peer.reply(peer.read())
                peer.event(name)

        heard = threading.Event()
        lost = threading.Event()

        def exit_when_lost(state: State, text: str) -> None:
            lost.set()
            sys.exit(3)

        self.start(script)
        self.client.on("Event.A", lambda event: sys.exit(3))
        self.client.on("Event.B", lambda event: heard.set())
        self.client.on_state(exit_when_lost)
        self.client.execute("A")
        self.client.execute("B")
        self.assertTrue(heard.wait(LIMIT))
        self.assertTrue(lost.wait(LIMIT))
        with self.assertRaises(ClosedError):
            self.client.execute("C")

    def test_a_coroutine_is_no_handler_here(self) -> None:
        async def handle(event: Event) -> None:
            pass

        self.start(Peer.wait_for_end)
        with self.assertRaises(UsageError):
            self.client.on("Event.A", handle)  # type: ignore[arg-type]

    def test_a_handler_of_states_must_not_make_requests(self) -> None:
        refused: List[str] = []
        lost = threading.Event()

        def note(state: State, text: str) -> None:
            try:
                self.client.commands()
            except UsageError as error:
                refused.append(str(error))
            lost.set()

        self.start(Peer.read)
        self.client.on_state(note)
        with self.assertRaises(ClosedError):
            self.client.execute("A")
        self.assertTrue(lost.wait(LIMIT))
        self.assertEqual("a handler of states must not make requests", refused[0])

    def test_listens_before_it_asks_and_so_misses_nothing(self) -> None:
        def script(peer: Peer) -> None:
            request = peer.read()
            peer.event("Event.A")
            peer.event("Event.B")
            peer.reply(request)

        self.start(script)
        with self.client.listen("Event.B") as events:
            self.client.execute("A")
            self.assertEqual(Event("Event.B"), events.next(LIMIT))
            self.assertEqual([], list(events), "the connection has ended by now")

    def test_time_outs_and_refusals_come_through(self) -> None:
        self.start(Peer.wait_for_end)
        with self.assertRaisesRegex(TimedOutError, 'the reply to the command "A"'):
            self.client.execute("A", time_limit=SHORT)
        with self.assertRaisesRegex(TimedOutError, 'the event "Event.A"'):
            self.client.listen("Event.A").next(SHORT)
        with self.assertRaises(UsageError):
            self.client.execute("")

    def test_a_closed_client_ends_what_waits_in_other_threads_and_stays_closed(self) -> None:
        self.start(Peer.wait_for_end)
        listener = self.client.listen()
        ended = threading.Event()

        def wait() -> None:
            self.assertEqual([], list(listener))
            ended.set()

        threading.Thread(target=wait, daemon=True).start()
        self.client.close()
        self.assertTrue(ended.wait(LIMIT))
        self.client.close()
        with self.assertRaisesRegex(ClosedError, "this side closed the connection"):
            self.client.execute("A")

    def test_beats_while_the_program_does_something_else(self) -> None:
        beaten = threading.Event()

        def script(peer: Peer) -> None:
            peer.reply(peer.read(), parameters=parameter("Status", "Authorized"))
            for _ in range(3):
                peer.reply(peer.read())
            beaten.set()
            peer.wait_for_end()

        self.start(script, options=ClientOptions(heartbeat_seconds=0.01))
        self.assertTrue(self.client.authorize("desk-7", "Light desk").granted)
        self.assertTrue(beaten.wait(LIMIT))

    def test_reconnects_while_the_program_waits_for_an_event(self) -> None:
        def second(peer: Peer) -> None:
            peer.event("Event.A")
            peer.wait_for_end()

        back_off = BackOff(first=0.001)
        self.start(lambda peer: None, second, options=ClientOptions(reconnect=back_off))
        self.assertEqual("Event.A", self.all_events.next(LIMIT).name)

    def test_leaves_no_thread_behind(self) -> None:
        before = threading.active_count()
        for _ in range(3):
            with Client() as client:
                with self.assertRaises(NoConnectionError):
                    client.connect("127.0.0.1", 1)
        self.assertEqual(before, threading.active_count())
