"""As much of XML as the control stream uses.

A reader of whole XML would not do. The declaration says UTF-16 though the bytes are UTF-8, the list
of commands has two elements at its top, and a name that another device has chosen may hold control
characters. All of that is on the wire and has to be read.
"""

from __future__ import annotations

import re
from typing import Dict, List, Optional

from .errors import ProtocolError

_ENTITY = re.compile("&(?:lt|gt|apos|quot|amp);")
_ENTITIES = {"&lt;": "<", "&gt;": ">", "&apos;": "'", "&quot;": '"', "&amp;": "&"}
_ATTRIBUTE = re.compile(r"""([^\s=]+)\s*=\s*(?:"([^"]*)"|'([^']*)')""")
_DEPTH_LIMIT = 100
_ATTRIBUTES_LIMIT = 1000  # a host writes two short ones

# A tree takes some hundred times the room of its tags. A longer list than a quarter of a million
# commands is no list of commands.
_TAG_LIMIT = 1 << 19


def decode_entities(text: str) -> str:
    """Decodes the five entities that a host writes, each once; everything else stays."""
    if "&" not in text:
        return text
    return _ENTITY.sub(lambda match: _ENTITIES[match.group()], text)


def encode_value(text: str) -> str:
    """Encodes a value so that the host's decoding, which replaces "&amp;" last, undoes it."""
    return text.replace("&", "&amp;").replace("<", "&lt;").replace(">", "&gt;")


class Element:
    """One element with its text, its attributes and the elements in it."""

    __slots__ = ("name", "text", "attributes", "children")

    def __init__(self, name: str) -> None:
        self.name = name
        self.text = ""
        self.attributes: Dict[str, str] = {}
        self.children: List[Element] = []

    def find(self, name: str) -> Optional[Element]:
        for child in self.children:
            if child.name == name:
                return child
        return None

    def find_all(self, name: str) -> List[Element]:
        return [child for child in self.children if child.name == name]

    def text_of(self, name: str) -> str:
        """An absent element reads as an empty one."""
        child = self.find(name)
        return child.text if child is not None else ""


def _unreadable(reason: str) -> ProtocolError:
    return ProtocolError(f"the host sent a frame that cannot be read as XML: {reason}")


def _skip_special(text: str, begin: int) -> int:
    """Returns where the declaration or comment at `begin` ends."""
    for start, stop in (("<?", "?>"), ("<!--", "-->")):
        if text.startswith(start, begin):
            end = text.find(stop, begin + len(start))
            if end < 0:
                raise _unreadable(f'"{start}" has no end')
            return end + len(stop)
    raise _unreadable("it holds a construct that no host writes")


def _open_element(tag: str) -> Element:
    name, *rest = tag.split(None, 1)
    element = Element(name)
    if rest and len(rest[0]) < _ATTRIBUTES_LIMIT:
        for key, double, single in _ATTRIBUTE.findall(rest[0]):
            element.attributes[key] = decode_entities(double or single)
    return element


def parse(text: str) -> Element:
    """Reads a document. The element returned has no name and holds the top-level elements."""
    if text.count("<") > _TAG_LIMIT:
        raise _unreadable("it has too many elements")
    top = Element("")
    open_elements = [top]
    position = 0
    while True:
        begin = text.find("<", position)
        _add_text(open_elements, text[position:] if begin < 0 else text[position:begin])
        if begin < 0:
            break
        if text[begin + 1 : begin + 2] in ("?", "!"):
            position = _skip_special(text, begin)
            continue
        end = text.find(">", begin)
        if end < 0:
            raise _unreadable("a tag has no end")
        _take_tag(open_elements, text[begin + 1 : end])
        position = end + 1
    if len(open_elements) > 1:
        raise _unreadable(f"the element {open_elements[-1].name} has no end")
    return top


def _add_text(open_elements: List[Element], text: str) -> None:
    if not text:
        return
    if len(open_elements) > 1:
        # The first text of an element is its value, as for the host.
        open_elements[-1].text = open_elements[-1].text or decode_entities(text)
    elif not text.isspace():
        raise _unreadable("it has text outside of any element")


def _take_tag(open_elements: List[Element], tag: str) -> None:
    if tag.startswith("/"):
        if len(open_elements) < 2 or tag[1:].rstrip() != open_elements[-1].name:
            raise _unreadable(f"the end tag of {tag[1:]} has no beginning")
        open_elements.pop()
        return
    short_form = tag.endswith("/")
    content = tag[:-1] if short_form else tag
    if not content or content[0].isspace():
        raise _unreadable("a tag has no name")
    element = _open_element(content)
    open_elements[-1].children.append(element)
    if not short_form:
        open_elements.append(element)
        if len(open_elements) > _DEPTH_LIMIT:
            raise _unreadable("it is nested too deeply")
