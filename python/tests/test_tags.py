"""Tags of loops: judged by the command, whose JSON has the same names and values."""

import json
import shutil
import threading

import ktfiles
import pytest


def command_tags(command, path):
    (record,) = json.loads(command("tags", "--json", path))
    assert record.pop("path") == str(path)
    return record


@pytest.fixture
def loop(media, tmp_path):
    return shutil.copy(media / "bassline.aiff", tmp_path / "loop.aiff")


def test_tags_are_those_of_the_command(media, command):
    files = [path for path in sorted(media.iterdir()) if path.suffix in (".wav", ".aiff", ".aifc", ".caf")]
    assert len(files) > 10
    for path in files:
        assert ktfiles.tags(path) == command_tags(command, path)
    tags = ktfiles.tags(media / "bassline.aiff")
    assert (tags["tempo"], tags["key"], tags["mode"], tags["signature"]) == (120, "F#", "minor", "4/4")
    assert len(tags["transients"]) == 8


def test_tags_are_set_and_removed_as_by_the_command(loop, tmp_path, command):
    other = shutil.copy(loop, tmp_path / "other.aiff")
    changes = ktfiles.set_tags(
        loop, genre="Jazz", key="Bb major", signature="3/4", beatCount=6, descriptors=["Dry", "Clean"], title="É", artist=None
    )
    command("tags", "set", other, "genre=Jazz", "key=Bb", "mode=major", "signature=3/4", "beatCount=6", "descriptors=Dry,Clean", "title=É")
    assert loop.read_bytes() == other.read_bytes()
    assert changes["genre"] == ("Electronic", "Jazz") and changes["signatureTop"] == (4, 3) and "artist" not in changes
    assert ktfiles.tags(loop) == command_tags(command, other)
    assert ktfiles.set_tags(loop, {"genre": "Jazz"}) == {}
    ktfiles.set_tags(loop, genre=None, signature=None, key=None)
    tags = ktfiles.tags(loop)
    assert not {"genre", "signature", "signatureTop", "midiRootNote", "keyType"} & set(tags) and tags["beatCount"] == 6
    ktfiles.set_tags(loop, transients=[0, 44100, [22050, 2]])
    assert [t["frame"] for t in ktfiles.tags(loop)["transients"]] == [0, 22050, 44100]
    assert ktfiles.remove_tags(loop)
    assert "beatCount" not in ktfiles.tags(loop)


def test_what_cannot_be_a_tag_is_refused(loop, media, sound, tmp_path):
    content = loop.read_bytes()
    for values in {"nothing": 1}, {"beatCount": -1}, {"beatCount": "many"}, {"key": "H"}, {"genre": 3}, {"tempo": 120}, {"signature": "4"}:
        with pytest.raises(ValueError):
            ktfiles.set_tags(loop, values)
    for value in 1.5, b"Jazz", object():
        with pytest.raises((ValueError, TypeError)):
            ktfiles.set_tags(loop, genre=value)
    assert loop.read_bytes() == content
    with pytest.raises(ktfiles.Error):
        ktfiles.set_tags(sound("a.wav"), genre="Jazz")
    for path in sound("a.flac"), tmp_path, tmp_path / "no.aiff":
        with pytest.raises(ktfiles.Error):
            ktfiles.tags(path)


@pytest.fixture
def library(media, tmp_path):
    """Loops in folders, files that are none, damaged ones, links that go round."""
    for i in range(100):
        folder = tmp_path / "library" / f"{i % 7}" / "deep"
        folder.mkdir(parents=True, exist_ok=True)
        shutil.copy(media / "bassline.aiff", folder / f"loop \udce9{i}.aiff")
        shutil.copy(media / "drum-8.wav", folder / f"shot{i}.wav")
    (tmp_path / "library" / "bad.aiff").write_bytes(b"FORM")
    (tmp_path / "library" / "notes.txt").write_bytes(b"no sound")
    (tmp_path / "library" / ".hidden.aiff").write_bytes((media / "bassline.aiff").read_bytes())
    (tmp_path / "library" / "nowhere.aiff").symlink_to("nothing")
    (tmp_path / "library" / "round").symlink_to(tmp_path / "library", target_is_directory=True)
    (tmp_path / "elsewhere").mkdir()
    shutil.copy(media / "bassline.aiff", tmp_path / "elsewhere" / "far.aiff")
    (tmp_path / "library" / "out").symlink_to(tmp_path / "elsewhere", target_is_directory=True)
    return tmp_path / "library"


def test_a_scan_is_that_of_the_command(library, command, monkeypatch):
    import os
    import subprocess

    done = subprocess.run([os.environ["KTFILES"], "scan", "--jsonl", str(library)], capture_output=True, text=True)
    told = [json.loads(line) for line in done.stdout.splitlines()]
    errors = []
    for threads in None, 1:
        del errors[:]
        found = list(ktfiles.scan(library, threads=threads, on_error=errors.append))
        # In JSON, what of a name is not UTF-8 stands in another form.
        assert [each | {"path": 0} for each in found] == [each | {"path": 0} for each in told if "error" not in each]
        assert len(found) == 101 and all(os.path.exists(each["path"]) for each in found)
        assert [error.filename for error in errors] == [each["path"] for each in told if "error" in each]
        assert all(isinstance(error, ktfiles.Error) for error in errors) and len(errors) == 2


def test_a_scan_streams_and_may_be_left(library):
    before = threading.active_count()
    scan = ktfiles.scan(library, threads=2)
    assert next(scan)["tempo"] == 120
    scan.close()
    for thread in threading.enumerate():
        if thread.name.startswith("ktfiles.scan"):
            thread.join(10)
    assert threading.active_count() == before

    def stop(error):
        raise error

    with pytest.raises(ktfiles.Error):
        list(ktfiles.scan(library, on_error=stop))
    with pytest.raises(FileNotFoundError):
        ktfiles.scan(library / "nothing")
    assert len(list(ktfiles.scan([library / "0", bytes(library / "1")]))) == 30


def test_control_c_ends_a_scan(library, script):
    code = """
import ktfiles, signal, sys, time
signal.signal(signal.SIGALRM, signal.default_int_handler)
signal.setitimer(signal.ITIMER_REAL, 0.1)
try:
    while True:
        for loop in ktfiles.scan(sys.argv[1]):
            pass
except KeyboardInterrupt:
    print("interrupted")
"""
    assert script(code, library) == "interrupted\n"
