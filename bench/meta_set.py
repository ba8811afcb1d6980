#!/usr/bin/env python3
"""What `ktfiles meta set --in-place` of a bext field takes in a recording of 4 GiB, beside a bare open, pwrite and fdatasync; milliseconds.

Usage: meta_set.py KTFILES. Files are sparse, in the system's temporary folder. What an edit takes is the difference between one command over
many files and over one, which leaves the start of the process out; that is told beside it.
"""
import os
import pathlib
import struct
import sys
import tempfile
import time

FILES, TURNS, SOUND = 21, 25, 4 << 30
FORMAT = b"fmt " + struct.pack("<IHHIIHH", 16, 1, 1, 48000, 96000, 2, 16)
DESCRIPTION = 12 + 36 + len(FORMAT) + 8


def recording():
    length = DESCRIPTION + 602 + 8 + SOUND
    return (b"RF64\xff\xff\xff\xffWAVEds64" + struct.pack("<IQQQI", 28, length - 8, SOUND, SOUND // 2, 0) + FORMAT +
            b"bext" + struct.pack("<I", 602) + bytes(602) + b"data\xff\xff\xff\xff"), length


def seconds(work, *arguments):
    start = time.perf_counter()
    work(*arguments)
    return time.perf_counter() - start


def run(*command):
    child = os.posix_spawn(command[0], command, os.environ, file_actions=[(os.POSIX_SPAWN_OPEN, 1, "/dev/null", os.O_WRONLY, 0)])
    if os.waitpid(child, 0)[1] != 0:
        sys.exit(f"{command[:5]} failed")


def write(path, text):
    descriptor = os.open(path, os.O_RDWR)
    os.pwrite(descriptor, text.encode(), DESCRIPTION)
    os.fdatasync(descriptor)
    os.close(descriptor)


def main(ktfiles):
    with tempfile.TemporaryDirectory() as folder:
        os.environ["KTFILES_COORDINATION"] = folder + "/coordination"
        paths = [folder + f"/{i}.wav" for i in range(FILES)]
        head, length = recording()
        for path in paths:
            pathlib.Path(path).write_bytes(head)
            os.truncate(path, length)
        taken = {name: [] for name in ("start", "bare", "command", "edit")}
        for turn in range(TURNS):
            taken["start"].append(seconds(run, ktfiles, "--version"))
            taken["bare"].append(seconds(write, paths[0], f"turn {turn}"))
            one = seconds(run, ktfiles, "meta", "set", "--in-place", paths[0], f"bext.description=one {turn}")
            many = seconds(run, ktfiles, "meta", "set", "--in-place", *paths, f"bext.description=many {turn}")
            taken["command"].append(one)
            taken["edit"].append((many - one) / (FILES - 1))
    for name, values in taken.items():
        values.sort()
        print(f"{name:8}", *(f"{label} {1000 * values[int(place * TURNS)]:6.2f}" for label, place in (("10 %", 0.1), ("median", 0.5), ("90 %", 0.9))))


if __name__ == "__main__":
    main(*sys.argv[1:])
