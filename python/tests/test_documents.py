"""What the guide shows is typed, in a copy of the files that it names; so are the programs of the examples."""

import doctest
import os
import pathlib
import re
import shutil
import struct
import subprocess
import sys
import zlib

import ktfiles
import pytest

SOURCE = pathlib.Path(os.environ["KTFILES_SOURCE"])
EXAMPLES = SOURCE / "examples/python"


@pytest.fixture
def folder(tmp_path, monkeypatch):
    copy = tmp_path / "media"
    shutil.copytree(SOURCE / "examples/media", copy)
    monkeypatch.chdir(copy)
    return copy


def sessions(document):
    return "".join(re.findall(r"^```python\n(.*?)^```$", document.read_text(), re.MULTILINE | re.DOTALL))


@pytest.mark.parametrize("name", ["docs/guide/from-python.md", "README.md"])
def test_sessions_give_what_they_show(folder, name):
    shown = sessions(SOURCE / name)
    assert shown.count(">>>") > 1
    told = []
    runner = doctest.DocTestRunner(optionflags=doctest.IGNORE_EXCEPTION_DETAIL)
    runner.run(doctest.DocTestParser().get_doctest(shown, {}, name, name, 0), out=told.append)
    assert not runner.failures, "".join(told)


def test_the_guides_table_names_all_that_is_public():
    table = (SOURCE / "docs/guide/from-python.md").read_text().split("## All of it")[1]
    quoted = " ".join(re.findall(r"`([^`]*)`", table))
    public = set(ktfiles.__all__) - {"FRAMES_PER_POINT", "Alternative", "Backup", "Media", "Lock"}
    assert public <= set(re.findall(r"\w+", quoted))
    for name in re.findall(r"AudioFile\.(\w+)", quoted):
        assert hasattr(ktfiles.AudioFile, name)


def run(name, *arguments):
    """Runs a program of the examples, as it is named from the folder of the tree."""
    program = os.path.relpath(EXAMPLES / name)
    done = subprocess.run([sys.executable, program, *arguments], capture_output=True, text=True, timeout=60)
    assert done.returncode == 0, done.stderr
    return done.stdout


def test_example_read_file(folder):
    lines = run("read_file.py", "tone-16.wav", "percussion.wav").splitlines()
    assert lines[1].startswith("percussion.wav: 4.000 s, 32000 Hz, peak -") and len(lines) == 2


def test_example_add_note(folder):
    assert run("add_note.py", "tone-16.wav", "rain").splitlines()[-1] == "note  4"
    assert ktfiles.chunks("tone-16.wav")["note"] == b"rain"


def test_example_tags_table(folder):
    assert run("tags_table.py", ".") == "120\tF#\tminor\t4/4\tElectronic\t./bassline.aiff\n"


def test_example_overview_png(folder):
    for blocked in "", "import sys; sys.modules['matplotlib'] = None\n":
        program = (EXAMPLES / "overview_png.py").read_text()
        subprocess.run([sys.executable, "-c", blocked + program, "percussion.wav", "a.png"], check=True, capture_output=True)
        content = (folder / "a.png").read_bytes()
        assert content.startswith(b"\x89PNG") and content.endswith(b"IEND\xaeB`\x82")
    size = subprocess.run(["ffprobe", "-v", "error", "-show_entries", "stream=width,height", "-of", "csv=p=0", "a.png"],
                          capture_output=True, text=True, check=True).stdout
    assert size.strip() == "500,128"


def test_example_adm_positions(folder):
    lines = run("adm_positions.py", "harbour.xml").splitlines()
    assert "Narrator: 0.050 s  azimuth 0, elevation 0, distance 1" in lines and len(lines) == 12


def test_example_missing_media(folder):
    (line,) = run("missing_media.py", "Sketch.fuguex").splitlines()
    assert line.startswith("Sketch.fuguex: Sketch, slower: ")


def test_example_hold_file(folder):
    assert run("hold_file.py", "tone-16.wav") == "changed 1 times\n"
    assert run("hold_file.py", "tone-16.wav") == "changed 2 times\n"
