import unittest
from typing import Callable, List, Tuple

from korva_control import requests
from korva_control.errors import UsageError


class Requests(unittest.TestCase):
    def test_are_the_literal_texts_of_the_protocol(self) -> None:
        self.assertEqual("<ServerInformation/>", requests.server_information_request())
        self.assertEqual("<Events/>", requests.events_request())
        self.assertEqual(
            "<Commands><Correlation>7</Correlation></Commands>", requests.commands_request("7")
        )
        self.assertEqual(
            "<CommandInformation><Correlation>7</Correlation><Name>A.B</Name></CommandInformation>",
            requests.command_information_request("7", "A.B"),
        )
        self.assertEqual(
            "<EventInformation>Event.X</EventInformation>",
            requests.event_information_request("Event.X"),
        )

    def test_a_command_without_parameters_has_no_list_of_them(self) -> None:
        self.assertEqual(
            "<ExecuteCommand><Name>A</Name><Correlation>7</Correlation></ExecuteCommand>",
            requests.execute_command_request("7", "A"),
        )

    def test_only_the_values_of_parameters_are_encoded(self) -> None:
        self.assertEqual(
            "<ExecuteCommand><Name>A&B>\"'</Name><Correlation>7&amp;</Correlation><Parameters>"
            "<Parameter><Name>p&q</Name><Value>a&lt;b&gt;&amp;lt;\"'\t\n</Value></Parameter>"
            "<Parameter><Name>empty</Name><Value></Value></Parameter>"
            "</Parameters></ExecuteCommand>",
            requests.execute_command_request(
                "7&amp;", "A&B>\"'", {"p&q": "a<b>&lt;\"'\t\n", "empty": ""}
            ),
        )

    def test_parameters_may_be_pairs(self) -> None:
        self.assertEqual(
            requests.execute_command_request("7", "A", {"b": "1", "a": "2"}),
            requests.execute_command_request("7", "A", [("b", "1"), ("a", "2")]),
        )


class Lint(unittest.TestCase):
    def assert_refused(self, make: Callable[[], str], reason: str) -> None:
        with self.assertRaises(UsageError) as caught:
            make()
        self.assertEqual(reason, str(caught.exception))

    def test_says_why_it_refuses_what_the_host_takes_as_it_stands(self) -> None:
        cases: List[Tuple[str, str]] = [
            ("", "is empty, and the host answers nothing to that"),
            (
                " \t\r\n",
                "is white space alone, which the host takes for empty and does not answer",
            ),
            ("a<b", 'holds "<", which the host can read in the value of a parameter only'),
            ("a\nb", "holds the control character U+000A"),
            ("a\0b", "holds the control character U+0000"),
            ("a\x7fb", "holds the control character U+007F"),
            ("a\ud83d", "holds half of a surrogate pair, which is no character"),
        ]
        for text, reason in cases:
            with self.subTest(text=text):
                self.assert_refused(
                    lambda: requests.execute_command_request("7", text),
                    f"the name of the command {reason}",
                )
                self.assert_refused(
                    lambda: requests.command_information_request("7", text),
                    f"the name of the command {reason}",
                )
                self.assert_refused(
                    lambda: requests.event_information_request(text),
                    f"the name of the event {reason}",
                )
                self.assert_refused(
                    lambda: requests.commands_request(text), f"the correlation {reason}"
                )
                self.assert_refused(
                    lambda: requests.execute_command_request("7", "A", {text: "1"}),
                    f"the name of a parameter {reason}",
                )

    def test_says_why_it_refuses_a_value(self) -> None:
        cases = [
            (" ", "is white space alone, which would reach the host as an empty one"),
            ("a\0b", "holds the control character U+0000"),
            ("a\x0bb", "holds the control character U+000B"),
            ("\udc00", "holds half of a surrogate pair, which is no character"),
        ]
        for value, reason in cases:
            with self.subTest(value=value):
                self.assert_refused(
                    lambda: requests.execute_command_request("7", "A", {"p": value}),
                    f'the value of the parameter "p" {reason}',
                )

    def test_refuses_a_number_instead_of_writing_it_in_some_way(self) -> None:
        self.assert_refused(
            lambda: requests.execute_command_request("7", "A", {"p": 0.5}),  # type: ignore
            'the value of the parameter "p" is float, not text',
        )

    def test_refuses_a_name_that_is_given_twice(self) -> None:
        self.assert_refused(
            lambda: requests.execute_command_request("7", "A", [("p", "1"), ("p", "2")]),
            'the parameter "p" is given twice, and the host would keep only the later',
        )

    def test_lets_everything_else_pass(self) -> None:
        for text in ("a b", " a", "м一😀", "]]>", "a=b", "\xa0"):
            requests.execute_command_request(text, text, {text: text})
