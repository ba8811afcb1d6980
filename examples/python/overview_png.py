"""Draws the waveform of a sound file. Usage: overview_png.py FILE PICTURE.png

By Matplotlib, or without it by NumPy and zlib alone.
"""

import struct
import sys
import zlib

import ktfiles
import numpy as np


def draw_by_numpy(overview: ktfiles.Overview, picture: str, width: int = 1200, lane: int = 128) -> None:
    """A grey-scale PNG, a lane of 2 * 64 lines for each channel."""
    columns = np.asarray(overview.columns(width)).astype(int)
    lines = np.arange(lane)[:, np.newaxis]
    lanes = []
    for channel in range(columns.shape[1]):
        low, high = columns[:, channel, 0], columns[:, channel, 1]
        lanes.append((lines >= (127 - high) // 2) & (lines <= (127 - low) // 2))
    pixels = np.where(np.concatenate(lanes), 40, 255).astype(np.uint8)
    rows = np.pad(pixels, ((0, 0), (1, 0)))  # each line begins with its filter, none

    def chunk(name: bytes, body: bytes) -> bytes:
        return struct.pack(">I", len(body)) + name + body + struct.pack(">I", zlib.crc32(name + body))

    header = struct.pack(">IIBBBBB", pixels.shape[1], pixels.shape[0], 8, 0, 0, 0, 0)
    with open(picture, "wb") as f:
        f.write(b"\x89PNG\r\n\x1a\n" + chunk(b"IHDR", header))
        f.write(chunk(b"IDAT", zlib.compress(rows.tobytes())) + chunk(b"IEND", b""))


path, picture = sys.argv[1:]
overview = ktfiles.overview(path)
try:
    import matplotlib.pyplot as pyplot  # type: ignore[import]
except ImportError:
    draw_by_numpy(overview, picture)
else:
    figure, ax = pyplot.subplots(figsize=(12, 3))
    overview.plot(ax)
    figure.savefig(picture)
print(f"{picture}: {len(overview)} points of {overview.shape[1]} channels")
