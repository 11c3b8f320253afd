"""Tells what would become of a request that was written by hand.

A host says nothing of a message that it does not take, and a device cannot tell that from a lost
one. What the client itself writes needs no look: it is refused before it is made.
"""

from __future__ import annotations

from dataclasses import dataclass, field
from typing import Callable, Dict, List, Set, Union

from . import hosttext
from .hosttext import Node


@dataclass(frozen=True)
class LintReport:
    """The refusal is why the host would drop the text in silence, empty where it answers. The
    warnings are what the host would do that its writer may not expect, though it answers."""

    refusal: str = ""
    warnings: List[str] = field(default_factory=list)


def _missing(parent: Node, name: str) -> str:
    if parent.find(name) is None:
        return f"has no {name}"
    return f"has an empty {name} (white space alone and CDATA count as empty)"


def _warn_of_entities(node: Union[Node, None], warnings: List[str]) -> None:
    if node is not None and "&" in node.value and ";" in node.value:
        warnings.append(
            f'"{node.value}" is taken as it stands: entities are decoded in the Value of a '
            "parameter only"
        )


def _require(element: Node, name: str, warnings: List[str]) -> str:
    if not element.value_of(name):
        return _missing(element, name)
    _warn_of_entities(element.find(name), warnings)
    return ""


def _execute_command(element: Node, warnings: List[str]) -> str:
    refusal = _require(element, "Name", warnings) or _require(element, "Correlation", warnings)
    if refusal:
        return refusal
    listed = element.find("Parameters")
    if listed is not None:
        return _parameters(listed, warnings)
    if element.find("Parameter") is not None:
        warnings.append("a Parameter outside of Parameters is not looked at")
    return ""


def _parameters(listed: Node, warnings: List[str]) -> str:
    first = listed.find("Parameter")
    if first is None:
        if listed.children:
            warnings.append("Parameters holds no Parameter, and so the command runs without any")
        return ""
    seen: Set[str] = set()
    # From the first Parameter on the host takes everything for a parameter.
    begin = listed.children.index(first)
    for number, parameter in enumerate(listed.children[begin:], 1):
        if not parameter.name:
            return (
                "has text between its parameters, which the host takes for a parameter without a "
                f"name (entry {number})"
            )
        name = parameter.value_of("Name")
        if not name:
            return f"has a parameter that {_missing(parameter, 'Name')} (entry {number})"
        _warn_of_parameter(parameter, name, seen, warnings)
    return ""


def _warn_of_parameter(parameter: Node, name: str, seen: Set[str], warnings: List[str]) -> None:
    if parameter.name != "Parameter":
        warnings.append(
            f"the element {parameter.name} counts as a parameter, as everything behind the first "
            "Parameter does"
        )
    if name in seen:
        warnings.append(f"the parameter {name} is given twice, and the later value counts")
    seen.add(name)
    _warn_of_entities(parameter.find("Name"), warnings)
    value = parameter.find("Value")
    if value is not None and not value.value and value.children:
        warnings.append(
            f"the value of the parameter {name} is read as empty: CDATA and elements are no value"
        )


def _commands(element: Node, warnings: List[str]) -> str:
    return _require(element, "Correlation", warnings)


def _command_information(element: Node, warnings: List[str]) -> str:
    return _require(element, "Correlation", warnings) or _require(element, "Name", warnings)


def _event_information(element: Node, warnings: List[str]) -> str:
    if element.value:
        _warn_of_entities(element, warnings)
        return ""
    if element.find("Name") is not None:
        return "has a Name, but the event's name must be its own text"
    return "has no text: the event's name"


def _anything(_element: Node, _warnings: List[str]) -> str:
    return ""


# In the order in which a host tries them.
_ROOTS: Dict[str, Callable[[Node, List[str]], str]] = {
    "ExecuteCommand": _execute_command,
    "ServerInformation": _anything,
    "Commands": _commands,
    "CommandInformation": _command_information,
    "EventInformation": _event_information,
    "Events": _anything,
}


def lint_request(text: Union[str, bytes]) -> LintReport:
    """Looks at the text of a frame as a host does."""
    data = text.encode("utf-8", "surrogatepass") if isinstance(text, str) else text
    readable = data.decode("utf-8", "replace")
    if readable.startswith("\ufeff"):
        return LintReport("it begins with a byte-order mark, which a host takes for text")
    try:
        document = hosttext.read(readable)
    except hosttext.Unreadable as error:
        return LintReport(f"it is no XML that the host can read: {error}")
    report = _lint(document)
    if not report.refusal:
        if b"\0" in data:
            report.warnings.append("what stands behind the first zero is not looked at")
        if readable.split("\0", 1)[0].encode() != data.split(b"\0", 1)[0]:
            report.warnings.append("bytes that are not UTF-8 arrive as U+FFFD")
    return report


def _lint(document: Node) -> LintReport:
    refusals = []
    for root, check in _ROOTS.items():
        element = document.find(root)
        if element is None:
            continue
        warnings: List[str] = []
        refusal = check(element, warnings)
        if not refusal:
            if element.has_attributes:
                warnings.append("attributes are not looked at")
            return LintReport("", warnings)
        refusals.append(f"{root} {refusal}")
    if not refusals:
        known = ", ".join(_ROOTS)
        refusals.append(f"none of the elements that a host knows is there: {known}")
    return LintReport("; ".join(refusals))
