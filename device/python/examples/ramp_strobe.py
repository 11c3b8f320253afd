"""Ramps the strobe of a camera from where it is to a target, evenly over some seconds.

    python3 examples/ramp_strobe.py --camera 1 --to 1.0 --seconds 2

It prints each step as the host confirms it. With --authorize ID it asks to be let in first.
"""

from __future__ import annotations

import argparse
import sys
import threading
import time
from typing import Iterator

from korva_control import DEFAULT_PORT, Client, CommandReply, ControlError

CONFIRMED = "Event.Cameras.SettingChanged"


def steps(begin: float, end: float, count: int) -> Iterator[float]:
    """The values behind `begin`, the last of which is `end` exactly."""
    for number in range(1, count):
        yield begin + (end - begin) * number / count
    yield end


def require(reply: CommandReply) -> CommandReply:
    if not reply.ok:
        raise ControlError(reply.result)
    return reply


def ramp(client: Client, camera: str, target: float, seconds: float, count: int) -> None:
    identity = {"Param_CameraDeviceId": camera}
    now = require(client.execute("CameraSettings_GetStrobeIntensity", identity))
    begin = float(now.parameters["Param_StrobeIntensity"])
    print(f"camera {camera}: strobe {begin:g}", flush=True)
    shown = begin
    with client.listen(CONFIRMED) as confirmations:
        start = time.monotonic()
        for number, value in enumerate(steps(begin, target, count), 1):
            time.sleep(max(0.0, start + seconds * number / count - time.monotonic()))
            text = f"{value:.6g}"
            if float(text) == shown:
                continue  # the host has nothing to confirm
            wanted = {**identity, "Param_StrobeIntensity": text}
            require(client.execute("CameraSettings_SetStrobeIntensity", wanted))
            while True:  # the events of other cameras and settings come here too
                event = confirmations.next(5.0).parameters
                if (event["CameraId"], event["SettingName"]) == (camera, "StrobeIntensity"):
                    break
            shown = float(event["SettingValue"])
            print(f"camera {camera}: strobe {shown:g}", flush=True)


def main() -> int:
    parser = argparse.ArgumentParser(description="Ramps the strobe of a camera.")
    parser.add_argument("--host", default="127.0.0.1")
    parser.add_argument("--port", type=int, default=DEFAULT_PORT)
    parser.add_argument("--camera", default="1", help="the camera's number")
    parser.add_argument("--to", type=float, default=1.0, help="the target, from 0 to 1")
    parser.add_argument("--seconds", type=float, default=2.0, help="how long the ramp takes")
    parser.add_argument("--steps", type=int, default=10)
    parser.add_argument("--authorize", metavar="ID", help="ask to be let in first, under this id")
    arguments = parser.parse_args()
    if arguments.steps < 1:
        parser.error("a ramp has one step or more")
    if not 0 <= arguments.to <= 1:  # which is so for what is not a number, too
        parser.error("the target lies from 0 to 1")  # the host would keep another value in silence
    if not 0 <= arguments.seconds < threading.TIMEOUT_MAX:
        parser.error("a ramp takes some seconds")
    try:
        with Client() as client:
            client.connect(arguments.host, arguments.port)
            if arguments.authorize:
                outcome = client.authorize(arguments.authorize, "Strobe ramp")
                if not outcome.granted:
                    raise ControlError(f"not let in: {outcome.status}")
            ramp(client, arguments.camera, arguments.to, arguments.seconds, arguments.steps)
    except ControlError as error:
        print(f"ramp_strobe: {error}", file=sys.stderr)
        return 1
    return 0


if __name__ == "__main__":
    sys.exit(main())
