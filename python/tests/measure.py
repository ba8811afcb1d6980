"""Measures the package side by side with soundfile, mutagen and NumPy: measure.py [FOLDER]

The files are made in the folder, by default a temporary one, and stay in the page cache. Of several runs each the fastest
counts, those of both sides in turn. Each line is how many times as fast as the other side this package is.
"""

from __future__ import annotations

import pathlib
import subprocess
import sys
import tempfile
import time
from concurrent.futures import ThreadPoolExecutor
from typing import Callable, List

import ktfiles
import mutagen  # type: ignore[import]
import numpy as np
import soundfile  # type: ignore[import]

RATE, SECONDS, FILES = 44100, 120, 2000


def fastest(*sides: Callable[[], object], runs: int = 7) -> List[float]:
    times = [[] for _ in sides]  # type: List[List[float]]
    for _ in range(runs):
        for side, taken in zip(sides, times):
            started = time.perf_counter()
            side()
            taken.append(time.perf_counter() - started)
    return [min(taken) for taken in times]


def report(what: str, other: float, ours: float) -> None:
    print(f"{what:45} {other / ours:6.2f} x  ({ours * 1000:.1f} ms, {other * 1000:.1f} ms)", flush=True)


def read_ours(path: pathlib.Path) -> np.ndarray:  # type: ignore[type-arg]
    with ktfiles.open(path) as f:
        return f.read()


def overview_of_blocks(path: pathlib.Path) -> np.ndarray:  # type: ignore[type-arg]
    points = []
    for block in soundfile.blocks(path, 65536, dtype="float32", always_2d=True):
        whole = block[: len(block) // 256 * 256].reshape(-1, 256, block.shape[1])
        points.append(np.stack([whole.min(axis=1), whole.max(axis=1)], axis=2))
    return np.clip(np.rint(np.concatenate(points) * 128), -127, 127).astype(np.int8)


def import_time(module: str) -> float:
    def run() -> None:
        subprocess.run([sys.executable, "-c", f"import {module}"], check=True)

    return fastest(run, runs=11)[0]


def main(folder: pathlib.Path) -> None:
    random = np.random.default_rng(1)
    envelope = np.exp(-np.arange(RATE * SECONDS) % RATE / RATE * 4)
    sound = (random.normal(0, 0.1, (RATE * SECONDS, 2)) * envelope[:, np.newaxis]).clip(-1, 1)
    for name, subtype in ("16.wav", "PCM_16"), ("24.wav", "PCM_24"), ("16.flac", "PCM_16"), ("24.flac", "PCM_24"):
        path = folder / name
        soundfile.write(path, sound, RATE, subtype=subtype)
        report(
            f"read {name}, {SECONDS} s of stereo, and soundfile",
            *fastest(lambda: soundfile.read(path, dtype="float32"), lambda: read_ours(path)),
        )
        report(f"overview of {name}, and NumPy", *fastest(lambda: overview_of_blocks(path), lambda: ktfiles.overview(path)))

    files = [folder / f"loop{i}.aiff" for i in range(FILES)]
    source = (pathlib.Path(__file__).parents[2] / "examples/media/bassline.aiff").read_bytes()
    for file in files:
        file.write_bytes(source)
    if hasattr(ktfiles, "tags"):
        report(
            f"tags of {FILES} AIFF files, and mutagen",
            *fastest(lambda: [mutagen.File(file) for file in files], lambda: [ktfiles.tags(file) for file in files]),
        )

        def opened() -> None:
            for file in files:
                with ktfiles.open(file):
                    ktfiles.tags(file)

        report(f"open and tags of {FILES}, and mutagen", *fastest(lambda: [mutagen.File(file) for file in files], opened))

    one, eight = fastest(
        lambda: [read_ours(folder / "24.flac") for _ in range(8)],
        lambda: list(ThreadPoolExecutor(8).map(read_ours, [folder / "24.flac"] * 8)),
        runs=3,
    )
    report("8 readers of FLAC in a pool, and one by one", one, eight)
    numpy, ours = import_time("numpy"), import_time("ktfiles")
    print(f"import ktfiles takes {(ours - numpy) * 1000:.0f} ms more than import numpy ({numpy * 1000:.0f} ms)")


if len(sys.argv) > 1:
    main(pathlib.Path(sys.argv[1]))
else:
    with tempfile.TemporaryDirectory() as temporary:
        main(pathlib.Path(temporary))
