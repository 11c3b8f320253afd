"""The protocol guide against the running host: it is what the host says, and its example works."""

import json
import os
import re
import shutil
import subprocess
import sys
import tempfile
import unittest
from pathlib import Path
from typing import Any, Dict, Iterator, Tuple

ROOT = Path(__file__).resolve().parents[2]
GENERATOR = ROOT / "tools" / "protocol-guide"
DOCS = ROOT / "docs"
sys.path.insert(0, str(GENERATOR))

import facts  # noqa: E402
import oddities  # noqa: E402
import scenario  # noqa: E402
from quorix_host import LIMIT, QuorixHost  # noqa: E402
from stage import Surprise  # noqa: E402


def check(docs: Path) -> Tuple[int, str]:
    done = subprocess.run(
        [
            sys.executable,
            str(GENERATOR / "generate.py"),
            "--check",
            "--docs",
            str(docs),
            os.environ["QUORIX_HOST_PROGRAM"],
        ],
        stdout=subprocess.PIPE,
        stderr=subprocess.STDOUT,
        text=True,
        timeout=2 * LIMIT,
    )
    return done.returncode, done.stdout


class Guide(unittest.TestCase):
    def test_is_what_the_host_says(self) -> None:
        self.assertEqual((0, ""), check(DOCS))

    def test_a_single_letter_that_differs_is_told(self) -> None:
        for name in ("protocol.md", "protocol.json"):
            with self.subTest(name=name), tempfile.TemporaryDirectory() as folder:
                for each in ("protocol.md", "protocol.json"):
                    shutil.copy(DOCS / each, folder)
                path = Path(folder) / name
                path.write_text(path.read_text().replace("between 0.0 and 1.0", "from 0.0 to 1.0"))
                code, output = check(Path(folder))
                self.assertEqual(1, code)
                self.assertIn("from 0.0 to 1.0", output)

    def test_links_lead_somewhere(self) -> None:
        links = re.findall(r"\]\(([^)#]+)\)", (DOCS / "protocol.md").read_text())
        self.assertGreater(len(links), 1)
        for link in links:
            self.assertTrue((DOCS / link).is_file(), link)


class TableOfFacts(unittest.TestCase):
    """What the table tells is held against the host, so that it cannot go stale in silence."""

    session: scenario.Session

    @classmethod
    def setUpClass(cls) -> None:
        with QuorixHost(window=True) as host:
            cls.session = scenario.play(host)

    def tearDown(self) -> None:
        scenario.check_facts(self.session)  # what a test changed is back

    def expect_surprise(self, reason: str) -> None:
        with self.assertRaisesRegex(Surprise, reason):
            scenario.check_facts(self.session)

    def test_an_event_that_the_host_does_not_have(self) -> None:
        facts.EVENTS["Event.Novelty"] = facts.EventFacts("New.", [])
        self.addCleanup(facts.EVENTS.pop, "Event.Novelty", None)
        self.expect_surprise("^events: the guide tells .*Event.Novelty")
        del facts.EVENTS["Event.Novelty"]

    def test_an_event_that_the_guide_does_not_tell(self) -> None:
        told = facts.EVENTS.pop("Event.Disconnect")
        self.expect_surprise("^events: ")
        facts.EVENTS["Event.Disconnect"] = told

    def test_a_parameter_of_another_name(self) -> None:
        parameters = facts.EVENTS["Event.Authorize"].parameters
        parameters.append(("DeviceId", "of the device"))
        self.expect_surprise("the parameters of Event.Authorize")
        parameters.pop()

    def test_a_command_without_a_description(self) -> None:
        command = facts.AUTHORIZATION_COMMANDS.pop()
        self.expect_surprise("commands without a description")
        facts.AUTHORIZATION_COMMANDS.append(command)


class Oddities(unittest.TestCase):
    def test_each_probe_is_held_against_the_host(self) -> None:
        silent = facts.Oddity("Silent", "", "", [(facts.execute("Host.Echo"), facts.SILENCE)])
        other = facts.Oddity("Other", "", "", [(facts.execute("Host.Echo"), "<Reply/>")])
        for oddity in (silent, other):
            oddities.ODDITIES.insert(0, oddity)
            with self.subTest(title=oddity.title), QuorixHost(window=True) as host:
                with self.assertRaises(Surprise):
                    scenario.play(host)
            oddities.ODDITIES.remove(oddity)

    def test_so_is_each_failure(self) -> None:
        wrong = facts.Failure("wrong", facts.execute("Host.Echo"), "Error: System Error")
        facts.FAILURES.append(wrong)
        with QuorixHost(window=True) as host, self.assertRaisesRegex(Surprise, "^wrong: got"):
            scenario.play(host)
        facts.FAILURES.remove(wrong)


class Results(unittest.TestCase):
    def test_are_read_from_the_server_s_own_table(self) -> None:
        with tempfile.TemporaryDirectory() as folder:
            source = Path(folder) / "ResultText.cpp"
            table = 'Unknown = L"?";\n/*  0 */ L"zero",\n/*  1 */ Unknown,\n'
            source.write_text(table)
            self.assertEqual([(0, "zero"), (1, "?")], facts.read_results(source))
            for broken in (
                "",
                table.replace("1 */", "2 */"),
                table.replace("Unknown =", "Other ="),
            ):
                source.write_text(broken)
                with self.assertRaises(ValueError):
                    facts.read_results(source)


def frames(data: Any) -> Iterator[Dict[str, str]]:
    if isinstance(data, dict):
        if set(data) == {"header", "text"}:
            yield data
        for value in data.values():
            yield from frames(value)
    elif isinstance(data, list):
        for value in data:
            yield from frames(value)


class Data(unittest.TestCase):
    data = json.loads((DOCS / "protocol.json").read_text())

    def test_every_header_is_the_length_of_its_text(self) -> None:
        found = list(frames(self.data))
        self.assertGreater(len(found), 50)
        for frame in found:
            length = len(frame["text"].encode())
            self.assertEqual(length.to_bytes(4, "little").hex(" ").upper(), frame["header"])

    def test_has_every_result(self) -> None:
        results = {result["code"]: result["text"] for result in self.data["results"]}
        self.assertEqual(list(range(47)), sorted(results))
        self.assertEqual("OK", results[1])
        self.assertEqual("Error: An unknown error occurred.", results[46])


class Example(unittest.TestCase):
    """A stranger's first client, in a language that the project does not use."""

    def run_example(self, *arguments: str) -> Tuple[int, str, str]:
        done = subprocess.run(
            ["node", str(DOCS / "examples" / "set-strobe.js"), *arguments],
            capture_output=True,
            text=True,
            timeout=LIMIT,
        )
        return done.returncode, done.stdout, done.stderr

    def test_is_let_in_and_sets_a_strobe_and_hears_of_it(self) -> None:
        with QuorixHost() as host:
            self.assertEqual(
                (0, "strobe of camera 2: 0.3\n", ""), self.run_example("127.0.0.1", "2", "0.3")
            )
            state = host.state()
        self.assertEqual(0.3, state["cameras"][1]["StrobeIntensity"])
        self.assertEqual("Strobe", state["control"]["strobe-1"]["Name"])

    def test_sets_it_again_though_no_event_comes_then(self) -> None:
        with QuorixHost():
            for strobe, result in (("0.3", "0.3"), ("0.3", "0.3"), ("5", "1.0"), ("5", "1.0")):
                with self.subTest(strobe=strobe):
                    self.assertEqual(
                        (0, f"strobe of camera 2: {result}\n", ""),
                        self.run_example("127.0.0.1", "2", strobe),
                    )

    def test_tells_what_went_wrong(self) -> None:
        with QuorixHost():
            self.assertEqual(
                (
                    1,
                    "",
                    "set-strobe: CameraSettings_SetStrobeIntensity: "
                    "Error: Unable to access requested data.\n",
                ),
                self.run_example("127.0.0.1", "99"),
            )
        code, _, errors = self.run_example()
        self.assertEqual((1, "set-strobe: connect ECONNREFUSED 127.0.0.1:803\n"), (code, errors))

    def test_is_as_short_as_the_guide_says(self) -> None:
        lines = (DOCS / "examples" / "set-strobe.js").read_text().splitlines()
        self.assertLess(len(lines), 75)


if __name__ == "__main__":
    unittest.main()
