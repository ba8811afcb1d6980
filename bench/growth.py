#!/usr/bin/env python3
"""How the cost of work over many things grows with their number: time, memory, and the exponents fitted to them.

Usage: growth.py KTFILES [adm] [alternatives] [files]; without a kind all of them. The largest ADM document has 2 GB, the largest folder a
million names; TMPDIR chooses where they lie. Each row is a process of the command with its output thrown away: seconds of processor time, the
least of some turns, peak memory in MiB, and the exponents since the row ahead (1: in proportion). The exponents at the end are fitted to all
rows, without what the smallest row has that is no work: the process as it starts.
"""
import math
import os
import pathlib
import plistlib
import shutil
import sys
import tempfile

MEGABYTE = 1_000_000
BLOCK = """        <audioBlockFormat audioBlockFormatID="AB_0003{object:04X}_{block:08X}" rtime="00:{minute:02}:{second:02}.{part:02}000" duration="00:00:00.02000">
          <position coordinate="azimuth">{azimuth}.500000</position>
          <position coordinate="elevation">-12.000000</position>
          <position coordinate="distance">0.750000</position>
          <gain>0.707107</gain>
          <jumpPosition interpolationLength="0.005">1</jumpPosition>
        </audioBlockFormat>
"""


def cost(*command):
    """Seconds of processor time and MiB of a process."""
    child = os.posix_spawn(command[0], command, os.environ, file_actions=[(os.POSIX_SPAWN_OPEN, 1, "/dev/null", os.O_WRONLY, 0)])
    _, status, usage = os.wait4(child, 0)
    if status != 0:
        sys.exit(f"{command} failed")
    return usage.ru_utime + usage.ru_stime, usage.ru_maxrss / 1024


def least(turns, *command):
    costs = [cost(*command) for _ in range(turns)]
    return min(seconds for seconds, _ in costs), min(memory for _, memory in costs)


def exponent(points):
    """The slope of the line through the logarithms that leaves the smallest squares."""
    points = [(math.log(size), math.log(value)) for size, value in points if value > 0]
    if len(points) < 2:
        return math.nan
    x = sum(point[0] for point in points) / len(points)
    y = sum(point[1] for point in points) / len(points)
    return sum((a - x) * (b - y) for a, b in points) / sum((a - x) ** 2 for a, b in points)


def report(title, unit, rows, start):
    print(f"\n{title}\n{unit:>12} {'seconds':>10} {'MiB':>8}  time^  memory^")
    above = [(size, seconds - start[0], memory - start[1]) for size, seconds, memory in rows]
    for index, (size, seconds, memory) in enumerate(rows):
        pair = above[index - 1:index + 1] if index else []
        print(f"{size:>12,} {seconds:>10.3f} {memory:>8.1f}  {exponent([row[:2] for row in pair]):>5.2f}  {exponent([row[::2] for row in pair]):>7.2f}")
    print(f"{'fitted':>12} {'':>19}  {exponent([row[:2] for row in above]):>5.2f}  {exponent([row[::2] for row in above]):>7.2f}", flush=True)


def adm(ktfiles, folder, start):
    rows = []
    for size in (1, 4, 16, 64, 256, 1000, 2000):
        path = folder / "document.xml"
        with open(path, "w") as document:
            document.write('<audioFormatExtended>\n')
            written = number = 0
            while written < size * MEGABYTE: # 4,000 blocks to a channel
                number += 1
                document.write(f'      <audioChannelFormat audioChannelFormatID="AC_0003{number:04X}" audioChannelFormatName="C" typeLabel="0003">\n')
                blocks = "".join(BLOCK.format(object=number, block=block + 1, minute=block // 3000, second=block // 50 % 60, part=block % 50 * 2,
                                              azimuth=block % 180) for block in range(min(4000, (size * MEGABYTE - written) // 430 + 1)))
                written += document.write(blocks)
                document.write("      </audioChannelFormat>\n")
            document.write("</audioFormatExtended>\n")
        seconds, memory = least(5 if size < 256 else 2, ktfiles, "adm", "--quiet", str(path))
        rows.append((size, seconds, memory))
    report("ktfiles adm --quiet of one document", "MB", rows, start)


def alternatives(ktfiles, folder, start):
    rows = []
    for count in (1, 2, 4, 8, 16, 32, 64, 128):
        package = folder / "Song.fuguex"
        shutil.rmtree(package, ignore_errors=True)
        (package / "Resources").mkdir(parents=True)
        (package / "Resources/ProjectInformation.plist").write_bytes(plistlib.dumps(
            {"BundleVersion": 2, "VariantNames": {str(index): f"Mix {index}" for index in range(count)}}))
        for index in range(count):
            alternative = package / f"Alternatives/{index:03}"
            alternative.mkdir(parents=True)
            (alternative / "MetaData.plist").write_bytes(plistlib.dumps(
                {"AudioFiles": [f"Media/Audio Files/Take {index} of {take}.wav" for take in range(2000)]}, fmt=plistlib.FMT_BINARY))
        seconds, memory = least(3, ktfiles, "project", "media", str(package))
        rows.append((count, seconds, memory))
    report("ktfiles project media, 2,000 files of its own to an alternative", "alternatives", rows, start)


def files(ktfiles, folder, start):
    """Names of a few files: no file system of a test machine has room for a million of them."""
    rows = {"scan": [], "info": []}
    original = pathlib.Path(__file__).parent.parent / "examples/media/bassline.aiff"
    made, links, source = 0, 60000, None # most file systems allow 65,000 names of a file
    for count in (1_000, 10_000, 100_000, 1_000_000):
        for number in range(made, count):
            pack = folder / f"library/pack{number // 1000}"
            if number % 1000 == 0:
                pack.mkdir(parents=True)
            if number % links == 0:
                source = folder / f"source{number // links}.aiff"
                shutil.copyfile(original, source)
            os.link(source, pack / f"loop{number}.aiff")
        made = count
        for verb, found in rows.items():
            found.append((count, *least(3 if count < 1_000_000 else 1, ktfiles, verb, str(folder / "library"))))
    for verb, found in rows.items():
        report(f"ktfiles {verb} of a folder, 1,000 files to a folder below it", "files", found, start)


def main():
    kinds = {"adm": adm, "alternatives": alternatives, "files": files}
    if len(sys.argv) < 2 or any(name not in kinds for name in sys.argv[2:]):
        sys.exit(__doc__)
    ktfiles = os.path.abspath(sys.argv[1])
    start = least(20, ktfiles, "--version")
    print(f"the process as it starts: {start[0]:.4f} s, {start[1]:.1f} MiB")
    for name in sys.argv[2:] or kinds:
        with tempfile.TemporaryDirectory(prefix="ktfiles-growth-") as folder:
            kinds[name](ktfiles, pathlib.Path(folder), start)


if __name__ == "__main__":
    main()
