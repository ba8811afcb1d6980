#!/usr/bin/env python3
"""Writes harbour-bw64.wav: four channels of plain tones, and harbour.xml in its chunk "axml" (ITU-R BS.2088)."""
import math
import pathlib
import struct

RATE, FRAMES = 8000, 3200
FREQUENCIES = (220, 330, 440, 880)  # narrator, bed left, bed right, gulls
TRACKS = (("ATU_00000001", "AT_00031001_01", "AP_00031001"), ("ATU_00000002", "AC_00011001_00", "AP_00011001"),
          ("ATU_00000003", "AC_00011002_00", "AP_00011001"), ("ATU_00000004", "AC_00031002_00", "AP_00031002"))


def chunk(chunk_id, body):
    return chunk_id + struct.pack("<I", len(body)) + body + b"\0" * (len(body) % 2)


channels = len(FREQUENCIES)
fmt = struct.pack("<HHIIHH", 1, channels, RATE, RATE * channels * 2, channels * 2, 16)
samples = b"".join(struct.pack("<h", round(8000 * math.sin(2 * math.pi * f * n / RATE) * (1 - n / FRAMES)))
                   for n in range(FRAMES) for f in FREQUENCIES)
chna = struct.pack("<HH", channels, len(TRACKS)) + b"".join(
    struct.pack("<H12s14s11sx", i + 1, *(text.encode() for text in track)) for i, track in enumerate(TRACKS))
folder = pathlib.Path(__file__).parent
behind = chunk(b"fmt ", fmt) + chunk(b"data", samples) + chunk(b"chna", chna) + chunk(b"axml", (folder / "harbour.xml").read_bytes())
ds64 = struct.pack("<QQQI", 4 + 8 + 28 + len(behind), len(samples), 0, 0)
(folder / "harbour-bw64.wav").write_bytes(b"BW64\xff\xff\xff\xffWAVE" + chunk(b"ds64", ds64) + behind)
