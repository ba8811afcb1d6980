"""Coordinated access, between this process, other interpreters and the command."""

import json
import os
import signal
import subprocess
import sys
import threading
import time

import ktfiles
import pytest


def held_by_others(path, write):
    """A process that holds the file until its standard input ends."""
    code = (
        "import ktfiles, sys\n"
        "with ktfiles.lock(sys.argv[1], write=sys.argv[2] == 'True'):\n"
        "    print('held', flush=True); sys.stdin.read()\n"
    )
    process = subprocess.Popen(
        [sys.executable, "-c", code, str(path), str(write)], stdin=subprocess.PIPE, stdout=subprocess.PIPE
    )
    assert process.stdout.readline() == b"held\n"
    return process


def end(process):
    process.communicate()


def test_a_lock_is_seen_by_the_command(sound, command):
    path = sound("a.wav")
    lock = ktfiles.lock(path, write=True)
    assert not lock.held
    for _ in range(2):
        with lock:
            (record,) = json.loads(command("locks", "--json", path))
            assert record["processID"] == os.getpid() and lock.held
            with pytest.raises(ValueError):
                lock.acquire()
        assert not lock.held and json.loads(command("locks", "--json", path)) == []
    with pytest.raises(ValueError):
        lock.release()


def test_others_are_waited_for_and_time_runs_out(sound):
    path = sound("a.wav")
    other = held_by_others(path, write=True)
    content = path.read_bytes()
    for wait in (
        lambda: ktfiles.lock(path, timeout=0.1).acquire(),
        lambda: ktfiles.lock(path, write=True, timeout=0.1).acquire(),
        lambda: ktfiles.chunks(path).add("note", b"x", timeout=0.1),
        lambda: ktfiles.chunks(path).remove("note", timeout=0.1),
    ):
        started = time.monotonic()
        with pytest.raises(TimeoutError) as caught:
            wait()
        assert 0.1 <= time.monotonic() - started < 5 and caught.value.filename == str(path)
    assert path.read_bytes() == content
    got = []
    waiting = threading.Thread(target=lambda: got.append(ktfiles.chunks(path).add("note", b"x")))
    waiting.start()
    time.sleep(0.2)
    assert not got  # and this thread runs meanwhile
    end(other)
    waiting.join(20)
    assert got == [None] and ktfiles.chunks(path)["note"] == b"x"


def test_readers_share_and_a_killed_holder_lets_go(sound):
    path = sound("a.wav")
    reader = held_by_others(path, write=False)
    with ktfiles.lock(path, timeout=5):
        pass
    with pytest.raises(TimeoutError):
        ktfiles.lock(path, write=True, timeout=0.05).acquire()
    reader.kill()
    reader.communicate()
    with ktfiles.lock(path, write=True, timeout=10):
        pass


def test_edits_go_through_under_a_lock_of_this_process(sound):
    path = sound("a.wav")
    with ktfiles.lock(path, write=True):
        ktfiles.chunks(path).add("note", b"x", timeout=1)
    with ktfiles.lock(path):
        with pytest.raises(ktfiles.Error, match="locked for reading by this process"):
            ktfiles.chunks(path).add("note", b"x")
    assert len([c for c in ktfiles.chunks(path).list() if c.id == "note"]) == 1


def test_control_c_ends_a_wait(sound, script):
    path = sound("a.wav")
    other = held_by_others(path, write=True)
    code = (
        "import ktfiles, sys\n"
        "print('waiting', flush=True)\n"
        "try:\n    ktfiles.chunks(sys.argv[1]).add('note', b'x')\n"
        "except KeyboardInterrupt:\n    print('interrupted')\n"
    )
    waiting = subprocess.Popen([sys.executable, "-c", code, path], stdout=subprocess.PIPE)
    assert waiting.stdout.readline() == b"waiting\n"
    time.sleep(0.2)
    waiting.send_signal(signal.SIGINT)
    assert waiting.communicate(timeout=10)[0] == b"interrupted\n" and waiting.returncode == 0
    end(other)
