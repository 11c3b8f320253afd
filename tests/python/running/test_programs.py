"""The command line, the examples and everything that the README quotes, against a running host."""

import csv
import os
import re
import shlex
import signal
import subprocess
import sys
import tempfile
import unittest
from pathlib import Path
from typing import Iterator, Sequence, Tuple

from quorix_host import LIMIT, QuorixHost, wait_for_lines

PYTHON = Path(__file__).resolve().parents[3] / "device" / "python"


def run(*words: str) -> Tuple[int, str]:
    done = subprocess.run(
        words,
        cwd=PYTHON,
        text=True,
        timeout=LIMIT,
        stdout=subprocess.PIPE,
        stderr=subprocess.STDOUT,
    )
    return done.returncode, done.stdout


def start(*words: str) -> "subprocess.Popen[str]":
    return subprocess.Popen(
        words,
        cwd=PYTHON,
        text=True,
        stdout=subprocess.PIPE,
        stderr=subprocess.STDOUT,
        # Ignored where a shell runs the tests in the background.
        preexec_fn=lambda: signal.signal(signal.SIGINT, signal.SIG_DFL),
    )


def blocks(text: str, language: str) -> Iterator[str]:
    yield from re.findall(rf"^```{language}\n(.*?)^```$", text, re.S | re.M)


def commands_of(block: str) -> Iterator[Tuple[str, str]]:
    """The commands of a block with the output that stands below each."""
    for part in re.split(r"^\$ ", block, flags=re.M)[1:]:
        command, _, output = part.partition("\n")
        yield command, output


class Programs(unittest.TestCase):
    def setUp(self) -> None:
        self.host = QuorixHost()
        self.addCleanup(self.host.__exit__)

    def test_the_strobe_is_ramped_to_its_target(self) -> None:
        for extra in ([], ["--authorize", "desk-7"]):
            with self.subTest(extra=extra):
                self.host.command("set Device qx:1 StrobeIntensity 0.5")
                code, output = run(
                    sys.executable, "examples/ramp_strobe.py", "--camera", "1", "--to", "1",
                    "--seconds", "0.1", "--steps", "4", *extra,
                )  # fmt: skip
                self.assertEqual(
                    "".join(
                        f"camera 1: strobe {value}\n" for value in (0.5, 0.625, 0.75, 0.875, 1)
                    ),
                    output,
                )
                self.assertEqual(0, code)
                self.assertEqual(1, self.host.state()["cameras"][0]["StrobeIntensity"])

    def test_the_strobe_is_ramped_again_though_no_event_comes_then(self) -> None:
        words = [sys.executable, "examples/ramp_strobe.py", "--to", "0.5", "--seconds", "0.1"]
        self.assertEqual((0, "camera 1: strobe 0.5\n"), run(*words))

    def test_the_ramp_refuses_what_no_host_takes(self) -> None:
        for wrong in (["--to", "nan"], ["--to", "1.5"], ["--steps", "0"], ["--seconds", "inf"]):
            with self.subTest(wrong=wrong):
                code, output = run(sys.executable, "examples/ramp_strobe.py", *wrong)
                self.assertEqual(2, code)
                self.assertNotIn("Traceback", output)

    def test_the_ramp_tells_what_the_host_says_against_it(self) -> None:
        code, output = run(sys.executable, "examples/ramp_strobe.py", "--camera", "99")
        self.assertEqual(
            (1, "ramp_strobe: Error: Unable to access requested data.\n"), (code, output)
        )

    def test_the_log_has_every_event(self) -> None:
        with tempfile.TemporaryDirectory() as folder:
            file = os.path.join(folder, "events.csv")
            program = start(sys.executable, "examples/log_events.py", file, "--count", "3")
            self.assertEqual(["logging the events of 127.0.0.1:803"], wait_for_lines(program, 1))
            self.host.command('fire Event.A Text="a, b"')
            self.host.command("set Device qx:2 StrobeIntensity 0.25")
            self.host.command("fire Event.C")
            self.assertEqual(0, program.wait(LIMIT))
            assert program.stdout is not None
            program.stdout.close()
            with open(file, newline="", encoding="utf-8") as lines:
                rows = list(csv.reader(lines))
        self.assertEqual(["(connected)", "127.0.0.1:803"], rows[0][1:])
        self.assertEqual(
            [
                ["(closed)", "this side closed the connection"],
                ["Event.A", "Text=a, b"],
                ["Event.C"],
                [
                    "Event.Cameras.SettingChanged",
                    "CameraId=2",
                    "SettingName=StrobeIntensity",
                    "SettingValue=0.25",
                ],
            ],
            sorted(row[1:] for row in rows[1:]),  # the cameras confirm in their own time
        )
        self.assertRegex(rows[1][0], r"^\d{4}-\d\d-\d\dT\d\d:\d\d:\d\d\.\d{3}\+00:00$")

    def test_watch_ends_by_control_c_with_0(self) -> None:
        program = start(sys.executable, "-m", "korva_control", "watch", "Event.A")
        wait_for_lines(program, 1)  # tells that it watches
        self.host.command("fire Event.A Text=x")
        self.assertEqual(["Event.A Text=x"], wait_for_lines(program, 1))
        program.send_signal(signal.SIGINT)
        self.assertEqual(0, program.wait(LIMIT))
        assert program.stdout is not None
        program.stdout.close()


class Readme(unittest.TestCase):
    text = (PYTHON / "README.md").read_text()

    def test_every_command_prints_what_stands_below_it(self) -> None:
        tried = 0
        with QuorixHost():
            for block in blocks(self.text, "console"):
                for command, expected in commands_of(block):
                    with self.subTest(command=command):
                        words: Sequence[str] = shlex.split(command)
                        self.assertEqual("python3", words[0])
                        _, output = run(sys.executable, *words[1:])
                        self.assertEqual(expected, output)
                        tried += 1
        self.assertGreater(tried, 3)

    def test_every_program_runs(self) -> None:
        programs = list(blocks(self.text, "python"))
        self.assertGreater(len(programs), 2)
        for program in programs:
            with self.subTest(program=program), QuorixHost():
                code, output = run(sys.executable, "-c", program)
                self.assertEqual(0, code, output)
                expected = re.findall(r"#> (.*)", program)
                self.assertEqual(expected, output.splitlines())


if __name__ == "__main__":
    unittest.main()
