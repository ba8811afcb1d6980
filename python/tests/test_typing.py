"""The package and the programs of the examples are typed, as strictly as mypy can be."""

import os
import pathlib
import subprocess
import sys

import ktfiles
import pytest

# A second run takes a twentieth of the time.
CACHE = pathlib.Path(ktfiles.__file__).parent.parent / "mypy"
SOURCE = pathlib.Path(os.environ["KTFILES_SOURCE"])


def test_mypy_finds_nothing():
    pytest.importorskip("mypy")
    examples = sorted((SOURCE / "examples/python").glob("*.py"))
    done = subprocess.run(
        [sys.executable, "-m", "mypy", "--strict", "--cache-dir", CACHE, SOURCE / "python/ktfiles", *examples],
        capture_output=True,
        text=True,
        env={**os.environ, "MYPYPATH": str(SOURCE / "python")},
    )
    assert done.returncode == 0, done.stdout + done.stderr


def test_the_stub_tells_what_the_compiled_part_has():
    import ast

    from ktfiles import _core

    stub = ast.parse((SOURCE / "python/ktfiles/_core.pyi").read_text())
    told = {}
    for node in stub.body:
        if isinstance(node, ast.ClassDef):
            told[node.name] = {each.name for each in node.body if isinstance(each, ast.FunctionDef)}
        elif isinstance(node, ast.FunctionDef):
            told[node.name] = [argument.arg for argument in node.args.args]
    names = {name for name in dir(_core) if not name.startswith("_")}
    assert names == set(told) | {"FRAMES_PER_POINT"}
    for name, value in told.items():
        if isinstance(value, set):
            assert {each for each in dir(getattr(_core, name)) if not each.startswith("_")} == value - {"__init__"}
        else:
            signature = getattr(_core, name).__doc__.split("->")[0]
            assert all(f"{argument}:" in signature for argument in value), signature


def test_all_that_is_public_is_there_and_told_of():
    for name in ktfiles.__all__:
        assert getattr(ktfiles, name).__doc__
