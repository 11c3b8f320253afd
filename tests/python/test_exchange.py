import unittest
from typing import List, Optional

from korva_control import requests
from korva_control.errors import ClosedError, ControlError, TimedOutError
from korva_control.exchange import WINDOW, Exchange, Request
from korva_control.framing import FrameBuffer
from korva_control.messages import Kind, Message
from korva_control.records import Event, ServerInformation
from scripted_host import SERVER_INFORMATION


class Asked:
    """A request with what came of it."""

    def __init__(self, exchange: Exchange, kind: Kind, text: str, correlation: str = "") -> None:
        self.message: Optional[Message] = None
        self.error: Optional[ControlError] = None
        self.request = Request(kind, correlation, text.encode(), "something", self._complete)
        exchange.submit(self.request)

    def _complete(self, message: Optional[Message], error: Optional[ControlError]) -> None:
        assert self.message is None and self.error is None, "completed twice"
        self.message, self.error = message, error


def sent(exchange: Exchange) -> List[bytes]:
    buffer = FrameBuffer(1 << 30)
    buffer.add(exchange.take_sendable())
    texts = []
    while True:
        text = buffer.take()
        if text is None:
            return texts
        texts.append(text)


def reply(correlation: str) -> bytes:
    return (
        f"<CommandReply><Correlation>{correlation}</Correlation><Result>{correlation}</Result>"
        "</CommandReply>"
    ).encode()


class ExchangeTest(unittest.TestCase):
    def setUp(self) -> None:
        self.events: List[Event] = []
        self.exchange = Exchange(lambda event, size: self.events.append(event))

    def command(self, correlation: str, size: int = 10) -> Asked:
        return Asked(self.exchange, Kind.COMMAND_REPLY, "x" * size, correlation)

    def server_information(self) -> Asked:
        return Asked(self.exchange, Kind.SERVER_INFORMATION, requests.server_information_request())

    def test_replies_are_matched_by_correlation_in_any_order(self) -> None:
        first, second = self.command("1"), self.command("2")
        sent(self.exchange)
        self.exchange.frame_arrived(reply("2"))
        self.exchange.frame_arrived(reply("1"))

        assert first.message is not None and second.message is not None
        self.assertEqual(["1", "2"], [first.message.correlation, second.message.correlation])

    def test_a_reply_of_another_kind_is_not_taken_for_the_reply(self) -> None:
        asked = Asked(self.exchange, Kind.COMMAND_INFORMATION, "x", "1")
        sent(self.exchange)
        self.exchange.frame_arrived(reply("1"))

        self.assertIsNone(asked.message)

    def test_events_pass_by_while_requests_are_open(self) -> None:
        asked = self.command("1")
        sent(self.exchange)
        self.exchange.frame_arrived(b"<Event><Name>E</Name><Parameters/></Event>")

        self.assertEqual([Event("E")], self.events)
        self.assertIsNone(asked.message)

    def test_no_more_than_the_window_is_unanswered(self) -> None:
        for number in range(3):
            self.command(str(number), WINDOW // 2)

        self.assertEqual(2, len(sent(self.exchange)))
        self.assertEqual(WINDOW, self.exchange.unanswered)
        self.assertEqual([], sent(self.exchange))
        self.exchange.frame_arrived(reply("0"))
        self.assertEqual(1, len(sent(self.exchange)))

    def test_a_request_above_the_window_goes_alone(self) -> None:
        self.command("1")
        self.command("2", WINDOW + 1)
        self.command("3")

        self.assertEqual([10], [len(text) for text in sent(self.exchange)])
        self.exchange.frame_arrived(reply("1"))
        self.assertEqual([WINDOW + 1], [len(text) for text in sent(self.exchange)])
        self.exchange.frame_arrived(reply("2"))
        self.assertEqual([10], [len(text) for text in sent(self.exchange)])

    def test_a_request_that_is_given_up_frees_its_room_and_its_late_reply_is_passed_over(
        self,
    ) -> None:
        given_up, waiting = self.command("1", WINDOW), self.command("2")
        sent(self.exchange)
        self.exchange.give_up(given_up.request, TimedOutError("late"))

        self.assertEqual(1, len(sent(self.exchange)))
        self.exchange.frame_arrived(reply("1"))
        self.exchange.frame_arrived(reply("2"))
        self.assertIsNone(given_up.message)
        self.assertIsNotNone(waiting.message)
        self.assertEqual(0, self.exchange.unanswered)

    def test_one_that_was_not_sent_is_never_sent(self) -> None:
        self.command("1", WINDOW)
        given_up = self.command("2")
        sent(self.exchange)
        self.exchange.give_up(given_up.request, TimedOutError("late"))
        self.exchange.frame_arrived(reply("1"))

        self.assertEqual([], sent(self.exchange))

    def test_replies_without_a_correlation_belong_to_the_oldest_request_of_their_kind(self) -> None:
        first = self.server_information()
        events = Asked(self.exchange, Kind.EVENTS, "<Events/>")
        second = self.server_information()
        sent(self.exchange)

        self.exchange.frame_arrived(SERVER_INFORMATION.encode())
        self.assertIsNotNone(first.message)
        self.exchange.frame_arrived(b"<Events/>")
        self.assertIsNotNone(events.message)
        self.assertIsNone(second.message)
        self.exchange.frame_arrived(SERVER_INFORMATION.encode())
        self.assertIsNotNone(second.message)

    def test_a_late_reply_without_a_correlation_is_not_taken_for_the_next(self) -> None:
        late = self.server_information()
        sent(self.exchange)
        self.exchange.give_up(late.request, TimedOutError("late"))
        again = self.server_information()

        texts = sent(self.exchange)
        self.assertEqual(
            [b"<Commands><Correlation>1</Correlation></Commands>", b"<ServerInformation/>"], texts
        )
        self.exchange.frame_arrived(SERVER_INFORMATION.encode())
        self.assertIsNone(again.message, "that was the late one")
        self.exchange.frame_arrived(b"<Correlation>1</Correlation><Commands/>")
        self.exchange.frame_arrived(SERVER_INFORMATION.encode())
        assert again.message is not None
        self.assertEqual(ServerInformation(1, 0), again.message.content)
        self.assertEqual(0, self.exchange.unanswered)

    def test_a_late_reply_that_never_comes_is_not_waited_for(self) -> None:
        late = self.server_information()
        sent(self.exchange)
        self.exchange.give_up(late.request, TimedOutError("late"))
        again = self.server_information()
        sent(self.exchange)
        self.exchange.frame_arrived(b"<Correlation>1</Correlation><Commands/>")
        self.exchange.frame_arrived(SERVER_INFORMATION.encode())

        self.assertIsNotNone(again.message)

    def test_a_raw_frame_gets_whatever_comes_and_is_no_event(self) -> None:
        raw = Asked(self.exchange, Kind.UNKNOWN, "anything")
        sent(self.exchange)
        self.exchange.frame_arrived(b"<Event><Name>E</Name></Event>")
        self.assertIsNone(raw.message)
        self.exchange.frame_arrived(b"not XML")

        self.assertIsNotNone(raw.message)
        self.assertEqual(b"not XML", self.exchange.raw_frame)

    def test_an_unreadable_frame_fails_what_waits_and_nothing_else(self) -> None:
        asked, waiting = self.command("1", WINDOW), self.command("2")
        sent(self.exchange)
        self.exchange.frame_arrived(b"not XML")

        self.assertIn("cannot be read as XML", str(asked.error))
        self.assertIsNone(waiting.error)
        self.assertEqual(1, len(sent(self.exchange)))

    def test_a_lost_connection_fails_everything_once(self) -> None:
        asked = [self.command("1", WINDOW), self.server_information()]
        sent(self.exchange)
        self.exchange.fail_all(ClosedError("gone"))

        self.assertEqual(["gone", "gone"], [str(one.error) for one in asked])
        self.assertEqual(0, self.exchange.unanswered)
