"""Logs all events of a host to a CSV file, until Ctrl-C, and over restarts of the host.

    python3 examples/log_events.py events.csv

Each line is the time, the event's name and its parameters as NAME=VALUE, one to a column. What
happens to the connection is logged as well, under names that begin with "(", so that a gap can be
told from silence.
"""

from __future__ import annotations

import argparse
import asyncio
import csv
import sys
from datetime import datetime, timezone
from typing import TextIO

from korva_control import (
    DEFAULT_PORT,
    AsyncClient,
    BackOff,
    ClientOptions,
    ControlError,
    State,
)


class EventLog:
    """Writes each line at once, so that nothing is lost where the program ends."""

    def __init__(self, file: TextIO) -> None:
        self._file = file
        self._writer = csv.writer(file)
        self.lines = 0

    def write(self, name: str, *columns: str) -> None:
        now = datetime.now(timezone.utc).isoformat(timespec="milliseconds")
        self._writer.writerow([now, name, *columns])
        self._file.flush()
        self.lines += 1


async def log_events(log: EventLog, host: str, port: int, count: int) -> None:
    def note(state: State, text: str) -> None:
        log.write(f"({state.value})", text)

    async with AsyncClient(ClientOptions(reconnect=BackOff())) as client:
        client.on_state(note)
        events = client.listen()  # before the connection, to miss nothing
        await client.connect(host, port)
        print(f"logging the events of {host}:{port}", flush=True)
        left = count
        async for event in events:
            columns = [f"{name}={value}" for name, value in event.parameters.items()]
            log.write(event.name, *columns)
            left -= 1
            if left == 0:
                break


def main() -> int:
    parser = argparse.ArgumentParser(description="Logs all events of a host to a CSV file.")
    parser.add_argument("file", help="is appended to")
    parser.add_argument("--host", default="127.0.0.1")
    parser.add_argument("--port", type=int, default=DEFAULT_PORT)
    parser.add_argument("--count", type=int, default=0, help="end after so many events")
    arguments = parser.parse_args()
    try:
        with open(arguments.file, "a", newline="", encoding="utf-8") as file:
            log = EventLog(file)
            asyncio.run(log_events(log, arguments.host, arguments.port, arguments.count))
    except (ControlError, OSError) as error:
        print(f"log_events: {error}", file=sys.stderr)
        return 1
    except KeyboardInterrupt:
        pass
    return 0


if __name__ == "__main__":
    sys.exit(main())
