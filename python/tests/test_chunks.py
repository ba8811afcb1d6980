"""Chunks of containers: judged by a walk over RIFF that is written here, and by libsndfile."""

import os
import pickle
import signal
import struct
import subprocess
import sys
import threading
import time

import ktfiles
import pytest
import soundfile


def riff_chunks(path):
    """(id, body) of each chunk of a RIFF file."""
    content = path.read_bytes()
    assert content[:4] == b"RIFF" and struct.unpack("<I", content[4:8])[0] == len(content) - 8
    at, found = 12, []
    while at < len(content):
        size = struct.unpack("<I", content[at + 4 : at + 8])[0]
        found.append((content[at : at + 4].decode(), content[at + 8 : at + 8 + size]))
        at += 8 + size + size % 2
    return found


def test_chunks_are_a_mapping(sound):
    path = sound("a.wav")
    before = soundfile.read(path)[0]
    with ktfiles.open(path) as f:
        chunks = f.chunks
        assert dict(chunks) == dict(riff_chunks(path))
        assert list(chunks)[0] == "fmt " and chunks["fmt"] == chunks["fmt "] == chunks[b"fmt "]
        assert "note" not in chunks and "data" in chunks and 3 not in chunks and "" not in chunks
        with pytest.raises(KeyError):
            chunks["note"]
        chunks.add("note", b"a rainy day")
        chunks["odd"] = b"\0\xff"
        assert riff_chunks(path)[-2:] == [("note", b"a rainy day"), ("odd ", b"\0\xff")]
        chunks["note"] = memoryview(b"sun")
        assert chunks["note"] == b"sun" and chunks.get("nono") is None
        chunks.add("note", bytearray(b"wind"))
        assert [c.size for c in chunks.list() if c.id == "note"] == [3, 4] and chunks["note"] == b"wind"
        body = chunks.list()[-1].body
        assert path.read_bytes()[body : body + 4] == b"wind"
        assert chunks.remove("note") == 2
        del chunks["odd"]
        with pytest.raises(KeyError):
            del chunks["odd"]
        assert len(f.read()) == 10000
    assert (soundfile.read(path)[0] == before).all()


def test_what_would_cost_sound_is_refused(sound):
    path = sound("a.wav")
    content = path.read_bytes()
    chunks = ktfiles.chunks(path)
    for edit in lambda: chunks.remove("data"), lambda: chunks.add("data", b""), lambda: chunks.__setitem__("fmt", b"x"):
        with pytest.raises(ktfiles.Error) as caught:
            edit()
        assert "sound" in str(caught.value) and caught.value.filename == str(path)
        assert path.read_bytes() == content
    for bad in "", "fives", "日本":
        with pytest.raises(ValueError):
            chunks.add(bad, b"")
    with pytest.raises(TypeError):
        chunks.add("note", "text")
    assert chunks.remove("data", force=True) == 1
    assert "data" not in chunks


def test_edits_keep_what_is_asked_for(sound, tmp_path):
    path = sound("a.wav")
    content = path.read_bytes()
    os.utime(path, (1000, 1000))
    backup = ktfiles.chunks(path).add("note", b"x", backup=True, keep_times=True)
    assert backup == str(path) + ".bak" and open(backup, "rb").read() == content
    assert path.stat().st_mtime == 1000
    inode = path.stat().st_ino
    ktfiles.chunks(path).add("note", b"y", in_place=True)
    assert path.stat().st_ino == inode
    link = tmp_path / "link.wav"
    link.symlink_to(path)
    ktfiles.chunks(link).add("note", b"z")
    assert link.is_symlink() and ktfiles.chunks(path)["note"] == b"z"
    os.link(path, tmp_path / "second.wav")
    with pytest.raises(ktfiles.Error, match="2 names"):
        ktfiles.chunks(path).add("note", b"w")


@pytest.mark.parametrize("name", ["a.aiff", "a.caf"])
def test_other_containers_take_chunks(sound, name):
    path = sound(name)
    expected = soundfile.read(path)[0]
    ktfiles.chunks(path)["note"] = b"here"
    assert ktfiles.chunks(path)["note"] == b"here"
    assert (soundfile.read(path)[0] == expected).all()


def test_a_chunk_that_is_cut_short_is_an_error(tmp_path, sound):
    path = sound("a.wav")
    ktfiles.chunks(path)["note"] = bytes(1000)
    path.write_bytes(path.read_bytes()[:-500])
    assert "note" in ktfiles.chunks(path)
    with pytest.raises(ktfiles.Error, match="claims 1000 bytes, but 500 are there"):
        ktfiles.chunks(path)["note"]


def test_errors_say_what_and_where(tmp_path, sound):
    missing = tmp_path / "no.wav"
    for use in ktfiles.open, lambda p: ktfiles.chunks(p).list(), ktfiles.overview, ktfiles.adm, ktfiles.Project:
        with pytest.raises(FileNotFoundError) as caught:
            use(missing)
        error = caught.value
        assert isinstance(error, ktfiles.Error) and isinstance(error, OSError)
        assert error.filename == str(missing) and error.errno == 2 and error.status == -43
        assert str(error) == f"{missing}: {error.strerror}"
        again = pickle.loads(pickle.dumps(error))
        assert type(again) is type(error) and again.status == -43 and str(again) == str(error)
    for content in b"", b"no sound at all", b"RIFF\xff\xff\xff\xffWAVEfmt \xff\xff\xff\xff", b"fLaC" + bytes(200):
        bad = tmp_path / "bad.wav"
        bad.write_bytes(content)
        for use in ktfiles.open, ktfiles.overview, ktfiles.adm:
            with pytest.raises(ktfiles.Error) as caught:
                use(bad)
            assert caught.value.status != 0 and caught.value.strerror
    with pytest.raises(ktfiles.Error):
        ktfiles.open(tmp_path)
    with pytest.raises(NotADirectoryError):
        ktfiles.Project(sound("a.wav"))


EDITOR = """
import ktfiles, sys
chunks = ktfiles.chunks(sys.argv[1])
print("ready", flush=True)
for i in range(10**6):
    chunks["note"] = b"%d" % i * 100000
"""


def test_a_killed_interpreter_leaves_no_half_file(sound):
    path = sound("a.wav", frames=400000)
    expected = soundfile.read(path)[0]
    for delay in 0.05, 0.11, 0.2:
        editor = subprocess.Popen([sys.executable, "-c", EDITOR, path], stdout=subprocess.PIPE)
        assert editor.stdout.readline() == b"ready\n"
        time.sleep(delay)
        editor.kill()
        editor.wait()
        editor.stdout.close()
        notes = [body for name, body in riff_chunks(path) if name == "note"]
        assert len(notes) <= 1 and all(note == note[: len(note) // 100000] * 100000 for note in notes)
        assert (soundfile.read(path)[0] == expected).all()
    ktfiles.chunks(path)["note"] = b"done"  # takes away what was left
    assert os.listdir(path.parent) == ["a.wav"]
