#!/usr/bin/env python3
"""tidy.py BUILD_FOLDER FOLDER...: runs clang-tidy on what changed since it last passed.

A source has changed when its preprocessed text, its command line, the checks or clang-tidy itself
are not those of an earlier run without a finding. What passed is remembered by a hash, below the
user's cache folder, so that a fresh clone of unchanged sources has nothing to do.
"""

import collections
import concurrent.futures
import hashlib
import json
import os
import pathlib
import shlex
import subprocess
import sys

top = pathlib.Path(__file__).resolve().parent.parent
cache = pathlib.Path(os.environ.get("XDG_CACHE_HOME") or "~/.cache").expanduser() / "quorix" / "tidy"


def compiler_arguments(entry):
    """The command of a compilation without its launcher, its output and its input."""
    words = shlex.split(entry["command"])
    start = next(i for i, word in enumerate(words) if word.rpartition("/")[2].startswith("clang++"))
    words = words[start:]
    end = words.index("-o")
    return words[:end]


def fingerprint(entries, environment):
    digest = hashlib.sha256(environment)
    for entry in entries:
        arguments = compiler_arguments(entry)
        preprocessed = subprocess.run(
            arguments + ["-E", "-P", entry["file"]], cwd=entry["directory"], capture_output=True, check=True
        ).stdout
        digest.update(" ".join(arguments).replace(str(top), "").encode() + preprocessed)
    return digest.hexdigest()


def check(source, entries, build, environment):
    """Returns the findings in a source, empty where there are none, None where nothing changed.

    clang-tidy itself goes through all the commands that compile the source.
    """
    passed = cache / fingerprint(entries, environment)
    if passed.exists():
        passed.touch()
        return None
    result = subprocess.run(
        ["clang-tidy", "--quiet", "-p", build, source], capture_output=True, text=True
    )
    if result.returncode == 0:
        passed.touch()
        return ""
    return result.stdout + result.stderr


def main():
    build, folders = sys.argv[1], [str(top / folder) + "/" for folder in sys.argv[2:]]
    sources = collections.defaultdict(list)
    for entry in json.loads((pathlib.Path(build) / "compile_commands.json").read_text()):
        if any(entry["file"].startswith(folder) for folder in folders):
            sources[entry["file"]].append(entry)
    cache.mkdir(parents=True, exist_ok=True)
    environment = (top / ".clang-tidy").read_bytes()
    environment += subprocess.run(["clang-tidy", "--version"], capture_output=True).stdout

    ran = failed = 0
    with concurrent.futures.ThreadPoolExecutor(os.cpu_count()) as pool:
        for findings in pool.map(lambda source: check(*source, build, environment), sources.items()):
            ran += findings is not None
            failed += bool(findings)
            if findings:
                print(findings)
    print(f"clang-tidy: {len(sources)} sources, {ran} changed, {failed} with findings")
    return 1 if failed else 0


if __name__ == "__main__":
    sys.exit(main())
