"""`python -m korva_control`: a small command line over the client."""

from __future__ import annotations

import argparse
import contextlib
import io
import json
import os
import sys
import time
from typing import Dict, List, Optional, Sequence, Tuple

from . import requests
from .client import Client
from .errors import (
    ClosedError,
    ControlError,
    NoConnectionError,
    TimedOutError,
    UsageError,
)
from .link import reason_of
from .options import ClientOptions
from .records import DEFAULT_PORT, Event
from .terminal import for_terminal, word_for_terminal

DONE, HOST_FAILED, WRONG_USAGE, NO_CONNECTION, TIMED_OUT = range(5)

_EPILOG = """Exit codes:
  0  done
  1  the host answered with a failure, or with something unreadable
  2  wrong usage; nothing was sent
  3  no connection, or the host closed it
  4  timed out"""


def _seconds(text: str) -> float:
    with contextlib.suppress(ValueError):
        if 0 < float(text) <= 365 * 24 * 3600:
            return float(text)
    raise argparse.ArgumentTypeError(f"'{text}' is no number of seconds above 0")


def _port(text: str) -> int:
    with contextlib.suppress(ValueError):
        if 0 < int(text) < 65536:
            return int(text)
    raise argparse.ArgumentTypeError(f"'{text}' is no port from 1 to 65535")


def _count(text: str) -> int:
    with contextlib.suppress(ValueError):
        if int(text) > 0:
            return int(text)
    raise argparse.ArgumentTypeError(f"'{text}' is no whole number above 0")


def _common_options() -> argparse.ArgumentParser:
    """The options that may stand before the command and behind it."""
    common = argparse.ArgumentParser(add_help=False, argument_default=argparse.SUPPRESS)
    common.add_argument("--host", help="the host's name or IPv4 address (127.0.0.1)")
    common.add_argument(
        "--port", type=_port, help=f"the port on which the host listens ({DEFAULT_PORT})"
    )
    common.add_argument(
        "--json", action="store_true", help="print each result as one JSON object on a line"
    )
    common.add_argument(
        "--timeout",
        type=_seconds,
        metavar="SECONDS",
        help="how many seconds connecting, or a request, may take (5)",
    )
    return common


def make_parser() -> argparse.ArgumentParser:
    common = _common_options()
    parser = argparse.ArgumentParser(
        prog="korva_control",
        description="Drives a motion-capture host over its control stream.",
        epilog=_EPILOG,
        formatter_class=argparse.RawDescriptionHelpFormatter,
        parents=[common],
    )
    commands = parser.add_subparsers(dest="command", required=True, metavar="COMMAND")
    commands.add_parser("info", parents=[common], help="ask what the host is")
    commands.add_parser("commands", parents=[common], help="list the host's commands")
    run = commands.add_parser("run", parents=[common], help="run a command of the host")
    run.add_argument("name", metavar="NAME", help="the command's name")
    run.add_argument(
        "parameters", metavar="NAME=VALUE", nargs="*", help="parameters, as many as there are"
    )
    watch = commands.add_parser(
        "watch",
        parents=[common],
        help="print the host's events as they come, until Ctrl-C",
        epilog="A --timeout that is given bounds the whole of it; without one it goes on.",
    )
    watch.add_argument("events", metavar="EVENT", nargs="*", help="only events of these names")
    watch.add_argument("--count", type=_count, metavar="N", help="end after so many events")
    return parser


def _split(text: str) -> Tuple[str, str]:
    """Cuts "Name=value" at the first "="; the value may hold more of them."""
    name, equals, value = text.partition("=")
    if not equals:
        raise UsageError(f'a parameter is written as NAME=VALUE, not as "{text}"')
    return name, value


def _print(line: str) -> None:
    print(line, flush=True)


def _print_json(content: Dict[str, object]) -> None:
    text = json.dumps(content, ensure_ascii=False)
    try:
        text.encode(getattr(sys.stdout, "encoding", None) or "utf-8")
    except UnicodeError:
        text = json.dumps(content)  # what stands for a character elsewhere would be no JSON
    _print(text)


class _Program:
    def __init__(self, arguments: argparse.Namespace) -> None:
        self._arguments = arguments
        self._host: str = getattr(arguments, "host", "127.0.0.1")
        self._port: int = getattr(arguments, "port", DEFAULT_PORT)
        self._json: bool = getattr(arguments, "json", False)
        self._time_limit: Optional[float] = getattr(arguments, "timeout", None)

    def run(self) -> int:
        work = {
            "info": self._info,
            "commands": self._commands,
            "run": self._run,
            "watch": self._watch,
        }[self._arguments.command]
        return work()

    def _connect(self) -> Client:
        client = self._make_client()
        try:
            client.connect(self._host, self._port)
        except BaseException:
            client.close()
            raise
        return client

    def _make_client(self) -> Client:
        return Client(ClientOptions(time_limit=self._time_limit or ClientOptions.time_limit))

    def _info(self) -> int:
        with self._connect() as client:
            version = client.server_information()
        if self._json:
            _print_json({"streamVersion": {"major": version.major, "minor": version.minor}})
        else:
            where = for_terminal(f"{self._host}:{self._port}")
            _print(f"Control stream {version.major}.{version.minor} at {where}")
        return DONE

    def _commands(self) -> int:
        with self._connect() as client:
            names = client.commands()
        if self._json:
            _print_json({"commands": names})
        else:
            for name in names:
                _print(for_terminal(name))
        return DONE

    def _run(self) -> int:
        name = self._arguments.name
        parameters: List[Tuple[str, str]] = [_split(text) for text in self._arguments.parameters]
        requests.execute_command_request("1", name, parameters)  # refuses before it connects
        with self._connect() as client:
            reply = client.execute(name, parameters)
        if self._json:
            _print_json(
                {
                    "command": name,
                    "result": reply.result,
                    "ok": reply.ok,
                    "parameters": reply.parameters,
                }
            )
        else:
            _print(for_terminal(reply.result))
            for key, value in reply.parameters.items():
                _print(f"{for_terminal(key)}={for_terminal(value)}")
        return DONE if reply.ok else HOST_FAILED

    def _watch(self) -> int:
        count: Optional[int] = self._arguments.count
        with self._make_client() as client, client.listen(*self._arguments.events) as events:
            client.connect(self._host, self._port)
            print(f"korva_control: watching {self._host}:{self._port}", file=sys.stderr, flush=True)
            end = None if self._time_limit is None else time.monotonic() + self._time_limit
            seen = 0
            while count is None or seen < count:
                try:
                    event = events.next(None if end is None else max(end - time.monotonic(), 0))
                except TimedOutError:
                    raise TimedOutError(
                        f"timed out, waiting for an event; {seen} came in time"
                    ) from None
                self._print_event(event)
                seen += 1
        return DONE

    def _print_event(self, event: Event) -> None:
        if self._json:
            _print_json({"event": event.name, "parameters": event.parameters})
            return
        words = [
            f"{for_terminal(name)}={word_for_terminal(value)}"
            for name, value in event.parameters.items()
        ]
        _print(" ".join([for_terminal(event.name), *words]))


def _exit_code(error: ControlError) -> int:
    if isinstance(error, UsageError):
        return WRONG_USAGE
    if isinstance(error, (NoConnectionError, ClosedError)):
        return NO_CONNECTION
    if isinstance(error, TimedOutError):
        return TIMED_OUT
    return HOST_FAILED


def main(words: Optional[Sequence[str]] = None) -> int:
    arguments = make_parser().parse_args(words)
    for stream in (sys.stdout, sys.stderr):
        if isinstance(stream, io.TextIOWrapper):
            stream.reconfigure(errors="backslashreplace")  # for a terminal that has no UTF-8
    try:
        return _Program(arguments).run()
    except KeyboardInterrupt:
        return DONE if arguments.command == "watch" else 130
    except ControlError as error:
        print(f"korva_control: {for_terminal(str(error))}", file=sys.stderr)
        return _exit_code(error)
    except OSError as error:
        # What Python would still flush has nowhere to go.
        os.dup2(os.open(os.devnull, os.O_WRONLY), sys.stdout.fileno())
        if not isinstance(error, BrokenPipeError):  # else whoever read the output has gone
            reason = reason_of(error)
            print(f"korva_control: the output cannot be written: {reason}", file=sys.stderr)
        return HOST_FAILED
