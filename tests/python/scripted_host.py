"""A host that does what a test tells it, frame by frame, on a free port of the loopback."""

from __future__ import annotations

import select
import socket
import struct
import threading
from types import TracebackType
from typing import Callable, List, Optional, Type

LIMIT = 30.0
"""Seconds after which a test that waits for what is sure to come fails."""

DECLARATION = '<?xml version="1.0" encoding="UTF-16" standalone="no"?>'
SERVER_INFORMATION = (
    DECLARATION + '<ServerInformation><StreamVersion major="1" minor="0"/></ServerInformation>'
)


def frame(text: str) -> bytes:
    data = text.encode()
    return struct.pack("<I", len(data)) + data


class Peer:
    """One connected client, as the script sees it."""

    def __init__(self, connection: socket.socket) -> None:
        connection.settimeout(LIMIT)
        self._connection = connection

    def read_bytes(self, count: int) -> bytes:
        data = b""
        while len(data) < count:
            part = self._connection.recv(count - len(data))
            if not part:
                raise EOFError
            data += part
        return data

    def read(self) -> str:
        (length,) = struct.unpack("<I", self.read_bytes(4))
        return self.read_bytes(length).decode()

    def has_more(self) -> bool:
        """Whether something arrives within a moment."""
        return bool(select.select([self._connection], [], [], 0.1)[0])

    def send(self, text: str) -> None:
        self.send_bytes(frame(text))

    def send_bytes(self, data: bytes) -> None:
        self._connection.sendall(data)

    def greet(self) -> None:
        """Answers the question with which the client begins."""
        assert self.read() == "<ServerInformation/>"
        self.send(SERVER_INFORMATION)

    def reply(self, request: str, result: str = "OK", parameters: str = "") -> None:
        """Answers a request of the kind ExecuteCommand."""
        listed = f"<Parameters>{parameters}</Parameters>" if parameters else "<Parameters/>"
        self.send(
            f"{DECLARATION}<CommandReply><Name>{between(request, 'Name')}</Name>"
            f"<Correlation>{between(request, 'Correlation')}</Correlation>"
            f"<Result>{result}</Result>{listed}</CommandReply>"
        )

    def event(self, name: str, parameters: str = "") -> None:
        listed = f"<Parameters>{parameters}</Parameters>" if parameters else "<Parameters/>"
        self.send(f"{DECLARATION}<Event><Name>{name}</Name>{listed}</Event>")

    def wait_for_end(self) -> None:
        while self._connection.recv(65536):
            pass

    def close(self) -> None:
        self._connection.close()


def between(text: str, element: str) -> str:
    return text.split(f"<{element}>", 1)[1].split(f"</{element}>", 1)[0]


def parameter(name: str, value: str) -> str:
    return f"<Parameter><Name>{name}</Name><Value>{value}</Value></Parameter>"


class ScriptedHost:
    """Runs one script for each connection, one after the other.

    A script that ends closes its connection. What a script raises fails the test at `close`, apart
    from the client's going.
    """

    def __init__(self, *scripts: Callable[[Peer], None]) -> None:
        self._listener = socket.create_server(("127.0.0.1", 0))
        self._listener.settimeout(LIMIT)
        self.port: int = self._listener.getsockname()[1]
        self._scripts = scripts
        self.failures: List[BaseException] = []
        self._thread = threading.Thread(target=self._run, daemon=True)
        self._thread.start()

    def _run(self) -> None:
        for script in self._scripts:
            try:
                connection, _ = self._listener.accept()
            except OSError as error:
                self.failures.append(error)
                return
            with connection:
                try:
                    script(Peer(connection))
                except (EOFError, ConnectionError):
                    pass
                except BaseException as error:  # the test's own thread raises it
                    self.failures.append(error)
                    return

    def close(self) -> None:
        self._thread.join(LIMIT)
        self._listener.close()
        if self.failures:
            raise self.failures[0]

    def __enter__(self) -> ScriptedHost:
        return self

    def __exit__(
        self,
        kind: Optional[Type[BaseException]],
        _error: Optional[BaseException],
        _trace: Optional[TracebackType],
    ) -> None:
        if kind is None:
            self.close()
        else:
            self._listener.close()
