"""ktfiles index: a database that is as the folders are, whatever happens to either. KTFILES_KILLS is the number of kills."""
import json
import os
import platform
import random
import resource
import shutil
import signal
import sqlite3
import struct
import subprocess
import time
import unittest

from command import INSTRUMENTED, KTFILES, LIBRARY, MEDIA, CommandTest, chunk, wave
from test_failing_calls import TRACES

KILLS = int(os.environ.get("KTFILES_KILLS", "20"))
OWN_MOUNTS = ["unshare", "--mount", "--propagation", "private"]
needs_mounts = unittest.skipUnless(subprocess.run([*OWN_MOUNTS, "mount", "-t", "tmpfs", "none", "/mnt"], capture_output=True).returncode == 0,
                                   "no file systems can be mounted here")
NOTHING = {"added": 0, "changed": 0, "moved": 0, "removed": 0}


class IndexTest(CommandTest):
    def index(self, *arguments, status=0, database="library.db", **options):
        result = self.run_command("index", *arguments, "--db", database, "--json", status=status, **options)
        self.told = result.stderr.decode(errors="surrogateescape").splitlines()
        return {key: value for key, value in (json.loads(result.stdout)[0]["counts"] if result.stdout else {}).items()
                if key in NOTHING or value != 0}

    def changes(self, **expected):
        return {**NOTHING, **expected}

    def query(self, sql, database="library.db"):
        connection = sqlite3.connect(self.folder / database)
        try:
            return connection.execute(sql).fetchall()
        finally:
            connection.close()

    def rows(self, database="library.db"):
        """The row of each audio file by its path below the test's folder."""
        root = str(self.folder.resolve()) + "/"
        return {path.removeprefix(root): row for path, row in
                self.query("SELECT d.path || f.name, f.id FROM files f JOIN folders d ON d.id = f.folder", database)}

    def make(self, *names, frames=100):
        for number, name in enumerate(names):
            path = self.folder / name
            path.parent.mkdir(parents=True, exist_ok=True)
            path.write_bytes(wave(frames=frames + number))

    def assert_sound(self, database="library.db"):
        self.assertEqual(self.query("PRAGMA integrity_check", database), [("ok",)])
        self.query("INSERT INTO search(search, rank) VALUES('integrity-check', 1)", database)  # and the words are those of the files
        self.assertEqual(self.query("SELECT count(*) FROM sqlite_schema WHERE type = 'trigger'", database), [(9,)])
        self.assertEqual(self.query("PRAGMA foreign_key_check", database), [])
        self.assertEqual(self.query("SELECT count(*) FROM files WHERE id NOT IN (SELECT file FROM seen WHERE file NOT NULL)", database), [(0,)])


class Index(IndexTest):
    @unittest.skipUnless(TRACES, "strace cannot trace here")
    def test_unchanged_files_are_not_opened(self):
        self.make("lib/a.wav", "lib/deep/b.wav")
        self.write("lib/notes.txt", b"no sound")
        self.assertEqual(self.index("lib"), self.changes(added=2, passedOver=1))
        subprocess.run(["strace", "-f", "-o", "log", "-e", "trace=open,openat", KTFILES, "index", "lib", "--db", "library.db"],
                       cwd=self.folder, check=True)
        log = (self.folder / "log").read_text()
        self.assertIn("lib/deep", log)
        self.assertNotRegex(log, r"a\.wav|b\.wav|notes\.txt")
        self.assertEqual(self.index(), self.changes(unchanged=2, passedOver=1))

    def test_what_moves_keeps_its_row(self):
        def swap():
            os.rename("lib/a.wav", "lib/t"), os.rename("lib/b.wav", "lib/a.wav"), os.rename("lib/t", "lib/b.wav")

        for what, moves in (("a name", {"lib/a.wav": "lib/z.wav"}), ("a folder", {"lib/deep": "lib/other"}),
                            ("a file into a new folder", {"lib/deep/c.wav": "lib/new/c.wav"}),
                            ("to another root", {"lib/a.wav": "more/a.wav", "lib/deep": "more/deep"}),
                            ("a chain of names", {"lib/b.wav": "lib/x.wav", "lib/a.wav": "lib/y.wav"})):
            with self.subTest(what):
                self.make("lib/a.wav", "lib/b.wav", "lib/deep/c.wav", "lib/deep/d.wav", "more/e.wav")
                self.index("lib", "more")
                before = self.rows()
                for old, new in moves.items():
                    (self.folder / new).parent.mkdir(exist_ok=True)
                    os.rename(self.folder / old, self.folder / new)
                names = {path: next((new + path[len(old):] for old, new in moves.items() if path == old or path.startswith(old + "/")), path)
                         for path in before}
                moved = sum(old != new for old, new in names.items())
                self.assertEqual(self.index("lib", "more"), self.changes(moved=moved, unchanged=len(before) - moved))
                self.assertEqual(self.rows(), {names[path]: row for path, row in before.items()})
                self.assertEqual(self.query("SELECT count(*) FROM search WHERE search MATCH 'other'")[0][0], 2 if what == "a folder" else 0)
                self.assert_sound()
                for name in ("lib", "more", "library.db"):
                    shutil.rmtree(self.folder / name) if (self.folder / name).is_dir() else os.unlink(self.folder / name)
        self.make("lib/a.wav", "lib/b.wav")
        self.index("lib")
        before = self.rows()
        os.link(self.folder / "lib/a.wav", self.folder / "lib/hard.wav")
        self.assertEqual(self.index("lib")["added"], 1)
        self.assertEqual({path: row for path, row in self.rows().items() if path != "lib/hard.wav"}, before)

    def test_a_file_with_the_size_and_time_of_another_is_read(self):
        self.make("lib/a.wav", "lib/b.wav", "lib/c.wav")
        self.index("lib")
        rows = self.rows()
        for name in ("a", "b"):
            path = self.folder / f"lib/{name}.wav"
            times, content = path.stat(), bytearray(path.read_bytes())
            content[24:28] = (22050).to_bytes(4, "little")
            if name == "b":  # another inode
                path.rename(self.folder / "old")
            path.write_bytes(content)
            os.utime(path, ns=(times.st_atime_ns, times.st_mtime_ns))
        self.assertEqual(self.index("lib"), self.changes(changed=2, unchanged=1))
        self.assertEqual(self.rows(), rows)
        self.assertEqual(self.query("SELECT name, sample_rate FROM files ORDER BY name"), [("a.wav", 22050), ("b.wav", 22050), ("c.wav", 48000)])

    @unittest.skipUnless(TRACES, "strace cannot trace here")
    def test_files_on_a_memory_stick_are_the_same_when_it_is_plugged_in_again(self):
        """On FAT inodes are made up while it is mounted."""
        self.make("lib/a.wav", "lib/b.wav")
        self.index("lib")
        with sqlite3.connect(self.folder / "library.db") as database:
            database.execute("UPDATE seen SET inode = inode + 7")
        for kind, told in (("444d000000000000", "unchanged"), ("53ef000000000000", "changed")):  # what the system calls FAT, and EXT4
            result = subprocess.run(["strace", "-f", "-o", "log", "-e", "trace=statfs", "-e", f"inject=statfs:poke_exit=@arg2={kind}",
                                     KTFILES, "index", "lib", "--db", "library.db", "--jsonl"], cwd=self.folder, check=True, capture_output=True)
            self.assertEqual(json.loads(result.stdout)["counts"][told], 2)

    @unittest.skipUnless(TRACES and platform.machine() == "x86_64", "strace cannot trace here, or structures are others")
    def test_a_file_that_changed_in_this_tick_of_its_clock_may_change_once_more_unseen(self):
        self.make("lib/a.wav")
        # A time in whole hundredths may be of a clock of seconds and shows nothing yet; it does so later, or where a clock is waited for.
        for ago, told in ((0, "changed"), (5_000_000_000, "unchanged"), (7, "unchanged")):
            changed = time.time_ns() // 10_000_000 * 10_000_000 - ago
            self.index_with_status("a.wav", changed)
            self.assertEqual(self.index_with_status("a.wav", changed)[told], 1, ago)
            (self.folder / "library.db").unlink()

    def index_with_status(self, name, changed):
        """Counts of an indexing to which the system says that a file changed then, in nanoseconds."""
        status = os.stat(self.folder / "lib" / name)
        times = [part for time in (status.st_atime_ns, status.st_mtime_ns, changed) for part in divmod(time, 1_000_000_000)]
        told = struct.pack("=3Q4IQ9q24x", status.st_dev, status.st_ino, status.st_nlink, status.st_mode, status.st_uid, status.st_gid, 0, 0,
                           status.st_size, status.st_blksize, status.st_blocks, *times)
        result = subprocess.run(["strace", "-f", "-o", "log", "-P", self.folder / "lib" / name, "-P", name, "-e", "trace=newfstatat",
                                 "-e", f"inject=newfstatat:poke_exit=@arg3={told.hex()}", KTFILES, "index", "lib", "--db", "library.db", "--jsonl"],
                                cwd=self.folder, check=True, capture_output=True)
        return json.loads(result.stdout)["counts"]

    def test_an_inode_that_is_given_to_another_file_is_no_move(self):
        self.make("lib/a.wav")
        self.index("lib")
        os.link(self.folder / "lib/a.wav", self.folder / "lib/z.wav")
        os.unlink(self.folder / "lib/a.wav")
        (self.folder / "lib/z.wav").write_bytes(wave(frames=900))
        self.assertEqual(self.index("lib"), self.changes(added=1, removed=1))
        self.assertEqual(self.query("SELECT name, frames FROM files"), [("z.wav", 900)])

    def test_what_was_known_of_a_file_goes_when_it_changes(self):
        self.make("lib/repaired")
        tagged = wave(chunk(b"LIST", b"INFO" + chunk(b"ICMT", b"forgotten\0")), size=100)
        for name in ("repaired", "silent", "text", "gone"):
            self.write(f"lib/{name}", tagged)
        self.index("lib")
        self.assertEqual([count for count, in self.query("SELECT count(*) FROM findings UNION ALL SELECT count(*) FROM overviews")], [8, 4])
        self.make("lib/repaired", "lib/silent", frames=500)
        self.write("lib/text", b"no sound any more")
        os.unlink(self.folder / "lib/gone")
        self.assertEqual(self.index("lib", "--no-overview"), self.changes(changed=2, removed=2, passedOver=1))
        self.assertEqual(self.query("SELECT name, state, frames FROM files ORDER BY name"), [("repaired", "whole", 500), ("silent", "whole", 501)])
        for table in ("findings", "overviews", "search WHERE search MATCH 'forgotten'"):
            self.assertEqual(self.query(f"SELECT count(*) FROM {table}"), [(0,)], table)
        self.assert_sound()

    def test_an_index_with_hashes_keeps_them_of_files_that_change(self):
        self.make("lib/a.wav", "lib/b.wav")
        self.index("lib", "--hash")
        hashes = dict(self.query("SELECT name, sound_hash FROM files"))
        (self.folder / "lib/a.wav").write_bytes((self.folder / "lib/b.wav").read_bytes())
        self.assertEqual(self.index("lib")["changed"], 1)
        self.assertEqual(dict(self.query("SELECT name, sound_hash FROM files")), {"a.wav": hashes["b.wav"], "b.wav": hashes["b.wav"]})

    def test_what_is_not_there_is_kept_or_removed(self):
        self.make("lib/a.wav", "lib/deep/b.wav", "more/c.wav")
        self.index("lib", "more")
        os.unlink(self.folder / "lib/deep/b.wav")
        self.assertEqual(self.index("lib"), self.changes(removed=1, unchanged=1))
        self.assertEqual(sorted(self.rows()), ["lib/a.wav", "more/c.wav"])
        os.rename(self.folder / "more", self.folder / "elsewhere")
        with sqlite3.connect(self.folder / "library.db") as database:
            database.execute("UPDATE roots SET completed = 1")
        for arguments in (("more",), (), ("lib", "more")):
            self.assertEqual(self.index(*arguments, status=1)["removed"], 0)
            self.assertRegex(self.told[0], "more: is not there; .* kept")
        self.assertEqual(self.query("SELECT substr(path, -5), completed > 1 FROM roots ORDER BY path"), [("/lib/", 1), ("more/", 0)])
        (self.folder / "more").mkdir()
        self.index(status=1)
        self.assertRegex(self.told[0], "more: is empty, .* kept")
        self.assertEqual(sorted(self.rows()), ["lib/a.wav", "more/c.wav"])
        os.rmdir(self.folder / "more")
        self.assertEqual(self.index("--prune"), self.changes(removed=1, unchanged=1))
        self.assertEqual(self.index(), self.changes(unchanged=1))
        self.assertEqual(self.index("never", status=1), self.changes(problems=1))
        self.make("single/d.wav", "single/e.wav")
        self.assertEqual(self.index("single/d.wav"), self.changes(added=1))
        os.unlink(self.folder / "single/d.wav")
        self.assertEqual(self.index("single/d.wav"), self.changes(removed=1))
        self.make("hollow/f.wav")
        self.index("hollow")
        os.unlink(self.folder / "hollow/f.wav")
        self.assertEqual(self.index("hollow", status=1), self.changes(problems=1))
        self.assertEqual(self.index("hollow", "--prune"), self.changes(removed=1))
        self.failure("index", "--db", "none.db", status=2)
        self.failure("index", "lib", "--db", "no/such.db")
        self.assertFalse((self.folder / "no").exists())
        (self.folder / "empty").mkdir()
        self.assertEqual(self.index("empty"), self.changes())
        (self.folder / "empty").rmdir()
        self.index(status=1)
        self.assertRegex(self.told[0], "empty: is not there; .* kept")
        self.assertEqual(self.index("--prune"), self.changes(unchanged=1))
        self.assertEqual(self.index(), self.changes(unchanged=1))
        self.assert_sound()

    def test_a_link_in_the_place_of_a_file_is_told_and_the_file_kept(self):
        self.make("lib/a.wav", "lib/b.wav")
        self.index("lib")
        os.unlink(self.folder / "lib/a.wav")
        (self.folder / "lib/a.wav").symlink_to("volume/a.wav")
        self.assertEqual(self.index("lib", status=1), self.changes(unchanged=1, problems=1))
        self.assertRegex(self.told[0], r"lib/a\.wav: .*leads nowhere")
        self.assertEqual(sorted(self.rows()), ["lib/a.wav", "lib/b.wav"])
        self.index("lib/a.wav", status=None)
        self.assertEqual(sorted(self.rows()), ["lib/a.wav", "lib/b.wav"])
        (self.folder / "lib/volume/a.wav").mkdir(parents=True)  # to a folder, it is no file any more
        self.assertEqual(self.index("lib"), self.changes(removed=1, unchanged=1))

    def test_a_hidden_folder_that_was_named_stays_though_no_walk_comes_by(self):
        self.make("lib/a.wav", "lib/.mine/b.wav", "lib/deep/.own/c.wav")
        self.assertEqual(self.index("lib", "lib/.mine", "lib/deep/.own", "lib/.mine/b.wav"), self.changes(added=3))
        self.assertEqual(self.index("lib"), self.changes(unchanged=1))
        self.assertEqual(self.index(), self.changes(unchanged=3))
        self.assertEqual(self.index("lib", "lib/a.wav", "lib/deep"), self.changes(unchanged=1), "each once")
        self.make("single/d.wav", "single/deep/e.wav", "single/deep/f.wav")
        self.assertEqual(self.index("single/d.wav", "single/deep/e.wav"), self.changes(added=2))

    @needs_mounts
    def test_volumes_that_are_not_mounted(self):
        script = f"""set -e
            index() {{ {KTFILES} index lib --db library.db --json "$@" | grep -o '"added.*removed":[0-9]*' || true; }}
            mkdir -p lib/disk other; cp $1 lib/own.wav; cp $1 lib/gone.wav
            mount -t tmpfs none lib/disk; mkdir lib/disk/pack; cp -p $1 lib/disk/pack/a.wav
            index; rm lib/gone.wav; index; umount lib/disk; index
            mount -t tmpfs none other; mkdir other/pack; cp -p lib/own.wav other/pack/a.wav
            {KTFILES} index other --db library.db -q
            umount other; rmdir lib/disk; index; index --prune"""
        source = self.write("source.wav", wave())
        result = subprocess.run([*OWN_MOUNTS, "bash", "-c", script, "bash", source], cwd=self.folder, capture_output=True, text=True, timeout=60)
        counts = [[int(word.split(":")[1]) for word in line.split(",")] for line in result.stdout.splitlines()]
        # Added, changed, moved, removed; a file of the same inode, size and time on another device is another one.
        self.assertEqual(counts, [[3, 0, 0, 0], [0, 0, 0, 1], [0, 0, 0, 0], [0, 0, 0, 0], [0, 0, 0, 1]], result)
        self.assertEqual(result.stderr.count("is not mounted"), 2, result.stderr)
        self.assertEqual(sorted(self.rows()), ["lib/own.wav", "other/pack/a.wav"])

    def test_kills_leave_a_good_index_that_goes_on(self):
        for number in range(300):
            self.make(f"lib/{number % 7}/{number}.wav", frames=200 + number)
        start = time.monotonic()
        self.index("lib", database="whole.db")
        longest = time.monotonic() - start
        def known(database):
            return self.query("""SELECT d.path, f.name, f.size, f.state, f.frames, length(o.points), x.fields FROM files f JOIN folders d ON d.id = f.folder
                                 JOIN overviews o ON o.file = f.id JOIN details x ON x.file = f.id ORDER BY 1, 2""", database)
        whole, seed = known("whole.db"), random.randrange(1 << 30)
        moments, between = random.Random(seed), set()
        for number in range(KILLS):
            process = subprocess.Popen([KTFILES, "index", "lib", "--db", "killed.db"], cwd=self.folder)
            time.sleep(moments.uniform(0, longest))
            process.send_signal(moments.choice([signal.SIGKILL, signal.SIGKILL, signal.SIGINT]))
            process.wait()
            if (self.folder / "killed.db").exists() and self.query("PRAGMA user_version", "killed.db") != [(0,)]:
                self.assert_sound("killed.db")
                between.add(len(known("killed.db")))
            if number % 4 == 3:  # else it would be complete soon
                self.index("lib", database="killed.db")
                self.assertEqual(known("killed.db"), whole, seed)
                for ending in ("", "-wal", "-shm"):
                    (self.folder / f"killed.db{ending}").unlink(missing_ok=True)
        self.index("lib", database="killed.db")
        self.assertEqual(known("killed.db"), whole, seed)
        self.assertGreater(len(between), 0)

    def test_programs_that_make_an_index_at_once_wait_for_each_other(self):
        self.make("lib/a.wav")
        for number in range(30):
            started = [subprocess.Popen([KTFILES, "index", "lib", "--db", f"{number}.db"], cwd=self.folder, stderr=subprocess.PIPE) for _ in range(4)]
            self.assertEqual([(process.communicate(timeout=60)[1], process.returncode) for process in started], [(b"", 0)] * 4)

    def test_two_at_once_do_not_spoil_each_other(self):
        for number in range(400):
            self.make(f"lib/{number % 9}/{number}.wav", frames=100 + number)
        self.index("lib", database="whole.db")
        for work in ("from nothing", "after moves"):
            both = [subprocess.Popen([KTFILES, "index", "lib", "--db", "library.db", "-j", "4"], cwd=self.folder, stderr=subprocess.PIPE) for _ in range(2)]
            self.assertEqual([process.communicate(timeout=60)[1] for process in both], [b"", b""], work)
            self.assertEqual([process.returncode for process in both], [0, 0])
            self.assert_sound()
            self.assertEqual(len(self.rows()), 400)
            rows = sorted(self.rows().values())
            if work == "after moves":
                self.assertEqual(rows, before)
            else:
                before = rows
                os.rename(self.folder / "lib/3", self.folder / "lib/three")
                os.rename(self.folder / "lib/4", self.folder / "lib/5/four")

    def test_other_databases_are_left_alone(self):
        self.make("lib/a.wav")
        self.index("lib", database="newer.db")
        for name, sql in (("newer.db", "PRAGMA user_version = 99"), ("other.db", "CREATE TABLE mine(a)")):
            connection = sqlite3.connect(self.folder / name)
            connection.execute(sql)
            connection.commit()
            connection.close()
        self.write("text.db", b"no database " * 1000)
        self.write("cut.db", (self.folder / "newer.db").read_bytes()[:50])
        self.make("lib/b.wav")
        for name, words in (("newer.db", "newer ktfiles"), ("other.db", "another"), ("text.db", "no SQLite"), ("cut.db", "damaged")):
            before = (self.folder / name).read_bytes()
            self.assertIn(words, self.failure("index", "lib", "--db", name))
            self.assertEqual((self.folder / name).read_bytes(), before)
        self.assertEqual([name for name in os.listdir(self.folder) if name.endswith(("-wal", "-shm"))], [])

    @unittest.skipUnless(shutil.which("setpriv") and os.geteuid() == 0, "nobody else can be run as")
    def test_who_may_only_read_can_ask(self):
        self.make("lib/a.wav")
        database = self.folder / "all %41 of us?.db"
        self.index("lib", database=database.name)
        tool = shutil.copytree(os.path.dirname(os.path.realpath(KTFILES)), self.folder / "tool", ignore=lambda _, names: set(names) - {"ktfiles"})
        self.folder.chmod(0o755)
        def names():
            result = subprocess.run(["setpriv", "--reuid=65534", "--clear-groups", tool / "ktfiles", "find", "--db", database],
                                    cwd=self.folder, capture_output=True, text=True, env={**os.environ, "LD_LIBRARY_PATH": str(LIBRARY.parent), "HOME": "/"})
            return result.stderr, [os.path.basename(path) for path in result.stdout.splitlines()]
        self.assertEqual(names(), ("", ["a.wav"]))
        writer = sqlite3.connect(database)  # keeps what it wrote in the log
        self.addCleanup(writer.close)
        writer.execute("UPDATE files SET name = 'b.wav'")
        writer.commit()
        self.assertEqual(names(), ("", ["b.wav"]))

    def test_odd_names_and_links(self):
        names = [b"\xff\xfe.wav", b"two\nlines.wav", "é\U0010ff80.wav".encode(), b"-j", b"' or 1.wav"]
        folder = os.fsencode(self.folder / "lib") + b"/\xe9dir"
        os.makedirs(folder)
        for name in names:
            with open(folder + b"/" + name, "wb") as file:
                file.write(wave())
        self.index("lib", database="lib/own.db")
        # Its own files are none of the library's, by whichever name.
        os.link(self.folder / "lib/own.db", self.folder / "lib/again.db")
        self.make("lib/.hidden/x.wav", "lib/.x.wav", "outside/o.wav", "lib/plain.wav")
        for link, target in (("lib/up", ".."), ("lib/self", "."), ("lib/out", "../outside"), ("outside/back", "../lib"), ("lib/also.wav", "plain.wav"),
                             ("lib/dangling.wav", "nowhere"), ("lib/dangling.txt", "nowhere")):
            (self.folder / link).symlink_to(target)
        os.mkfifo(self.folder / "lib/fifo.wav")
        self.index("lib", database="lib/own.db", status=1)
        self.assertEqual(self.told, [f"ktfiles: {self.folder.resolve()}/lib/dangling.wav: cannot be looked at, or is a link that leads nowhere"])
        again = self.index("lib", database="lib/own.db", status=1)
        self.assertEqual(again, self.changes(unchanged=len(names) + 3, problems=1))
        self.assertEqual([name for (name,) in self.query("SELECT name FROM seen WHERE name LIKE '%.db%'", "lib/own.db")], [])
        self.assertEqual(len(self.rows("lib/own.db")), len(names) + 3)
        os.rename(folder + b"/" + names[0], folder + b"/\xfd.wav")
        self.assertEqual(self.index("lib", database="lib/own.db", status=1)["moved"], 1)

    @unittest.skipUnless(TRACES, "strace cannot trace here")
    def test_what_cannot_be_read_is_kept(self):
        self.make("lib/a.wav", "lib/deep/b.wav", "lib/deep/deeper/c.wav", "lib/z.wav")
        self.index("lib")
        rows = self.rows()
        os.unlink(self.folder / "lib/deep/b.wav")
        os.unlink(self.folder / "lib/z.wav")
        deep = f"{self.folder.resolve()}/lib/deep"
        for call in ("openat", "getdents64"):
            result = subprocess.run(["strace", "-f", "-o", "/dev/null", "-P", deep + "/", "-e", f"trace={call}", "-e", f"inject={call}:error=EIO",
                                     KTFILES, "index", "lib", "--db", "library.db"], cwd=self.folder, capture_output=True, text=True)
            self.assertEqual((result.returncode, result.stderr.splitlines()[-1]), (1, f"ktfiles: {deep}: input/output error"), call)
            self.assertEqual(self.rows(), {path: row for path, row in rows.items() if path != "lib/z.wav"})
        # A folder that is gone when its turn comes is no problem, and its files are looked for.
        result = subprocess.run(["strace", "-f", "-o", "/dev/null", "-P", deep + "/", "-e", "trace=openat", "-e", "inject=openat:error=ENOENT",
                                 KTFILES, "index", "lib", "--db", "library.db"], cwd=self.folder, capture_output=True, text=True)
        self.assertEqual((result.returncode, "ktfiles:" in result.stderr, sorted(self.rows())), (0, False, ["lib/a.wav", "lib/deep/deeper/c.wav"]))
        self.make("lib/deep/b.wav")
        self.index("lib")
        os.unlink(self.folder / "lib/deep/b.wav")
        # What the system cannot say of a file that is not listed any more.
        result = subprocess.run(["strace", "-f", "-o", "/dev/null", "-P", deep + "/b.wav", "-e", "trace=%file", "-e", "inject=%file:error=EIO",
                                 KTFILES, "index", "lib", "--db", "library.db"], cwd=self.folder, capture_output=True, text=True)
        self.assertEqual((result.returncode, result.stderr, "lib/deep/b.wav" in self.rows()), (0, "", True))
        self.assertEqual(self.index("lib"), self.changes(removed=1, unchanged=2))
        # What the system refuses is tried again, what is no audio is not.
        self.make("lib/locked.wav")
        self.write("lib/empty.wav", b"")
        locked = f"{self.folder.resolve()}/lib/locked.wav"
        for expected in (2, 1):
            result = subprocess.run(["strace", "-f", "-o", "/dev/null", "-P", locked, "-e", "trace=openat,openat2", "-e", "inject=openat,openat2:error=EACCES",
                                     KTFILES, "index", "lib", "--db", "library.db"], cwd=self.folder, capture_output=True, text=True)
            self.assertEqual((result.returncode, result.stderr.count("\n")), (1, expected), result.stderr)
        self.assertEqual(self.query("SELECT name, state FROM files WHERE state = 'unreadable' ORDER BY name"), [("empty.wav", "unreadable"), ("locked.wav", "unreadable")])
        self.assertEqual(self.index("lib"), self.changes(changed=1, unchanged=3))

    @unittest.skipIf(INSTRUMENTED, "the limit is for files of sanitizers too")
    def test_full_disk(self):
        for number in range(300):
            self.make(f"lib/{number}.wav", frames=5000)
        def limit():
            resource.setrlimit(resource.RLIMIT_FSIZE, (150_000, 150_000))
        result = self.run_command("index", "lib", "--db", "library.db", status=1, preexec_fn=limit)
        self.assertRegex(result.stderr.decode(), r"^ktfiles: library\.db: [^\n]+\n$")
        self.assert_sound()
        self.index("lib")
        self.assertEqual(len(self.rows()), 300)

    @unittest.skipIf(INSTRUMENTED, "an instrumented program reserves more memory than that")
    def test_want_of_memory_is_told_and_ends_in_order(self):
        (self.folder / "lib").mkdir()
        for number in range(20_000):
            self.write(f"lib/{number:05}{'x' * 220}", b"")
        told = set()
        for arguments in (["--db", "library.db"], ["--records"]):
            for result in self.with_little_memory("index", "lib", "-j", "2", *arguments):
                told.add(result.stderr.rpartition(": ")[2])
                self.assertEqual(result.returncode, 1 if result.stderr else 0, result.stderr)
        self.assertIn("out of memory\n", told)
        self.index("lib")
        self.assert_sound()

    def test_a_tree_that_changes_meanwhile(self):
        self.make(*(f"lib/{number % 5}/{number}.wav" for number in range(500)))
        process = subprocess.Popen([KTFILES, "index", "lib", "--db", "library.db"], cwd=self.folder, stderr=subprocess.PIPE)
        for number in range(0, 500, 3):
            os.unlink(self.folder / f"lib/{number % 5}/{number}.wav")
            self.make(f"lib/new/{number}.wav")
        os.rename(self.folder / "lib/1", self.folder / "lib/one")
        self.assertEqual(process.communicate()[1], b"")
        self.assertEqual(process.returncode, 0)
        self.index("lib")
        there = {str(path.relative_to(self.folder)) for path in (self.folder / "lib").rglob("*.wav")}
        self.assertEqual(set(self.rows()), there)
        self.assert_sound()

    def test_shards_and_lists(self):
        names = [f"lib/{number % 3}/{number}.wav" for number in range(40)]
        self.make(*names)
        added = [self.index("lib", "--shard", f"{number}/3")["added"] for number in (1, 2, 3)]
        self.assertEqual(sum(added), 40)
        self.assertTrue(all(added), added)
        os.unlink(self.folder / names[0])
        self.assertEqual(sum(self.index("lib", "--shard", f"{number}/3")["removed"] for number in (1, 2, 3)), 1)
        shutil.copytree(self.folder / "lib", self.folder / "copy")
        self.assertEqual([self.index("copy", "--shard", f"{number}/3", database="copy.db")["added"] for number in (1, 2, 3)],
                         [self.index("lib", "--shard", f"{number}/3", database="again.db")["added"] for number in (1, 2, 3)])
        self.write("list", b"\0".join(name.encode() for name in names[1:6]))
        self.assertEqual(self.index("--files-from", "list", "-0", database="list.db")["added"], 5)
        for part in ("0/3", "4/3", "1", "a/b", "1/3x"):
            self.failure("index", "lib", "--shard", part, status=2)

    def test_told_on_a_terminal_and_kept_in_the_users_folder(self):
        self.make("lib/a.wav")
        shutil.copy(MEDIA / "tone-16.aiff", self.folder / "lib")
        environment = {"XDG_DATA_HOME": str(self.folder / "data"), "NO_COLOR": "1"}
        text, status = self.on_terminal("index", "lib", **environment)
        self.assertRegex(text, r"^2 added, 0 changed, 0 moved, 0 removed, 0 unchanged.*; .*data/ktfiles/library\.db\n$")
        self.assertEqual(status, 0)
        self.assertEqual(self.on_terminal("index", "--quiet", **environment), ("", 0))
        self.assertEqual(self.run_command("index", env={**os.environ, **environment}).stderr, b"")
        self.assertEqual((self.folder / "data/ktfiles").stat().st_mode & 0o777, 0o700)


class Watch(IndexTest):
    def watch(self, *before):
        """Starts it, and waits for the first update."""
        process = subprocess.Popen([*before, KTFILES, "index", "lib", "--db", "library.db", "--watch", "--jsonl"], cwd=self.folder,
                                   stdout=subprocess.PIPE, stderr=subprocess.PIPE)
        self.addCleanup(process.wait)
        self.addCleanup(process.kill)
        self.addCleanup(process.stdout.close)
        self.addCleanup(process.stderr.close)
        process.stdout.readline()
        return process

    def until(self, *paths):
        """Waits until the index has exactly these files."""
        end = time.monotonic() + 30
        while sorted(self.rows()) != sorted(paths):
            self.assertLess(time.monotonic(), end, self.rows())
            time.sleep(0.05)

    def end(self, process):
        process.send_signal(signal.SIGINT)
        out, error = process.communicate(timeout=30)
        self.assertEqual(process.returncode, -signal.SIGINT)
        self.assert_sound()
        return error.decode()

    def test_follows_changes(self):
        self.make("lib/a.wav", "lib/deep/b.wav")
        process = self.watch()
        self.make("lib/c.wav", "lib/new/folder/d.wav")
        self.until("lib/a.wav", "lib/c.wav", "lib/deep/b.wav", "lib/new/folder/d.wav")
        rows = self.rows()
        os.rename(self.folder / "lib/new", self.folder / "lib/renamed")
        os.rename(self.folder / "lib/a.wav", self.folder / "lib/deep/z.wav")
        self.until("lib/c.wav", "lib/deep/b.wav", "lib/deep/z.wav", "lib/renamed/folder/d.wav")
        self.assertEqual(sorted(self.rows().values()), sorted(rows.values()))
        self.make("lib/renamed/folder/e.wav")  # of a folder that is watched by its new name
        os.unlink(self.folder / "lib/c.wav")
        shutil.rmtree(self.folder / "lib/deep")
        self.until("lib/renamed/folder/d.wav", "lib/renamed/folder/e.wav")
        # Names of files that are there announce no end of writing.
        self.make("outside.wav")
        os.link(self.folder / "outside.wav", self.folder / "lib/hard.wav")
        self.until("lib/renamed/folder/d.wav", "lib/renamed/folder/e.wav", "lib/hard.wav")
        (self.folder / "lib/soft.wav").symlink_to("../outside.wav")
        self.until("lib/renamed/folder/d.wav", "lib/renamed/folder/e.wav", "lib/hard.wav", "lib/soft.wav")
        os.unlink(self.folder / "lib/hard.wav")
        os.unlink(self.folder / "lib/soft.wav")
        # More than the system's queue holds.
        process.send_signal(signal.SIGSTOP)
        two = [os.open(self.folder / f"lib/{name}.txt", os.O_CREAT | os.O_WRONLY) for name in "xy"]
        for number in range(20_000):
            os.fchmod(two[number % 2], 0o600 + number % 3)
        list(map(os.close, two))
        self.make("lib/renamed/f.wav", "lib/late/g.wav")
        process.send_signal(signal.SIGCONT)
        self.until("lib/renamed/folder/d.wav", "lib/renamed/folder/e.wav", "lib/renamed/f.wav", "lib/late/g.wav")
        self.assertEqual(self.end(process), "")

    def test_what_ignores_a_signal_goes_on(self):
        self.make("lib/a.wav")
        process = self.watch("env", "--ignore-signal=HUP")
        process.send_signal(signal.SIGHUP)
        self.make("lib/b.wav")
        self.until("lib/a.wav", "lib/b.wav")
        self.assertEqual(self.end(process), "")

    def test_a_root_that_goes_and_comes(self):
        self.make("lib/a.wav")
        process = self.watch()
        os.rename(self.folder / "lib", self.folder / "away")
        self.assertRegex(process.stderr.readline().decode(), "is not there")
        os.rename(self.folder / "away", self.folder / "lib")
        self.make("lib/b.wav")
        self.until("lib/a.wav", "lib/b.wav")
        self.assertEqual(self.end(process), "")

    @unittest.skipUnless(TRACES, "strace cannot trace here")
    def test_beyond_the_systems_limit(self):
        self.make("lib/a.wav")
        process = self.watch("strace", "-f", "-o", "/dev/null", "-e", "trace=inotify_add_watch", "-e", "inject=inotify_add_watch:error=ENOSPC")
        self.assertRegex(process.stderr.readline().decode(), "watches no more folders")
        self.make("lib/b.wav")
        self.until("lib/a.wav", "lib/b.wav")
        self.assertEqual(json.loads(process.stdout.readline())["counts"]["added"], 1)  # told before the pipe is closed, which would end it while its folder is removed


if __name__ == "__main__":
    unittest.main()
