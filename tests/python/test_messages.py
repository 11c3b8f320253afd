import unittest
from typing import List, Tuple

from korva_control.errors import ProtocolError
from korva_control.messages import Kind, Message, parse_message
from korva_control.records import (
    CommandInformation,
    CommandReply,
    Event,
    EventInformation,
    ParameterInformation,
    ServerInformation,
)
from scripted_host import DECLARATION


def read(text: str) -> Message:
    return parse_message((DECLARATION + text).encode())


class Messages(unittest.TestCase):
    def test_server_information(self) -> None:
        self.assertEqual(
            Message(Kind.SERVER_INFORMATION, "", ServerInformation(1, 0)),
            read('<ServerInformation><StreamVersion major="1" minor="0"/></ServerInformation>'),
        )

    def test_the_list_of_commands_has_its_correlation_beside_it(self) -> None:
        self.assertEqual(
            Message(Kind.COMMANDS, "7", ["A", "B"]),
            read(
                "<Correlation>7</Correlation>"
                "<Commands><Command>A</Command><Command>B</Command></Commands>"
            ),
        )
        self.assertEqual(
            Message(Kind.COMMANDS, "7", []), read("<Correlation>7</Correlation><Commands/>")
        )

    def test_command_information_calls_descriptions_values(self) -> None:
        self.assertEqual(
            Message(
                Kind.COMMAND_INFORMATION,
                "7",
                CommandInformation(
                    "A", "Does.", [ParameterInformation("p", "in")], [ParameterInformation("q", "")]
                ),
            ),
            read(
                "<CommandInformation><Correlation>7</Correlation><Name>A</Name>"
                "<Description>Does.</Description><InputParameters><Parameter><Name>p</Name>"
                "<Value>in</Value></Parameter></InputParameters><ReplyParameters><Parameter>"
                "<Name>q</Name><Value/></Parameter></ReplyParameters></CommandInformation>"
            ),
        )

    def test_events_and_event_information_bear_no_correlation(self) -> None:
        self.assertEqual(
            Message(Kind.EVENTS, "", ["Event.A"]), read("<Events><Event>Event.A</Event></Events>")
        )
        self.assertEqual(
            Message(
                Kind.EVENT_INFORMATION,
                "",
                EventInformation("E", "d", [ParameterInformation("p", "text")]),
            ),
            read(
                "<EventInformation><Name>E</Name><Description>d</Description><Parameters>"
                "<Parameter><Name>p</Name><Description>text</Description></Parameter></Parameters>"
                "</EventInformation>"
            ),
        )

    def test_a_reply_and_its_entities(self) -> None:
        message = read(
            "<CommandReply><Name>A</Name><Correlation>7</Correlation><Result>OK</Result>"
            "<Parameters><Parameter><Name>p</Name><Value>&lt;&gt;&apos;&quot;&amp;amp;&#65;</Value>"
            "</Parameter><Parameter><Name>blank</Name><Value> </Value></Parameter></Parameters>"
            "</CommandReply>"
        )

        self.assertEqual(
            Message(
                Kind.COMMAND_REPLY, "7", CommandReply("OK", {"p": "<>'\"&amp;&#65;", "blank": " "})
            ),
            message,
        )

    def test_a_failure(self) -> None:
        message = read(
            "<CommandReply><Name>A</Name><Correlation>7</Correlation>"
            "<Result>Error: System Error</Result><Parameters/></CommandReply>"
        )

        assert isinstance(message.content, CommandReply)
        self.assertFalse(message.content.ok)
        self.assertEqual("Error: System Error", message.content.result)

    def test_an_event(self) -> None:
        self.assertEqual(
            Message(Kind.EVENT, "", Event("Event.X", {"Id": "7"})),
            read(
                "<Event><Name>Event.X</Name><Parameters><Parameter><Name>Id</Name><Value>7</Value>"
                "</Parameter></Parameters></Event>"
            ),
        )
        self.assertEqual(
            Message(Kind.EVENT, "", Event("Event.X")),
            read("<Event><Name>Event.X</Name><Parameters/></Event>"),
        )

    def test_bad_bytes_and_controls_do_not_spoil_a_message(self) -> None:
        message = parse_message(b"<Event><Name>a\xff\x01\x00b</Name><Parameters/></Event>")

        self.assertEqual(Event("a\ufffd\x01\x00b"), message.content)

    def test_indentation_is_passed_over(self) -> None:
        message = read(" <Event>\n <Name>E</Name>\n <!-- <a> --> <Parameters/>\n</Event>\n")

        self.assertEqual(Event("E"), message.content)

    def test_an_element_of_another_name_is_a_message_of_no_kind(self) -> None:
        self.assertEqual(Message(Kind.UNKNOWN, "", None), read("<Novelty/>"))
        self.assertEqual(Message(Kind.UNKNOWN, "", None), read(""))

    def test_what_cannot_be_read(self) -> None:
        cases: List[Tuple[str, str]] = [
            ("text", "it has text outside of any element"),
            ("<a>", "the element a has no end"),
            ("<a", "a tag has no end"),
            ("</a>", "the end tag of a has no beginning"),
            ("<a></b>", "the end tag of b has no beginning"),
            ("< a/>", "a tag has no name"),
            ("<>", "a tag has no name"),
            ("<![CDATA[x]]>", "it holds a construct that no host writes"),
            ("<!-- ", '"<!--" has no end'),
            ("<a>" * 200 + "</a>" * 200, "it is nested too deeply"),
            ("<a/>" * (1 << 19), "it has too many elements"),
        ]
        for text, reason in cases:
            with self.subTest(text=text[:20]), self.assertRaises(ProtocolError) as caught:
                read(text)
            self.assertEqual(
                f"the host sent a frame that cannot be read as XML: {reason}",
                str(caught.exception),
            )

    def test_a_message_that_lacks_what_it_must_have(self) -> None:
        for version in ("", '<StreamVersion major="1"/>', '<StreamVersion major="x" minor="0"/>'):
            with self.assertRaisesRegex(ProtocolError, "no version of the stream"):
                read(f"<ServerInformation>{version}</ServerInformation>")
        with self.assertRaisesRegex(ProtocolError, "bears no result"):
            read("<CommandReply><Correlation>7</Correlation></CommandReply>")

    def test_a_hostile_text_costs_no_more_than_its_length(self) -> None:
        for text in ("<a " + "x" * 2_000_000 + ">", "<a>" + "x<b/>" * 200_000 + "</a>"):
            parse_message(text.encode() if text.endswith("</a>") else text.encode() + b"</a>")
