#!/usr/bin/env python3
"""Fills the database of an index with plausible rows, through its own tables and triggers: library_rows.py FILE [--rows N].

No sound is read or made. The same rows come of the same number and seed. Figures are for bench/find.py and for whoever
wants a large index to look at."""
import argparse
import bisect
import hashlib
import itertools
import json
import os
import pathlib
import random
import re
import sqlite3
import time

SOURCE = pathlib.Path(__file__).parents[1] / "tool/shared/library/LibrarySchema.cpp"
NOTES = ["C", "Db", "D", "Eb", "E", "F", "F#", "G", "Ab", "A", "Bb", "B"]
CATEGORIES = {"Drums": ["Kick", "Snare", "Hi-hat", "Shaker", "Tambourine", "Toms"], "Bass": ["Sub", "Fingered", "Synth Bass"],
              "Guitars": ["Acoustic", "Electric", "Slide"], "Keyboards": ["Piano", "Organ", "Clavinet"],
              "Synths": ["Lead", "Pad", "Arp"], "Strings": ["Violin", "Cello", "Ensemble"], "Vocals": ["Male", "Female", "Choir"],
              "Brass": ["Trumpet", "Trombone"], "Woodwinds": ["Flute", "Saxophone"], "Mallets": ["Vibraphone", "Marimba"],
              "Percussion": ["Conga", "Bongo", "Cowbell"], "Sound Effects": ["Ambience", "Impact", "Foley"]}
GENRES = ["House", "Techno", "Hip Hop", "Rock", "Jazz", "Funk", "Ambient", "Drum & Bass", "Soul", "Latin", "Orchestral", "Country"]
ADJECTIVES = ["Warm", "Dirty", "Deep", "Bright", "Slow", "Soft", "Hard", "Sunny", "Smoky", "Silver", "Velvet", "Broken", "Steady",
              "Shiny", "Dusty", "Crisp", "Round", "Open", "Sharp", "Hollow"]
FORMATS = [("WAVE", "WAVE", "PCM", ".wav", 62), ("AIFF", "AIFF", "PCM", ".aif", 14), ("CAF", "caff", "AAC-LC", ".caf", 10),
           ("MP3", "MPG3", "MP3", ".mp3", 9), ("FLAC", "flac", "FLAC", ".flac", 4), ("RF64", "WAVE", "PCM", ".wav", 1)]
PROBLEMS = ["soundIsCut", "containerIsCut", "chunkIsCut", "padIsMissing", "bytesBehind", "unreadable"]
COLUMNS = ("id folder name size modified indexed state kind container_name file_type coding sample_rate bits_per_sample source_bits floating_point channels "
           "frames duration_seconds tempo tempo_source beat_count key_note mode key key_source signature category sub_category genre "
           "descriptors title artist album comment recorded sound_hash").split()
START = 1_700_000_000


def made_words(pick, count):
    """Words that nobody knows, for the long tail."""
    syllables = [a + b for a in "b d f g k l m n p r s t v z ch sh br tr".split() for b in "a e i o u ai ou".split()]
    return sorted({"".join(pick.choices(syllables, k=pick.randint(2, 4))).capitalize() for _ in range(count)})


class Rows:
    def __init__(self, count, seed):
        self.count, self.pick = count, random.Random(seed)
        self.tail = made_words(self.pick, 30000)
        self.artists = [f"{self.pick.choice(self.tail)} {self.pick.choice(self.tail)}" for _ in range(3000)]
        self.folders = []  # (id, path, words), half of the files below Samples, in one folder for about 40 files

    def all(self):
        """Rows of files in the order in which folders are gone through."""
        per_folder = 40
        shares = [("Samples", 0.5, self.sample), ("Recordings", 0.3, self.recording), ("Projects", 0.2, self.project)]
        file = 0
        for root, share, make in shares:
            for _ in range(int(self.count * share / per_folder)):
                row = make(root)
                self.folders.append((len(self.folders) + 1, *next(row)))
                for _ in range(per_folder):
                    file += 1
                    yield self.whole(file, len(self.folders), next(row))

    def sample(self, root):
        pick = self.pick
        category = pick.choice(list(CATEGORIES))
        below = f"{pick.choice(self.tail)} {pick.choice(GENRES)}/{category}/{pick.choice(ADJECTIVES)} {len(self.folders)}/"
        yield f"/library/{root}/{below}", f"{root}/{below}"
        for number in itertools.count(1):
            kind = "loop" if pick.random() < 0.9 else "one-shot"
            sub = pick.choice(CATEGORIES[category])
            tempo = float(pick.choice([90, 95, 100, 110, 120, 120, 124, 125, 126, 128, 140, 174])) if pick.random() < 0.8 else round(pick.uniform(60, 190), 2)
            beats = pick.choice([4, 8, 16, 32])
            note, mode = pick.randrange(12), pick.choice(["major", "minor", "minor", "neither"])
            yield {"kind": kind, "name": f"{sub} {pick.choice(ADJECTIVES)} {'Loop' if kind == 'loop' else 'Hit'}_{number:02}",
                   "category": category, "sub_category": sub, "genre": pick.choice(GENRES), "descriptors": ", ".join(pick.sample(["Clean", "Dry", "Grooving", "Dark", "Relaxed", "Part", "Single"], 3)),
                   **({"tempo": tempo, "tempo_source": "basc", "beat_count": beats, "signature": "4/4", "duration_seconds": beats * 60 / tempo} if kind == "loop" else {"duration_seconds": pick.uniform(0.05, 3)}),
                   **({"key_note": note, "mode": mode, "key": f"{NOTES[note]} {mode}", "key_source": "basc"} if category not in ("Drums", "Percussion") else {}),
                   **({"comment": f"{pick.choice(self.tail)} session"} if pick.random() < 0.2 else {})}

    def recording(self, root):
        pick = self.pick
        artist, album = pick.choice(self.artists), f"{pick.choice(self.tail)} {pick.choice(self.tail)}"
        yield f"/library/{root}/{artist}/{album}/", f"{root}/{artist}/{album}/"
        year = pick.randint(1965, 2026)
        for number in itertools.count(1):
            title = " ".join(pick.choices(self.tail, k=pick.randint(1, 4)))
            yield {"kind": "recording", "name": f"{number:02} {title}", "title": title, "artist": artist, "album": album, "recorded": str(year),
                   "genre": pick.choice(GENRES), "duration_seconds": pick.lognormvariate(5.3, 0.6), **({"tempo": round(pick.uniform(60, 180), 1), "tempo_source": "TBPM"} if pick.random() < 0.1 else {})}

    def project(self, root):
        pick = self.pick
        below = f"{pick.choice(self.tail)} {len(self.folders)}/Media/Audio/"
        yield f"/library/{root}/{below}", f"{root}/{below}"
        for number in itertools.count(1):
            yield {"kind": "recording", "name": f"{pick.choice(['Vocal', 'Guitar', 'Bass DI', 'Drum Loop', 'Overhead', 'Room', 'Snare'])} Take_{number:02}#{pick.randint(1, 9)}",
                   "duration_seconds": pick.lognormvariate(4, 1)}

    def whole(self, file, folder, row):
        pick = self.pick
        container, file_type, coding, extension, _ = pick.choices(FORMATS, cum_weights=FORMAT_WEIGHTS)[0]
        rate = pick.choice([44100, 44100, 44100, 48000, 48000, 96000])
        row["name"] += extension
        row |= {"id": file, "folder": folder, "modified": (START + pick.randrange(86400 * 1000)) * 10**9 + pick.randrange(10**9), "indexed": START + 86400 * 1000,
                "state": "whole", "container_name": container, "file_type": file_type, "coding": coding, "sample_rate": float(rate),
                "channels": pick.choice([1, 2, 2, 2]), "frames": int(row["duration_seconds"] * rate)}
        row["size"] = row["frames"] * row["channels"] * 2 + 4096
        if coding == "PCM":
            row |= {"bits_per_sample": pick.choice([16, 24]), "floating_point": 0}
        if pick.random() < 0.01:
            row["problem"] = pick.choice(PROBLEMS)
            row["state"] = "unreadable" if row["problem"] == "unreadable" else "damaged"
        # A third has a hash, and of these every tenth has that of an earlier one.
        if file % 3 == 0:
            of = file if file % 30 else 3 * pick.randrange(1, file // 3 + 1)
            row["sound_hash"] = hashlib.sha256(str(of).encode()).hexdigest()
        return row


FORMAT_WEIGHTS = list(itertools.accumulate(entry[-1] for entry in FORMATS))


def prepared(path):
    """A database with the tables of an index and nothing in them."""
    steps = re.findall(r'R"sql\((.*?)\)sql"', SOURCE.read_text(encoding="utf-8"), re.S)
    database = sqlite3.connect(path, isolation_level=None)
    database.executescript("".join(steps))
    database.execute(f"PRAGMA application_id = {int.from_bytes(b'KTFi', 'big')}")
    database.execute(f"PRAGMA user_version = {len(steps)}")
    database.execute("PRAGMA journal_mode = WAL")
    database.execute("PRAGMA synchronous = NORMAL")
    return database


def fill(path, count, seed=1, batch=4000):
    """Returns how many rows there are, and the seconds of processor time that the database took."""
    database = prepared(path)
    rows = Rows(count, seed)
    insert = f"INSERT INTO files({', '.join(COLUMNS)}) VALUES({', '.join('?' * len(COLUMNS))})"
    points = bytes(range(128))
    written, files, taken = 0, 0, 0.0
    source = rows.all()
    while made := list(itertools.islice(source, batch)):
        began = time.process_time()
        database.execute("BEGIN")
        database.executemany("INSERT INTO folders(id, path, words) VALUES(?, ?, ?)", rows.folders[written:])
        written = len(rows.folders)
        database.executemany(insert, ([row.get(column) for column in COLUMNS] for row in made))
        database.executemany("INSERT INTO seen VALUES(?, ?, ?, ?, ?, ?, ?)", ((row["folder"], row["name"], row["size"], row["modified"], row["modified"], row["id"], row["id"]) for row in made))
        database.executemany("INSERT INTO overviews VALUES(?, 256, ?)", ((row["id"], points) for row in made))
        database.executemany("INSERT INTO details VALUES(?, ?, NULL)", ((row["id"], json.dumps([{"name": "title", "value": row["title"]}]) if "title" in row else None) for row in made))
        database.executemany("INSERT INTO findings VALUES(?, ?, 'is off')", ((row["id"], row["problem"]) for row in made if "problem" in row))
        database.execute("COMMIT")
        taken += time.process_time() - began
        files += len(made)
    return files, taken


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("file")
    parser.add_argument("--rows", type=int, default=1_000_000)
    parser.add_argument("--seed", type=int, default=1)
    arguments = parser.parse_args()
    if os.path.exists(arguments.file):
        parser.error(f"{arguments.file} exists")
    files, seconds = fill(arguments.file, arguments.rows, arguments.seed)
    print(f"{files} rows, {files / seconds:.0f} for a second of processor time, {os.path.getsize(arguments.file)} bytes")


if __name__ == "__main__":
    main()
