#!/usr/bin/env python3
"""`ktfiles index` beside what it is to keep up with: find for a tree without changes, one file at a time on storage with latency, `ktfiles scan`.

Usage: index.py KTFILES [unchanged] [latency] [scan]; without a kind all of them. TMPDIR chooses where the files lie. Each figure is the least of
several turns, taken in turns with what stands beside it. `scan` drops the contents of the files from the system's cache for half of its rows.
"""
import os
import pathlib
import shutil
import struct
import subprocess
import sys
import tempfile
import time

BENCH = pathlib.Path(__file__).resolve().parent


def wave(frames, number):
    body = struct.pack(f"<{frames}h", *((i * 37 + number) % 20_000 - 10_000 for i in range(frames)))
    head = b"WAVEfmt " + struct.pack("<IHHIIHH", 16, 1, 1, 48000, 96000, 2, 16)
    loop = b"acid" + struct.pack("<IIHHfIHHf", 24, 2, 60, 0x8000, 0, 4, 4, 4, 118 + number % 9)
    rest = head + loop + b"data" + struct.pack("<I", len(body)) + body
    return b"RIFF" + struct.pack("<I", len(rest)) + rest


def make(folder, files, frames, per_folder=500):
    for number in range(files):
        place = folder / f"pack {number // per_folder:04}"
        if number % per_folder == 0:
            place.mkdir(parents=True)
        (place / f"Shaker loop {number:06}.wav").write_bytes(wave(frames, number))


def run(*command, **environment):
    """Seconds of a process."""
    start = time.perf_counter()
    subprocess.run(command, stdout=subprocess.DEVNULL, env={**os.environ, **environment}, check=True)
    return time.perf_counter() - start


def least(turns, *works):
    """The least seconds of each of the works, done in turns."""
    times = [[work() for work in works] for _ in range(turns)]
    return [min(column) for column in zip(*times)]


def unchanged(ktfiles, folder, files=200_000):
    make(folder / "lib", files, 10)
    database = folder / "library.db"
    run(ktfiles, "index", folder / "lib", "--db", database, "--no-overview")
    beside, ours = least(9, lambda: run("find", folder / "lib", "-printf", "%s %T@\\n"), lambda: run(ktfiles, "index", folder / "lib", "--db", database))
    print(f"{files:,} files without changes: {ours:.3f} s to find's {beside:.3f} s: {ours / beside:.2f} × (at most 1.5)")


def latency(ktfiles, folder, files=1500):
    make(folder / "lib", files, 2000)
    shim, report = folder / "slow_storage.so", folder / "report"
    subprocess.run(["cc", "-O2", "-shared", "-fPIC", "-o", shim, BENCH / "slow_storage.c", "-ldl"], check=True)
    slow = {"LD_PRELOAD": str(shim), "SLOW_FOLDER": f"{folder}/lib/",  # and not the database beside it
            "SLOW_REPORT": str(report)}

    def index(*options):
        for path in folder.glob("library.db*"):
            path.unlink()
        return run(ktfiles, "index", folder / "lib", "--db", folder / "library.db", *options, **slow)

    for options in ([], ["--no-overview"]):
        alone, many = least(2, lambda: index("-j", "1", *options), lambda: index(*options))
        most, requests = report.read_text().split()
        print(f"1 ms more for each open and read, {files:,} files{' '.join(['', *options])}: {files / many:,.0f} files/s to {files / alone:,.0f} one at a time: "
              f"{alone / many:.1f} × (at least 10); {most} requests in flight (at least 16), {int(requests) / files:.1f} a file")


def scan(ktfiles, folder, files=20_000):
    make(folder / "lib", files, 2000)

    def forget():
        for path in (folder / "lib").rglob("*.wav"):
            with open(path, "rb") as file:
                os.fdatasync(file.fileno())
                os.posix_fadvise(file.fileno(), 0, 0, os.POSIX_FADV_DONTNEED)

    def index(cold, *options):
        for path in folder.glob("library.db*"):
            path.unlink()
        if cold:
            forget()
        return run(ktfiles, "index", folder / "lib", "--db", folder / "library.db", *options)

    def beside(cold):
        if cold:
            forget()
        return run(ktfiles, "scan", folder / "lib")

    for cold in (False, True):
        scanned, bare, whole = least(3, lambda: beside(cold), lambda: index(cold, "--no-overview"), lambda: index(cold))
        print(f"{files:,} loops, {'not ' if cold else ''}in the cache: scan {files / scanned:,.0f} files/s, index --no-overview {files / bare:,.0f} "
              f"({bare / scanned:.2f} × its time, at most 1), index {files / whole:,.0f}")


def main():
    ktfiles = os.path.abspath(sys.argv[1])
    for kind in sys.argv[2:] or ["unchanged", "latency", "scan"]:
        folder = pathlib.Path(tempfile.mkdtemp(prefix="ktfiles-bench-")).resolve()
        try:
            {"unchanged": unchanged, "latency": latency, "scan": scan}[kind](ktfiles, folder)
        finally:
            shutil.rmtree(folder)


if __name__ == "__main__":
    main()
