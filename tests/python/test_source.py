"""What the sources promise beside their behaviour."""

import ast
import shutil
import subprocess
import sys
import unittest
from pathlib import Path
from typing import Iterator

PYTHON = Path(__file__).resolve().parents[2] / "device" / "python"
SOURCES = sorted([*PYTHON.glob("korva_control/*.py"), *PYTHON.glob("examples/*.py")])


def imported(tree: ast.AST) -> Iterator[str]:
    for node in ast.walk(tree):
        if isinstance(node, ast.Import):
            yield from (name.name.split(".")[0] for name in node.names)
        elif isinstance(node, ast.ImportFrom) and node.level == 0 and node.module:
            yield node.module.split(".")[0]


class Sources(unittest.TestCase):
    def test_there_are_sources(self) -> None:
        self.assertGreater(len(SOURCES), 15)

    def test_keep_to_the_syntax_of_python_3_9(self) -> None:
        for source in SOURCES:
            ast.parse(source.read_text(), str(source), feature_version=(3, 9))

    def test_the_check_of_the_syntax_can_fail(self) -> None:
        with self.assertRaises(SyntaxError):
            ast.parse("match x:\n    case 1: pass\n", feature_version=(3, 9))

    @unittest.skipUnless(hasattr(sys, "stdlib_module_names"), "Python 3.10 tells the names")
    def test_import_nothing_but_the_standard_library(self) -> None:
        known = set(sys.stdlib_module_names) | {"korva_control"}
        for source in SOURCES:
            with self.subTest(source=source.name):
                self.assertEqual(set(), set(imported(ast.parse(source.read_text()))) - known)

    def test_every_function_is_typed(self) -> None:
        for source in SOURCES:
            for node in ast.walk(ast.parse(source.read_text())):
                if isinstance(node, (ast.FunctionDef, ast.AsyncFunctionDef)):
                    with self.subTest(source=source.name, function=node.name):
                        self.assertIsNotNone(node.returns)
                        arguments = [*node.args.args, *node.args.kwonlyargs, *node.args.posonlyargs]
                        untyped = [a.arg for a in arguments if a.annotation is None]
                        self.assertIn(untyped, ([], ["self"], ["cls"]))

    @unittest.skipUnless(shutil.which("mypy"), "mypy is not installed")
    def test_the_types_hold(self) -> None:
        done = subprocess.run(
            ["mypy", "--strict", "--python-version", "3.9", "--cache-dir", "/dev/null"]
            + [str(PYTHON / "korva_control"), *map(str, PYTHON.glob("examples/*.py"))],
            capture_output=True,
            text=True,
            cwd=PYTHON,
            check=False,
        )
        self.assertEqual(0, done.returncode, done.stdout)

    def test_are_of_a_readable_size(self) -> None:
        for source in SOURCES:
            lines = source.read_text().splitlines()
            with self.subTest(source=source.name):
                self.assertLess(len(lines), 500)
                self.assertLessEqual(max(map(len, lines), default=0), 100)
