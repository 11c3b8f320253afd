"""The texts of the requests, and the lint that stands before them.

The host answers a faulty request with silence, which cannot be told from a lost one. So every
function here raises UsageError for what the host would not answer, and for what would not arrive as
it was given.

The host takes names and correlations as they stand and decodes entities in the values of parameters
only. Therefore a name is written unchanged, "&" included, and one with "<" cannot be sent at all:
an escaped one would be another name.
"""

from __future__ import annotations

import re
from typing import Iterable, Mapping, Pattern, Tuple, Union

from .errors import UsageError
from .xmltext import encode_value

Parameters = Union[Mapping[str, str], Iterable[Tuple[str, str]]]
"""Names with values. Of two with one name the host would take the later; the lint refuses them."""

_WHITE_SPACE = " \t\n\r"
_UNSENDABLE = re.compile("[\x00-\x1f\x7f\ud800-\udfff]")
_UNSENDABLE_IN_LINES = re.compile("[\x00-\x08\x0b\x0c\x0e-\x1f\x7f\ud800-\udfff]")


def _refuse_unsendable(text: str, what: str, unsendable: Pattern[str]) -> None:
    if not isinstance(text, str):
        raise UsageError(f"{what} is {type(text).__name__}, not text")
    found = unsendable.search(text)
    if found is None:
        return
    if found.group() >= "\ud800":
        raise UsageError(f"{what} holds half of a surrogate pair, which is no character")
    raise UsageError(f"{what} holds the control character U+{ord(found.group()):04X}")


def check_verbatim(text: str, what: str) -> None:
    """Checks a text that the host takes as it stands, and cannot do without."""
    # White space alone is told below, in better words.
    _refuse_unsendable(text, what, _UNSENDABLE_IN_LINES)
    if not text:
        raise UsageError(f"{what} is empty, and the host answers nothing to that")
    if not text.strip(_WHITE_SPACE):
        raise UsageError(
            f"{what} is white space alone, which the host takes for empty and does not answer"
        )
    _refuse_unsendable(text, what, _UNSENDABLE)
    if "<" in text:
        raise UsageError(
            f'{what} holds "<", which the host can read in the value of a parameter only'
        )


def check_value(text: str, what: str) -> None:
    _refuse_unsendable(text, what, _UNSENDABLE_IN_LINES)
    if text and not text.strip(_WHITE_SPACE):
        raise UsageError(f"{what} is white space alone, which would reach the host as an empty one")


def _element(name: str, content: str) -> str:
    return f"<{name}>{content}</{name}>"


def _correlation_element(correlation: str) -> str:
    check_verbatim(correlation, "the correlation")
    return _element("Correlation", correlation)


def _name_element(name: str, what: str) -> str:
    check_verbatim(name, what)
    return _element("Name", name)


def pairs(parameters: Parameters) -> Iterable[Tuple[str, str]]:
    return parameters.items() if isinstance(parameters, Mapping) else parameters


def _parameter_elements(parameters: Parameters) -> str:
    seen = set()
    text = ""
    for name, value in pairs(parameters):
        element = _name_element(name, "the name of a parameter")
        if name in seen:
            raise UsageError(
                f'the parameter "{name}" is given twice, and the host would keep only the later'
            )
        seen.add(name)
        check_value(value, f'the value of the parameter "{name}"')
        text += _element("Parameter", element + _element("Value", encode_value(value)))
    return text


def server_information_request() -> str:
    return "<ServerInformation/>"


def commands_request(correlation: str) -> str:
    return _element("Commands", _correlation_element(correlation))


def command_information_request(correlation: str, name: str) -> str:
    return _element(
        "CommandInformation",
        _correlation_element(correlation) + _name_element(name, "the name of the command"),
    )


def events_request() -> str:
    return "<Events/>"


def event_information_request(name: str) -> str:
    check_verbatim(name, "the name of the event")
    return _element("EventInformation", name)


def execute_command_request(correlation: str, name: str, parameters: Parameters = ()) -> str:
    content = _name_element(name, "the name of the command") + _correlation_element(correlation)
    elements = _parameter_elements(parameters)
    if elements:
        content += _element("Parameters", elements)
    return _element("ExecuteCommand", content)
