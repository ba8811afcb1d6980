"""examples/dask_index.py: a scheduler and three workers, one of which is killed in the middle of its work, make the index that one machine makes."""
import csv
import json
import os
import pathlib
import shutil
import signal
import subprocess
import sys
import time
import unittest

from command import KTFILES, MEDIA, CommandTest, chunk, wave

EXAMPLE = pathlib.Path(__file__).resolve().parents[2] / "examples/dask_index.py"
PATIENCE = 300  # seconds; starting Python four times takes half a minute on a machine that is busy


def python_with_dask():
    """Debian's Python has Debian's packages, whichever other one comes first in the PATH."""
    for python in (sys.executable, "/usr/bin/python3"):
        if os.path.exists(python) and subprocess.run([python, "-c", "import distributed, pandas"], capture_output=True, check=False).returncode == 0:
            return python
    return None


PYTHON = python_with_dask()


def eventually(what, process=None):
    """Waits until `what` is true, and returns it."""
    end = time.monotonic() + PATIENCE
    while not (result := what()):
        if time.monotonic() > end or (process is not None and process.poll() is not None):
            raise AssertionError("what was waited for did not come")
        time.sleep(0.02)
    return result


@unittest.skipUnless(PYTHON, "python3-distributed or python3-pandas is not installed")
class DaskTest(CommandTest):
    def setUp(self):
        super().setUp()
        library = self.folder / "library"
        for number in range(400):
            folder = library / f"{number // 80} ä" / "sub"
            folder.mkdir(parents=True, exist_ok=True)
            title = chunk(b"LIST", b"INFO" + chunk(b"INAM", f"Take {number}".encode()))
            (folder / f"{number}.wav").write_bytes(wave(title, frames=200 + number))
        shutil.copytree(MEDIA, library / "media", ignore=shutil.ignore_patterns("*.ktproj", "*.bundle"))
        (library / "broken.wav").write_bytes(b"RIFFnone")
        (library / "text.txt").write_text("no audio")
        (library / ".hidden.wav").write_bytes(wave())
        with open(os.fsencode(library) + b"/\xe4.wav", "wb") as odd:
            odd.write(wave())
        (self.folder / "elsewhere").mkdir()
        (self.folder / "elsewhere/linked.wav").write_bytes(wave())
        (library / "link").symlink_to("../elsewhere")
        (library / "circle").symlink_to(".")

    def start(self, *arguments):
        process = subprocess.Popen([str(argument) for argument in arguments], cwd=self.folder, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL,
                                   stdin=subprocess.DEVNULL, env={**os.environ, "DASK_DISTRIBUTED__WORKER__DAEMON": "false"})
        self.addCleanup(process.wait)
        self.addCleanup(process.kill)
        return process

    def cluster(self, workers):
        """The address of a scheduler, and the processes of its workers."""
        self.start(PYTHON, "-m", "distributed.cli.dask_scheduler", "--host", "127.0.0.1", "--port", "0", "--no-dashboard", "--scheduler-file", "scheduler.json")
        place = self.folder / "scheduler.json"
        eventually(lambda: place.exists() and place.read_text().strip().endswith("}"))
        processes = [self.start(PYTHON, "-m", "distributed.cli.dask_worker", "--scheduler-file", place, "--nthreads", "1", "--no-nanny", "--no-dashboard", "--host",
                                "127.0.0.1", "--local-directory", self.folder / f"worker-{number}") for number in range(workers)]
        return json.loads(place.read_text())["address"], processes

    def rows(self, database):
        """What an index says, but for when."""
        records = map(json.loads, self.run_command("index", "export", "--db", database).stdout.decode().splitlines())
        return [{key: value for key, value in record.items() if key not in ("indexed", "completed")} for record in records]

    def by_one_machine(self):
        self.run_command("index", "library", "--db", "one.db", "--quiet", status=1)  # one file is broken
        return self.rows("one.db")

    def test_a_worker_is_killed_and_every_file_is_there_once(self):
        address, workers = self.cluster(3)
        started = self.folder / "started"
        slow = self.folder / "slow-ktfiles"  # tells which worker runs it, and is slow enough to be met at work
        slow.write_text(f'#!/bin/sh\n[ "$2" = --records ] && {{ echo $PPID $$ >>{started}; sleep 0.3; }}\nexec {KTFILES} "$@"\n')
        slow.chmod(0o755)
        index = self.start(PYTHON, EXAMPLE, "library", "--db", "many.db", "--csv", "many.csv", "--scheduler", address, "--files", "15", "--ktfiles", slow)
        ours = {process.pid: process for process in workers}

        def at_work():
            """All workers have begun to work, and this one is reading a part."""
            begun = [tuple(map(int, line.split())) for line in started.read_text().splitlines()] if started.exists() else []
            if {worker for worker, _ in begun} != set(ours):
                return None
            return next((ours[worker] for worker, part in begun[-3:] if os.path.exists(f"/proc/{part}")), None)

        victim = eventually(at_work, index)
        victim.send_signal(signal.SIGKILL)
        self.assertEqual(index.wait(PATIENCE), 0)
        self.assertEqual([worker.poll() for worker in workers if worker is not victim], [None, None])
        self.assertEqual(victim.wait(), -signal.SIGKILL)
        with open(self.folder / "many.csv", newline="", encoding="utf-8") as table:
            paths = [row["path"] for row in csv.DictReader(table)]
        expected = self.by_one_machine()
        self.assertEqual(self.rows("many.db"), expected)
        self.assertEqual(paths, sorted(record["path"] for record in expected if "path" in record))
        self.assertGreater(len(paths), 400)

    def test_workers_of_this_machine(self):
        small = self.folder / "library/0 ä"
        subprocess.run([PYTHON, EXAMPLE, small, "--db", "many.db", "--workers", "1", "--ktfiles", KTFILES, "--", "--no-overview"], cwd=self.folder, check=True,
                       timeout=PATIENCE, stderr=subprocess.DEVNULL)
        self.run_command("index", small, "--db", "one.db", "--no-overview")
        self.assertEqual(self.rows("many.db"), self.rows("one.db"))


if __name__ == "__main__":
    unittest.main()
