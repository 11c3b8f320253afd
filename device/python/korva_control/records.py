"""What crosses the control stream, as plain records."""

from __future__ import annotations

from dataclasses import dataclass, field
from typing import Dict, List

DEFAULT_PORT = 803
"""The TCP port on which every host listens. It differs from the port that hosts advertise."""


@dataclass(frozen=True)
class ServerInformation:
    """The version of the stream that the host speaks; 1.0 is the only one."""

    major: int
    minor: int


@dataclass(frozen=True)
class ParameterInformation:
    """One parameter's name with a text for people."""

    name: str
    description: str


@dataclass(frozen=True)
class CommandInformation:
    """What the host tells of a command.

    For a command that it does not describe the name may be empty, and the description is
    "Command not found."; this goes for the commands of the authorization too, which can be run all
    the same.
    """

    name: str
    description: str
    input_parameters: List[ParameterInformation] = field(default_factory=list)
    reply_parameters: List[ParameterInformation] = field(default_factory=list)


@dataclass(frozen=True)
class EventInformation:
    """What the host tells of an event. Hosts commonly tell nothing: all fields are empty then."""

    name: str
    description: str
    parameters: List[ParameterInformation] = field(default_factory=list)


@dataclass(frozen=True)
class CommandReply:
    """The outcome of a command: "OK", or the reason of the failure and no parameters."""

    result: str
    parameters: Dict[str, str] = field(default_factory=dict)

    @property
    def ok(self) -> bool:
        return self.result == "OK"


@dataclass(frozen=True)
class Event:
    """Something that the host told without being asked."""

    name: str
    parameters: Dict[str, str] = field(default_factory=dict)


@dataclass(frozen=True)
class Authorization:
    """Where an authorization stands.

    The status is "Authorized", "Failed" (refused), "Pending" (the operator is being asked) or
    "Connected" (not started: another device holds the connection, or a request is waiting already).
    """

    status: str
    server_name: str
    server_version: str = ""

    @property
    def granted(self) -> bool:
        return self.status == "Authorized"
