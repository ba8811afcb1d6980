"""Reads sound files into NumPy arrays and says how loud they are. Usage: read_file.py FILE..."""

import sys

import ktfiles
import numpy as np


def decibels(value: float) -> str:
    return f"{20 * np.log10(value):.1f} dB" if value > 0 else "silence"


for path in sys.argv[1:]:
    with ktfiles.open(path) as f:
        peak, power = 0.0, 0.0
        for block in f.blocks(65536):
            peak = max(peak, float(np.abs(block).max()))
            power += float(np.square(block, dtype=np.float64).sum())
        rms = (power / max(f.frames * f.channels, 1)) ** 0.5
        print(f"{path}: {f.duration:.3f} s, {f.sample_rate} Hz, peak {decibels(peak)}, RMS {decibels(rms)}")
