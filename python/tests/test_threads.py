"""Many threads, processes that part, and ends that come early."""

import gc
import os
import subprocess
import sys
import threading
import time
from concurrent.futures import ThreadPoolExecutor

import ktfiles
import numpy as np
import pytest
import soundfile


def test_eight_readers_read_what_one_reads(sound):
    paths = [sound(f"{i}.{kind}", channels=1 + i % 3) for i, kind in enumerate(["wav", "flac"] * 8)]
    expected = [soundfile.read(path, dtype="float32", always_2d=True)[0] for path in paths]

    def read(path):
        with ktfiles.open(path) as f:
            return np.concatenate(list(f.blocks(1000)))

    with ThreadPoolExecutor(8) as pool:
        for found, wanted in zip(pool.map(read, paths * 5), expected * 5):
            np.testing.assert_array_equal(found, wanted)


def test_other_threads_run_while_one_reads(tmp_path):
    """The interpreter is not held by a read of seconds."""
    path = tmp_path / "long.wav"
    soundfile.write(path, np.zeros((1, 1)), 44100, subtype="PCM_16")
    with open(path, "r+b") as f:  # half an hour of silence, of a file with a hole
        size = 1800 * 44100 * 2
        f.seek(4)
        f.write((36 + size).to_bytes(4, "little"))
        f.seek(40)
        f.write(size.to_bytes(4, "little"))
        f.truncate(44 + size)
    done = threading.Event()
    worker = threading.Thread(target=lambda: (ktfiles.overview(path), ktfiles.open(path).read(0, 44100 * 300), done.set()))
    worker.start()
    ticks = 0
    while not done.is_set():
        time.sleep(0.001)
        ticks += 1
    worker.join()
    assert ticks > 10


def test_one_file_serves_many_threads_and_may_be_closed_meanwhile(sound):
    path = sound("a.flac", frames=100000)
    whole = soundfile.read(path, dtype="float32", always_2d=True)[0]
    for _ in range(2):
        f = ktfiles.open(path)
        wrong, closed = [], []

        def read(number):
            random = np.random.default_rng(number)
            try:
                while True:
                    start = int(random.integers(0, len(whole)))
                    if not np.array_equal(f.read(start, 500), whole[start : start + 500]):
                        wrong.append(start)
            except ValueError:
                closed.append(number)

        threads = [threading.Thread(target=read, args=(i,)) for i in range(8)]
        for thread in threads:
            thread.start()
        time.sleep(0.1)
        f.close()
        for thread in threads:
            thread.join(20)
        assert not wrong and len(closed) == 8


def test_nothing_stays_open(sound, tmp_path):
    path = sound("a.wav")

    def opened():
        return len(os.listdir("/proc/self/fd"))

    for _ in range(2):  # the first time loads what stays
        before = opened()
        for _ in range(20):
            ktfiles.open(path).read(0, 10)
            blocks = ktfiles.open(path).blocks(100)
            next(blocks)
            del blocks
            ktfiles.chunks(path)["note"] = b"x"
            with pytest.raises(ktfiles.Error):
                ktfiles.adm(path)
            ktfiles.lock(path).acquire()
        gc.collect()
    assert opened() == before


def test_a_forked_process_reads_too(sound):
    path = sound("a.wav")
    with ktfiles.open(path) as f:
        expected = f.read()
        child = os.fork()
        if child == 0:
            same = np.array_equal(f.read(), expected) and len(ktfiles.overview(path)) == 40
            ktfiles.chunks(path)["note"] = b"of the child"
            os._exit(0 if same else 1)
        assert os.waitpid(child, 0)[1] == 0
        np.testing.assert_array_equal(f.read(), expected)
    assert ktfiles.chunks(path)["note"] == b"of the child"


def test_a_pool_of_processes_decodes(sound):
    """Processes that part from one in which threads of the library are idle."""
    path = sound("a.flac", frames=1_200_000)
    with ktfiles.open(path, threads=2) as f:
        expected = f.read()
    child = os.fork()
    if child == 0:
        with ktfiles.open(path, threads=2) as f:
            os._exit(0 if np.array_equal(f.read(), expected) else 1)
    assert os.waitpid(child, 0)[1] == 0


def test_the_interpreter_ends_whatever_is_under_way(sound, script):
    path = sound("a.flac", frames=200000)
    code = """
import ktfiles, sys, threading, time
f = ktfiles.open(sys.argv[1])
def read():
    while True:
        f.read(); ktfiles.overview(sys.argv[1])
for _ in range(4):
    threading.Thread(target=read, daemon=True).start()
blocks = f.blocks(100)
next(blocks)
time.sleep(0.05)
"""
    for _ in range(2):
        done = script(code, path, check=False)
        assert (done.returncode, done.stdout, done.stderr) == (0, "", "")


def test_nothing_is_printed(sound, tmp_path, capfd):
    bad = tmp_path / "bad.flac"
    bad.write_bytes(sound("a.flac").read_bytes()[:3000] + bytes(3000))
    for use in lambda: ktfiles.open(bad).read(), lambda: ktfiles.overview(bad), lambda: ktfiles.adm(bad):
        try:
            use()
        except ktfiles.Error:
            pass
    assert capfd.readouterr() == ("", "")


def test_control_c_ends_a_long_read(tmp_path, script):
    code = """
import ktfiles, signal, sys, time, soundfile, numpy
path = sys.argv[1]
soundfile.write(path, numpy.zeros((1, 1)), 44100, subtype="PCM_16")
size = 2**31
with open(path, "r+b") as f:
    f.seek(4); f.write((36 + size).to_bytes(4, "little")); f.seek(40); f.write(size.to_bytes(4, "little")); f.truncate(44 + size)
signal.signal(signal.SIGALRM, signal.default_int_handler)
signal.setitimer(signal.ITIMER_REAL, 0.02)
started = time.monotonic()
try:
    for _ in range(1000):
        ktfiles.overview(path)
except KeyboardInterrupt:
    print("interrupted", time.monotonic() - started < 0.3)
"""
    assert script(code, tmp_path / "long.wav") == "interrupted True\n"
