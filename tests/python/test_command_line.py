import json
import os
import subprocess
import sys
import unittest
from typing import Callable, Tuple

from korva_control.terminal import for_terminal
from scripted_host import LIMIT, Peer, ScriptedHost, parameter

LIST = (
    "<Correlation>1</Correlation><Commands><Command>A</Command><Command>B\x1b</Command></Commands>"
)


def run(*words: str) -> Tuple[int, str, str]:
    done = subprocess.run(
        [sys.executable, "-m", "korva_control", *words],
        capture_output=True,
        text=True,
        timeout=LIMIT,
        env={**os.environ, "PYTHONIOENCODING": "utf-8"},
    )
    return done.returncode, done.stdout, done.stderr


def run_on(script: Callable[[Peer], object], *words: str) -> Tuple[int, str, str]:
    def whole(peer: Peer) -> None:
        peer.greet()
        script(peer)

    with ScriptedHost(whole) as host:
        return run("--port", str(host.port), *words)


class CommandLine(unittest.TestCase):
    def test_info(self) -> None:
        code, output, _ = run_on(Peer.greet, "info")
        self.assertEqual(0, code)
        self.assertRegex(output, r"^Control stream 1\.0 at 127\.0\.0\.1:\d+\n$")
        self.assertEqual(
            (0, '{"streamVersion": {"major": 1, "minor": 0}}\n', ""),
            run_on(Peer.greet, "--json", "info"),
        )

    def test_commands_are_harmless_for_a_terminal(self) -> None:
        def script(peer: Peer) -> None:
            peer.read()
            peer.send(LIST)

        self.assertEqual((0, "A\nB\\x1B\n", ""), run_on(script, "commands"))
        _, output, _ = run_on(script, "commands", "--json")
        self.assertEqual({"commands": ["A", "B\x1b"]}, json.loads(output))

    def test_what_is_not_seen_is_shown_but_for_joiners(self) -> None:
        self.assertEqual(
            "a\\u061C\\u2066\\uFEFF\\xADb\u200c\u200d",
            for_terminal("a\u061c\u2066\ufeff\xadb\u200c\u200d"),
        )

    def test_run_prints_the_reply(self) -> None:
        def script(peer: Peer) -> None:
            request = peer.read()
            assert "<Name>p</Name><Value>1=2</Value>" in request, request
            peer.reply(request, parameters=parameter("q", "a b"))

        self.assertEqual((0, "OK\nq=a b\n", ""), run_on(script, "run", "A", "p=1=2"))
        _, output, _ = run_on(script, "run", "A", "p=1=2", "--json")
        self.assertEqual(
            {"command": "A", "result": "OK", "ok": True, "parameters": {"q": "a b"}},
            json.loads(output),
        )

    def test_run_ends_with_1_where_the_host_fails(self) -> None:
        def script(peer: Peer) -> None:
            peer.reply(peer.read(), "Error: System Error")

        self.assertEqual((1, "Error: System Error\n", ""), run_on(script, "run", "A"))

    def test_watch_prints_events(self) -> None:
        def script(peer: Peer) -> None:
            peer.event("Event.Other")
            peer.event("Event.A", parameter("Name", "a &quot;b") + parameter("Id", "7"))
            peer.event("Event.A")
            peer.wait_for_end()

        code, output, errors = run_on(script, "watch", "--count", "2", "Event.A")
        self.assertEqual((0, 'Event.A Name="a \\"b" Id=7\nEvent.A\n'), (code, output))
        self.assertRegex(errors, r"^korva_control: watching 127\.0\.0\.1:\d+\n$")
        _, output, _ = run_on(script, "watch", "--json", "--count", "1")
        self.assertEqual({"event": "Event.Other", "parameters": {}}, json.loads(output))

    def test_watch_ends_with_4_at_its_time_limit_and_with_3_where_the_host_goes(self) -> None:
        code, _, errors = run_on(Peer.wait_for_end, "watch", "--timeout", "2")
        self.assertEqual(4, code)
        self.assertIn("timed out, waiting for an event; 0 came in time", errors)
        code, _, errors = run_on(lambda peer: None, "watch")
        self.assertEqual(3, code)
        self.assertIn("the host closed the connection", errors)

    def test_wrong_usage_ends_with_2(self) -> None:
        for words in (
            [],
            ["dance"],
            ["run"],
            ["run", "A", "no assignment"],
            ["run", ""],
            ["run", "A", "p= "],
            ["--port", "0", "info"],
            ["--timeout", "nan", "info"],
            ["watch", "--count", "0"],
        ):
            with self.subTest(words=words):
                code, output, errors = run(*words)
                self.assertEqual((2, ""), (code, output))
                self.assertNotEqual("", errors)
                self.assertNotIn("invalid _", errors)  # the name of a function of ours

    def test_no_connection_ends_with_3_and_silence_with_4(self) -> None:
        self.assertEqual(
            (3, "", "korva_control: no connection to 127.0.0.1:1: Connection refused\n"),
            run("--port", "1", "info"),
        )
        with ScriptedHost(Peer.wait_for_end) as host:
            code, _, errors = run("--port", str(host.port), "--timeout", "0.1", "info")
        self.assertEqual(4, code)
        self.assertIn("timed out after 0.1 s, waiting for the server information", errors)

    def test_output_that_nobody_reads_is_no_traceback(self) -> None:
        def script(peer: Peer) -> None:
            peer.greet()
            peer.read()
            peer.send(LIST)
            peer.wait_for_end()

        reading, writing = os.pipe()
        os.close(reading)
        with ScriptedHost(script) as host:
            words = [sys.executable, "-m", "korva_control", "--port", str(host.port), "commands"]
            done = subprocess.run(words, stdout=writing, stderr=subprocess.PIPE, timeout=LIMIT)
        os.close(writing)
        self.assertEqual((1, b""), (done.returncode, done.stderr))

    @unittest.skipUnless(os.path.exists("/dev/full"), "needs an output that takes nothing")
    def test_output_that_takes_nothing_is_told(self) -> None:
        with ScriptedHost(lambda peer: (peer.greet(), peer.greet())) as host:
            words = [sys.executable, "-m", "korva_control", "--port", str(host.port), "info"]
            with open("/dev/full", "wb") as full:
                done = subprocess.run(words, stdout=full, stderr=subprocess.PIPE, timeout=LIMIT)
        text = b"korva_control: the output cannot be written: No space left on device\n"
        self.assertEqual((1, text), (done.returncode, done.stderr))

    def test_json_stays_json_where_the_output_has_no_utf_8(self) -> None:
        def script(peer: Peer) -> None:
            peer.greet()
            peer.reply(peer.read(), parameters=parameter("p", "é😀"))

        for encoding in ("ascii", "latin-1", "utf-8"):
            with self.subTest(encoding=encoding), ScriptedHost(script) as host:
                where = ["--json", "--port", str(host.port)]
                output = subprocess.run(
                    [sys.executable, "-m", "korva_control", *where, "run", "A"],
                    stdout=subprocess.PIPE,
                    timeout=LIMIT,
                    env={**os.environ, "PYTHONIOENCODING": encoding},
                    check=True,
                ).stdout
                self.assertEqual({"p": "é😀"}, json.loads(output.decode(encoding))["parameters"])

    def test_a_terminal_without_utf_8_gets_what_it_can_show(self) -> None:
        def script(peer: Peer) -> None:
            peer.greet()
            peer.reply(peer.read(), parameters=parameter("p", "é😀"))

        with ScriptedHost(script) as host:
            words = [sys.executable, "-m", "korva_control", "--port", str(host.port), "run", "A"]
            environment = {**os.environ, "PYTHONIOENCODING": "ascii"}
            output = subprocess.run(
                words, capture_output=True, timeout=LIMIT, env=environment, check=True
            ).stdout
        self.assertEqual(b"OK\np=\\xe9\\U0001f600\n", output)

    def test_help_tells_the_exit_codes(self) -> None:
        code, output, _ = run("--help")
        self.assertEqual(0, code)
        self.assertIn("2  wrong usage; nothing was sent", output)
