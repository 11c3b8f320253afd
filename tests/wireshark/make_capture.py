"""Writes session.pcap: a session with a running host, captured on the loopback of its own network.

    tests/support/in-network-namespace python3 tests/wireshark/make_capture.py HOST_PROGRAM

Needs dumpcap. Run it where the session below changes, and bring the table of the test up to date.
"""

from __future__ import annotations

import signal
import subprocess
import sys
import time
from pathlib import Path

HERE = Path(__file__).resolve().parent
ROOT = HERE.parents[1]
sys.path[:0] = [
    str(ROOT / "device" / "python"),
    str(ROOT / "tests" / "support" / "python"),
    str(ROOT / "tools" / "protocol-guide"),
]

from facts import execute  # noqa: E402
from quorix_host import QuorixHost  # noqa: E402
from stage import Device  # noqa: E402

CAMERA = ("Param_CameraDeviceId", "1")
IN_ITS_OWN_NAME = ["unshare", "--uts", "sh", "-c", 'hostname stage && exec "$@"', "sh"]


def frame(text: str) -> bytes:
    data = text.encode()
    return len(data).to_bytes(4, "little") + data


def discover(device: Device) -> None:
    device.exchange("<Commands><Correlation>1</Correlation></Commands>")
    device.exchange(
        "<CommandInformation><Correlation>2</Correlation>"
        "<Name>CameraSettings_GetStrobeIntensity</Name></CommandInformation>"
    )
    device.exchange("<Events/>")
    device.exchange("<EventInformation>Event.Disconnect</EventInformation>")


def drive(device: Device) -> None:
    device.exchange(
        execute(
            "System.Authorize",
            ("DeviceId", "desk-7"),
            ("DeviceName", "Light desk"),
            correlation="3",
        )
    )
    device.event("Event.Authorize")
    device.exchange(
        execute(
            "CameraSettings_SetStrobeIntensity",
            CAMERA,
            ("Param_StrobeIntensity", "0.75"),
            correlation="4",
        )
    )
    device.event("Event.Cameras.SettingChanged")
    device.exchange(
        execute(
            "CameraSettings_GetStrobeIntensity", ("Param_CameraDeviceId", "99"), correlation="5"
        )
    )
    device.exchange(execute("Host.Echo", ("Text", "&lt;é😀&amp;&gt;"), correlation="6"))


def misbehave(device: Device) -> None:
    for text in (
        "not XML",
        "",
        "<Novelty/>",
        "<Commands><Correlation> </Correlation></Commands>",
        execute("Host.Echo", ("A", "1"), ("", "2")),
        "<EventInformation><Name>Event.Disconnect</Name></EventInformation>",
    ):
        device.expect_silence(text)


def cut_and_join(device: Device) -> None:
    """Frames that arrive in pieces, and several in one piece."""
    whole = frame(execute("Host.Echo", ("Text", "x" * 3000), correlation="7"))
    for part in (whole[:2], whole[2:9], whole[9:1000], whole[1000:]):
        device.send_bytes(part)
        time.sleep(0.05)  # each part in a packet of its own
    device.reply()
    device.send_bytes(
        b"".join(frame(execute("Host.Echo", correlation=str(number))) for number in (8, 9, 10))
    )
    for _ in range(3):
        device.reply()


def wait_for(line: str, process: "subprocess.Popen[str]") -> None:
    assert process.stderr is not None
    while line not in process.stderr.readline():
        pass


def main() -> None:
    target = HERE / "session.pcap"
    command = ["dumpcap", "-q", "-P", "-i", "lo", "-f", "tcp port 803", "-w", str(target)]
    with QuorixHost(launcher=IN_ITS_OWN_NAME, program=sys.argv[1]) as host:
        capture = subprocess.Popen(command, stderr=subprocess.PIPE, text=True)
        wait_for("File:", capture)
        time.sleep(0.5)
        device = Device()
        discover(device)
        drive(device)
        misbehave(device)
        cut_and_join(device)
        host.quit()
        device.event("Event.Disconnect")
        device.close()
        time.sleep(1)
        capture.send_signal(signal.SIGINT)
        capture.wait()
    target.chmod(0o644)


if __name__ == "__main__":
    main()
