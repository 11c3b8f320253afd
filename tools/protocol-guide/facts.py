"""The one table of what a host does not tell of itself: the commands of the authorization, the
parameters of events, the times, and the oddities. What a running host can show is checked against it.
"""

from __future__ import annotations

import re
from dataclasses import dataclass, field
from pathlib import Path
from typing import Dict, List, Optional, Tuple

SILENCE = None
"""What a probe expects where the host answers nothing."""

NamesWithTexts = List[Tuple[str, str]]


@dataclass(frozen=True)
class Command:
    name: str
    description: str
    inputs: NamesWithTexts
    replies: NamesWithTexts


@dataclass(frozen=True)
class EventFacts:
    description: str
    parameters: NamesWithTexts


@dataclass(frozen=True)
class Oddity:
    """Something that looks like a mistake. Each probe is a request with the body of its reply."""

    title: str
    text: str
    reason: str
    probes: List[Tuple[str, Optional[str]]] = field(default_factory=list)


AUTHORIZATION_COMMANDS = [
    Command(
        "System.Authorize",
        "Asks to be let in.",
        [
            (
                "DeviceId",
                "what the operator's answer is remembered by: the same at each start, of letters, "
                "digits and hyphens",
            ),
            ("DeviceName", "what the operator reads; markup is taken out of it"),
            ("ServerName", "may be left out; where given, the reply echoes it"),
        ],
        [
            ("ServerName", 'the application and the computer, as "Quorix on stage"'),
            ("ServerVersion", '"300", the version of this dialogue'),
            ("Status", '"Authorized", "Failed", "Pending" or "Connected", see below'),
        ],
    ),
    Command(
        "System.Authorize.Cancel",
        "Takes a waiting request back. It is answered by a failure, though it is done.",
        [("DeviceId", "is not looked at: whatever dialog is open closes")],
        [],
    ),
    Command(
        "System.Heartbeat",
        "Keeps the place of the device that is let in.",
        [("BeatId", "any text")],
        [("BeatId", "the same text")],
    ),
]

CAMERA = ("CameraId", "the camera's number in decimal")

EVENTS: Dict[str, EventFacts] = {
    "Event.Authorize": EventFacts(
        "The operator has answered, or a host without a window has let a device in. A device that is "
        "known hears the answer in the reply only.",
        [
            ("ServerName", "the application and the computer"),
            ("Status", '"Authorized" or "Failed"'),
        ],
    ),
    "Event.Disconnect": EventFacts(
        "The host is about to close the connection. Never sent because one device fell silent.", []
    ),
    "Event.Cameras.SelectionChanged": EventFacts(
        "Other cameras are selected. Not sent where the last one was deselected.",
        [("SelectedCameraIds", 'camera numbers separated by commas, as "1,3"')],
    ),
    "Event.Cameras.NameChanged": EventFacts(
        "A camera has another name.",
        [
            CAMERA,
            ("CameraName", "the new name"),
            ("CameraType", "what sort of camera it is, for people"),
        ],
    ),
    "Event.Cameras.UserIdChanged": EventFacts(
        "A camera has another user id.", [CAMERA, ("UserId", "a number in decimal")]
    ),
    "Event.Cameras.GreyscaleModeChanged": EventFacts(
        "A camera has another greyscale mode.",
        [
            CAMERA,
            (
                "GreyscaleMode",
                '"Auto", "None", "All", "Only", "Edges" or "No Edges"; empty for a mode that has '
                "no text",
            ),
        ],
    ),
    "Event.Cameras.SettingChanged": EventFacts(
        "A number of a camera has changed.",
        [
            CAMERA,
            ("SettingName", '"StrobeIntensity", "Threshold" or "ShutterDuration"'),
            ("SettingValue", "the number as text"),
        ],
    ),
    "Event.Cameras.TapToSelectChanged": EventFacts(
        "Tap-to-select was switched.", [("Param_TapEnabled", '"1" for on, "0" for off')]
    ),
}

TIMES: List[Tuple[str, str, str]] = [
    (
        "1000 ms",
        "the pause between two heartbeats that is recommended",
        "leaves room for two that come late",
    ),
    (
        "3500 ms",
        "without a heartbeat from anybody, and another device may be let in",
        'at 3499 ms it is still answered "Connected"',
    ),
    (
        "3000 ms",
        "from one check of the heartbeat to the next",
        "a silent device is marked as gone after 3 to 6.5 s; nothing is sent to it",
    ),
    ("no limit", "for the operator's answer", "the device sets its own, and then cancels"),
    (
        "no limit",
        "for a frame to come in whole, and for a connection to be idle",
        "there is no keep-alive; a device that hangs keeps its connection",
    ),
    (
        "5000 ms",
        "a device may well wait for a reply",
        "commands of all devices run one after the other, so that a slow one delays the rest",
    ),
]

UNKNOWN_COMMAND = "Error: Invalid command name or command not valid for the host application."


def execute(name: str, *parameters: Tuple[str, str], correlation: str = "7") -> str:
    """The request as a device writes it; the values are encoded already."""
    listed = "".join(
        f"<Parameter><Name>{key}</Name><Value>{value}</Value></Parameter>"
        for key, value in parameters
    )
    content = f"<Parameters>{listed}</Parameters>" if listed else ""
    return (
        f"<ExecuteCommand><Name>{name}</Name><Correlation>{correlation}</Correlation>"
        f"{content}</ExecuteCommand>"
    )


def reply(
    name: str, *parameters: Tuple[str, str], result: str = "OK", correlation: str = "7"
) -> str:
    """The body of a reply: what stands behind the declaration."""
    listed = "".join(
        f"<Parameter><Name>{key}</Name>"
        + (f"<Value>{value}</Value></Parameter>" if value else "<Value/></Parameter>")
        for key, value in parameters
    )
    content = f"<Parameters>{listed}</Parameters>" if listed else "<Parameters/>"
    return (
        f"<CommandReply><Name>{name}</Name><Correlation>{correlation}</Correlation>"
        f"<Result>{result}</Result>{content}</CommandReply>"
    )


CAMERA_1 = ("Param_CameraDeviceId", "1")


@dataclass(frozen=True)
class Failure:
    text: str
    request: str
    result: str
    cause: str = ""  # a line for the host's console before it


FAILURES = [
    Failure(
        "there is no such camera",
        execute("CameraSettings_GetStrobeIntensity", ("Param_CameraDeviceId", "99")),
        "Error: Unable to access requested data.",
    ),
    Failure(
        "the camera's number is none",
        execute("CameraSettings_GetStrobeIntensity", ("Param_CameraDeviceId", "qx:1")),
        "Error: Unable to access requested data.",
    ),
    Failure(
        "the camera has no such setting: a video camera has no threshold",
        execute("CameraSettings_GetCentroidThreshold", ("Param_CameraDeviceId", "3")),
        "Error: Invalid Parameter Name",
    ),
    Failure(
        "the camera refuses the value: a calibration holds it",
        execute(
            "CameraSettings_SetCentroidThreshold",
            ("Param_CameraDeviceId", "4"),
            ("Param_CentroidThreshold", "0.5"),
        ),
        "Error: Unable to modify read only data.",
    ),
    Failure(
        "the camera's greyscale mode is one that has no text",
        execute("CameraSettings_GetGreyscaleMode", ("Param_CameraDeviceId", "2")),
        "Error: An unknown error occurred.",
        "mode 2 6",
    ),
    Failure("the host has no such command", execute("Host.Bogus"), UNKNOWN_COMMAND),
]


def read_results(source: Path) -> List[Tuple[int, str]]:
    """Reads the codes and texts of results from the table that the server answers with."""
    text = source.read_text()
    unknown = re.search(r'Unknown = L"(.*?)";', text)
    rows = re.findall(r'/\*\s*(\d+) \*/ (?:L"(.*)"|Unknown),', text)
    if unknown is None or [int(code) for code, _ in rows] != list(range(len(rows))):
        raise ValueError(f"{source.name}: its table of results has another form now")
    return [(int(code), words or unknown.group(1)) for code, words in rows]
