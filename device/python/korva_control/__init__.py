"""A device's side of the control stream of a motion-capture host.

`Client` has blocking calls, `AsyncClient` is for asyncio. Standard library only.
"""

from .aio import AsyncClient
from .client import Client, Listener
from .errors import (
    ClosedError,
    ControlError,
    NoConnectionError,
    ProtocolError,
    TimedOutError,
    UsageError,
)
from .lint import LintReport, lint_request
from .listening import EventStream
from .options import BackOff, ClientOptions, State
from .records import (
    DEFAULT_PORT,
    Authorization,
    CommandInformation,
    CommandReply,
    Event,
    EventInformation,
    ParameterInformation,
    ServerInformation,
)
from .requests import Parameters

__version__ = "0.1.0"

__all__ = [
    "DEFAULT_PORT",
    "AsyncClient",
    "Authorization",
    "BackOff",
    "Client",
    "ClientOptions",
    "ClosedError",
    "CommandInformation",
    "CommandReply",
    "ControlError",
    "Event",
    "EventInformation",
    "EventStream",
    "LintReport",
    "Listener",
    "NoConnectionError",
    "ParameterInformation",
    "Parameters",
    "ProtocolError",
    "ServerInformation",
    "State",
    "TimedOutError",
    "UsageError",
    "lint_request",
]
