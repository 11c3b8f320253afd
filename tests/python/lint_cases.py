"""Requests with what the lint says of them. A host is asked for the truth of it elsewhere."""

from typing import List, Tuple

E = "<ExecuteCommand><Name>Host.Echo</Name><Correlation>7</Correlation>{}</ExecuteCommand>"
P = "<Parameter><Name>{}</Name><Value>{}</Value></Parameter>"
EMPTY = "(white space alone and CDATA count as empty)"
NO_XML = "it is no XML that the host can read: "

# The text, and why a host drops it.
REFUSED: List[Tuple[str, str]] = [
    ("", "none of the elements that a host knows is there"),
    ("text", NO_XML + "there is text outside of the elements"),
    ("<Events/> text", NO_XML + "there is text outside of the elements"),
    ("\ufeff<Events/>", "it begins with a byte-order mark, which a host takes for text"),
    ("<Events>", NO_XML + "the element Events has no end"),
    ("<Events", NO_XML + "the tag of Events cannot be read"),
    ("<Events a/>", NO_XML + "the tag of Events cannot be read"),
    ("<Events a=b/>", NO_XML + "the tag of Events cannot be read"),
    ("</Events>", NO_XML + '"<" is not followed by a name'),
    ("<>", NO_XML + '"<" is not followed by a name'),
    ("< Events/>", NO_XML + '"<" is not followed by a name'),
    ("<Events></Events", NO_XML + "the end tag of Events cannot be read"),
    ("<!-- <Events/>", NO_XML + "a comment has no end"),
    ("<?xml <Events/>", NO_XML + "a processing instruction has no end"),
    ("<!DOCTYPE a [ > <Events/>", NO_XML + "the document type has no end"),
    ("<Events>\0</Events>", NO_XML + "the element Events has no end"),
    ("<a>" * 1001 + "</a>" * 1001 + "<Events/>", NO_XML + "its elements lie more than 1000 deep"),
    ("<Novelty/>", "none of the elements that a host knows is there"),
    ("<events/>", "none of the elements that a host knows is there"),
    ("<a><Events/></a>", "none of the elements that a host knows is there"),
    ("<Commands/>", "Commands has no Correlation"),
    ("<Commands><Correlation/></Commands>", f"Commands has an empty Correlation {EMPTY}"),
    (
        "<Commands><Correlation> \n</Correlation></Commands>",
        f"Commands has an empty Correlation {EMPTY}",
    ),
    (
        "<Commands><Correlation><![CDATA[7]]></Correlation></Commands>",
        f"Commands has an empty Correlation {EMPTY}",
    ),
    (
        "<CommandInformation><Correlation>7</Correlation></CommandInformation>",
        "CommandInformation has no Name",
    ),
    (
        "<CommandInformation><Name>A</Name></CommandInformation>",
        "CommandInformation has no Correlation",
    ),
    ("<EventInformation/>", "EventInformation has no text: the event's name"),
    (
        "<EventInformation> <Name>E</Name></EventInformation>",
        "EventInformation has a Name, but the event's name must be its own text",
    ),
    ("<ExecuteCommand><Name>A</Name></ExecuteCommand>", "ExecuteCommand has no Correlation"),
    (
        "<ExecuteCommand><Correlation>7</Correlation></ExecuteCommand>",
        "ExecuteCommand has no Name",
    ),
    (
        E.format("<Parameters>" + P.format("a", "1") + P.format("", "2") + "</Parameters>"),
        f"ExecuteCommand has a parameter that has an empty Name {EMPTY} (entry 2)",
    ),
    (
        E.format("<Parameters>" + P.format("a", "1") + " text</Parameters>"),
        "ExecuteCommand has text between its parameters, which the host takes for a parameter "
        "without a name (entry 2)",
    ),
    (
        E.format("<Parameters>" + P.format("a", "1") + "<![CDATA[x]]></Parameters>"),
        "ExecuteCommand has text between its parameters, which the host takes for a parameter "
        "without a name (entry 2)",
    ),
    (
        E.format("<Parameters>" + P.format("a", "1") + "<Foo/></Parameters>"),
        "ExecuteCommand has a parameter that has no Name (entry 2)",
    ),
    (
        "<Commands/><CommandInformation/>",
        "Commands has no Correlation; CommandInformation has no Correlation",
    ),
]

# The text, and what may surprise its writer though the host answers.
ANSWERED: List[Tuple[str, List[str]]] = [
    ("<Events/>", []),
    (" \n<?xml version='1.0'?>\t<!-- a --><Events>anything<b></c></Events>\n", []),
    ("<!DOCTYPE a [<!ELEMENT b>]><Events/>", []),
    ("<!anything><Events/>", []),
    ("<Events></Other>", []),
    ("<Events></ >", []),
    ("<Novelty/><Events/>", []),
    ("<Commands/><Events/>", []),
    ("<Events a='1' b = \"2\"/>", ["attributes are not looked at"]),
    ("<Events/>\0<nothing", ["what stands behind the first zero is not looked at"]),
    ("<ServerInformation><Foo/></ServerInformation>", []),
    ("<Commands>\n  <Correlation>7</Correlation>\n</Commands>", []),
    (
        "<Commands><Correlation>a&amp;b</Correlation></Commands>",
        ['"a&amp;b" is taken as it stands: entities are decoded in the Value of a parameter only'],
    ),
    ("<EventInformation> <Name>x</Name> tail</EventInformation>", []),
    ("<EventInformation>E</EventInformation>", []),
    ("<CommandInformation><Name>A</Name><Correlation>7</Correlation></CommandInformation>", []),
    (E.format(""), []),
    (E.format("<Parameters/>"), []),
    (E.format("<Parameters> </Parameters>"), []),
    (E.format("<Parameters>\n" + P.format("a", "&lt;") + "\n</Parameters>"), []),
    (E.format(P.format("a", "1")), ["a Parameter outside of Parameters is not looked at"]),
    (
        E.format("<Parameters><Foo/></Parameters>"),
        ["Parameters holds no Parameter, and so the command runs without any"],
    ),
    (
        E.format("<Parameters>" + P.format("a", "1") * 2 + "</Parameters>"),
        ["the parameter a is given twice, and the later value counts"],
    ),
    (
        E.format("<Parameters>" + P.format("a", "1") + "<Foo><Name>b</Name></Foo></Parameters>"),
        ["the element Foo counts as a parameter, as everything behind the first Parameter does"],
    ),
    (
        E.format("<Parameters>" + P.format("a", "<![CDATA[1]]>") + "</Parameters>"),
        ["the value of the parameter a is read as empty: CDATA and elements are no value"],
    ),
    (E.format("<Parameters>text" + P.format("a", "1") + "<!-- b --></Parameters>"), []),
]
