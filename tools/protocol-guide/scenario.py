"""A session with a running host, in which every message and every oddity comes about."""

from __future__ import annotations

import time
from typing import Dict, List, Optional, Tuple

import facts
from facts import execute
from oddities import ODDITIES
from stage import DECLARATION, LIMIT, Device, Exchange, Frame, Surprise

from quorix_host import QuorixHost

from korva_control.messages import parse_message
from korva_control.records import CommandInformation, Event


class Session:
    """What was said, by the name under which the guide shows it."""

    def __init__(self) -> None:
        self.exchanges: Dict[str, Exchange] = {}
        self.events: Dict[str, Frame] = {}
        self.denial: Optional[Frame] = None
        self.failures: List[Exchange] = []
        self.probes: List[List[Exchange]] = []
        self.commands: List[CommandInformation] = []
        self.undescribed: List[str] = []


def names_of(frame: Optional[Frame]) -> List[str]:
    assert frame is not None
    content = parse_message(frame.body).content
    assert isinstance(content, list)
    return content


def describe(device: Device, name: str) -> Tuple[Exchange, CommandInformation]:
    exchange = device.exchange(
        f"<CommandInformation><Correlation>7</Correlation><Name>{name}</Name></CommandInformation>"
    )
    assert exchange.reply is not None
    content = parse_message(exchange.reply.body).content
    assert isinstance(content, CommandInformation)
    return exchange, content


def discover(device: Device, session: Session) -> None:
    said = session.exchanges
    said["server-information"] = device.exchange("<ServerInformation/>")
    said["commands"] = device.exchange("<Commands><Correlation>7</Correlation></Commands>")
    said["events"] = device.exchange("<Events/>")
    said["event-information"] = device.exchange(
        "<EventInformation>Event.Cameras.NameChanged</EventInformation>"
    )
    for name in names_of(said["commands"].reply):
        exchange, content = describe(device, name)
        if content.name:
            session.commands.append(content)
        else:
            session.undescribed.append(name)
        if name == "CameraSettings_SetStrobeIntensity":
            said["command-information"] = exchange


def tell(host: QuorixHost, line: str) -> None:
    answer = host.command(line)
    if answer != "ok":
        raise Surprise(f"the host's console answers {answer} to: {line}")


def authorize(device_id: str, name: str) -> str:
    return execute("System.Authorize", ("DeviceId", device_id), ("DeviceName", name))


def ask(device: Device, device_id: str, name: str, status: str) -> Exchange:
    """Asks until the answer has the status. An outcome is told a moment before the request that it
    ends is over, and until then a host says "Connected"."""
    end = time.monotonic() + LIMIT
    while True:
        exchange = device.exchange(authorize(device_id, name))
        assert exchange.reply is not None
        if f"<Value>{status}</Value>" in exchange.reply.text:
            return exchange
        if "<Value>Connected</Value>" not in exchange.reply.text or time.monotonic() > end:
            raise Surprise(f"asked for {status}, got {exchange.reply.text}")


def be_let_in(device: Device, session: Session, host: QuorixHost) -> None:
    said, events = session.exchanges, session.events
    other = Device()
    said["authorize-taken"] = ask_twice_and_cancel(device, other, host, said)
    said["authorize-pending"] = ask(device, "desk-7", "Light desk", "Pending")
    host.wait_for_dialog()
    tell(host, "answer deny forget")
    session.denial = device.event("Event.Authorize")
    ask(device, "desk-7", "Light desk", "Pending")
    host.wait_for_dialog()
    tell(host, "answer allow remember")
    events["Event.Authorize"] = device.event("Event.Authorize")
    said["authorize-known"] = ask(device, "desk-7", "Light desk", "Authorized")
    said["heartbeat"] = device.exchange(execute("System.Heartbeat", ("BeatId", "1")))
    other.close()


def ask_twice_and_cancel(
    device: Device, other: Device, host: QuorixHost, said: Dict[str, Exchange]
) -> Exchange:
    """One device waits for the operator, another asks meanwhile, the first gives up."""
    ask(device, "desk-7", "Light desk", "Pending")
    host.wait_for_dialog()
    taken = ask(other, "desk-8", "Other desk", "Connected")
    said["cancel"] = device.exchange(execute("System.Authorize.Cancel", ("DeviceId", "desk-7")))
    host.wait_for_dialog(False)
    return taken


def drive_cameras(device: Device, session: Session, host: QuorixHost) -> None:
    said, events = session.exchanges, session.events
    camera = ("Param_CameraDeviceId", "1")
    said["execute"] = device.exchange(
        execute("CameraSettings_SetStrobeIntensity", camera, ("Param_StrobeIntensity", "0.75"))
    )
    events["Event.Cameras.SettingChanged"] = device.event("Event.Cameras.SettingChanged")
    said["execute-reply"] = device.exchange(execute("CameraSettings_GetStrobeIntensity", camera))
    causes: List[Tuple[str, Optional[str], Optional[str]]] = [
        (
            "Event.Cameras.GreyscaleModeChanged",
            execute("CameraSettings_SetGreyscaleMode", camera, ("Param_GreyscaleMode", "No Edges")),
            None,
        ),
        (
            "Event.Cameras.TapToSelectChanged",
            execute("CameraSettings_ToggleTap", ("Param_TapEnabled", "1")),
            None,
        ),
        (
            "Event.Cameras.SelectionChanged",
            execute("CameraSettings_SetSelection", ("Param_CameraSelection", "1,3")),
            None,
        ),
        ("Event.Cameras.NameChanged", None, 'set Device qx:1 Name "Left & high"'),
        ("Event.Cameras.UserIdChanged", None, "set Device qx:1 UserId 17"),
    ]
    for name, request, line in causes:
        if request is not None:
            device.exchange(request)
        elif line is not None:
            tell(host, line)
        events[name] = device.event(name)


def fail(device: Device, session: Session, host: QuorixHost) -> None:
    for failure in facts.FAILURES:
        if failure.cause:
            tell(host, failure.cause)
        exchange = device.exchange(failure.request)
        assert exchange.reply is not None
        if f"<Result>{failure.result}</Result><Parameters/>" not in exchange.reply.text:
            raise Surprise(f"{failure.text}: got {exchange.reply.text}")
        session.failures.append(exchange)
    session.exchanges["execute-failure"] = session.failures[0]


def probe(device: Device, session: Session) -> None:
    for oddity in ODDITIES:
        exchanges = []
        for request, expected in oddity.probes:
            if expected is facts.SILENCE:
                exchanges.append(device.expect_silence(request))
                continue
            exchange = device.exchange(request)
            assert exchange.reply is not None
            if exchange.reply.text != DECLARATION + expected:
                raise Surprise(f"{oddity.title}: {request} got {exchange.reply.text}")
            exchanges.append(exchange)
        session.probes.append(exchanges)


def compare(what: str, told: List[str], shown: List[str]) -> None:
    if sorted(told) != sorted(shown):
        raise Surprise(f"{what}: the guide tells {told}, the host shows {shown}")


def check_facts(session: Session) -> None:
    """The host shows all that the table tells of commands and events, and nothing else."""
    compare("events", list(facts.EVENTS), names_of(session.exchanges["events"].reply))
    compare("events in the session", list(facts.EVENTS), list(session.events))
    for name, frame in session.events.items():
        event = parse_message(frame.body).content
        assert isinstance(event, Event)
        told = [parameter for parameter, _ in facts.EVENTS[name].parameters]
        compare(f"the parameters of {name}", told, list(event.parameters))
    told_commands = [command.name for command in facts.AUTHORIZATION_COMMANDS]
    compare("commands without a description", told_commands, session.undescribed)
    replies = dict(zip(told_commands, ("authorize-known", "cancel", "heartbeat")))
    for command in facts.AUTHORIZATION_COMMANDS:
        reply = session.exchanges[replies[command.name]].reply
        assert reply is not None
        shown = getattr(parse_message(reply.body).content, "parameters")
        compare(f"the reply of {command.name}", [name for name, _ in command.replies], list(shown))


def play(host: QuorixHost) -> Session:
    session = Session()
    device = Device()
    discover(device, session)
    be_let_in(device, session, host)
    drive_cameras(device, session, host)
    fail(device, session, host)
    probe(device, session)
    host.quit()
    session.events["Event.Disconnect"] = device.event("Event.Disconnect")
    device.close()
    check_facts(session)
    return session
