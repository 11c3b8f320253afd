"""What the pages show is run as it stands there, in a network of the test's own."""

import os
import re
import shlex
import shutil
import socket
import subprocess
import sys
import unittest
from pathlib import Path
from typing import List

from quorix_host import LIMIT, QuorixHost, wait_for_lines

ROOT = Path(__file__).resolve().parents[2]
PAGES = sorted(
    [
        ROOT / "README.md",
        ROOT / "benchmarks" / "README.md",
        ROOT / "device" / "python" / "README.md",
        *(ROOT / "docs").glob("*.md"),
    ]
)
CONTROL = os.environ["KORVA_CONTROL_PROGRAM"]
PORT = 803
NOBODY = 65534

ANSWERS = {
    "commands": "CameraSettings_GetTapEnabled\n",
    "cameras": "Camera 4: StrobeIntensity=0.5 ",
    "run CameraSettings_SetSelection Param_CameraSelection=1,3": "OK\n",
}


def blocks(page: str) -> List[str]:
    return re.findall(r"^```\w*\n(.*?)^```", (ROOT / page).read_text(), re.DOTALL | re.MULTILINE)


def run(words: List[str]) -> str:
    done = subprocess.run(words, stdout=subprocess.PIPE, text=True, timeout=LIMIT, check=True)
    return done.stdout


class Links(unittest.TestCase):
    def test_lead_somewhere(self) -> None:
        count = 0
        for page in PAGES:
            for link in re.findall(r"\]\(([^)#]+)\)", page.read_text()):
                with self.subTest(page=page.name, link=link):
                    self.assertTrue((page.parent / link).exists())
                count += 1
        self.assertGreater(count, 15)


class ReadMe(unittest.TestCase):
    lines = re.findall(
        r"^\$ build/release/bin/korva-control (.*)$", "".join(blocks("README.md")), re.MULTILINE
    )

    def test_every_command_of_the_second_terminal_is_answered(self) -> None:
        self.assertEqual([*ANSWERS, "watch"], self.lines)
        with QuorixHost():
            for line, expected in ANSWERS.items():
                with self.subTest(line=line):
                    self.assertIn(expected, run([CONTROL, *shlex.split(line)]))

    def test_an_ordinary_user_may_take_the_port_after_the_line_that_says_so(self) -> None:
        if os.geteuid() != 0 or Path("/proc/self/uid_map").read_text().split()[2] == "1":
            self.skipTest("there is no other user here")
        (line,) = re.findall(r"`sudo (sysctl .*?)`", (ROOT / "README.md").read_text())
        take = [sys.executable, "-c", f"import socket; socket.create_server(('', {PORT}))"]
        ordinary = ["setpriv", f"--reuid={NOBODY}", f"--regid={NOBODY}", "--clear-groups", *take]
        refused = subprocess.run(ordinary, stderr=subprocess.PIPE, text=True, timeout=LIMIT)
        self.assertIn("Permission denied", refused.stderr)
        self.addCleanup(run, ["sysctl", "net.ipv4.ip_unprivileged_port_start=1024"])
        run(shlex.split(line))
        run(ordinary)


class Security(unittest.TestCase):
    def connect_from(self, address: str, limit: float) -> None:
        socket.create_connection(("192.0.2.1", PORT), limit, (address, 0)).close()

    @unittest.skipUnless(shutil.which("nft"), "nftables is not installed")
    def test_the_firewall_lets_the_known_addresses_through_and_no_other(self) -> None:
        for address in ("192.0.2.1", "192.0.2.10", "192.0.2.11", "192.0.2.12"):
            run(["ip", "address", "add", f"{address}/32", "dev", "lo"])
            self.addCleanup(run, ["ip", "address", "del", f"{address}/32", "dev", "lo"])
        rules = blocks("docs/security.md")[0].splitlines()
        with QuorixHost():
            self.connect_from("192.0.2.12", LIMIT)
            for rule in rules:
                run(shlex.split(rule))
            self.addCleanup(run, ["nft", "delete", "table", "inet", "control"])
            self.connect_from("192.0.2.10", LIMIT)
            self.connect_from("192.0.2.11", LIMIT)
            with self.assertRaises(socket.timeout):
                self.connect_from("192.0.2.12", 0.5)
            self.assertIn("Control stream 1.0", run([CONTROL, "info"]))

    def test_a_device_asks_through_the_tunnel(self) -> None:
        tunnel, ask = blocks("docs/security.md")[1].splitlines()
        self.assertIn(f"-L 8803:127.0.0.1:{PORT} ", tunnel)
        serve = [CONTROL, "serve", "--listen", "8803"]
        with subprocess.Popen(
            serve, stdout=subprocess.PIPE, stderr=subprocess.DEVNULL, text=True
        ) as host:
            try:
                wait_for_lines(host, 1)
                program, *words = shlex.split(ask)
                self.assertEqual("korva-control", program)
                self.assertIn("1.0", run([CONTROL, *words]))
            finally:
                host.terminate()


if __name__ == "__main__":
    unittest.main()
