"""Writes docs/protocol.md and docs/protocol.json from a session with a running host.

    tests/support/in-network-namespace python3 tools/protocol-guide/generate.py HOST_PROGRAM
    tests/support/in-network-namespace python3 tools/protocol-guide/generate.py --check HOST_PROGRAM

The host is started here, in a place where port 803 is free and the computer's name may be set: the
guide shows real bytes, and they must not differ from one computer to the next. With --check nothing
is written, and the program ends with 1 where the files are not what it would write.
"""

from __future__ import annotations

import argparse
import difflib
import sys
from pathlib import Path

ROOT = Path(__file__).resolve().parents[2]
sys.path[:0] = [str(ROOT / "device" / "python"), str(ROOT / "tests" / "support" / "python")]

import facts  # noqa: E402
import render  # noqa: E402
import scenario  # noqa: E402
from quorix_host import QuorixHost  # noqa: E402
from stage import Surprise  # noqa: E402

COMPUTER = "stage"
IN_ITS_OWN_NAME = ["unshare", "--uts", "sh", "-c", f'hostname {COMPUTER} && exec "$@"', "sh"]
RESULTS = ROOT / "src/QuorixPluginControlStreamServer/ControlStreamServer/ResultText.cpp"


def differs(path: Path, wanted: str) -> bool:
    present = path.read_text(encoding="utf-8") if path.exists() else ""
    difference = list(
        difflib.unified_diff(
            present.splitlines(), wanted.splitlines(), path.name, "what the host says", lineterm=""
        )
    )
    for line in difference[:40]:
        print(line)
    return bool(difference)


def main() -> int:
    parser = argparse.ArgumentParser(description="Writes the protocol guide from a running host.")
    parser.add_argument("host_program")
    parser.add_argument("--check", action="store_true", help="write nothing, tell of drift")
    parser.add_argument("--docs", type=Path, default=ROOT / "docs", help="the folder of the guide")
    arguments = parser.parse_args()
    try:
        program = arguments.host_program
        with QuorixHost(launcher=IN_ITS_OWN_NAME, program=program, window=True) as host:
            session = scenario.play(host)
        results = facts.read_results(RESULTS)
    except (Surprise, ValueError) as error:
        print(f"protocol-guide: {error}", file=sys.stderr)
        return 1
    template = Path(__file__).with_name("protocol.template.md").read_text(encoding="utf-8")
    files = {
        "protocol.md": render.write_guide(template, session, results),
        "protocol.json": render.write_data(session, results),
    }
    drifted = False
    for name, content in files.items():
        if not arguments.check:
            (arguments.docs / name).write_text(content, encoding="utf-8")
        elif differs(arguments.docs / name, content):
            drifted = True
    if drifted:
        print("The protocol guide and the host differ. Run generate.py and read what changes.")
    return 1 if drifted else 0


if __name__ == "__main__":
    sys.exit(main())
