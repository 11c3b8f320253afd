"""Every fault of the fake host: the right error, within its time limit, and a good connection after."""

from __future__ import annotations

import asyncio
import os
import subprocess
import time
import unittest
from typing import Type

from korva_control import (
    AsyncClient,
    BackOff,
    Client,
    ClientOptions,
    ClosedError,
    ControlError,
    ProtocolError,
    State,
    TimedOutError,
)
from quorix_host import LIMIT, wait_for_lines

SHORT = 0.5
"""The time limit of what is meant to run out."""

SLACK = 10.0
"""What a busy machine may add to a time limit."""

GREETING = 4 + 130
"""The bytes of the reply with which a connection begins."""


class FakeHost:
    """A host with simulated cameras behind a proxy, of whose connections the first is faulty."""

    def __init__(self, *fault: str) -> None:
        self._process = subprocess.Popen(
            [os.environ["KORVA_CONTROL_PROGRAM"], "serve", "--listen", "0"]
            + ["--faulty", "1", *fault],
            stdout=subprocess.PIPE,
            stderr=subprocess.DEVNULL,
            text=True,
        )
        (line,) = wait_for_lines(self._process, 1)
        self.port = int(line.rsplit(" ", 1)[1])

    def __enter__(self) -> FakeHost:
        return self

    def __exit__(self, *_details: object) -> None:
        self._process.terminate()
        self._process.wait(LIMIT)
        assert self._process.stdout is not None
        self._process.stdout.close()


class Faults(unittest.TestCase):
    def expect_failure(
        self, error: Type[ControlError], text: str, client: Client, port: int
    ) -> None:
        limit = SHORT if error is TimedOutError else LIMIT  # the others come by themselves
        begin = time.monotonic()
        with self.assertRaisesRegex(error, text):
            client.connect("127.0.0.1", port, limit)
            client.execute("CameraSettings_GetSelection", time_limit=limit)
        self.assertLess(time.monotonic() - begin, limit + SLACK)

    def expect_recovery(self, client: Client, port: int) -> None:
        client.connect("127.0.0.1", port, LIMIT)
        self.assertTrue(client.execute("CameraSettings_GetSelection", time_limit=LIMIT).ok)

    def fail_and_recover(self, error: Type[ControlError], text: str, *fault: str) -> None:
        with FakeHost(*fault) as host, Client() as client:
            self.expect_failure(error, text, client, host.port)
            self.expect_recovery(client, host.port)

    def test_a_delay_within_the_limit_is_borne(self) -> None:
        with FakeHost("--delay", "0.1") as host, Client() as client:
            begin = time.monotonic()
            client.connect("127.0.0.1", host.port, LIMIT)
            self.assertTrue(client.execute("CameraSettings_GetSelection", time_limit=LIMIT).ok)
            self.assertGreaterEqual(time.monotonic() - begin, 0.2)

    def test_a_delay_beyond_the_limit(self) -> None:
        self.fail_and_recover(
            TimedOutError, "waiting for the server information", "--delay", str(LIMIT)
        )

    def test_a_cut_in_the_middle_of_the_first_frame(self) -> None:
        self.fail_and_recover(
            ClosedError,
            "the host closed the connection; 6 of the 130 bytes of a frame had come",
            "--cut-after",
            "10",
        )

    def test_a_cut_behind_the_greeting(self) -> None:
        self.fail_and_recover(
            ClosedError,
            "the host closed the connection; 2 of the 4 bytes of a header had come",
            "--cut-after",
            str(GREETING + 2),
        )

    def test_a_host_that_never_replies(self) -> None:
        self.fail_and_recover(
            TimedOutError, "0.5 s, waiting for the server information", "--never-reply"
        )

    def test_a_host_that_never_reads(self) -> None:
        self.fail_and_recover(
            TimedOutError, "0.5 s, waiting for the server information", "--never-read"
        )

    def test_garbage_from_the_beginning(self) -> None:
        self.fail_and_recover(
            ProtocolError, "a frame of [0-9]+ bytes, above the limit", "--garbage-after", "0"
        )

    def test_garbage_behind_a_good_header(self) -> None:
        self.fail_and_recover(ProtocolError, "cannot be read as XML", "--garbage-after", "4")

    def test_garbage_behind_the_greeting(self) -> None:
        self.fail_and_recover(
            ProtocolError,
            "a frame of [0-9]+ bytes, above the limit",
            "--garbage-after",
            str(GREETING),
        )


class Reconnecting(unittest.IsolatedAsyncioTestCase):
    async def recover_by_itself(self, *fault: str) -> None:
        options = ClientOptions(time_limit=LIMIT, reconnect=BackOff(first=0.01))
        states: "asyncio.Queue[State]" = asyncio.Queue()
        with FakeHost(*fault) as host:
            async with AsyncClient(options) as client:
                client.on_state(lambda state, text: states.put_nowait(state))
                await client.connect("127.0.0.1", host.port)
                with self.assertRaises((ClosedError, ProtocolError)):
                    await client.execute("CameraSettings_GetSelection")
                self.assertTrue((await client.execute("CameraSettings_GetSelection")).ok)
        seen = [states.get_nowait() for _ in range(3)]
        self.assertEqual([State.CONNECTED, State.LOST, State.CONNECTED], seen)

    async def test_after_a_cut(self) -> None:
        await self.recover_by_itself("--cut-after", str(GREETING + 2))

    async def test_after_garbage(self) -> None:
        await self.recover_by_itself("--garbage-after", str(GREETING))


if __name__ == "__main__":
    unittest.main()
