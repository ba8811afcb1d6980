"""ktfiles meta beside other programs: files that they write, and fields that they read."""
import ctypes
import json
import re
import struct
import subprocess
import unittest

from command import MEDIA, CommandTest, chunk, wave
from test_meta import EVERYTHING, UMID, bext

# What each program calls the field, where it knows it and no other field bears the name: exiftool -n, ffprobe, mediainfo (a key of any track), sndfile-info.
NAMES = [
    ("bext.description", "Description", None, "Description", "Description"),
    ("bext.originator", "Originator", "encoded_by", "Producer", "Originator"),
    ("bext.originatorReference", "OriginatorReference", "originator_reference", "Producer_Reference", "Origination ref"),
    ("bext.originationDate", None, "date", None, "Origination date"),
    ("bext.originationTime", None, "creation_time", None, "Origination time"),
    ("bext.timeReference", "TimeReference", "time_reference", None, "Time ref"),
    ("bext.version", "BWFVersion", None, "bext_Version", "BWF version"),
    ("bext.umid", "BWF_UMID", "umid", None, None),  # mediainfo leaves leading zeros of its parts out
    ("bext.loudnessValue", None, None, "LoudnessValue", "Loudness value"),
    ("bext.loudnessRange", None, None, "LoudnessRange", "Loudness range"),
    ("bext.maxTruePeakLevel", None, None, "MaxTruePeakLevel", "Max. true peak level"),
    ("bext.maxMomentaryLoudness", None, None, "MaxMomentaryLoudness", "Max. momentary loudness"),
    ("bext.maxShortTermLoudness", None, None, "MaxShortTermLoudness", "Max. short term loudness"),
    ("info.INAM", "Title", "title", "Title", "Title"), ("info.IART", "Artist", "artist", None, "Artist"),
    ("info.ICMT", "Comment", None, "Comment", "Comment"), ("info.ICOP", "Copyright", "copyright", "Copyright", "Copyright"),
    ("info.ICRD", "DateCreated", None, "Recorded_Date", "Date"), ("info.ISFT", "Software", None, "Encoded_Application", None),
    ("info.IGNR", "Genre", "genre", "Genre", "Genre"), ("info.ITRK", None, "track", None, "Tracknumber"), ("info.IPRD", None, "album", None, "Album"),
    ("smpl.midiUnityNote", "MIDIUnityNote", None, None, "MIDI note"), ("smpl.samplePeriod", "SamplePeriod", None, None, None),
    ("smpl.smpteFormat", "SMPTEFormat", None, None, None), ("inst.lowNote", "LowNote", None, None, None),
    ("inst.highNote", "HighNote", None, None, None), ("inst.gain", "Gain", None, None, None), ("inst.fineTune", "FineTune", None, None, None),
    ("acid.tempo", "Tempo", None, None, None), ("acid.beats", "Beats", None, None, None), ("acid.rootNote", "RootNote", None, None, None),
    ("NAME", "Name", "title", "Title", "Title"), ("AUTH", "Author", "artist", None, "Artist"), ("(c)", "Copyright", "copyright", None, "Copyright"),
    ("ANNO", "Annotation", "comment", None, "Comment"),
]
NO_UTF8 = ("exiftool", "mediainfo")  # take texts of chunks for Latin-1 or Mac Roman, also those that ffmpeg and libsndfile write
FORMATS = {"wav": 0x010002, "aiff": 0x020002, "caf": 0x180002, "rf64": 0x220002, "w64": 0x0B0002}
SF_TITLE, SF_COPYRIGHT, SF_SOFTWARE, SF_ARTIST, SF_COMMENT, SF_DATE, SF_ALBUM, SF_GENRE = 1, 2, 3, 4, 5, 6, 7, 0x10


class SFInfo(ctypes.Structure):
    _fields_ = [("frames", ctypes.c_int64), ("samplerate", ctypes.c_int), ("channels", ctypes.c_int), ("format", ctypes.c_int),
                ("sections", ctypes.c_int), ("seekable", ctypes.c_int)]


def by_sndfile(path, kind, strings=(), **blocks):
    """A second of silence; `blocks` are the records of its commands, packed."""
    library = ctypes.CDLL("libsndfile.so.1")
    library.sf_open.restype = ctypes.c_void_p
    info = SFInfo(samplerate=48000, channels=1, format=FORMATS[kind])
    file = ctypes.c_void_p(library.sf_open(str(path).encode(), 0x20, ctypes.byref(info)))
    for name, content in blocks.items():
        command = {"broadcast": 0x10F1, "cues": 0x10CF, "instrument": 0x10D1, "cart": 0x1400}[name]
        if library.sf_command(file, command, content, len(content)) != 1:
            raise AssertionError(f"{name} was refused")
    for number, text in strings:
        library.sf_set_string(file, number, text.encode())
    library.sf_writef_short(file, bytes(96000), ctypes.c_int64(48000))
    library.sf_close(file)


BEXT = bext(b"sndfile's", time_reference=123456789)
SF_BROADCAST = BEXT[:338] + bytes(2) + BEXT[338:602] + struct.pack("<I", 15) + b"A=PCM,F=48000\r\n".ljust(256, b"\0")  # aligned as C does
SF_CUES = struct.pack("<I", 2) + b"".join(
    struct.pack("<iIiiiI", number, 0, int.from_bytes(b"data", "little"), 0, 0, position) + name.ljust(256, b"\0")
    for number, position, name in ((1, 1000, b"verse"), (7, 2000, b"chorus")))
SF_INSTRUMENT = struct.pack("<i6bxxi", 1, 61, 0, 1, 127, 10, 100, 1) + struct.pack("<iIII", 801, 10, 4000, 0) + bytes(16 * 15)
SF_CART = (b"0101" + b"".join(text.ljust(64, b"\0") for text in (b"A title", b"An artist", b"cut", b"client", b"cat", b"class", b"out")) +
           b"2026-11-2210:00:002027-11-2211:00:00" + b"".join(text.ljust(64, b"\0") for text in (b"app", b"1.0", b"user")) +
           struct.pack("<i", 32768) + b"MRK " + struct.pack("<i", 100) + bytes(56 + 276) + b"http://x/".ljust(1024, b"\0") +
           struct.pack("<I", 6) + b"<tag/>".ljust(256, b"\0"))


def plain(value):
    """Numbers and texts as they can be compared: programs round, and write numbers as text and in hexadecimal."""
    text = str(value).strip().lower()
    if found := re.match(r"0x([0-9a-f]+) \(", text):  # sndfile-info's times, with seconds behind them
        return int(found[1], 16)
    text = re.sub(r"^0x0*|(?<=\d) (lufs|lu|dbtp)$", "", text)
    try:
        return round(float(text), 2)
    except ValueError:
        return text.replace(":", "-")[:10] if re.match(r"\d{4}[:-]\d\d[:-]\d\d", text) else text.lstrip("0")


class Judges(CommandTest):
    def output(self, *command):
        return subprocess.run(command, capture_output=True, cwd=self.folder, text=True, errors="replace", timeout=60).stdout

    def judged(self, name):
        """What each program says, by its own names."""
        tags, = json.loads(self.output("exiftool", "-j", "-n", "-a", name))
        probe = json.loads(self.output("ffprobe", "-v", "error", "-show_format", "-of", "json", name))["format"].get("tags", {})
        media = {}
        for track in (json.loads(self.output("mediainfo", "--Output=JSON", name)).get("media") or {"track": []})["track"]:
            media |= {key: value for key, value in {**track, **track.get("extra", {})}.items() if not isinstance(value, dict)}
        shown = self.output("sndfile-info", name) + self.output("sndfile-info", "--broadcast", name) + self.output("sndfile-info", "--instrument", name)
        lines = dict(re.findall(r"^ *([A-Z][\w. ]*?) *: (.+?)\s*$", shown, re.M))
        return {"exiftool": tags, "ffprobe": {key.lower(): value for key, value in probe.items()}, "mediainfo": media, "sndfile-info": lines}

    def compare(self, name, least):
        fields = {item["field"]: item["value"] for item in self.record("meta", name)["fields"]}
        said, compared = self.judged(name), {}
        for field, *keys in NAMES:
            for judge, key in zip(said, keys):
                if field not in fields or key not in said[judge]:
                    continue
                if judge in NO_UTF8 and not str(fields[field]).isascii():
                    continue
                with self.subTest(file=name, field=field, judge=judge):
                    self.assertEqual(plain(said[judge][key]), plain(fields[field]))
                compared[judge] = compared.get(judge, 0) + 1
        self.assertGreaterEqual(sum(compared.values()), least, (name, compared, said))
        return fields

    def test_files_by_ffmpeg(self):
        tags = ["-metadata", "title=Ta", "-metadata", "artist=me", "-metadata", "copyright=2026 me", "-metadata", "genre=Dub"]
        self.encoded("a.wav", "-write_bext", "1", "-metadata", "description=Words", "-metadata", "originator=somebody", "-metadata",
                     "originator_reference=R1", "-metadata", "origination_date=2026-11-22", "-metadata", "origination_time=10:44:00", "-metadata",
                     "time_reference=88200", "-metadata", "coding_history=A=PCM,F=44100", "-metadata", "umid=0x" + UMID.hex(), *tags)
        fields = self.compare("a.wav", 20)
        self.assertEqual((fields["bext.umidMaterial"], fields["bext.codingHistory[0]"]), (UMID[16:].hex(), "A=PCM,F=44100"))
        for name in ("b.aiff", "c.w64", "d.caf"):
            self.encoded(name, *tags)
            said = json.loads(self.output("ffprobe", "-v", "error", "-show_format", "-of", "json", name))["format"].get("tags", {})
            ours = {item["field"]: item["value"] for item in self.record("meta", name)["fields"]}
            for key, value in said.items():
                self.assertIn(value, ours.values(), (name, key))

    def test_files_by_libsndfile(self):
        texts = ((SF_TITLE, "Ta"), (SF_ARTIST, "me"), (SF_COMMENT, "Wörter"), (SF_COPYRIGHT, "2026"), (SF_DATE, "2026-11-22"), (SF_GENRE, "Dub"), (SF_ALBUM, "Al"))
        blocks = {"broadcast": SF_BROADCAST, "cues": SF_CUES, "instrument": SF_INSTRUMENT, "cart": SF_CART}
        by_sndfile(self.folder / "a.rf64", "rf64", texts, **blocks)  # without cues and instrument
        self.compare("a.rf64", 8)
        by_sndfile(self.folder / "a.wav", "wav", texts, **blocks)
        fields = self.compare("a.wav", 20)
        self.assertEqual([fields[f"cue[{i}].{key}"] for i in (0, 1) for key in ("id", "position")], [1, 1000, 7, 2000])  # without labels
        self.assertEqual([fields[f"cart.{key}"] for key in ("title", "outCue", "endTime", "levelReference", "timer[0].usage", "timer[0].position", "url", "tagText")],
                         ["A title", "out", "11:00:00", 32768, "MRK ", 100, "http://x/", "<tag/>\r\n"])
        self.assertEqual([fields[f"smpl.{key}"] for key in ("midiUnityNote", "loop[0].start", "loop[0].end", "loop[0].type")], [61, 10, 4000 - 1, 0])
        for kind in ("aiff", "caf"):
            by_sndfile(self.folder / f"a.{kind}", kind, texts)
            fields = self.compare(f"a.{kind}", 3 if kind == "aiff" else 0)
            self.assertTrue({"Ta", "me", "Wörter"} <= set(fields.values()), fields)

    def test_files_made_here(self):
        """Every version of "bext", and the chunks that no writer at hand makes."""
        for version in (0, 1, 2):
            self.write(f"v{version}.wav", wave(chunk(b"bext", bext(b"Words", version=version, history=b"A=PCM\r\n")), frames=4800))
            self.compare(f"v{version}.wav", (13, 16, 22)[version])
        self.write("all.wav", wave(*(EVERYTHING[i] for i in (6, 7, 8)), frames=4800))
        self.compare("all.wav", 9)

    def test_files_by_sox(self):
        self.encoded("a.wav")
        for name in ("b.aiff", "b.flac", "b.ogg"):
            subprocess.run(["sox", "a.wav", "--comment", "Words", name], cwd=self.folder, check=True)
            self.assertIn("Words", [str(item["value"]).strip() for item in self.record("meta", name)["fields"]], name)  # AIFF: of even length

    def test_all_media_at_hand(self):
        paths = [str(path) for path in sorted(MEDIA.rglob("*")) if path.is_file()]
        result = self.run_command("meta", "--jsonl", *paths, status=None)
        for line in result.stdout.decode().splitlines():
            record = json.loads(line)
            self.assertNotIn("cannot be read", record.get("error", ""), record)
        self.assertEqual(len(result.stdout.splitlines()), len(paths))


if __name__ == "__main__":
    unittest.main()
