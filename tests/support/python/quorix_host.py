"""A quorix-host process of a test, in the test's own network."""

from __future__ import annotations

import json
import os
import queue
import subprocess
import tempfile
import threading
import time
from typing import Any, Dict, List, Optional, Sequence

LIMIT = 60.0
"""Seconds. Under a sanitizer, on a busy machine, a host may take long over what is done at once
otherwise."""


class QuorixHost:
    """Runs a host, by default the one that the environment names, and speaks to its console.

    The data folder is the host's own, so that one test's operator is not remembered in another.
    """

    def __init__(
        self,
        arguments: Sequence[str] = (),
        launcher: Sequence[str] = (),
        program: Optional[str] = None,
        window: bool = False,
    ) -> None:
        """@param window: whether the host has one, on no screen, and so asks its operator"""
        self._folder = tempfile.TemporaryDirectory()
        environment = {
            **os.environ,
            "XDG_RUNTIME_DIR": self._folder.name,
            "XDG_CACHE_HOME": os.path.join(self._folder.name, "cache"),
            "QT_QPA_PLATFORM": "offscreen",
            "QT_QUICK_BACKEND": "software",
            # What a test advertises must not reach the machine's own network.
            "DBUS_SYSTEM_BUS_ADDRESS": "unix:path=/nonexistent/bus",
        }
        self._errors = tempfile.TemporaryFile()
        program = program or os.environ["QUORIX_HOST_PROGRAM"]
        options = ["--console", "--data", self._folder.name, *arguments]
        if not window:
            options.append("--headless")
        self._process = subprocess.Popen(
            [*launcher, program, *options],
            stdin=subprocess.PIPE,
            stdout=subprocess.PIPE,
            stderr=self._errors,
            env=environment,
            text=True,
        )
        self._lines: "queue.Queue[str]" = queue.Queue()
        threading.Thread(target=self._read, daemon=True).start()
        if self._next_line() != "ready":
            self._errors.seek(0)
            errors = self._errors.read().decode(errors="replace")
            self.kill()
            raise RuntimeError(f"the host did not get ready: {errors[-3000:]}")

    def _read(self) -> None:
        assert self._process.stdout is not None
        for line in self._process.stdout:
            self._lines.put(line.rstrip("\n"))
        self._lines.put("(the host has ended)")

    def _next_line(self) -> str:
        return self._lines.get(timeout=LIMIT)

    def command(self, line: str) -> str:
        """Sends a line to the console and returns its answer."""
        assert self._process.stdin is not None
        self._process.stdin.write(line + "\n")
        self._process.stdin.flush()
        return self._next_line()

    def state(self) -> Dict[str, Any]:
        answer = self.command("state")
        assert answer.startswith("ok "), answer
        state: Dict[str, Any] = json.loads(answer[3:])
        return state

    def wait_for_dialog(self, is_open: bool = True) -> None:
        """Waits until the operator's dialog is open, or closed."""
        end = time.monotonic() + LIMIT
        while (self.state()["dialog"] is not None) is not is_open:
            if time.monotonic() > end:
                raise RuntimeError(f"the dialog did not {'open' if is_open else 'close'}")

    def kill(self) -> None:
        self._process.kill()
        self._process.wait(LIMIT)
        self._clean_up()

    def quit(self) -> int:
        """Stops the host in order. @return its exit code"""
        self.command("quit")
        code = self._process.wait(LIMIT)
        self._clean_up()
        return code

    def _clean_up(self) -> None:
        for pipe in (self._process.stdin, self._process.stdout):
            assert pipe is not None
            pipe.close()
        self._errors.close()
        self._folder.cleanup()

    def __enter__(self) -> QuorixHost:
        return self

    def __exit__(self, *_details: object) -> None:
        if self._process.poll() is None:
            self.kill()


def wait_for_lines(process: "subprocess.Popen[str]", count: int) -> List[str]:
    """Reads so many lines of a process's standard output, each within the limit."""
    lines: "queue.Queue[str]" = queue.Queue()

    def read() -> None:
        assert process.stdout is not None
        for _ in range(count):
            lines.put(process.stdout.readline().rstrip("\n"))

    threading.Thread(target=read, daemon=True).start()
    return [lines.get(timeout=LIMIT) for _ in range(count)]
