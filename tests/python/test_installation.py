"""What `pip install device/python` makes."""

import os
import shutil
import subprocess
import sys
import tempfile
import unittest
from pathlib import Path
from typing import Optional

PYTHON = Path(__file__).resolve().parents[2] / "device" / "python"


def installer() -> Optional[str]:
    """A Python that has what pip would fetch otherwise: this one, or the system's."""
    for python in (sys.executable, "/usr/bin/python3"):
        words = [python, "-c", "import setuptools, wheel, pip"]
        if (
            os.path.exists(python)
            and subprocess.run(words, stderr=subprocess.DEVNULL).returncode == 0
        ):
            return python
    return None


class Installation(unittest.TestCase):
    def test_can_be_used_away_from_the_sources(self) -> None:
        python = installer()
        if python is None:
            self.skipTest("pip, setuptools and wheel are not installed")
        with tempfile.TemporaryDirectory() as folder:
            copy = shutil.copytree(PYTHON, Path(folder) / "source")  # pip builds beside the sources
            target = Path(folder) / "target"
            options = ["--quiet", "--no-deps", "--no-build-isolation", "--no-index"]
            environment = {**os.environ, "PIP_ROOT_USER_ACTION": "ignore"}
            environment.pop("PYTHONPATH", None)
            install = [python, "-m", "pip", "install", *options, "--target", str(target), str(copy)]
            subprocess.run(install, check=True, env=environment, cwd=folder)
            done = subprocess.run(
                [python, "-m", "korva_control", "--help"],
                check=True,
                capture_output=True,
                text=True,
                cwd=target,
                env=environment,
            )
            self.assertTrue((target / "korva_control" / "py.typed").is_file())
        self.assertIn("Drives a motion-capture host", done.stdout)
