"""What an index knows about a file: the same that the other verbs say of it, within bounds, and of whatever file."""
import base64
import contextlib
import hashlib
import json
import os
import pathlib
import shutil
import signal
import struct
import subprocess
import threading
import time
import unittest

from command import KTFILES, MEDIA, CommandTest, chunk, wave

TRACES = shutil.which("strace") and subprocess.run(["strace", "-o", "/dev/null", "true"], capture_output=True).returncode == 0


def id3(**frames):
    """An ID3v2.3 tag of texts in Latin-1."""
    body = b""
    for name, text in frames.items():
        text = b"\0" + text.encode("latin1")
        body += name.encode() + struct.pack(">IH", len(text), 0) + text
    size = len(body)
    packed = bytes((size >> shift) & 0x7f for shift in (21, 14, 7, 0))
    return b"ID3\3\0\0" + packed + body


def info(**texts):
    return chunk(b"LIST", b"INFO" + b"".join(chunk(name.encode(), text + b"\0") for name, text in texts.items()))


def bext(description=b"", originator=b"", date=b""):
    return chunk(b"bext", description.ljust(256, b"\0") + originator.ljust(32, b"\0") + bytes(32) + date.ljust(10, b"\0") + bytes(272))


def acid(flags=0, root=0, beats=0, tempo=0.0):
    return chunk(b"acid", struct.pack("<IHHfIHHf", flags, root, 0x8000, 0, beats, 4, 4, tempo))


def long_wave(frames, step):
    """16-bit mono: a slow saw, whose extremes differ from point to point."""
    samples = b"".join(struct.pack("<h", (i * step) % 65536 - 32768) for i in range(4096)) * (frames // 4096 + 1)
    fmt = chunk(b"fmt ", struct.pack("<HHIIHH", 1, 1, 48000, 96000, 2, 16))
    body = b"WAVE" + fmt + chunk(b"data", samples[:frames * 2])
    return b"RIFF" + struct.pack("<I", len(body)) + body


class IndexRecords(CommandTest):
    def setUp(self):
        super().setUp()
        (self.folder / "lib").mkdir()

    def records(self, *options, status=0):
        """By name, the records of the files below the folder "lib", which are all read."""
        for index in self.folder.glob("index.db*"):
            index.unlink()
        self.update(*options, status=status)
        return self.known()

    def update(self, *options, status=0):
        self.run_command("index", "--quiet", "--db", "index.db", *options, "lib", status=status)

    def known(self):
        found = [json.loads(line) for line in self.lines("index", "export", "--db", "index.db")]
        return {os.path.basename(each["path"]): each for each in found if "root" not in each}

    @contextlib.contextmanager
    def holding(self, name):
        """Keeps readers away from a file."""
        with subprocess.Popen([KTFILES, "lock", "--write", name, "--", "sh", "-c", "echo held; cat"], cwd=self.folder,
                              stdin=subprocess.PIPE, stdout=subprocess.PIPE) as holder:
            self.assertEqual(holder.stdout.readline(), b"held\n")
            yield
            holder.stdin.close()

    def make(self, *commands):
        for command in commands:
            words = command.split()
            quiet = ["-v", "error", "-nostdin"] if words[0] == "ffmpeg" else []
            subprocess.run([words[0], *quiet, *words[1:]], cwd=self.folder / "lib", check=True, capture_output=True)

    def make_library(self):
        for name in os.listdir(MEDIA):
            if (MEDIA / name).is_file():
                shutil.copy(MEDIA / name, self.folder / "lib")
        tags = "-metadata title=Title -metadata artist=Artist -metadata genre=Genre -metadata comment=Comment"
        self.make("sox -n -r 44100 -b 16 -c 2 s.wav synth 4411s sine 300", f"ffmpeg -i s.wav {tags} -write_bext 1 m.wav",
                  f"ffmpeg -i s.wav {tags} -metadata TBPM=121 m.mp3", f"ffmpeg -i s.wav {tags} m.m4a", f"ffmpeg -i s.wav {tags} m.flac",
                  f"ffmpeg -i s.wav {tags} -write_id3v2 1 m.aiff", f"ffmpeg -i s.wav {tags} m.caf", f"ffmpeg -i s.wav {tags} m.wma",
                  "ffmpeg -i s.wav -c:a adpcm_ima_wav ima.wav", "ffmpeg -i s.wav -c:a alac alac.caf", "sox s.wav s.au", "sox s.wav s.w64",
                  "lame --quiet --tt T --ta A --tg Rock s.wav l.mp3", "flac -s -T BPM=99 -T KEY=Gm s.wav -o f.flac",
                  "oggenc -Q -t T -c INITIALKEY=8B s.wav -o o.ogg", "opusenc --quiet --title T s.wav o.opus", "wavpack -q s.wav -o w.wv")
        whole = {name: (self.folder / "lib" / name).read_bytes() for name in os.listdir(self.folder / "lib")}
        damaged = {"cut.wav": whole["s.wav"][:9000], "cut.aiff": whole["m.aiff"][:9000], "cut.caf": whole["m.caf"][:9000],
                   "cut.mp3": whole["l.mp3"][:900], "cut.flac": whole["f.flac"][:3000], "cut.ogg": whole["o.ogg"][:3000],
                   "stray.wav": whole["s.wav"] + b"stray bytes", "uneven.wav": whole["s.wav"][:40] + struct.pack("<I", 8001) + whole["s.wav"][44:8046], "late.wav": wave(acid(tempo=90), info(INAM=b"late"), size=100),
                   "acid.wav": wave(acid(flags=2, root=61, beats=8, tempo=120), frames=192000)}
        for name, content in damaged.items():
            (self.folder / "lib" / name).write_bytes(content)

    def test_the_index_says_what_the_other_verbs_say(self):
        self.make_library()
        records = self.records("--hash", status=1)
        told = {name: self.answers(name) for name in os.listdir(self.folder / "lib")}
        self.assertEqual(sorted(records), sorted(name for name, answers in told.items() if "error" not in answers["info"] or name == "cut.ogg"))
        self.assertGreater(len(records), 35)
        for name, record in records.items():
            with self.subTest(name=name):
                self.compare(record, **told[name])

    def answers(self, name):
        path = "lib/" + name
        info = ["info", "--sha256"] if name.endswith((".wav", ".aiff", ".aifc", ".caf", ".au", ".w64")) else ["info"]
        return {"info": self.record(*info, path, status=None), "check": self.record("info", "--check", path, status=None),
                "tags": self.record("tags", path, status=None), "meta": self.record("meta", path, status=None),
                "overview": self.record("overview", path, status=None)}

    def compare(self, record, info, check, tags, meta, overview):
        if "error" in info:
            self.assertEqual((record["state"], record["problems"]), ("unreadable", [{"kind": "unreadable", "text": info["error"]}]))
            return
        for key in ("containerName", "fileType", "coding", "sampleRate", "bitsPerSample", "sourceBits", "floatingPoint", "channels",
                    "channelLayout", "frames", "durationSeconds", "bitRate"):
            self.assertEqual(record.get(key), info.get(key), key)
        problems = [(problem["kind"], problem["text"]) for problem in check["findings"]]
        self.assertEqual([(problem["kind"], problem["text"]) for problem in record.get("problems", [])], problems)
        self.assertEqual(record["state"], "whole" if info["isWhole"] and not problems else "damaged")
        if "sha256" in info:
            self.assertEqual(record["soundHash"], info["sha256"])
        tags.pop("path")
        if "error" in tags or "sources" not in tags:
            self.assertEqual(record.get("loopTags"), tags if "chunks" in tags else None)
        else:
            self.assertEqual(record["loopTags"], tags)
            for key in ("tempo", "beatCount", "signature", "title", "genre"):
                self.assertEqual(record.get(key), tags.get(key, record.get(key)), key)
            for key, tag in (("category", "instrumentType"), ("subCategory", "instrumentSubType")):
                self.assertEqual(record.get(key), tags.get(tag), key)
        fields = [(field["field"], field["value"], field.get("words")) for field in meta["fields"]]
        self.assertEqual([(field["name"], field["value"], field.get("words")) for field in record.get("fields", [])], fields)
        if "points" in overview:
            points = base64.b64decode(record["overview"]["points"])
            self.assertEqual(record["overview"]["framesPerPoint"], overview["framesPerPoint"])
            self.assertEqual([list(point) for point in struct.iter_unpack("bb", points)], overview["points"])

    def test_keys_and_tempos_are_understood_as_people_write_them(self):
        cases = {"F#m": (6, "minor", "F# minor"), "Gb major": (6, "major", "F# major"), "Bbmin": (10, "minor", None), "8A": (9, "minor", "A minor"), "c moll": (0, "minor", None), "Take 2 - 8A": (9, "minor", None),
                 "8B": (0, "major", "C major"), "1A": (8, "minor", None), "12B": (4, "major", None), "5b": (3, "major", None),
                 "1d": (0, "major", None), "1m": (9, "minor", None), "12m": (2, "minor", None), "C": (0, "major", None), "Cb": (11, "major", None),
                 "B#": (0, "major", None), "a": (9, None, "A"), "D M": (2, "major", None), "Ebmaj": (3, "major", None), "c sharp minor": (1, "minor", None),
                 "A-flat major": (8, "major", None), "8A - Am": (9, "minor", None), "F#m/Gbm": (6, "minor", None), "(Dm)": (2, "minor", None),
                 "": None, "13A": None, "0B": None, "H": None, "o": None, "Drums": None, "Em7b5": None, "120": None}
        for number, key in enumerate(cases):
            self.write(f"lib/{number}.wav", wave(chunk(b"id3 ", id3(TBPM=f"{80 + number}.5", TKEY=key))))
        tempos = {"x1": "0", "x2": "-3", "x3": "fast", "x4": "1e9", "x5": "nan", "x6": "12x"}
        for name, tempo in tempos.items():
            self.write(f"lib/{name}.wav", wave(chunk(b"id3 ", id3(TBPM=tempo))))
        records = self.records("--no-overview")
        for number, (key, expected) in enumerate(cases.items()):
            record = records[f"{number}.wav"]
            with self.subTest(key=key):
                self.assertEqual((record["tempo"], record["tempoSource"]), (80.5 + number, "id3.TBPM"))
                found = (record.get("keyNote"), record.get("mode"))
                self.assertEqual(found, expected[:2] if expected else (None, None))
                self.assertEqual(record.get("keySource"), "id3.TKEY" if expected else None)
                if expected and expected[2]:
                    self.assertEqual(record["key"], expected[2])
        for name in tempos:
            self.assertNotIn("tempo", records[name + ".wav"], name)

    def test_what_loops_say_of_themselves_counts_before_other_fields(self):
        tag = chunk(b"id3 ", id3(TBPM="70", TKEY="Am", TIT2="of the tag", TALB="Album", TPE1="Somebody", TYER="1999"))
        self.write("lib/loop.wav", wave(acid(flags=2, root=60, beats=8, tempo=120), tag, frames=192000))
        self.write("lib/shot.wav", wave(acid(flags=1), tag))
        self.write("lib/take.wav", wave(bext(b"Scene 1", b"Recorder", b"2026-11-23"), info(INAM=b"of the list", ICMT=b"\xc4 comment")))
        cart = chunk(b"cart", b"0101" + b"of the cart".ljust(2044, b"\0"))
        self.write("lib/cart.wav", wave(cart, info(INAM=b"of the list")))
        self.write("lib/blank.wav", wave(cart, info(INAM=b" ")))
        shutil.copy(MEDIA / "bassline.aiff", self.folder / "lib")
        records = self.records("--no-overview")
        expected = {
            "cart.wav": dict(title="of the list"), "blank.wav": dict(title="of the cart"),
            "loop.wav": dict(kind="loop", tempo=120, tempoSource="acid", keyNote=0, key="C", keySource="acid", title="of the tag", artist="Somebody",
                             album="Album", recorded="1999", beatCount=8),
            "shot.wav": dict(kind="one-shot", tempo=70, tempoSource="id3.TBPM", keyNote=9, key="A minor", mode="minor", keySource="id3.TKEY"),
            "take.wav": dict(kind="recording", title="of the list", artist="Recorder", comment="\xc4 comment", recorded="2026-11-23"),
            "bassline.aiff": dict(kind="loop", tempo=120, tempoSource="basc", keyNote=6, mode="minor", key="F# minor", keySource="basc",
                                  signature="4/4", category="Bass", descriptors=["Dry", "Grooving", "Single"])}
        for name, values in expected.items():
            self.assertEqual({key: records[name].get(key) for key in values}, values, name)

    def test_texts_and_lists_of_any_size_make_small_records(self):
        long = ("\u00fc" * 500_000).encode()
        self.write("lib/comment.wav", wave(info(ICMT=long, INAM=b"line 1\r\nline 2\0\0")))
        self.write("lib/odd.wav", wave(info(ICMT=b"x" + long)))
        self.write("lib/unheld.wav", wave(info(ICMT=long * 10, INAM=b"title"), acid(tempo=80)))
        self.write("lib/fields.wav", wave(info(**{f"I{number:03}": b"value" for number in range(1000)}), *[info(ICMT=b"x" * 3000)] * 1000))
        cues = chunk(b"cue ", struct.pack("<I", 80_000) + b"".join(struct.pack("<II4sIII", n, n, b"data", 0, 0, n) for n in range(80_000)))
        self.write("lib/cues.wav", wave(cues))
        records = self.records()
        for name, record in records.items():
            self.assertLess(len(json.dumps(record)), 1_500_000, name)
        comment = records["comment.wav"]
        self.assertEqual(records["odd.wav"]["comment"], "x" + "\u00fc" * 2047, "whole characters only")
        self.assertEqual((comment["comment"], comment["title"]), ("\u00fc" * 2048, "line 1  line 2"))
        value = next(field for field in comment["fields"] if field["name"] == "info.ICMT")
        self.assertEqual((value["value"], value["size"]), ("\u00fc" * 2048, len(long)))
        told = records["fields.wav"]["fields"]
        self.assertEqual(len(told) - 1 + told[-1]["value"], len(self.record("meta", "lib/fields.wav")["fields"]))

    def test_waveforms_of_long_sound_are_folded(self):
        for frames, per_point in ((1, 256), (5625 * 256, 256), (5625 * 256 + 1, 512), (5_000_000, 1024)):
            self.write("lib/long.wav", long_wave(frames, 37))
            waveform = self.records()["long.wav"]["overview"]
            points = list(struct.iter_unpack("bb", base64.b64decode(waveform["points"])))
            self.assertEqual(waveform["framesPerPoint"], per_point)
            base = self.record("overview", "lib/long.wav")["points"]
            times = per_point // 256
            parts = [base[i:i + times] for i in range(0, len(base), times)]
            self.assertEqual(points, [(min(low for low, _ in part), max(high for _, high in part)) for part in parts])

    def test_a_hole_of_a_terabyte_is_silence_at_no_cost(self):
        size = 1 << 40
        sizes = struct.pack("<IQQQI", 28, size + 72, size, size // 4, 0)
        with open(self.folder / "lib/hole.wav", "wb") as file:
            file.write(b"RF64\xff\xff\xff\xffWAVEds64" + sizes + chunk(b"fmt ", struct.pack("<HHIIHH", 1, 2, 48000, 192000, 4, 16)) +
                       b"data\xff\xff\xff\xff" + struct.pack("<hh", 32767, -32768) * 256)
            start = file.tell() - 1024
            file.truncate(start + size)
        record = self.records()["hole.wav"]
        self.assertEqual((record["frames"], record["state"], record["overview"]["framesPerPoint"]), (size // 4, "whole", 256 << 18))
        points = base64.b64decode(record["overview"]["points"])
        self.assertEqual((points[:2], set(points[2:])), (b"\x81\x7f", {0}))
        # To hash it, all is read.
        size = 80_000_000
        with open(self.folder / "lib/hole.wav", "wb") as file:
            file.write(long_wave(4096, 0)[:40] + struct.pack("<I", size))
            file.truncate(44 + size)
        record = self.records("--hash")["hole.wav"]
        self.assertEqual((record["soundHash"], set(base64.b64decode(record["overview"]["points"]))), (hashlib.sha256(bytes(size)).hexdigest(), {0}))

    @unittest.skipUnless(shutil.which("ffmpeg"), "no ffmpeg")
    def test_the_same_sound_with_other_tags_has_the_same_hash(self):
        self.make("sox -n -r 44100 -b 16 -c 2 s.wav synth 44111s sine 300 sine 400")
        self.make("sox s.wav t.wav gain -3", "oggenc -Q s.wav -o a.ogg", "oggenc -Q -t Something_long -c KEY=Am s.wav -o b.ogg", "oggenc -Q t.wav -o c.ogg")
        # ffmpeg rounds the edit list of MP4 anew.
        self.make("ffmpeg -i s.wav a.m4a", "ffmpeg -i t.wav c.m4a", "cp a.m4a b.m4a", "exiftool -q -overwrite_original -Title=Something_long b.m4a")
        for kind in ("mp3", "flac", "wma", "caf", "aiff"):
            self.make(f"ffmpeg -i s.wav a.{kind}")
            tags = "-metadata title=Something_long -metadata comment=Else -metadata genre=Rock"
            self.make(f"ffmpeg -i a.{kind} -c copy {tags} b.{kind}", f"ffmpeg -i t.wav c.{kind}")
        self.write("lib/b.wav", (self.folder / "lib/s.wav").read_bytes() + info(INAM=b"tagged"))
        records = self.records("--hash", "--no-overview")
        for kind in ("mp3", "flac", "ogg", "m4a", "wma", "caf", "aiff"):
            hashes = [records[f"{name}.{kind}"]["soundHash"] for name in "abc"]
            self.assertEqual(hashes[0], hashes[1], kind)
            self.assertNotEqual(hashes[0], hashes[2], kind)
        self.assertEqual(records["s.wav"]["soundHash"], records["b.wav"]["soundHash"])

    def test_problems_are_as_many_as_can_be_kept_and_digests_are_compared_with_hashes(self):
        self.write("lib/many.wav", wave(*[chunk(b"cue ", b"\1")] * 3000))
        self.write("lib/wrong.wav", wave(chunk(b"MD5 ", bytes(16))))
        records = self.records("--hash")
        self.assertEqual((len(records["many.wav"]["problems"]), records["many.wav"]["state"]), (1000, "damaged"))
        self.assertEqual([problem["kind"] for problem in records["wrong.wav"].get("problems", [])], ["digestDiffers"])
        self.assertEqual(self.records()["wrong.wav"]["state"], "whole", "what is not read to its end is not judged by it")

    def test_files_that_are_no_sound(self):
        tone = (MEDIA / "tone-16.aiff").read_bytes()
        files = {"empty.wav": b"", "text.aiff": b"no sound", "head.wav": wave()[:20], "notes.txt": b"no sound", "empty": b"", "picture.png": b"\x89PNG\r\n\x1a\n",
                 "named like nothing": tone, "zeros.flac": bytes(5000), "junk.mp3": b"\1\2\3" * 999}
        for name, content in files.items():
            self.write("lib/" + name, content)
        with open(self.folder / "lib/sparse.wav", "wb") as file:
            file.truncate(1 << 40)
        os.mkfifo(self.folder / "lib/fifo.wav")
        (self.folder / "lib/folder.wav").mkdir()
        records = self.records(status=None)
        unreadable = {"empty.wav", "text.aiff", "head.wav", "zeros.flac", "junk.mp3", "sparse.wav"}
        self.assertEqual({name for name, record in records.items() if record.get("state") == "unreadable"}, unreadable)
        self.assertEqual(records["named like nothing"]["state"], "whole")
        self.assertFalse({"notes.txt", "empty", "picture.png", "folder.wav"} & set(records))
        for name in unreadable:
            problem, = records[name]["problems"]
            self.assertEqual({"kind": "unreadable", "text": self.record("info", "lib/" + name, status=1)["error"]}, problem, name)

    def test_a_file_that_changes_while_it_is_read_is_read_again_next_time(self):
        path = self.write("lib/busy.wav", long_wave(30_000_000, 37))
        stop = threading.Event()

        def change():
            while not stop.wait(0.001):
                os.utime(path)

        changing = threading.Thread(target=change)
        changing.start()
        try:
            for _ in range(20):  # unless it was read while the thread waited
                record = self.records("--hash")["busy.wav"]
                if record["stamp"]["inode"] == 0:
                    break
        finally:
            stop.set()
            changing.join()
        self.assertEqual((record["stamp"]["inode"], record["stamp"]["changed"]), (0, 0))
        settled = self.records("--no-overview")["busy.wav"]
        self.assertEqual(settled["stamp"]["inode"], path.stat().st_ino)

    def test_an_end_that_is_asked_for_does_not_wait_for_long_sound(self):
        with open(self.write("lib/long.wav", long_wave(4_000_000, 37)), "r+b") as file:
            sizes = struct.pack("<IQQQI", 28, 1 << 36, (1 << 36) - 80, 1 << 35, 0)
            file.write(b"RF64\xff\xff\xff\xffWAVEds64" + sizes + chunk(b"fmt ", struct.pack("<HHIIHH", 1, 1, 48000, 96000, 2, 16)) + b"data\xff\xff\xff\xff")
            file.truncate(1 << 36)
        with subprocess.Popen([KTFILES, "index", "--hash", "--db", "index.db", "lib"], cwd=self.folder) as process:
            while process.poll() is None and int(pathlib.Path(f"/proc/{process.pid}/io").read_text().split()[1]) < 100_000_000:
                time.sleep(0.02)
            process.terminate()
            process.wait(timeout=60)
        self.assertEqual(process.returncode, -signal.SIGTERM)
        self.assertEqual(self.known(), {}, "a file that was not read to its end is not told")
        roots = [json.loads(line) for line in self.lines("index", "export", "--db", "index.db")]
        self.assertEqual([root for root in roots if "completed" in root], [])

    def test_a_file_that_shrinks_while_it_is_read_ends_well(self):
        content = long_wave(20_000_000, 37)
        path = self.write("lib/shrinks.wav", content)
        stop = threading.Event()

        def change():
            while not stop.wait(0.002):
                os.truncate(path, 1000)
                with open(path, "r+b") as file:
                    file.seek(0, os.SEEK_END)
                    file.write(content[1000:len(content) // 2])

        changing = threading.Thread(target=change)
        changing.start()
        try:
            for _ in range(5):
                record = self.records("--hash")["shrinks.wav"]
                self.assertIn(record["state"], ("damaged", "unreadable"))
                if record["stamp"]["inode"] != 0:
                    self.assertLessEqual(record["frames"] * 2, record["stamp"]["size"])
        finally:
            stop.set()
            changing.join()

    def test_a_file_that_another_program_holds_is_not_waited_for_long(self):
        shutil.copy(MEDIA / "tone-16.aiff", self.folder / "lib")
        with self.holding("lib/tone-16.aiff"):
            record = self.records(status=1)["tone-16.aiff"]
        self.assertEqual((record["state"], record["stamp"]["inode"], [problem["kind"] for problem in record["problems"]]), ("unreadable", 0, ["inUse"]))
        self.update()
        known = self.known()["tone-16.aiff"]
        self.assertEqual(known["state"], "whole")
        path = self.folder / "lib/tone-16.aiff"
        path.write_bytes(path.read_bytes() + bytes(100))
        with self.holding("lib/tone-16.aiff"):
            self.update(status=1)
        self.assertEqual(self.known()["tone-16.aiff"], known, "what was known before stays")
        self.update()
        self.assertEqual(self.known()["tone-16.aiff"]["state"], "damaged")

    @unittest.skipUnless(TRACES, "strace cannot trace here")
    def test_a_read_that_fails_is_never_taken_for_an_end(self):
        self.write("loop.wav", wave(chunk(b"keep", bytes(9000)), acid(flags=2, root=60, beats=8, tempo=120), chunk(b"more", bytes(9000)),
                                    info(INAM=b"title"), frames=192000))
        shutil.copy(MEDIA / "bassline.aiff", self.folder)
        self.encoded("tone.mp3", "-metadata", "title=T")
        for name in ("loop.wav", "bassline.aiff", "tone.mp3"):
            good = self.failing(name, "")
            self.assertEqual(good["state"], "whole", name)
            failed = 0
            # One read, and all from one on: what is read ahead is read again where that fails.
            for number, many in ((number, many) for number in range(1, 50) for many in ("", "+")):
                record = self.failing(name, f"{number}{many}")
                if record is None:
                    break
                if record["state"] == "whole":
                    self.assertEqual(record, good, (name, number))
                else:
                    failed += 1
                    self.assertTrue(any(problem["text"] for problem in record["problems"]), (name, number, record))
            self.assertGreater(failed, 0, name)
        shutil.copy(self.folder / "loop.wav", self.folder / "nameless")  # is audio though nothing but its beginning says so
        self.assertEqual({self.failing("nameless", f"{number}+")["state"] for number in range(1, 9)}, {"unreadable", "damaged"})

    def failing(self, name, which):
        """The record that is made when those reads of the file fail, as strace counts them. None: there are not so many."""
        log = self.folder / "log"
        inject = ["-e", f"inject=pread64:error=EIO:when={which}"] if which else []
        trace = ["strace", "-f", "-o", log, "-P", name, "-e", "trace=pread64", *inject]
        # A sanitizer cannot look for leaks in a process that is traced already.
        environment = {**os.environ, "ASAN_OPTIONS": os.environ.get("ASAN_OPTIONS", "") + ":detect_leaks=0"}
        result = subprocess.run([*trace, KTFILES, "index", "--records", "--jsonl", "-j1", name], cwd=self.folder, capture_output=True,
                                timeout=60, env=environment)
        if which and b"INJECTED" not in log.read_bytes():
            return None
        record, = (each for each in map(json.loads, result.stdout.splitlines()) if "root" not in each)
        record.pop("indexed", None)
        return record

    def test_tempo_and_key_of_other_formats(self):
        self.make("sox -n -r 44100 -b 16 -c 2 s.wav synth 4411s sine 300", "flac -s -T BPM=99.5 -T KEY=Gm s.wav -o bpm.flac",
                  "flac -s -T TEMPO=98 -T INITIALKEY=4A s.wav -o tempo.flac", "opusenc --quiet --comment BPM=97 --comment initialkey=Bb s.wav o.opus",
                  "oggenc -Q -c bpm=96 -c key=Ebm s.wav -o o.ogg", "wavpack -q -w BPM=95 -w KEY=Abm s.wav", "ffmpeg -i s.wav m.m4a",
                  "exiftool -q -overwrite_original -ItemList:BeatsPerMinute=94 m.m4a", "ffmpeg -i s.wav -metadata TBPM=93 -metadata TKEY=Dbm l.mp3")
        expected = {"bpm.flac": (99.5, "vorbis.BPM", "G minor"), "tempo.flac": (98, "vorbis.TEMPO", "F minor"), "o.opus": (97, "vorbis.BPM", "A# major"),
                    "o.ogg": (96, "vorbis.BPM", "D# minor"), "s.wv": (95, "ape.BPM", "G# minor"), "m.m4a": (94, "mp4.tmpo", None),
                    "l.mp3": (93, "id3v2.TBPM", "Db minor"), "s.wav": (None, None, None)}
        records = self.records("--no-overview")
        for name, values in expected.items():
            self.assertEqual((records[name].get("tempo"), records[name].get("tempoSource"), records[name].get("key")), values, name)


if __name__ == "__main__":
    unittest.main()
