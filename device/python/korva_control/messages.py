"""Reads the messages of a host."""

from __future__ import annotations

import enum
from dataclasses import dataclass
from typing import Callable, Dict, List, Optional, Tuple, Union

from . import xmltext
from .errors import ProtocolError
from .records import (
    CommandInformation,
    CommandReply,
    Event,
    EventInformation,
    ParameterInformation,
    ServerInformation,
)
from .xmltext import Element


class Kind(enum.Enum):
    """Which message it is, named by its element."""

    COMMAND_REPLY = "CommandReply"
    EVENT = "Event"
    COMMANDS = "Commands"
    COMMAND_INFORMATION = "CommandInformation"
    EVENTS = "Events"
    EVENT_INFORMATION = "EventInformation"
    SERVER_INFORMATION = "ServerInformation"
    UNKNOWN = ""


Content = Union[
    CommandReply,
    Event,
    List[str],
    CommandInformation,
    EventInformation,
    ServerInformation,
    None,
]


@dataclass(frozen=True)
class Message:
    """One message. The correlation is the request's own, empty for the kinds that have none."""

    kind: Kind
    correlation: str
    content: Content


def _parameters(message: Element) -> Dict[str, str]:
    listed = message.find("Parameters")
    elements = listed.find_all("Parameter") if listed is not None else []
    return {element.text_of("Name"): element.text_of("Value") for element in elements}


def _descriptions(message: Element, name: str, description: str) -> List[ParameterInformation]:
    listed = message.find(name)
    elements = listed.find_all("Parameter") if listed is not None else []
    return [
        ParameterInformation(element.text_of("Name"), element.text_of(description))
        for element in elements
    ]


def _version_number(version: Optional[Element], name: str) -> int:
    text = version.attributes.get(name, "") if version is not None else ""
    if not (text.isascii() and text.isdigit()) or len(text) > 9:
        raise ProtocolError("the host's server information bears no version of the stream")
    return int(text)


def _read_server_information(element: Element, _top: Element) -> Tuple[str, Content]:
    version = element.find("StreamVersion")
    return "", ServerInformation(
        _version_number(version, "major"), _version_number(version, "minor")
    )


def _read_commands(element: Element, top: Element) -> Tuple[str, Content]:
    # Deliberate: Correlation stands beside Commands, not in it as everywhere else. That is how
    # every host writes it.
    return top.text_of("Correlation"), [child.text for child in element.find_all("Command")]


def _read_command_information(element: Element, _top: Element) -> Tuple[str, Content]:
    # Deliberate: the descriptions of a command's parameters bear the name Value, though those of an
    # event's parameters are called what they are. That is how every host writes them.
    return element.text_of("Correlation"), CommandInformation(
        element.text_of("Name"),
        element.text_of("Description"),
        _descriptions(element, "InputParameters", "Value"),
        _descriptions(element, "ReplyParameters", "Value"),
    )


def _read_events(element: Element, _top: Element) -> Tuple[str, Content]:
    return "", [child.text for child in element.find_all("Event")]


def _read_event_information(element: Element, _top: Element) -> Tuple[str, Content]:
    return "", EventInformation(
        element.text_of("Name"),
        element.text_of("Description"),
        _descriptions(element, "Parameters", "Description"),
    )


def _read_command_reply(element: Element, _top: Element) -> Tuple[str, Content]:
    result = element.text_of("Result")
    if not result:
        raise ProtocolError("the host's reply to a command bears no result")
    return element.text_of("Correlation"), CommandReply(result, _parameters(element))


def _read_event(element: Element, _top: Element) -> Tuple[str, Content]:
    return "", Event(element.text_of("Name"), _parameters(element))


_READERS: Dict[str, Tuple[Kind, Callable[[Element, Element], Tuple[str, Content]]]] = {
    "CommandReply": (Kind.COMMAND_REPLY, _read_command_reply),
    "Event": (Kind.EVENT, _read_event),
    "Commands": (Kind.COMMANDS, _read_commands),
    "CommandInformation": (Kind.COMMAND_INFORMATION, _read_command_information),
    "Events": (Kind.EVENTS, _read_events),
    "EventInformation": (Kind.EVENT_INFORMATION, _read_event_information),
    "ServerInformation": (Kind.SERVER_INFORMATION, _read_server_information),
}


def parse_message(text: bytes) -> Message:
    """Reads the text of a frame; ProtocolError where it is no message. Bad UTF-8 becomes U+FFFD."""
    top = xmltext.parse(text.decode("utf-8", "replace"))
    for element in top.children:
        found = _READERS.get(element.name)
        if found is not None:
            kind, read = found
            correlation, content = read(element, top)
            return Message(kind, correlation, content)
    return Message(Kind.UNKNOWN, "", None)
