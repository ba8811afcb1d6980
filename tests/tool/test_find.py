"""find: questions to an index, against a plain filter over the same rows, and what is typed and printed."""
import json
import os
import pathlib
import random
import re
import sqlite3
import sys
import tempfile
import time
import unicodedata
import unittest

from command import CommandTest, MEDIA

sys.path.insert(0, str(pathlib.Path(__file__).resolve().parents[2] / "bench"))
import library_rows

NOTES = {"C": 0, "Db": 1, "D": 2, "Eb": 3, "E": 4, "F": 5, "F#": 6, "G": 7, "Ab": 8, "A": 9, "Bb": 10, "B": 11}
RELATED = {"minor": (3, "major"), "major": (9, "minor")}


def words_of(text):
    plain = "".join(c for c in unicodedata.normalize("NFD", text or "") if not unicodedata.combining(c))
    return re.findall(r"[^\W_]+", plain.lower())


class Plain:
    """The questions, answered row by row."""

    def __init__(self, path):
        self.database = sqlite3.connect(f"file:{path}?mode=ro", uri=True)
        self.database.row_factory = sqlite3.Row
        self.rows = self.database.execute("SELECT f.*, d.path AS folder_path, d.words AS folder_words FROM files f JOIN folders d ON d.id = f.folder ORDER BY f.id").fetchall()
        self.problems = {}
        for file, kind in self.database.execute("SELECT file, kind FROM findings"):
            self.problems.setdefault(file, set()).add(kind)
        hashes = [row["sound_hash"] for row in self.rows if row["sound_hash"]]
        count = {}
        for value in hashes:
            count[value] = count.get(value, 0) + 1
        self.copied = {value for value, number in count.items() if number > 1}
        music = ("category", "sub_category", "genre", "descriptors", "key")
        self.texts = {row["id"]: [words_of(text) for text in (row["name"], row["folder_words"], row["title"], row["artist"], row["album"], row["comment"],
                                                              " ".join(row[name] or "" for name in music))] for row in self.rows}

    def relevance(self, row, terms):
        """None if a term is missing."""
        total = 0
        for term in terms:
            wanted, best = words_of(term), 0
            for weight, words in zip((5, 2, 4, 3, 2, 1, 3), self.texts[row["id"]]):
                for start in range(len(words) - len(wanted) + 1):
                    part = words[start:start + len(wanted)]
                    if part[:-1] == wanted[:-1] and part[-1].startswith(wanted[-1]):
                        best = max(best, weight + 10 * (part[-1] == wanted[-1]))
            if not best:
                return None
            total += best
        return total

    def is_wanted(self, row, asked):
        keys = asked.get("keys", set())
        tests = {
            "terms": lambda terms: self.relevance(row, terms) is not None,
            "tempos": lambda ranges: row["tempo"] is not None and any(least <= row["tempo"] <= most for least, most in ranges),
            "keys": lambda _: row["key_note"] is not None and any(note == row["key_note"] and (mode is None or row["mode"] in (mode, "both")) for note, mode in keys),
            "kind": lambda kind: row["kind"] == kind,
            "category": lambda name: words_of(name) in (words_of(row["category"]), words_of(row["sub_category"])),
            "genre": lambda name: words_of(row["genre"]) == words_of(name),
            "artist": lambda name: words_of(row["artist"]) == words_of(name),
            "seconds": lambda limits: row["duration_seconds"] is not None and limits[0] <= row["duration_seconds"] <= limits[1],
            "rate": lambda rate: row["sample_rate"] == rate,
            "channels": lambda number: row["channels"] == number,
            "containers": lambda names: row["container_name"] in names,
            "coding": lambda name: row["coding"] == name,
            "problems": lambda kinds: bool(self.problems.get(row["id"], set()) & kinds),
            "any_problem": lambda _: row["state"] != "whole" or row["id"] in self.problems,
            "copied": lambda _: row["sound_hash"] in self.copied,
            "since": lambda moment: row["modified"] >= moment,
            "scope": lambda path: row["folder_path"].startswith(path),
        }
        return all(tests[name](value) for name, value in asked.items())

    def answer(self, asked, order, is_reversed, limit):
        found = [row for row in self.rows if self.is_wanted(row, asked)]
        if order == "relevance":
            first = sorted(found[:1000], key=lambda row: (-self.relevance(row, asked["terms"]), row["id"]), reverse=is_reversed)
            found = first + found[1000:]
        else:
            columns = {"path": ("folder_path", "name"), "key": ("key_note", "mode", "tempo"), "duration": ("duration_seconds",), "category": ("category", "tempo"),
                       "rate": ("sample_rate",), "sound": ("sound_hash",)}.get(order, (order,))
            def key(row):
                return [(row[column] is not None, row[column].encode() if isinstance(row[column], str) else row[column] or 0) for column in columns] + [row["id"]]
            found.sort(key=key, reverse=is_reversed)
            found.sort(key=lambda row: row[columns[0]] is None)
        return [row["folder_path"] + row["name"] for row in found[:limit or len(found)]]


class Questions:
    """Random ones: the words on the command line, and what they ask."""

    def __init__(self, plain, seed):
        self.plain, self.pick = plain, random.Random(seed)

    def one(self):
        pick, typed, asked = self.pick, [], {}
        sample = pick.choice(self.plain.rows)
        def add(name, value, *words):
            asked[name] = value
            typed.extend(words)
        parts = ["scope", "terms", "tempos", "keys", "kind", "category", "genre", "artist", "seconds", "rate", "channels", "containers", "coding", "problems", "any_problem", "copied", "since"]
        for part in pick.sample(parts, pick.choice([0, 1, 1, 1, 2, 2, 3])):
            if part == "scope":
                path = sample["folder_path"]
                path = "/".join(path.split("/")[:pick.randint(3, path.count("/"))]) + "/"
                asked["scope"] = path
                typed.insert(0, path)
            elif part == "terms":
                texts = [words for words in self.plain.texts[sample["id"]] if words]
                terms = []
                for _ in range(pick.choice([1, 1, 2, 3])):
                    words = pick.choice(texts)
                    start = pick.randrange(len(words))
                    several = words[start:start + pick.choice([1, 1, 1, 2])]
                    several[-1] = several[-1][:pick.choice([1, 2, 3, 4, 99])]
                    terms.append(" ".join(several))
                asked["terms"] = terms
                typed += [term.upper() if pick.random() < 0.2 else term for term in terms]
            elif part == "tempos" and sample["tempo"]:
                tempo = round(sample["tempo"])
                ranges, text = pick.choice([([(tempo - 0.5, tempo + 0.5)], str(tempo)), ([(tempo, tempo + 9)], f"{tempo}..{tempo + 9}"),
                                            ([(tempo, 9e9)], f"{tempo}.."), ([(0, tempo)], f"..{tempo}")])
                add("tempos", ranges, "--tempo", text)
            elif part == "keys":
                note, mode = pick.choice(list(NOTES)), pick.choice(["minor", "major", None])
                add("keys", {(NOTES[note], mode)}, "--key", f"{note} {mode}" if mode else note)
            elif part == "kind":
                kind = pick.choice(["loop", "one-shot", "recording"])
                add("kind", kind, "--kind", kind)
            elif part in ("category", "genre", "artist") and sample[part]:
                name = sample["sub_category"] if part == "category" and pick.random() < 0.5 else sample[part]
                add(part, name, f"--{part}", name.upper())
            elif part == "seconds":
                least, most = sorted((pick.choice([0, 0.5, 2, 10, 60]), pick.choice([1, 5, 30, 120, 1e9])))
                add("seconds", (least, most), "--longer", f"{least}s", *(["--shorter", f"{most}"] if most < 1e9 else []))
            elif part == "rate":
                rate = pick.choice([44100, 48000, 96000])
                add("rate", rate, "--rate", f"{rate / 1000:g}k")
            elif part == "channels":
                add("channels", 2, "--channels", "2")
            elif part == "containers" and "coding" not in asked:
                name, names = pick.choice([("wav", {"WAVE", "RF64", "BW64"}), ("aiff", {"AIFF", "AIFC"}), ("mp3", {"MP3"}), ("rf64", {"RF64"})])
                add("containers", names, "--format", name)
            elif part == "coding" and "containers" not in asked:
                add("coding", "Opus", "--format", "opus")
            elif part == "problems" and "any_problem" not in asked:
                name, kinds = pick.choice([("truncated", {"soundIsCut", "containerIsCut", "chunkIsCut"}), ("unreadable", {"unreadable"}), ("padIsMissing", {"padIsMissing"})])
                add("problems", kinds, "--problem", name)
            elif part == "any_problem" and "problems" not in asked:
                add("any_problem", True, "--problem", "any")
            elif part == "copied":
                add("copied", True, "--duplicates")
            elif part == "since":
                moment = sample["modified"] // 10**9
                add("since", moment * 10**9, "--since", time.strftime("%Y-%m-%dT%H:%M:%SZ", time.gmtime(moment)))
        orders = ["path", "name", "tempo", "key", "duration", "size", "modified", "category", "rate"]
        order = pick.choice(orders + [None] * 4)
        if order:
            typed += ["--sort", order]
        is_reversed = pick.random() < 0.3
        typed += ["--reverse"] * is_reversed
        limit = pick.choice([None, 1, 20, 300])
        typed += ["--limit", str(limit)] if limit else []
        return typed, (asked, order or ("sound" if "copied" in asked else "relevance" if "terms" in asked else "path"), is_reversed, limit)


class AgainstAPlainFilter(CommandTest):
    """Among so many rows every way to an answer is taken: along the order, by sets, sorted, and along the order within sets."""

    @classmethod
    def setUpClass(cls):
        cls.home = tempfile.TemporaryDirectory()
        cls.addClassCleanup(cls.home.cleanup)
        cls.index = os.path.join(cls.home.name, "library.db")
        library_rows.fill(cls.index, 12000, seed=5)
        with sqlite3.connect(cls.index) as database:
            database.execute("UPDATE files SET coding = 'Opus' WHERE id % 3 = 0")
        cls.plain = Plain(cls.index)

    def found(self, *typed, **options):
        result = self.run_command("find", "--db", self.index, "-0", *typed, status=None, **options)
        self.assertEqual((result.stderr, result.returncode), (b"", 0 if result.stdout else 1), typed)
        return result.stdout.decode().split("\0")[:-1]

    def test_random_questions_have_the_same_answers_in_the_same_order(self):
        questions = Questions(self.plain, 1)
        sizes = []
        for _ in range(200):
            typed, meant = questions.one()
            expected = self.plain.answer(*meant)
            self.assertEqual(self.found(*typed), expected, typed)
            sizes.append(len(expected))
        self.assertGreater(sum(size > 100 for size in sizes), 20)
        self.assertGreater(sum(size == 0 for size in sizes), 5)

    def test_related_keys_and_tempos(self):
        for key, keys in (("F# minor", {(6, "minor"), (9, "major"), (6, "major")}), ("C", {(0, None), (3, "major"), (9, "minor")})):
            asked = {"keys": keys, "tempos": [(119.5, 120.5), (59.75, 60.25), (239, 241)]}
            self.assertEqual(self.found("--key", key, "--tempo", "120", "--related"), self.plain.answer(asked, "path", False, None))

    def test_a_mode_alone_asks_for_all_its_keys(self):
        for mode in ("minor", "major"):
            self.assertEqual(self.found("--key", mode), self.plain.answer({"keys": {(note, mode) for note in range(12)}}, "path", False, None))

    def test_marks_of_the_language_of_the_search_are_no_language_among_many_rows(self):
        for terms in (['"bongo'], ['loop"s'], ["NOT bongo"], ["bongo OR"], ["kick*"], ["name:kick"], ["^kick"], ["-kick"], ["(kick)"], ["kick NEAR"], ["kick", "AND", "wav"]):
            self.assertEqual(self.found("--", *terms), self.plain.answer({"terms": terms}, "relevance", False, None), terms)

    def test_rare_rows_and_words_that_stand_in_one_part_of_the_index(self):
        for typed, asked in ((("--format", "rf64"), {"containers": {"RF64"}}), (("--problem", "any"), {"any_problem": True})):
            for term in ("kick", "vocals", "take"):
                for order in ("relevance", "size"):
                    expected = self.plain.answer({**asked, "terms": [term]}, order, False, None)
                    self.assertEqual(self.found(*typed, term, "--sort", order), expected, (typed, term, order))

    def test_terms_stand_within_words_of_scripts_without_spaces_and_names_may_be_taken_apart(self):
        pieces = ["和太鼓", "アンサンブル", "ドラム", "電子音", "夜明け", "パーカッション"]
        pick, index, names = random.Random(1), os.path.join(self.home.name, "scripts.db"), {}
        library_rows.fill(index, 3000, seed=6)
        with sqlite3.connect(index) as database:
            for row, in database.execute("SELECT id FROM files").fetchall():
                names[row] = "".join(pick.sample(pieces, 3)) + f"{row} 장구"
                database.execute("UPDATE files SET name = ? WHERE id = ?", (unicodedata.normalize(pick.choice(["NFC", "NFD"]), names[row]), row))
        sizes = []
        for term in ("太鼓", "ドラム", "ラム", "鼓ア", "太鼓アンサンブル", "夜明けパーカッションドラム", "ッション電子音7", "장구", "장", "猫", "ドラム猫"):
            expected = {name for name in names.values() if term in name}
            sizes.append(len(expected))
            for form in ("NFC", "NFD"):
                found = self.run_command("find", "--db", index, "-0", unicodedata.normalize(form, term), status=None).stdout.decode().split("\0")[:-1]
                self.assertEqual({unicodedata.normalize("NFC", path.rsplit("/", 1)[1]) for path in found}, expected, (term, form))
        self.assertEqual((sizes[-2:], max(sizes)), ([0, 0], len(names)))

    def test_orders_are_gone_along_without_sorting(self):
        """What find walks along for each order is an index of the database."""
        source = (pathlib.Path(__file__).resolve().parents[2] / "tool/shared/library/QueryOrder.cpp").read_text(encoding="utf-8")
        columns = re.findall(r'return \{("[^}]*")\};', source)
        self.assertGreater(len(columns), 8)
        for each in columns:
            names = re.findall(r'"([a-z._]+)"', each)
            folders = "folders d CROSS JOIN files f ON f.folder = d.id" if names[0].startswith("d.") else "files f"
            order = ", ".join(f"{name} DESC" for name in names + ["f.id"] * (folders == "files f"))
            steps = [row[3] for row in self.plain.database.execute(f"EXPLAIN QUERY PLAN SELECT f.id FROM {folders} WHERE {names[0]} IS NOT NULL ORDER BY {order}")]
            self.assertFalse([step for step in steps if "TEMP B-TREE" in step], (each, steps))

    def test_copies_are_known_through_every_change(self):
        database = sqlite3.connect(self.index)
        self.addCleanup(database.close)
        same = "SELECT count(*) FROM files f WHERE copied <> (sound_hash IS NOT NULL AND EXISTS (SELECT 1 FROM files o WHERE o.sound_hash = f.sound_hash AND o.id <> f.id))"
        pick = random.Random(3)
        hashes = [row[0] for row in database.execute("SELECT DISTINCT sound_hash FROM files WHERE sound_hash IS NOT NULL LIMIT 40")] + [None]
        for _ in range(300):
            file = pick.randrange(1, 300)
            pick.choice([lambda: database.execute("UPDATE files SET sound_hash = ? WHERE id = ?", (pick.choice(hashes), file)),
                         lambda: database.execute("DELETE FROM files WHERE id = ?", (file,))])()
            self.assertEqual(database.execute(same).fetchone()[0], 0)
        database.rollback()


def find_enum(schema, word):
    """The lists of words in a schema that have the word."""
    for value in schema.values() if isinstance(schema, dict) else schema if isinstance(schema, list) else []:
        if isinstance(value, list) and word in value:
            yield value
        yield from find_enum(value, word)


class Typed(CommandTest):
    """What is typed and printed, over a few made rows."""
    ROWS = [
        {"name": "Shaker_01.wav", "folder": "Loops/", "kind": "loop", "container_name": "WAVE", "tempo": 120.0, "key_note": 6, "mode": "minor", "key": "F# minor",
         "category": "Drums", "duration_seconds": 2.0, "sample_rate": 44100.0, "channels": 2, "frames": 88200, "floating_point": 1, "descriptors": "Dry, Clean"},
        {"name": "Béla Bass.aif", "folder": "Loops/Bass/", "kind": "loop", "container_name": "AIFC", "tempo": 60.2, "key_note": 9, "mode": "both", "key": "A both",
         "category": "Bass", "artist": "Björk Öst", "duration_seconds": 90.0, "sample_rate": 48000.0, "channels": 1},
        {"name": "Interview\n2.wav", "folder": "Talk/", "kind": "recording", "container_name": "RF64", "title": "AND \"NOT\" (the) OR*", "artist": "!!!", "duration_seconds": 0.4,
         "sample_rate": 22050.5, "channels": 6, "problem": "soundIsCut", "state": "damaged"},
    ]

    def setUp(self):
        super().setUp()
        self.index = str(self.folder / "library.db")
        self.root = f"{self.folder.resolve()}/"
        self.now = int(time.time())
        database = library_rows.prepared(self.index)
        for number, row in enumerate(self.ROWS, 1):
            folder = self.root + row["folder"]
            os.makedirs(folder, exist_ok=True)
            database.execute("INSERT OR IGNORE INTO folders(path, words) VALUES(?, ?)", (folder, row["folder"]))
            values = {"state": "whole", "size": 1000 * number, "modified": (self.now - number * 86400) * 10**9, "indexed": self.now, **row, "id": number,
                      "folder": database.execute("SELECT id FROM folders WHERE path = ?", (folder,)).fetchone()[0]}
            if problem := values.pop("problem", None):
                database.execute("INSERT INTO findings VALUES(?, ?, 'some of it is missing')", (number, problem))
            database.execute(f"INSERT INTO files({', '.join(values)}) VALUES({', '.join('?' * len(values))})", list(values.values()))
        database.execute("INSERT INTO overviews VALUES(1, 256, ?)", (bytes([0x81, 0x7f] * 6 + [0, 0] * 6),))
        database.close()

    def find(self, *typed, status=None, **options):
        """The names that are found, by the first letters."""
        out = self.run_command("find", "--db", self.index, "-0", *typed, status=status, **options).stdout.decode()
        return "".join(path.rsplit("/", 1)[1][0] for path in out.split("\0")[:-1])

    def test_values_in_the_forms_that_people_type(self):
        cases = [
            ("--tempo", {"120": "S", "119.6": "S", "121": "", "60": "B", "60..": "BS", "..60.2": "B", "60.2..120": "BS"}),
            ("--key", {"F# minor": "S", "Gb min": "S", "f#m": "S", "F♯m": "S", "G♭ Minor": "S", "F#": "S", "Gb": "S", "f sharp minor": "S", "11A": "S", "F# major": "",
                       "minor": "BS", "A minor": "B", "A": "B", "A maj": "B"}),
            ("--rate", {"44.1k": "S", "44100": "S", "44.1 kHz": "S", "48000Hz": "B", "..44.1k": "IS", "48k..": "B"}),
            ("--channels", {"2": "S", "2..": "IS", "1..2": "BS"}),
            ("--longer", {"2s": "BS", "2": "BS", "2001ms": "B", "1:30": "B", "1.5min": "B", "0:01:31": "", "1m": "B", "2m": "", "0.02h": "B", "0.03h": ""}),
            ("--shorter", {"400ms": "I", "2 s": "IS", "0.4": "I"}),
            ("--format", {"wav": "IS", "WAV": "IS", "rf64": "I", "aiff": "B", "aifc": "B", "mp3": ""}),
            ("--problem", {"truncated": "I", "any": "I", "soundiscut": "I", "unreadable": ""}),
            ("--category", {"bass": "B", "BASS": "B"}), ("--artist", {"bjork ost": "B", "Björk": "", "!!!": "I", "—": ""}), ("--kind", {"loops": "BS", "one-shot": ""}),
            ("--since", {"yesterday": "S", "today": "", "25h": "S", "47h": "S", "60h": "BS", "1w": "BIS", "2001-01-01": "BIS", "2100-01-01T00:00:00Z": "",
                         "1500min": "S", "2 months": "BIS", "1 year": "BIS", "2001-01-01 23:59": "BIS"}),
        ]
        for option, values in cases:
            for value, expected in values.items():
                with self.subTest(f"{option} {value}"):
                    self.assertEqual("".join(sorted(self.find(option, value))), expected)
        self.assertEqual(self.find("--longer", "2", "--shorter", "2"), "S")
        with sqlite3.connect(self.index) as database:  # damaged, and nothing says how
            database.execute("UPDATE files SET state = 'damaged' WHERE name LIKE 'Shaker%'")
        self.assertEqual("".join(sorted(self.find("--problem", "any"))), "IS")

    def test_dates_and_days_are_those_of_the_local_clock(self):
        hours = (12 - time.gmtime(self.now).tm_hour) or 1  # there it is about noon, and never UTC
        here = {**os.environ, "TZ": f"HERE{-hours}"}
        with sqlite3.connect(self.index) as database:
            for name, age in (("Shaker", 6), ("Béla", 30), ("Interview", 40)):
                database.execute("UPDATE files SET modified = ? WHERE name LIKE ?", ((self.now - age * 3600) * 10**9, name + "%"))
        moment = self.now - 6 * 3600
        local, utc = (lambda seconds, form=form, ahead=ahead: time.strftime(form, time.gmtime(seconds + ahead))
                      for form, ahead in (("%Y-%m-%dT%H:%M", hours * 3600), ("%Y-%m-%d %H:%M:%SZ", 0)))
        for since, expected in (("today", "S"), ("yesterday", "BS"), (local(moment), "S"), (local(moment + 60), ""), (utc(moment), "S"), (utc(moment + 1), "")):
            self.assertEqual("".join(sorted(self.find("--since", since, env=here))), expected, since)

    def test_every_word_for_a_format_or_a_problem_is_one_that_records_have(self):
        root = pathlib.Path(__file__).resolve().parents[2]
        options = (root / "tool/shared/library/LibraryQueryOptions.cpp").read_text(encoding="utf-8")
        coding = (root / "tool/shared/input/CodingWords.cpp").read_text(encoding="utf-8")
        formats = {name for names in re.findall(r'\{"\w+", \{([^}]*)\}\}', options.split("formatChoices()")[1].split("\n}")[0]) for name in re.findall(r'"([^"]+)"', names)}
        self.assertLessEqual(formats - {"AIFF", "AIFC", "RF64", "BW64"}, set(re.findall(r'"([^"]+)"\}', coding.split("containers[]")[1].split(";\n")[0])))
        self.assertGreater(len(formats), 25)
        kinds = set(re.findall(r'"(\w+)"', options.split("kind :")[1].split(")")[0]))
        told = json.loads((root / "docs/schemas/info-check.json").read_text())
        self.assertEqual(kinds - {"unreadable"}, set(next(find_enum(told, "containerIsCut"))))

    def test_words_are_looked_for_and_never_understood_as_more(self):
        cases = {"shak": "S", "SHAKER": "S", "haker": "", "bela": "B", "Béla": "B", "bjork": "B", "bela loops": "", "loops bass": "B", "loops/bass": "B", "drums": "S", "dry clean": "S",
                 '"not"': "I", "AND": "I", "OR*": "I", "(the)": "I", "the) or": "I", "name:shaker": "", "NEAR(a b)": "", "^shaker": "S", "shaker\\": "S", "'": None, "*": None, '"': None,
                 "": None, "—": "", "\udcff": "", "a" * 10000: ""}
        for word, expected in cases.items():
            with self.subTest(word[:20]):
                if expected is None:
                    self.assertIn("no letter or digit", self.failure("find", "--db", self.index, "--", word, status=2))
                else:
                    self.assertEqual(self.find("--", os.fsencode(word)), expected)
        self.assertEqual((self.find("loops", "bela"), self.find("loops", "talk")), ("B", ""))

    def test_folders_are_told_from_words(self):
        def paths(*typed, **options):
            return self.lines("find", "--db", self.index, *typed, **options)
        bass = "Loops/Bass/Béla Bass.aif"
        self.assertEqual(paths("Loops"), [f"Loops/Shaker_01.wav", bass])
        self.assertEqual(paths("./Loops/", "bela"), [f"./{bass}"])
        self.assertEqual(paths(self.root + "Loops/Bass"), [self.root + bass])
        self.assertEqual(paths("bela", "Loops"), [self.root + bass])  # the second word is one to look for
        self.assertEqual(paths("bela", "Loops/"), [bass])
        self.assertEqual(paths("bela", "."), [f"./{bass}"])
        self.assertEqual(paths("Gone/", status=1), [])
        self.assertEqual(paths("Gone/../Loops/Bass/"), ["Gone/../Loops/Bass/Béla Bass.aif"])
        os.symlink("Loops", self.folder / "link")
        self.assertEqual(paths("link/Bass"), ["link/Bass/Béla Bass.aif"])
        self.assertEqual(paths("shak"), [self.root + "Loops/Shaker_01.wav"])
        self.assertEqual(paths("interview"), [self.root + "Talk/Interview\\x0A2.wav"])
        self.assertEqual(paths("Talk/", "./Loops/Bass/"), [f"./{bass}", "Talk/Interview\\x0A2.wav"])
        with sqlite3.connect(self.index) as database:  # whatever their numbers
            for number, name in ((2**62, "Talk/"), (-5, "Loops/Bass/")):
                database.execute("UPDATE files SET folder = ?1 WHERE folder = (SELECT id FROM folders WHERE words = ?2)", (number, name))
                database.execute("UPDATE folders SET id = ?1 WHERE words = ?2", (number, name))
        self.assertEqual(paths("Talk/", "./Loops/Bass/"), [f"./{bass}", "Talk/Interview\\x0A2.wav"])

    def test_wrong_values_are_told_with_what_is_right(self):
        cases = {("--tempo", "fast"): "118..122", ("--tempo", "122..118"): "118..122", ("--tempo", ".."): "118..122", ("--key", "H"): "F# minor", ("--key", ""): "F# minor",
                 ("--kind", "lop"): 'did you mean "loop"?', ("--format", "flacc"): 'did you mean "flac"?', ("--problem", "truncate"): 'did you mean "truncated"?', ("--sort", "temop"): 'did you mean "tempo"?',
                 ("--rate", "fast"): "48k", ("--channels", "two"): "number of channels", ("--longer", "-1"): "500ms", ("--longer", "9" * 308 + "h"): "500ms", ("--rate", "9" * 308): "48k", ("--shorter", "1:75"): "500ms", ("--since", "2026-02-30"): "2026-11-01",
                 ("--since", "2026-13-01"): "yesterday", ("--since", "tomorrow"): "yesterday", ("--since", "2026-01-01T24:00"): "yesterday", ("--since", "2026-01-01T12:00:60"): "yesterday", ("--since", "99999999999d"): "yesterday",
                 ("--since", "2026-01-01T"): "yesterday", ("--since", "2026-01-01T12"): "yesterday", ("--limit", "-1"): "--limit", ("--related",): "--key or --tempo",
                 ("--limit", "1", "--limit", "2"): "--limit is given more than once", ("--longer", "3", "--shorter", "2"): "--longer", ("--sort", "relevance"): "words", ("--json",): "-0"}
        for typed, told in cases.items():
            with self.subTest(typed):
                self.assertIn(told, self.failure("find", "--db", self.index, "-0", *typed, status=2))

    def test_lines_json_and_csv(self):
        record, = self.json("find", "--db", self.index, "shaker")
        self.assertEqual({key: record[key] for key in ("path", "fileLength", "tempo", "key", "sampleRate", "descriptors", "kind", "floatingPoint")},
                         {"path": self.root + "Loops/Shaker_01.wav", "fileLength": 1000, "tempo": 120.0, "key": "F# minor", "sampleRate": 44100, "descriptors": ["Dry", "Clean"], "kind": "loop", "floatingPoint": True})
        self.assertEqual(record["modified"], time.strftime("%Y-%m-%dT%H:%M:%SZ", time.gmtime(self.now - 86400)))
        record, = self.json("find", "--db", self.index, "--problem", "any")
        self.assertEqual((record["problems"], record["state"]), ([{"kind": "soundIsCut", "text": "some of it is missing"}], "damaged"))
        rows = self.run_command("find", "--db", self.index, "--csv", "--sort", "size", "--reverse").stdout.decode().split("\r\n")
        self.assertEqual((len(rows), "soundIsCut" in rows[1], '"Dry,Clean"' in rows[3]), (5, True, True))
        self.assertEqual(self.json("find", "--db", self.index, "nothing", status=1), [])
        self.assertEqual(self.run_command("find", "--db", self.index, "--quiet", "shaker").stdout, b"")
        self.run_command("find", "--db", self.index, "--quiet", "nothing", status=1)

    def test_a_table_fits_any_terminal(self):
        for columns in (80, 200, 40, 20):
            text, status = self.on_terminal("find", "--db", self.index, columns=columns)
            lines = text.splitlines()
            self.assertEqual((status, len(lines)), (0, 4), text)
            plain = [re.sub(r"\x1b\[\d*m", "", line) for line in lines]
            self.assertLessEqual(max(map(len, plain)), columns)
            self.assertIn("FILE", plain[0])
            if columns >= 80:
                self.assertRegex(plain[1], "^██████▁▁▁▁▁▁ +120  F# minor +0:02.0  Drums ")
        text, _ = self.on_terminal("find", "--db", self.index, "--limit", "2", columns=80)
        self.assertRegex(text, "more than these 2; --limit")
        self.assertEqual(self.on_terminal("find", "--db", self.index, "nothing", columns=80), ("nothing is found\n", 1))

    def test_no_index_and_no_database(self):
        home = {**os.environ, "XDG_DATA_HOME": str(self.folder / "data")}
        self.assertIn("there is no index; ktfiles index FOLDER makes one", self.failure("find", "shaker", env=home))
        self.assertIn("there is no index", self.failure("find", "--db", "none.db"))
        self.write("text.db", b"no database at all, " * 100)
        self.assertIn("text.db: is no index", self.failure("find", "--db", "text.db"))
        self.assertEqual(self.json("find", "--db", "none.db", status=1)[0]["path"], "none.db")

    def test_fresh_looks_at_the_folder_first(self):
        target = self.folder / "Fresh"
        target.mkdir()
        self.assertEqual(self.lines("find", "--db", "new.db", "Fresh", "--fresh", status=1), [])
        (target / "kick.wav").write_bytes((MEDIA / "drum-8.wav").read_bytes())
        self.assertEqual(self.lines("find", "--db", "new.db", "Fresh", status=1), [])
        self.assertEqual(self.lines("find", "--db", "new.db", "Fresh", "--fresh"), ["Fresh/kick.wav"])
        (target / "kick.wav").rename(target / "snare.wav")
        self.assertEqual(self.lines("find", "--db", "new.db"), [self.root + "Fresh/kick.wav"])  # an index says what was there
        self.assertEqual(self.lines("find", "--db", "new.db", "--fresh"), [self.root + "Fresh/snare.wav"])


if __name__ == "__main__":
    unittest.main()
