"""Files that the tests are about, made by other programs than this library."""

import os
import pathlib
import subprocess
import sys
import tempfile

# Processes of the tests meet nobody else's.
os.environ["KTFILES_COORDINATION"] = tempfile.mkdtemp(prefix="ktfiles-coordination-")

import numpy as np
import pytest
import soundfile

SOURCE = pathlib.Path(os.environ["KTFILES_SOURCE"])
MEDIA = SOURCE / "examples" / "media"


def noise(frames, channels, seed=1):
    """Full-scale noise with silence and an attack."""
    made = np.random.default_rng(seed).uniform(-1, 1, (frames, channels))
    made[: frames // 10] = 0
    return made


@pytest.fixture
def media():
    return MEDIA


@pytest.fixture
def sound(tmp_path):
    """Makes a sound file by libsndfile: sound("a.wav", subtype="PCM_24", channels=2, frames=1000)."""

    def make(name, subtype="PCM_16", channels=2, frames=10000, rate=44100, **options):
        path = tmp_path / name
        soundfile.write(path, noise(frames, channels), rate, subtype=subtype, **options)
        return path

    return make


@pytest.fixture
def script():
    """Runs a Python program in an interpreter of its own; returns what it prints."""

    def run(code, *arguments, check=True, **options):
        command = [sys.executable, "-c", code, *map(str, arguments)]
        done = subprocess.run(command, capture_output=True, text=True, timeout=60, **options)
        assert not check or done.returncode == 0, done.stderr
        return done.stdout if check else done

    return run


@pytest.fixture
def command():
    """Runs the command `ktfiles`; returns what it prints."""

    def run(*arguments):
        done = subprocess.run([os.environ["KTFILES"], *map(str, arguments)], capture_output=True, text=True, timeout=60)
        assert done.returncode == 0, done.stderr
        return done.stdout

    return run
