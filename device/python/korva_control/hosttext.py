"""Reads a request as a host does, leniently where a host is lenient.

A host compares no end tags, takes no CDATA section for a value, passes over comments and document
types, and stops at the first zero. What it cannot read it drops in silence.
"""

from __future__ import annotations

import re
from typing import List, Optional, Tuple

_BLANKS = " \t\n\r"
_SPACE = re.compile(f"[{_BLANKS}]*")
_NODE_NAME = re.compile(f"[^{_BLANKS}/>?\0]+")
_END_TAG = re.compile(f"[^{_BLANKS}/>?\0]*[{_BLANKS}]*>")
_ATTRIBUTE = re.compile(
    f"[^{_BLANKS}/<>=?!\0]+[{_BLANKS}]*=[{_BLANKS}]*(?:\"[^\"\0]*\"|'[^'\0]*')[{_BLANKS}]*"
)
_DATA = re.compile("[^<\0]+")
NESTING_LIMIT = 1000


class Unreadable(Exception):
    """The text is no XML that a host can read; tells where and why."""


class Node:
    """An element, or a piece of text or CDATA, which have no name."""

    __slots__ = ("name", "value", "children", "has_attributes")

    def __init__(self, name: str) -> None:
        self.name = name
        self.value = ""
        self.children: List[Node] = []
        self.has_attributes = False

    def find(self, name: str) -> Optional[Node]:
        for child in self.children:
            if child.name == name:
                return child
        return None

    def value_of(self, name: str) -> str:
        child = self.find(name)
        return child.value if child is not None else ""


def _skip_blanks(text: str, position: int) -> int:
    match = _SPACE.match(text, position)
    return match.end() if match is not None else position


def _behind(text: str, end: str, position: int, what: str) -> int:
    found = text.find(end, position)
    if found < 0:
        raise Unreadable(f"{what} has no end")
    return found + len(end)


def _behind_doctype(text: str, position: int) -> int:
    depth = 0
    while position < len(text):
        character = text[position]
        if character == ">" and depth == 0:
            return position + 1
        depth += {"[": 1, "]": -1}.get(character, 0)
        position += 1
    raise Unreadable("the document type has no end")


def _special(text: str, position: int, parent: Node) -> int:
    """Passes over what begins with "<?" or "<!"."""
    if text.startswith("<?", position):
        return _behind(text, "?>", position + 2, "a processing instruction")
    if text.startswith("<!--", position):
        return _behind(text, "-->", position + 4, "a comment")
    if text.startswith("<![CDATA[", position):
        parent.children.append(Node(""))
        return _behind(text, "]]>", position + 9, "a CDATA section")
    if text.startswith("<!DOCTYPE", position) and text[position + 9 : position + 10] in _BLANKS:
        return _behind_doctype(text, position + 9)
    return _behind(text, ">", position + 2, "a declaration")


def _open_tag(text: str, position: int) -> Tuple[Node, int, bool]:
    """Reads a tag behind its "<". Returns the element, where it ends and whether it is short."""
    match = _NODE_NAME.match(text, position)
    if match is None:
        raise Unreadable('"<" is not followed by a name')
    node = Node(match.group())
    position = _skip_blanks(text, match.end())
    attribute = _ATTRIBUTE.match(text, position)
    while attribute is not None:
        node.has_attributes = True
        position = attribute.end()
        attribute = _ATTRIBUTE.match(text, position)
    if text.startswith(">", position):
        return node, position + 1, False
    if text.startswith("/>", position):
        return node, position + 2, True
    raise Unreadable(f"the tag of {node.name} cannot be read")


def _add_data(text: str, position: int, parent: Node) -> int:
    """Takes the text at the position for a node, blanks before it included."""
    match = _DATA.match(text, position)
    if match is None:
        return position
    data = match.group()
    if data.strip(_BLANKS):
        parent.children.append(Node(""))
        parent.value = parent.value or data
    return match.end()


def read(text: str) -> Node:
    """Returns an element without a name that holds the top-level ones; or raises Unreadable."""
    text = text.split("\0", 1)[0]
    top = Node("")
    opened = [top]
    position = 0
    while True:
        if len(opened) > 1:
            position = _add_data(text, position, opened[-1])
        else:
            position = _skip_blanks(text, position)
        if position == len(text):
            break
        if not text.startswith("<", position):
            raise Unreadable("there is text outside of the elements")
        if text.startswith("</", position) and len(opened) > 1:
            end = _END_TAG.match(text, position + 2)
            if end is None:
                raise Unreadable(f"the end tag of {opened[-1].name} cannot be read")
            opened.pop()
            position = end.end()
        elif text[position + 1 : position + 2] in ("?", "!"):
            position = _special(text, position, opened[-1])
        else:
            node, position, short = _open_tag(text, position + 1)
            opened[-1].children.append(node)
            if not short:
                opened.append(node)
                if len(opened) - 1 > NESTING_LIMIT:
                    raise Unreadable(f"its elements lie more than {NESTING_LIMIT} deep")
    if len(opened) > 1:
        raise Unreadable(f"the element {opened[-1].name} has no end")
    return top
