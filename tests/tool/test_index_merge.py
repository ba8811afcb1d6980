"""Records of an index as JSON Lines, and indexes that become one: nothing is lost, nothing bad comes in, no order matters."""
import base64
import itertools
import json
import os
import shutil
import sqlite3
import subprocess
import time
import unittest

from command import KTFILES, MEDIA, CommandTest

STAMP = {"size": 100, "modified": 1_700_000_000_123_456_789, "changed": 1_700_000_001_000_000_001, "inode": 12}
ODD_FIELDS = '[{"name":"a","value":1.50,"words":"\\u200b"}, {"name":"b","value":-0.0},{"name":"c","value":123456789012345678901}]'


def line(path, indexed=1_700_000_002, **more):
    stamp = {key: more.pop(key, value) for key, value in STAMP.items()}
    return json.dumps({"path": path, "stamp": stamp, "indexed": indexed, "state": "whole", **more})


def whole_record():
    """Every key, and values that are lost where numbers or texts are taken for less than they are."""
    return {"path": "/m/Ä \U0010ffe4\u202e\"\\.wav", "stamp": {"size": 2**53 + 1, "modified": -(2**63), "changed": 2**63 - 1, "inode": -1},
            "indexed": 1_700_000_002, "state": "damaged", "kind": "loop", "containerName": "WAVE", "fileType": "WAVE", "coding": "PCM",
            "sampleRate": 44100, "bitsPerSample": 24, "sourceBits": 20, "floatingPoint": False, "channels": 2, "channelLayout": "stereo",
            "frames": 2**59 + 1, "durationSeconds": 0.1 + 0.2, "bitRate": 128000, "tempo": 120, "tempoSource": "acid", "beatCount": 8,
            "keyNote": 0, "mode": "neither", "key": "C", "keySource": "acid", "signature": "7/8", "category": "Bass", "subCategory": "Synth",
            "genre": "Dub\u2028", "descriptors": ["a", "b", ""], "title": "\0\x7f\ufffd", "artist": "\U0001d11e", "album": "x" * 300, "comment": "a\nb\r\t",
            "recorded": "2026", "soundHash": "0123456789abcdef" * 4, "problems": [{"kind": "truncated", "text": "z"}, {"kind": "b", "text": ""}],
            "overview": {"framesPerPoint": 512, "points": base64.b64encode(bytes(range(256))).decode()},
            "fields": [{"name": "n", "value": None}], "loopTags": {"tempo": 120.0, "x": [1]}}


class MergeTest(CommandTest):
    def merge(self, *sources, db="all.db", **options):
        return self.run_command("index", "merge", *sources, "--db", db, **options)

    def merged(self, *texts, db):
        """Merges texts of lines from standard input, one after the other."""
        for text in texts:
            self.merge("-", db=db, stdin=text.encode())
        return db

    def export(self, db="all.db"):
        return self.run_command("index", "export", "--db", db).stdout.decode()

    def files(self, db="all.db"):
        return {record["path"]: record for record in map(json.loads, self.export(db).splitlines()) if "path" in record}

    def test_every_key_comes_back_as_it_was(self):
        record = whole_record()
        schema = json.loads((self.schemas() / "index-export.json").read_text())["$defs"]["record"]["oneOf"][0]
        self.assertEqual(set(record), set(schema["properties"]))
        self.merge("-", stdin=json.dumps(record).encode())
        found, = self.files().values()
        self.assertEqual(found, record)
        self.assertEqual(self.json("index", "export", "--db", "all.db"), [record])

    @staticmethod
    def schemas():
        import schemas
        return schemas.FOLDER

    def test_what_is_stored_is_exported_character_by_character(self):
        text = line("/m/a.wav")[:-1] + f', "fields":  {ODD_FIELDS} , "loopTags":{{"a":[{{"b":"}}]"}}]}} }}'
        self.merge("-", stdin=text.encode())
        exported = self.export()
        self.assertIn(f'"fields":{ODD_FIELDS},"loopTags":{{"a":[{{"b":"}}]"}}]}}}}\n', exported)
        self.merge("-", stdin=exported.encode(), db="again.db")
        self.assertEqual(self.export("again.db"), exported)

    def test_names_that_are_not_utf8_are_the_same_bytes_again(self):
        names = [b"\xe4.wav", "\U0010ffe4.wav".encode(), b"\xff\xfe\x80", "\U0010ff7f".encode(), b"\xed\xa0\x80"]
        mapped = lambda name: "".join(  # noqa: E731: the mapping of docs/formats/library-index.md, written a second time
            character if not (0xDC80 <= ord(character) <= 0xDCFF) and ord(character) < 0x10FF80
            else "".join(chr(0x10FF00 + byte) for byte in os.fsencode(character)) for character in os.fsdecode(name))
        self.merge("-", stdin="\n".join(line("/m/" + mapped(name)) for name in names).encode())
        self.assertEqual(set(self.files()), {"/m/" + mapped(name) for name in names})
        with sqlite3.connect(self.folder / "all.db") as database:
            self.assertEqual({name for name, in database.execute("SELECT name FROM files")}, {mapped(name) for name in names})

    def test_bad_lines_are_told_by_number_and_change_nothing(self):
        good, bad = line("/m/good.wav"), lambda **more: line("/m/bad.wav", **more)
        points = lambda count: base64.b64encode(b"\0" * count).decode()  # noqa: E731
        table = {
            "cut": bad()[:-5], "no object": "[1]", "a text": '"x"', "no path": "{}", "two": bad() + bad(), "a NUL behind it": bad() + "\0", "more behind a NUL": bad() + '\0"',
            "not UTF-8": bad().encode() + b"\xff",
            "a key twice": bad()[:-1] + ', "indexed": 7}', "an escaped key": bad()[:-1] + ', "f\\u0069elds": []}', "an unknown key": bad(colour="red"),
            "a relative path": line("m/bad.wav"), "dots": line("/m/../bad.wav"), "a dot": line("/m/./bad.wav"), "two slashes": line("/m//bad.wav"),
            "a folder": line("/m/bad/"), "only dots": line("/m/.."), "a NUL": line("/m/b\0d"), "no name": line("/"), "long": line("/m/" + "x" * 2000), "a long folder": line("/m/" + 66 * ("x" * 1000 + "/") + "a"),
            "a fraction": bad(frames=1.5), "a number too large": bad(frames=2**63), "an infinite one": bad(tempo=0)[:-2] + "1e999}", "NaN": bad(tempo=float("nan")),
            "a negative count": bad(frames=-1), "a negative size": bad(size=-1), "no stamp": bad().replace("stamp", "seal"), "half a stamp": bad().replace('"inode"', '"node"'), "words in one": bad(descriptors=["a, b"]), "a text for a number": bad(channels="2"), "a number for a text": bad(title=2),
            "a number for a truth": bad(floatingPoint=1), "a note": bad(keyNote=12), "a note below": bad(keyNote=-1), "ahead of 1970": bad(indexed=-1), "a state": bad(state="great"), "no state": bad(state=""),
            "a kind": bad(kind="x"), "ahead of time": bad(indexed=int(time.time()) + 10**6), "odd points": bad(overview={"framesPerPoint": 256, "points": "AA=="}),
            "points that are none": bad(overview={"framesPerPoint": 256, "points": "AA*A"}), "many points": bad(overview={"framesPerPoint": 256, "points": points(300_000)}),
            "more than there are frames": bad(frames=256, overview={"framesPerPoint": 256, "points": points(6)}),
            "points of nothing": bad(overview={"framesPerPoint": 0, "points": ""}), "points of 300": bad(overview={"framesPerPoint": 300, "points": ""}), "points of 2^41": bad(overview={"framesPerPoint": 2**41, "points": ""}),
            "cut points": bad(overview={"framesPerPoint": 256, "points": "AAA"}),
            "fields": bad(fields={}), "fields without names": bad(fields=[{"value": 1}]), "tags": bad(loopTags=[]), "problems": bad(problems=[{"kind": "x"}]),
            "a root": '{"root": "m/"}', "a root without end": '{"root": "/m"}', "deep": "[" * 1_000_000,
            "fields too deep for SQLite": bad(fields=[{"name": "n", "value": "deep"}]).replace('"deep"', "[" * 5000 + "]" * 5000),
        }
        self.merge("-", stdin=good.encode())
        before = self.export()
        for name, text in table.items():
            with self.subTest(name):
                text = text if isinstance(text, bytes) else text.encode()
                self.assertIn("-: line 2: ", self.merge("-", stdin=b"\n" + text, status=1).stderr.decode())
        self.assertIn("a line has more than 64 MiB", self.merge("-", stdin=b"x" * (65 << 20), status=1).stderr.decode())
        self.assertEqual(self.export(), before)

    def test_what_stands_before_a_bad_line_stays_and_other_sources_are_merged(self):
        self.write("first.jsonl", "\n".join([*(line(f"/m/{i}.wav") for i in range(1500)), "{", line("/m/behind.wav")]).encode())
        self.write("second.jsonl", line("/m/second.wav").encode())
        result = self.merge("--json", "first.jsonl", "absent.jsonl", "second.jsonl", status=1)
        self.assertRegex(result.stderr.decode(), r"\Aktfiles: first.jsonl: line 1501: .*\nktfiles: absent.jsonl: file not found\n\Z")
        self.assertEqual([record.get("counts", {}).get("added") for record in json.loads(result.stdout)], [None, None, 1])
        self.assertEqual(len(self.files()), 1501)
        self.assertNotIn("/m/behind.wav", self.files())

    def test_the_newer_record_wins_in_whatever_order_they_come(self):
        old, new = line("/m/a.wav", 1_700_000_010, title="old"), line("/m/a.wav", 1_700_000_020, title="new")
        moved = line("/m/b.wav", changed=STAMP["changed"] + 5, title="changed later")
        texts = [
            '{"root":"/m/","completed":5}\n' + "\n".join([old, moved, line("/m/c.wav", title="equal a"), line("/m/sub/d.wav")]),
            '{"root":"/m/sub/"}\n' + "\n".join([new, line("/m/b.wav", title="changed earlier"), line("/m/c.wav", title="equal b")]),
            '{"root":"/m/","completed":9}\n' + "\n".join([line("/m/c.wav", title="equal a", overview={"framesPerPoint": 256, "points": ""}), line("/x/e.wav")]),
        ]
        for i, text in enumerate(texts):
            self.write(f"{i}.jsonl", text.encode())
            self.merged(text, db=f"{i}.db")
        # Files that are no audio, one newer and one older than the record of the same path, and one that nobody else knows.
        with sqlite3.connect(self.folder / "1.db") as database:
            for name, changed in (("a.wav", 0), ("d.wav", STAMP["changed"] + 10**12), ("f.txt", 1)):
                database.execute("INSERT OR IGNORE INTO seen SELECT id, ?, 1, 1, ?, 1, NULL FROM folders WHERE path = ?",
                                 (name, changed, "/m/sub/" if name == "d.wav" else "/m/"))
            database.execute("INSERT OR IGNORE INTO folders(path, words) VALUES('/m/sub/', 'sub/')")
            database.execute("UPDATE folders SET mounted = 1 WHERE path = '/m/sub/'")
            database.execute("INSERT OR REPLACE INTO seen SELECT id, 'd.wav', 1, 1, ?, 1, NULL FROM folders WHERE path = '/m/sub/'", (STAMP["changed"] + 10**12,))
        results = set()
        for order in itertools.permutations(["0.db", "1.db", "2.db"]):
            db = "-".join(order)
            self.merge(*order, *order[:1], db=db)
            with sqlite3.connect(self.folder / db) as database:
                seen = database.execute("SELECT d.path, s.name, s.changed, s.file IS NULL FROM seen s JOIN folders d ON d.id = s.folder ORDER BY 1, 2").fetchall()
                words = database.execute("SELECT path, words, mounted FROM folders WHERE path <> '/x/' ORDER BY 1").fetchall()
                database.execute("INSERT INTO search(search, rank) VALUES('integrity-check', 1)")
            results.add((self.export(db), str(seen), str(words)))
        self.assertEqual(len(results), 1, "\n".join(map(str, results)))
        export, seen, words = results.pop()
        titles = {path: record.get("title") for path, record in self.files(db).items()}
        self.assertEqual(titles, {"/m/a.wav": "new", "/m/b.wav": "changed later", "/m/c.wav": "equal a", "/x/e.wav": None})
        self.assertIn('{"root":"/m/","completed":9}\n{"root":"/m/sub/"}\n', export)
        self.assertIn("'f.txt', 1, 1", seen)
        self.assertEqual(words, str([("/m/", "m/", 0), ("/m/sub/", "m/sub/", 1)]))
        for order in itertools.permutations(["0.jsonl", "1.jsonl", "2.jsonl"]):
            self.merge(*order, db="".join(order))
            self.assertEqual({path: record.get("title") for path, record in self.files("".join(order)).items()}, {**titles, "/m/sub/d.wav": None})

    def test_of_what_is_of_one_time_the_later_change_wins_and_sound_over_none(self):
        ages = ["changed", "modified", "size", "inode"]
        for number, age in enumerate(ages):
            newer = line("/m/a.wav", title="newer", **{age: STAMP[age] + 1}, **{key: STAMP[key] - 1 for key in ages[number + 1:]})
            older = line("/m/a.wav", title="older, and longer")
            for order in ((newer, older), (older, newer)):
                self.merged(*order, db=f"{age}-{order[0] == newer}.db")
                self.assertEqual([record["title"] for record in self.files(f"{age}-{order[0] == newer}.db").values()], ["newer"], age)
        for order in ("one", "two"), ("two", "one"):
            self.merged(*(line("/m/a.wav", title=title) for title in order), db=f"{order[0]}.db")
            self.assertEqual(self.files(f"{order[0]}.db")["/m/a.wav"]["title"], "two")
        # A file that was no sound when it was looked at, and is sound now, is new.
        self.merged(line("/m/b.wav"), db="none.db")
        with sqlite3.connect(self.folder / "none.db") as database:
            database.execute("UPDATE seen SET file = NULL, changed = 5")
            database.execute("DELETE FROM files")
        self.merged(line("/m/b.wav", 6), db="sound.db")
        for source, db, key in (("none.db", "sound.db", "passedOver"), ("sound.db", "none.db", "added"), ("sound.db", "none.db", "unchanged")):
            counts = json.loads(self.merge("--jsonl", source, db=db).stdout)["counts"]
            self.assertEqual({key: count for key, count in counts.items() if count}, {key: 1})
            self.assertEqual(list(self.files(db)), ["/m/b.wav"])

    def test_words_of_folders_begin_with_the_outermost_root_from_its_line_on(self):
        self.merged("\n".join([line("/m/sub/a.wav"), '{"root":"/m/sub/"}', '{"root":"/m/"}', line("/m/sub/b.wav"), line("/x/m/c.wav"), line("/d.wav"),
                               '{"root":"/m/sub/"}', line("/m/sub/deep/e.wav")]), db="all.db")
        with sqlite3.connect(self.folder / "all.db") as database:
            self.assertEqual(dict(database.execute("SELECT path, words FROM folders")), {"/m/sub/": "m/sub/", "/x/m/": "m/", "/": "", "/m/sub/deep/": "m/sub/deep/"})
        for words in ("a/sub/", "b/sub/"):  # by links of one length
            self.merged(line("/m/sub/a.wav"), db=f"{words[0]}.db")
            with sqlite3.connect(self.folder / f"{words[0]}.db") as database:
                database.execute("UPDATE folders SET words = ?", (words,))
        for order in (("a.db", "b.db"), ("b.db", "a.db")):
            self.merge(*order, db="".join(order))
            with sqlite3.connect(self.folder / "".join(order)) as database:
                self.assertEqual(database.execute("SELECT words FROM folders").fetchall(), [("b/sub/",)])

    def test_words_and_copies_of_files_that_change_in_the_transaction_that_adds_them(self):
        record = lambda number, title, sound, **more: line(f"/m/{number}/a.wav", title=title, soundHash=sound * 64, **more)  # noqa: E731
        self.merged(record(0, "old", "a"), db="all.db")
        self.merged("\n".join([
            record(1, "first", "a"), record(2, "second", "b"), record(3, "third", "b"),  # copies of one that was known, and of each other
            record(2, "changed", "c", indexed=1_700_000_003), record(0, "later", "d", indexed=1_700_000_003),  # none of them any more
            record(4, "fourth", "c"), record(5, "fifth", "e"), record(6, "sixth", "d"),
            '{"root": "/m/"}', line("/m/5/b.wav"), record(7, "seventh", "e")]), db="all.db")  # a folder that has other words now
        self.assertEqual({record["title"] for record in self.json("find", "--duplicates", "--db", "all.db")},
                         {"changed", "later", "fourth", "fifth", "sixth", "seventh"})
        for title in ("first", "third", "changed", "later", "sixth"):
            self.assertEqual([record["title"] for record in self.json("find", title, "--db", "all.db")], [title])
        for title in ("old", "second"):
            self.assertEqual(self.json("find", title, "--db", "all.db", status=None), [])
        with sqlite3.connect(self.folder / "all.db") as database:
            database.execute("INSERT INTO search(search, rank) VALUES('integrity-check', 1)")
            database.execute(f"INSERT INTO files(folder, name, size, modified, indexed, state, sound_hash) VALUES(1, 'by.wav', 1, 1, 1, 'whole', '{'b' * 64}')")
            found = database.execute("SELECT count(*) FROM search WHERE search MATCH 'by'").fetchall() + database.execute("SELECT count(*) FROM duplicates").fetchall()
        self.assertEqual(found, [(1,), (8,)])  # the triggers are there again
        self.merged(record(1, "early", "a") + "\n" + record(1, "late", "b", indexed=1_700_000_003), db="new.db")  # words of which the search knows nothing yet
        self.assertEqual([record["title"] for record in self.json("find", "late", "--db", "new.db")], ["late"])

    def test_twice_is_once(self):
        self.merged("\n".join(line(f"/m/{i}.wav", title=str(i)) for i in range(50)), db="a.db")
        for _ in range(2):
            result = json.loads(self.merge("--jsonl", "a.db").stdout)["counts"]
        self.assertEqual((result["added"], result["changed"], result["unchanged"]), (0, 0, 50))
        self.assertEqual(self.export("a.db"), self.export())

    def test_sources_that_are_refused(self):
        self.merged(line("/m/a.wav"), db="all.db")
        before = (self.folder / "all.db").read_bytes()
        (self.folder / "link.db").symlink_to("all.db")
        self.merged(line("/m/b.wav"), db="newer.db")
        with sqlite3.connect(self.folder / "newer.db") as database:
            database.execute("PRAGMA user_version = 99")
        sqlite3.connect(self.folder / "other.db").execute("CREATE TABLE files(id)").connection.close()
        self.write("cut.db", before[:len(before) // 2])
        (self.folder / "folder").mkdir()
        open_elsewhere = sqlite3.connect(self.folder / "all.db")  # so that SQLite's files are beside it
        self.addCleanup(open_elsewhere.close)
        open_elsewhere.execute("SELECT count(*) FROM files").fetchall()
        for name, words in (("all.db-wal", "is the index that the others go into"), ("all.db-shm", "is the index that the others go into"),
                            ("all.db", "is the index that the others go into"), ("link.db", "is the index that the others go into"),
                            ("newer.db", "newer ktfiles"), ("other.db", "is no index"), ("cut.db", "damaged"), ("folder", "is a folder")):
            with self.subTest(name):
                self.assertIn(words, self.merge(name, status=1).stderr.decode())
        self.assertEqual(list(self.files()), ["/m/a.wav"])
        self.merge("absent", "folder", db="none.db", status=1)
        self.assertFalse((self.folder / "none.db").exists())

    def test_a_database_with_strange_rows_is_refused_at_these(self):
        for name, change in (("relative", "UPDATE folders SET path = 'm/', words = 'm/'"), ("dots", "UPDATE seen SET name = '..'"),
                             ("words", "UPDATE folders SET words = '../'"), ("number", "UPDATE files SET frames = -5"),
                             ("text", "UPDATE files SET title = CAST(x'ff' AS TEXT)"), ("points", "INSERT OR REPLACE INTO overviews VALUES(1, 256, zeroblob(1000001))"),
                             ("future", "UPDATE files SET indexed = 1 << 40"), ("fields", "UPDATE details SET fields = 'x'"),
                             ("fields of two lines", "UPDATE details SET fields = '[]' || char(10)"), ("no fields", "UPDATE details SET fields = '[1]'"),
                             ("fields without names", "UPDATE details SET fields = '[{\"name\":1,\"value\":1}]'"), ("bytes", "UPDATE details SET fields = '[]' || char(0) || 'x'"),
                             ("tags", "UPDATE details SET tags = '{}}'"), ("no tags", "UPDATE details SET tags = '[]'")):
            with self.subTest(name):
                self.merged(line("/m/a.wav", fields=[{"name": "n", "value": None}]), db=f"{name}.db")
                with sqlite3.connect(self.folder / f"{name}.db") as database:
                    database.execute(change)
                self.merge(f"{name}.db", db="target.db", status=1)
                self.assertEqual(self.files("target.db"), {})

    def test_an_index_that_is_damaged_in_the_middle_is_told_by_whoever_reads_it_and_spoils_no_other(self):
        self.merged("\n".join(line(f"/m/{i:05}.wav", title="t" * 200) for i in range(3000)), db="a.db")
        with open(self.folder / "a.db", "r+b") as file:
            size = os.path.getsize(file.name)
            file.seek(size // 2)
            file.write(b"\xff" * (size // 4))
        self.write("b.jsonl", line("/m/b.wav").encode())
        self.assertIn("a.db: the index is damaged", self.merge("a.db", "b.jsonl", status=1).stderr.decode())
        self.assertIn("/m/b.wav", self.files())
        for arguments in (("find", "--sort", "size"), ("page", "-o", "page.html")):
            self.assertIn("the index is damaged", self.failure(*arguments, "--db", "a.db"), arguments)
        for arguments in (("index", "export"), ("find",)):  # what was read before is told too
            *good, bad = self.json(*arguments, "--db", "a.db", status=1)
            self.assertEqual((len(good) > 10, bad["path"], "damaged" in bad["error"]), (True, "a.db", True))
            self.assertEqual(list(map(json.loads, self.lines(*arguments, "--db", "a.db", "--jsonl", status=1)))[-1], bad)
        self.assertIn("damaged", self.lines("find", "--csv", "--db", "a.db", status=1)[-1])

    def test_a_kill_in_the_middle_leaves_whole_records_and_the_next_merge_ends_it(self):
        self.merged("\n".join(line(f"/m/{i:05}.wav", title="t" * 200, fields=[{"name": "x", "value": "y"}]) for i in range(12_000)), db="a.db")
        whole = self.export("a.db")
        for delay in (0.05, 0.15, 0.3):
            process = subprocess.Popen([KTFILES, "index", "merge", "a.db", "--db", "killed.db"], cwd=self.folder, stdout=subprocess.DEVNULL)
            time.sleep(delay)
            process.kill()
            process.wait()
            if (self.folder / "killed.db").exists():
                with sqlite3.connect(self.folder / "killed.db") as database:
                    self.assertEqual(database.execute("PRAGMA integrity_check").fetchall(), [("ok",)])
        self.merge("a.db", db="killed.db")
        self.assertEqual(self.export("killed.db"), whole)


class RecordsTest(CommandTest):
    def rows(self, output):
        """The objects of lines, sorted, without when they were made."""
        rows = [{key: value for key, value in json.loads(each).items() if key not in ("indexed", "completed")} for each in output.decode().splitlines()]
        return sorted(rows, key=json.dumps)

    def records(self, *arguments, **options):
        return self.run_command("index", "--records", *arguments, **options)

    def setUp(self):
        super().setUp()
        shutil.copytree(MEDIA, self.folder / "media")
        (self.folder / "text.txt").write_text("no audio")

    def test_records_are_those_of_an_index_and_shards_are_parts_of_them(self):
        self.run_command("index", ".", "--hash", "--db", "a.db", "--quiet", status=None)
        expected = self.rows(self.run_command("index", "export", "--db", "a.db").stdout)
        self.assertEqual(self.rows(self.records(".", "--hash", status=None).stdout), expected)
        files = [row for row in expected if "path" in row]
        self.assertGreater(len(files), 10)
        parts = [[row for row in self.rows(self.records(".", "--hash", "--shard", f"{i}/3", status=None).stdout) if "path" in row] for i in (1, 2, 3)]
        self.assertEqual(sorted(sum(parts, []), key=json.dumps), files)
        self.assertTrue(all(parts))
        listed = self.records("--hash", "--files-from", "-", stdin="\n".join(row["path"] for row in files).encode(), status=None).stdout
        self.assertEqual(self.rows(listed), files)

    def test_what_cannot_be_read_is_told(self):
        self.write("bad.wav", b"RIFF")
        result = self.records("bad.wav", "absent", "text.txt", status=1)
        self.assertEqual([(row["path"].rsplit("/")[-1], row.get("state")) for row in self.rows(result.stdout)], [("absent", None), ("bad.wav", "unreadable")])
        self.assertEqual(result.stderr.count(b"\n"), 2, result.stderr)
        self.run_command("index", "merge", "-", "--db", "a.db", stdin=result.stdout)

    def test_it_needs_folders_and_no_index(self):
        for arguments in ((), (".", "--db", "a.db"), (".", "--prune")):
            self.failure("index", "--records", *arguments, status=2)
        self.assertFalse((self.folder / "a.db").exists())

    def test_a_reader_that_goes_away_ends_it(self):
        with subprocess.Popen([KTFILES, "index", "--records", "."], cwd=self.folder, stdout=subprocess.PIPE, stderr=subprocess.PIPE) as process:
            process.stdout.close()
            self.assertNotEqual(process.wait(timeout=60), -9)
            self.assertEqual(process.stderr.read().count(b"\n"), 0)


if __name__ == "__main__":
    unittest.main()
