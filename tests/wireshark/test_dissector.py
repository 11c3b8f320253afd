"""The dissector over a stored capture of a running host, and over packets that no host would send.

tshark runs as an unprivileged user, as people run it.
"""

import os
import re
import shlex
import shutil
import subprocess
import tempfile
import unittest
from pathlib import Path
from typing import List, Sequence

from packets import TO_DEVICE, TO_HOST, Payload, capture, frame

HERE = Path(__file__).resolve().parent
ROOT = HERE.parents[1]
DISSECTOR = ROOT / "device" / "wireshark" / "korva.lua"
NOBODY = 65534
LIMIT = 120.0

# The messages of session.pcap in their order.
# fmt: off
STILL_THERE = [
    ("ServerInformation", "request", "", "", ""),
    ("ServerInformation", "reply", "", "", ""),
]
SESSION = [
    # message, kind, name, correlation, result
    ("ServerInformation", "request", "", "", ""),
    ("ServerInformation", "reply", "", "", ""),
    ("Commands", "request", "", "1", ""),
    ("Commands", "reply", "", "1", ""),
    ("CommandInformation", "request", "CameraSettings_GetStrobeIntensity", "2", ""),
    ("CommandInformation", "reply", "CameraSettings_GetStrobeIntensity", "2", ""),
    ("Events", "request", "", "", ""),
    ("Events", "reply", "", "", ""),
    ("EventInformation", "request", "Event.Disconnect", "", ""),
    ("EventInformation", "reply", "", "", ""),
    ("ExecuteCommand", "request", "System.Authorize", "3", ""),
    ("CommandReply", "reply", "System.Authorize", "3", "OK"),
    ("Event", "event", "Event.Authorize", "", ""),
    ("ExecuteCommand", "request", "CameraSettings_SetStrobeIntensity", "4", ""),
    ("CommandReply", "reply", "CameraSettings_SetStrobeIntensity", "4", "OK"),
    ("Event", "event", "Event.Cameras.SettingChanged", "", ""),
    ("ExecuteCommand", "request", "CameraSettings_GetStrobeIntensity", "5", ""),
    ("CommandReply", "reply", "CameraSettings_GetStrobeIntensity", "5",
     "Error: Unable to access requested data."),
    ("ExecuteCommand", "request", "Host.Echo", "6", ""),
    ("CommandReply", "reply", "Host.Echo", "6", "OK"),
    *STILL_THERE,  # behind "not XML"
    *STILL_THERE,  # behind an empty frame
    ("Novelty", "request", "", "", ""),
    *STILL_THERE,
    ("Commands", "request", "", " ", ""),
    *STILL_THERE,
    ("ExecuteCommand", "request", "Host.Echo", "7", ""),
    *STILL_THERE,
    ("EventInformation", "request", "", "", ""),
    *STILL_THERE,
    ("ExecuteCommand", "request", "Host.Echo", "7", ""),
    ("CommandReply", "reply", "Host.Echo", "7", "OK"),
    ("ExecuteCommand", "request", "Host.Echo", "8", ""),
    ("ExecuteCommand", "request", "Host.Echo", "9", ""),
    ("ExecuteCommand", "request", "Host.Echo", "10", ""),
    ("CommandReply", "reply", "Host.Echo", "8", "OK"),
    ("CommandReply", "reply", "Host.Echo", "9", "OK"),
    ("CommandReply", "reply", "Host.Echo", "10", "OK"),
    ("Event", "event", "Event.Disconnect", "", ""),
]
# fmt: on


class Case(unittest.TestCase):
    """Each test has a folder that everybody may read, since tshark runs as somebody else."""

    def setUp(self) -> None:
        self.folder = Path(tempfile.mkdtemp())
        self.addCleanup(shutil.rmtree, self.folder)
        self.folder.chmod(0o755)
        shutil.copyfile(DISSECTOR, self.folder / "korva.lua")

    def tshark(self, capture_file: str, *arguments: str) -> str:
        return self.run_unprivileged(
            "tshark", "-r", capture_file, "-X", "lua_script:korva.lua", *arguments
        )

    def run_unprivileged(self, *words: str) -> str:
        command = list(words)
        if os.geteuid() == 0 and not self.in_user_namespace():
            user = ["setpriv", f"--reuid={NOBODY}", f"--regid={NOBODY}", "--clear-groups"]
            command = [*user, *command]
        done = subprocess.run(
            command,
            cwd=self.folder,
            env={**os.environ, "HOME": str(self.folder), "LC_ALL": "C.UTF-8"},
            capture_output=True,
            text=True,
            timeout=LIMIT,
        )
        self.assertEqual((0, ""), (done.returncode, done.stderr))
        self.assertNotIn("Lua Error", done.stdout)
        return done.stdout

    @staticmethod
    def in_user_namespace() -> bool:
        """There the only user is the one who started it, and he is unprivileged outside."""
        return Path("/proc/self/uid_map").read_text().split()[2] == "1"

    def fields(self, capture_file: str, *names: str, show: str = "korva") -> List[List[str]]:
        """The values of each packet; several of one packet are separated by a bar.

        In two passes, as people see it who scroll back: a request knows its reply.
        """
        wanted = [word for name in names for word in ("-e", name)]
        options = ["-2", "-T", "fields", "-E", "separator=/t", "-E", "aggregator=|"]
        output = self.tshark(capture_file, "-Y", show, *options, *wanted)
        return [line.split("\t") for line in output.splitlines()]


class Session(Case):
    def setUp(self) -> None:
        super().setUp()
        shutil.copyfile(HERE / "session.pcap", self.folder / "session.pcap")

    def test_each_message_is_told_with_its_elements(self) -> None:
        for index, field in enumerate(("message", "kind", "name", "correlation", "result")):
            with self.subTest(field=field):
                found = [
                    value
                    for (values,) in self.fields(
                        "session.pcap", f"korva.{field}", show=f"korva.{field}"
                    )
                    for value in values.split("|")
                    if value
                ]
                self.assertEqual([row[index] for row in SESSION if row[index]], found)

    def test_the_parameters_are_decoded(self) -> None:
        found = self.fields(
            "session.pcap",
            "korva.parameter",
            "korva.parameter.name",
            "korva.parameter.value",
            show='korva.name == "Event.Cameras.SettingChanged"',
        )
        self.assertEqual(
            [
                [
                    "CameraId=1|SettingName=StrobeIntensity|SettingValue=0.75",
                    "CameraId|SettingName|SettingValue",
                    "1|StrobeIntensity|0.75",
                ]
            ],
            found,
        )
        echo = self.fields(
            "session.pcap", "korva.parameter.value", show='korva.correlation == "6"'
        )
        self.assertEqual([["<é😀&>"]] * 2, echo)

    def test_lists_and_descriptions(self) -> None:
        ((commands,),) = self.fields(
            "session.pcap", "korva.listed", show='korva.listed && korva.message == "Commands"'
        )
        self.assertEqual(19, len(commands.split("|")))
        self.assertIn("System.Heartbeat", commands.split("|"))
        ((described, parameters),) = self.fields(
            "session.pcap",
            "korva.description",
            "korva.parameter.name",
            show="korva.description" ' && korva.message == "CommandInformation"',
        )
        self.assertEqual("Returns current strobe intensity", described)
        self.assertEqual("Param_CameraDeviceId|Param_StrobeIntensity", parameters)
        versions = self.fields("session.pcap", "korva.version", show="korva.version")
        self.assertEqual(["1.0"], versions[0])

    def test_a_reply_leads_to_its_request_and_back(self) -> None:
        rows = self.fields(
            "session.pcap",
            "frame.number",
            "korva.correlation",
            "korva.request_in",
            "korva.time",
            show='korva.kind == "reply" && korva.correlation',
        )
        self.assertEqual(["1", "2", "3", "4", "5", "6", "7", "8", "9", "10"], [r[1] for r in rows])
        for number, correlation, request, seconds in rows:
            ((asked, replied),) = self.fields(
                "session.pcap",
                "korva.correlation",
                "korva.reply_in",
                show=f"frame.number == {request}",
            )
            self.assertIn(correlation, asked.split("|"))
            self.assertIn(number, replied.split("|"))
            self.assertGreaterEqual(float(seconds), 0)
            self.assertLess(float(seconds), 5)

    def test_what_the_host_drops_is_marked_with_the_reason(self) -> None:
        found = self.fields("session.pcap", "_ws.expert.message", show="korva.silent")
        self.assertEqual(
            [
                ["The host answers nothing: it is none of the six requests"],
                ["The host answers nothing: it has no Correlation"],
                ["The host answers nothing: a parameter has no Name"],
                ["The host answers nothing: it has no name as its own text"],
            ],
            found,
        )
        self.assertEqual(
            2, len(self.fields("session.pcap", "korva.length", show="korva.unreadable"))
        )
        failed = self.fields("session.pcap", "_ws.expert.message", show="korva.failure")
        self.assertEqual([["The command failed: Error: Unable to access requested data."]], failed)

    def test_the_column_tells_the_message_in_a_line(self) -> None:
        lines = [
            info for (info,) in self.fields("session.pcap", "_ws.col.Info", show="korva.kind")
        ]
        self.assertEqual("ServerInformation", lines[0])
        self.assertIn("Commands #1 19 listed", lines)
        self.assertIn(
            "Event Event.Cameras.SettingChanged CameraId=1 SettingName=StrobeIntensity "
            "SettingValue=0.75",
            lines,
        )
        self.assertIn(
            "ExecuteCommand Host.Echo #8 | ExecuteCommand Host.Echo #9 | ExecuteCommand Host.Echo #10",
            lines,
        )

    def test_another_port_may_be_chosen(self) -> None:
        output = self.tshark("session.pcap", "-o", "korva.port:810", "-Y", "korva")
        self.assertEqual("", output)

    def test_a_frame_in_four_packets_is_shown_whole_in_the_last(self) -> None:
        ((length, value),) = self.fields(
            "session.pcap",
            "korva.length",
            "korva.parameter.value",
            show='korva.kind == "request" && korva.length > 3000',
        )
        self.assertGreater(int(length), 3000)
        self.assertTrue(value.startswith("xxx"))


class Guide(Case):
    def test_every_command_of_the_guide_prints_what_stands_below_it(self) -> None:
        for part in ("device/wireshark/korva.lua", "tests/wireshark/session.pcap"):
            target = self.folder / part
            target.parent.mkdir(parents=True)
            shutil.copyfile(ROOT / part, target)
        guide = (ROOT / "docs" / "protocol.md").read_text()
        (block,) = re.findall(r"^```console\n(.*?)^```$", guide, re.S | re.M)
        commands = re.split(r"^\$ ", block, flags=re.M)[1:]
        self.assertEqual(2, len(commands))
        for part in commands:
            command, _, expected = part.partition("\n")
            self.assertEqual(expected, self.run_unprivileged(*shlex.split(command)))


class Hostile(Case):
    def dissect(self, payloads: Sequence[Payload], *names: str) -> List[List[str]]:
        (self.folder / "made.pcap").write_bytes(capture(payloads))
        return self.fields("made.pcap", *(names or ("korva.message",)))

    def test_frames_of_any_cutting(self) -> None:
        data = frame(b"<Events/>") + frame(b"") + frame(b"<ServerInformation/>")
        whole = self.dissect([(TO_HOST, data)], "korva.length")
        self.assertEqual([["9|0|20"]], whole)
        bytewise = self.dissect([(TO_HOST, data[i : i + 1]) for i in range(len(data))])
        self.assertEqual(["Events", "ServerInformation"], [m for (m,) in bytewise if m])

    def test_a_header_that_claims_more_than_will_come(self) -> None:
        for claim in (b"\xff\xff\xff\xff", b"\xff\xff\xff\x7f", b"\xfb\xff\xff\xff"):
            self.dissect([(TO_HOST, claim + b"<Events/>"), (TO_HOST, b"more")])

    def test_texts_that_are_no_messages(self) -> None:
        texts: List[bytes] = [
            b"\x00", b"\xff\xfe", b"<", b"<>", b"</Events>", b"<Events", b"<Events>", b"<?xml",
            b"<Correlation>", b"<Correlation>1</Correlation>", b"<Commands><Correlation></Commands>",
            b"<CommandReply><Name>", b"<CommandReply><Name></CommandReply></Name>",
            b"<Event><Parameters><Parameter></Parameters></Event>",
            b"<Event><Name>\xc3</Name></Event>", b"<Event><Name/><Parameters/></Event>",
            b"<ServerInformation><StreamVersion/></ServerInformation>",
            b"<EventInformation>", b"<EventInformation></EventInformation>",
            b"<ExecuteCommand>\x00</ExecuteCommand>", b"%s%n<a>%d</a>",
        ]  # fmt: skip
        for ports in (TO_HOST, TO_DEVICE):
            rows = self.dissect([(ports, frame(text)) for text in texts], "korva.length")
            self.assertEqual([str(len(text)) for text in texts], [row[0] for row in rows])

    def test_a_capture_with_a_limit_lacks_the_end_of_its_packets(self) -> None:
        data = frame(b"<Commands><Correlation>1</Correlation></Commands>")
        for kept in (0, 1, 3, 4, 5, len(data) - 1):
            content = capture([(TO_HOST, data), (TO_HOST, frame(b"<Events/>"))], limit=40 + kept)
            (self.folder / "cut.pcap").write_bytes(content)
            rows = self.fields("cut.pcap", "_ws.expert.message", show="tcp.seq == 1")
            told = "The capture lacks a part of this message"
            self.assertEqual([[told if kept else ""]], rows)

    def test_the_name_of_a_parameter_is_not_that_of_the_command(self) -> None:
        listed = (
            b"<Parameters><Parameter><Name>Inner</Name><Value>1</Value></Parameter></Parameters>"
        )
        rows = self.dissect(
            [
                (TO_HOST, frame(b"<ExecuteCommand>" + listed + content + b"</ExecuteCommand>"))
                for content in (
                    b"<Name>Outer</Name><Correlation>1</Correlation>",
                    b"<Correlation>1</Correlation>",
                )
            ],
            "korva.name",
            "_ws.expert.message",
        )
        self.assertEqual([["Outer", ""], ["", "The host answers nothing: it has no Name"]], rows)

    def test_what_stands_around_the_message_is_read_as_a_host_does(self) -> None:
        answered = [
            b"<!-- <Novelty> --><Events/>",
            b"<Novelty/><Events/>",
            b"<Events/>\0what follows is not looked at",
            b" \n<Events>\n</Events>\n",
        ]
        rows = self.dissect(
            [(TO_HOST, frame(text)) for text in answered], "korva.message", "_ws.expert.message"
        )
        self.assertEqual([["Events", ""]] * len(answered), rows)

        novel = [b"<a_b></a_b>", "<Größe/>".encode()]
        rows = self.dissect([(TO_HOST, frame(text)) for text in novel])
        self.assertEqual([["a_b"], ["Größe"]], rows)

        unreadable = [b"x<Events/>", b"<Events/>x", b"<Events/></Events>"]
        rows = self.dissect([(TO_HOST, frame(text)) for text in unreadable])
        self.assertEqual([[""]] * len(unreadable), rows)

    def test_everything_behind_the_first_parameter_is_one(self) -> None:
        request = (
            b"<ExecuteCommand><Name>A</Name><Correlation>1</Correlation><Parameters><Parameter>"
            b"<Name>p</Name></Parameter><Novelty/></Parameters></ExecuteCommand>"
        )
        self.assertEqual(
            [["The host answers nothing: a parameter has no Name"]],
            self.dissect([(TO_HOST, frame(request))], "_ws.expert.message"),
        )

    def test_entities_are_decoded_once_and_bad_bytes_are_shown(self) -> None:
        event = b"<Event><Name>a&amp;lt;b\xffc</Name><Parameters/></Event>"
        self.assertEqual(
            [["a&lt;b\ufffdc"]], self.dissect([(TO_DEVICE, frame(event))], "korva.name")
        )

    def test_a_correlation_that_comes_again_belongs_to_the_last_request(self) -> None:
        request = frame(
            b"<ExecuteCommand><Name>A</Name><Correlation>1</Correlation></ExecuteCommand>"
        )
        reply = frame(
            b"<CommandReply><Name>A</Name><Correlation>1</Correlation><Result>OK</Result>"
            b"<Parameters/></CommandReply>"
        )
        conversation = [(TO_HOST, request), (TO_DEVICE, reply)] * 2 + [(TO_DEVICE, reply)]
        rows = self.dissect(conversation, "korva.request_in", "korva.reply_in", "korva.time")
        self.assertEqual([["", "2", ""], ["1", "", "1.000000000"]], rows[:2])
        self.assertEqual([["", "4", ""], ["3", "", "1.000000000"], ["", "", ""]], rows[2:])

    def test_long_texts_take_no_longer_than_their_length(self) -> None:
        for text in (
            b"<Event>" + b"<Name>" * 50_000,
            b"<Events>" + b"<Event>x</Event>" * 20_000 + b"</Events>",
            b"<a" + b" " * 300_000 + b"/>",
            b"<" * 300_000,
            b"&amp" * 100_000,
            b"<Commands>" + b"<Correlation" * 30_000 + b"</Commands>",
        ):
            self.assertEqual(1, len(self.dissect([(TO_HOST, frame(text))], "korva.length")[-1:]))


if __name__ == "__main__":
    if shutil.which("tshark") is None:
        print("skipped: tshark is not installed")
        raise SystemExit(77)
    unittest.main()
