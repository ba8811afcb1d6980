#!/usr/bin/env python3
"""Indexes folders on many machines: Dask distributed spreads the work, `ktfiles index merge` puts it together.

    dask_index.py FOLDER... --db library.db [--csv table.csv] [--scheduler HOST:PORT] [--workers N] [--files N] [-- OPTIONS]

Every worker must have `ktfiles`, and see the folders under the same paths. Without --scheduler the workers are processes of this machine.
The files are listed here and handed out in parts; a part whose worker dies is given to another one. Its records come back as JSON Lines
and go straight into the index, so that no machine holds more than a few parts. OPTIONS are those of `ktfiles index`, such as --hash.

Debian: python3-distributed, and python3-pandas for --csv.
"""
import argparse
import itertools
import json
import os
import subprocess
import sys

from distributed import Client, LocalCluster, as_completed

COLUMNS = ["path", "state", "kind", "containerName", "sampleRate", "channels", "durationSeconds", "tempo", "key", "category", "title", "artist"]
PARTS_EACH = 4  # for each worker, so that none waits, and few are held in memory


def files_below(folders):
    """The files that `ktfiles index` looks at: no names that begin with a dot, and links to folders where they lead out of all these."""
    to_do, visited = list(reversed(folders)), set()
    while to_do:
        folder = to_do.pop()
        status = os.stat(folder)
        if (status.st_dev, status.st_ino) in visited:
            continue
        visited.add((status.st_dev, status.st_ino))
        with os.scandir(folder) as entries:
            for entry in sorted((each for each in entries if not each.name.startswith(".")), key=lambda each: each.name):
                if entry.is_file():
                    yield entry.path
                elif entry.is_dir() and not entry.is_symlink():
                    to_do.append(entry.path)
                elif entry.is_dir() and not any(os.path.realpath(entry.path).startswith(root.rstrip("/") + "/") for root in folders):
                    to_do.append(os.path.realpath(entry.path))


def read_part(paths, command, options):
    """On a worker: the records of some files, a JSON object on each line, and what ktfiles said of files that cannot be read."""
    result = subprocess.run([command, "index", "--records", *options, "--files-from", "-", "--null"],
                            input=b"\0".join(map(os.fsencode, paths)), capture_output=True, check=False)
    if result.returncode not in (0, 1):  # 1: a file cannot be read, which its record says
        raise RuntimeError(f"{command}: status {result.returncode}: {result.stderr.decode(errors='replace')}")
    return result.stdout, result.stderr.decode(errors="replace")


def records_of(client, parts, arguments):
    """The records of all parts, as they come in. A worker that dies takes nothing with it: its parts are read by others."""
    parts = iter(parts)

    def submitted(part):
        return client.submit(read_part, part, arguments.ktfiles, arguments.options, pure=False, retries=arguments.retries)

    workers = max(1, len(client.scheduler_info()["workers"]))
    running = as_completed([submitted(part) for part in itertools.islice(parts, PARTS_EACH * workers)])
    for future in running:
        records, complaints = future.result()
        future.release()  # they are here: the scheduler need not have them computed again
        sys.stderr.write(complaints)
        yield records
        for part in itertools.islice(parts, 1):
            running.add(submitted(part))


def indexed_name(path):
    """A path as the index has it: a byte B that is no UTF-8 is the character U+10FF00 + B."""
    return "".join(chr(ord(each) - 0xDC00 + 0x10FF00) if 0xDC80 <= ord(each) <= 0xDCFF else each for each in path)


def index(client, arguments):
    folders = [os.path.realpath(folder) for folder in arguments.folders]
    paths = files_below(folders)
    parts = iter(lambda: list(itertools.islice(paths, arguments.files)), [])
    rows = []
    merge = subprocess.Popen([arguments.ktfiles, "index", "merge", "-", "--db", arguments.db, "--quiet"], stdin=subprocess.PIPE)
    with merge.stdin as lines:
        for folder in folders:
            lines.write(json.dumps({"root": indexed_name(folder.rstrip("/") + "/")}).encode() + b"\n")
        for records in records_of(client, parts, arguments):
            lines.write(records)
            if arguments.csv:
                rows += [{key: record.get(key) for key in COLUMNS} for record in map(json.loads, records.splitlines()) if "state" in record]
    if merge.wait() != 0:
        sys.exit(1)
    if arguments.csv:
        import pandas
        pandas.DataFrame(rows, columns=COLUMNS).sort_values("path").to_csv(arguments.csv, index=False)


def main():
    parser = argparse.ArgumentParser(description="Indexes folders on many machines, by Dask distributed.")
    parser.add_argument("folders", nargs="+", metavar="FOLDER")
    parser.add_argument("--db", required=True, help="the index, which is made or added to")
    parser.add_argument("--csv", help="also a table, for people and spreadsheets")
    parser.add_argument("--scheduler", help="the address of a Dask scheduler; otherwise workers are started here")
    parser.add_argument("--workers", type=int, default=os.cpu_count(), help="how many are started here")
    parser.add_argument("--files", type=int, default=500, help="of a part")
    parser.add_argument("--retries", type=int, default=3, help="of a part that fails")
    parser.add_argument("--ktfiles", default="ktfiles", help="the command, on every machine")
    arguments = parser.parse_args(before(sys.argv[1:], "--"))
    arguments.options = behind(sys.argv[1:], "--")
    if arguments.scheduler:
        with Client(arguments.scheduler) as client:
            index(client, arguments)
    else:
        with LocalCluster(n_workers=arguments.workers, threads_per_worker=1, dashboard_address=None) as cluster, Client(cluster) as client:
            index(client, arguments)


def before(words, end):
    return words[:words.index(end)] if end in words else words


def behind(words, end):
    return words[words.index(end) + 1:] if end in words else []


if __name__ == "__main__":
    main()
