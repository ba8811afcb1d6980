"""ktfiles tags: show, set, remove and copy, over real AIFF and CAF files, whose samples stay as they are."""
import itertools
import json
import shutil
import struct
import subprocess
import unittest
from random import Random

from command import KTFILES, MEDIA, CommandTest, caf

SAMPLES = {"a.aiff": "tone-16.aiff", "a.caf": "pluck-24-le.caf"}
PATCH = b"patch bytes"


def aiff_with(path, *chunks):
    """Puts chunks of (id, body) behind the last one of an AIFF file."""
    content = path.read_bytes()
    for chunk_id, body in chunks:
        content += chunk_id + struct.pack(">I", len(body)) + body + b"\0" * (len(body) & 1)
    path.write_bytes(content[:4] + struct.pack(">I", len(content) - 8) + content[8:])


def category(instrument=b"", sub=b"", genre=b"", descriptors=(), version=1):
    def text(value):
        return value.ljust(50, b"\0")
    return (struct.pack(">I", version) + text(instrument) + text(sub) + text(genre) + bytes(66) +
            struct.pack(">H", len(descriptors)) + b"".join(map(text, descriptors)))


# What is known of every file.
SOUND = ("path", "fileType", "containerName", "sampleRate", "frames", "durationSeconds")
BASIC = struct.pack(">Ii5h", 1, 8, 57, 1, 6, 8, 1) + bytes(64)


class TagsTest(CommandTest):
    def setUp(self):
        super().setUp()
        for name, original in SAMPLES.items():
            shutil.copy(MEDIA / original, self.folder / name)
        self.samples = {name: self.decoded(name) for name in SAMPLES}

    def decoded(self, name):
        return subprocess.run(["sox", name, "-t", "raw", "-"], cwd=self.folder, capture_output=True, check=True).stdout

    def tags(self, *names):
        items = self.json("tags", *names)
        return items[0] if len(names) == 1 else items

    def set(self, *arguments, **options):
        return self.run_command("tags", "set", *arguments, **options)

    def assert_sound(self):
        for name, samples in self.samples.items():
            self.assertEqual(self.decoded(name), samples, name)


class Show(TagsTest):
    def test_golden_aiff(self):
        descriptors = (b"Dry", b"Acoustic")
        aiff_with(self.folder / "a.aiff", (b"basc", BASIC), (b"cate", category(b"Drums", b"Kick", b"Rock", descriptors)),
                  (b"trns", bytes(72) + struct.pack(">I", 9) + struct.pack(">HHI16x", 1, 0, 77)),  # of 9, one is there
                  (b"CHST", b"strip"), (b"NAME", b"Ten"), (b"AUTH", b"J\x9Frgen"))
        shown = self.tags("a.aiff")
        self.assertEqual(shown.pop("artist"), "Jürgen")  # Mac Roman
        seconds = self.json("info", "a.aiff")[0]["durationSeconds"]
        self.assertAlmostEqual(shown.pop("tempo"), 8 * 60 / seconds)
        shown.pop("comments")  # by the program that made the file
        sources = shown.pop("sources")
        self.assertEqual({chunk: {key for key, value in sources.items() if value == chunk} for chunk in sources.values()},
                         {"basc": {"tempo", "beatCount", "midiRootNote", "keyType", "signatureTop", "signatureBottom", "loopFileType"},
                          "cate": {"instrumentType", "instrumentSubType", "genre", "descriptors"}, "NAME": {"title"}, "COMT": {"comments"},
                          "AUTH": {"artist"}, "trns": {"transients"}})
        self.assertEqual(shown, {
            "path": "a.aiff", "fileType": "AIFF", "containerName": "AIFF", "sampleRate": 44100, "frames": 4410, "durationSeconds": 0.1,
            "beatCount": 8, "midiRootNote": 57, "key": "A", "keyType": 1, "mode": "minor", "signatureTop": 6,
            "signatureBottom": 8, "signature": "6/8", "loopFileType": 1, "instrumentType": "Drums", "instrumentSubType": "Kick",
            "genre": "Rock", "descriptors": ["Acoustic", "Dry"], "title": "Ten",
            "chunks": [{"id": "CHST", "size": 5}], "transients": [{"type": 1, "frame": 77}]})
        text, status = self.on_terminal("tags", "a.aiff", NO_COLOR="1")
        self.assertEqual(status, 0)
        for line in ("a.aiff  AIFF", "  Key           A minor", "  Signature     6/8", "  Descriptors   Acoustic, Dry",
                     "  Transients    1", "  Chunks        CHST (5 bytes)"):
            self.assertIn(line + "\n", text)
        self.assertIn("key\tA minor", self.lines("tags", "a.aiff"))
        self.assertIn("a.aiff\tkey\tA minor", self.lines("tags", "a.aiff", "a.caf"))

    def test_damaged_chunks_leave_the_rest(self):
        for chunks, expected in (
                ([(b"basc", BASIC), (b"cate", category(b"Drums")[:221])], {"beatCount": 8}),
                ([(b"cate", category(b"Drums", version=3))], {}),
                ([(b"cate", category(b"Drums", descriptors=(b"Dry",))[:-1])], {"instrumentType": "Drums"}),
                ([(b"basc", BASIC[:40]), (b"trns", b"short")], {})):
            shutil.copy(MEDIA / "tone-16.aiff", self.folder / "a.aiff")
            aiff_with(self.folder / "a.aiff", *chunks)
            shown = self.tags("a.aiff")
            for key in ("beatCount", "instrumentType", "transients"):
                self.assertEqual(shown.get(key), expected.get(key), (key, chunks))

    def test_what_holds_no_tags_says_so(self):
        for name in ("tone-16.wav", "tone-fl32.aifc", "README.md"):
            shutil.copy(MEDIA / name, self.folder)
        for name in ("tone-16.wav", "tone-fl32.aifc"):
            self.assertEqual(set(self.tags(name)), set(SOUND))
        editing = (["tags", "set", "genre=x"], ["tags", "remove"])
        for name, verbs, said in (("tone-16.wav", editing, "is a WAVE file; tags are set and removed in AIFF and CAF files only"),
                                  ("tone-fl32.aifc", editing, "is an AIFC file; tags are set"),
                                  ("tone-fl32.aifc", (["tags", "copy", "a.aiff"],), "is an AIFC file; loop tags are put into"),
                                  ("README.md", (["tags"], *editing, ["tags", "copy", "a.aiff"]), "no audio that can be decoded"), ("missing", (["tags"], *editing), "not found")):
            before = (self.folder / name).read_bytes() if name[0] in "tR" else None
            for verb in verbs:
                self.assertIn(said, self.failure(*verb, "./" + name))
            if before:
                self.assertEqual((self.folder / name).read_bytes(), before)
        items = json.loads(self.run_command("tags", "--json", "missing", "a.caf", status=1).stdout)
        self.assertEqual([set(items[0]), items[1]["fileType"]], [{"path", "error"}, "caff"])


class Edits(TagsTest):
    ALL = {"beatCount": 8, "midiRootNote": 54, "keyType": 1, "signatureTop": 12, "signatureBottom": 8,
           "loopFileType": 1, "instrumentType": "Bass", "instrumentSubType": "Electric", "genre": "Rock",
           "descriptors": ["Dry", "Grooving"], "title": "Tïtle", "artist": "An Artist", "copyright": "2026",
           "comments": "Say: a=b, c", "transients": [{"type": 1, "frame": frame} for frame in (0, 50, 99)]}
    ARGUMENTS = ["beatCount=8", "key=Gb", "mode=minor", "signature=12/8", "instrumentType=Bass",
                 "instrumentSubType=Electric", "genre=Rock", "descriptors=Grooving, Dry,Dry", "title=Tïtle",
                 "artist=An Artist", "copyright=2026", "comments=Say: a=b, c", "transients=99,0,50"]

    def without(self, shown, *keys):
        words = ("key", "mode", "signature")  # beside their numbers
        return {key: value for key, value in shown.items() if key not in (*SOUND, *words, "tempo", "sources", *keys)}

    def test_every_tag_in_both_containers(self):
        self.set("a.aiff", "a.caf", *self.ARGUMENTS)
        for shown in self.tags("a.aiff", "a.caf"):
            self.assertEqual(self.without(shown), self.ALL)
        self.assert_sound()
        probed = json.loads(subprocess.run(["ffprobe", "-v", "quiet", "-of", "json", "-show_format", "a.caf"],
                                           cwd=self.folder, capture_output=True).stdout)["format"]["tags"]
        self.assertEqual([probed[key] for key in ("title", "artist", "copyright", "comments")],
                         [self.ALL[key] for key in ("title", "artist", "copyright", "comments")])
        content = [(self.folder / name).read_bytes() for name in SAMPLES]
        self.assertEqual(self.set("a.aiff", "a.caf", *self.ARGUMENTS).stdout, b"a.aiff: unchanged\na.caf: unchanged\n")
        self.assertEqual([(self.folder / name).read_bytes() for name in SAMPLES], content)

    def test_a_signature_survives_in_caf_without_beats(self):
        self.set("a.caf", "signature=3/4")
        self.set("a.caf", "genre=Waltz")
        self.assertEqual(self.tags("a.caf")["signatureTop"], 3)

    def test_mistakes_are_found_before_anything_is_touched(self):
        content = [(self.folder / name).read_bytes() for name in SAMPLES]
        wrong = ["genr=x", "beatCount=-1", "beatCount=x", "beatCount=99999999999", "keyType=5", "mode=sad", "key=H",
                 "key=C##", "signature=4", "signature=4/0", "signature=4/4/4", "signature=4/", "midiRootNote=128",
                 "loopFileType=3", "transients=1,x", "transients=-1", "transients=99999999", "tempo=120",
                 "genre=" + "x" * 50, b"title=\xFF"]
        for argument in wrong:
            self.failure("tags", "set", "a.aiff", "a.caf", "title=T", argument, status=2)
        self.failure("tags", "set", "a.aiff", "genre=a", "genre=b", status=2)
        self.failure("tags", "set", "a.aiff", "key=C", "midiRootNote=49", status=2)
        self.assertIn("CAF file cannot keep midiRootNote=60",
                      self.failure("tags", "set", "a.aiff", "a.caf", "midiRootNote=60", status=2))
        self.assertIn("CAF file cannot keep genre=R,B",
                      self.failure("tags", "set", "a.aiff", "a.caf", "genre=R,B", status=2))
        for arguments in (["a.aiff", "genr"], ["genre"], []):
            self.failure("tags", "remove", *arguments, status=2)
        self.assertEqual([(self.folder / name).read_bytes() for name in SAMPLES], content)
        shutil.copy(self.folder / "a.aiff", self.folder / "a=b.aiff")
        self.set("./a=b.aiff", "genre=x")
        self.assertEqual(self.tags("a=b.aiff")["genre"], "x")

    def test_remove(self):
        aiff_with(self.folder / "a.aiff", (b"CHST", b"strip"))
        self.set("a.aiff", "a.caf", *self.ARGUMENTS)
        self.run_command("tags", "remove", "a.aiff", "a.caf", "genre", "signature", "title", "transients", "descriptors")
        for shown in self.tags("a.aiff", "a.caf"):
            self.assertEqual([shown.get(key) for key in ("genre", "title", "transients", "descriptors", "beatCount")],
                             [None, None, None, None, 8])
            self.assertFalse(shown.get("signatureTop"))
            self.assertEqual(shown["artist"], "An Artist")
        self.run_command("tags", "remove", "a.aiff", "a.caf")
        for name, shown in zip(SAMPLES, self.tags("a.aiff", "a.caf")):
            self.assertEqual(set(shown), set(SOUND))
            ids = {item["id"] for item in self.record("chunks", name)["chunks"]}
            self.assertFalse(ids & {"basc", "cate", "trns", "CHST", "uuid", "NAME", "AUTH", "(c) ", "COMT"}, ids)
        self.assert_sound()

    def test_chunks_that_cannot_be_read_are_removed(self):
        uuids = {"trns": "0352811b9d5d42e1882d6af61a6b330c", "basc": "29819273b5bf4aefb78d62d1ef90bb2c"}
        for chunks in ([(b"basc", BASIC[:40])], [(b"basc", bytes(82))], [(b"cate", category(b"Drums", version=3))],
                       [(b"trns", b"short"), (b"AUTH", b"\xFF")], [(b"NAME", b"")]):
            shutil.copy(MEDIA / "tone-16.aiff", self.folder / "a.aiff")
            self.run_command("tags", "remove", "a.aiff")  # what its maker put there
            clean = self.record("chunks", "a.aiff")["chunks"]
            aiff_with(self.folder / "a.aiff", *chunks)
            self.assertIn(chunks[0][0].decode(), self.run_command("tags", "remove", "a.aiff").stdout.decode())
            self.assertEqual(self.record("chunks", "a.aiff")["chunks"], clean)
            self.assertEqual(self.lines("tags", "remove", "a.aiff"), ["a.aiff: unchanged"])
        for chunk_id, body in ((b"uuid", bytes.fromhex(uuids["trns"]) + b"short"), (b"info", b"\0\0\0\1title\0\xFF\0"),
                               (b"uuid", bytes.fromhex(uuids["basc"]))):
            self.write("b.caf", caf((chunk_id, body), (b"uuid", bytes(20))))
            self.run_command("tags", "remove", "b.caf")
            self.assertEqual([item["id"] for item in self.record("chunks", "b.caf")["chunks"] if item["id"] != "free"],
                             ["desc", "uuid", "data"])
        self.assert_sound()

    def test_pairs_of_others_stay_in_caf(self):
        basic = bytes.fromhex("29819273b5bf4aefb78d62d1ef90bb2c")
        pairs = b"\0\0\0\3" + b"genre\0Rock\0" + b"tempo\x00120,5\0" + b"beat count\x008\0"
        self.write("b.caf", caf((b"uuid", basic + pairs)))
        self.run_command("tags", "set", "b.caf", "genre=Jazz")
        self.run_command("tags", "remove", "b.caf", "beatCount")
        content = self.run_command("chunks", "get", "b.caf", "uuid").stdout
        for text, count in ((b"tempo\x00120,5\0", 1), (b"genre\0Jazz\0", 1), (b"beat count", 0)):
            self.assertEqual(content.count(text), count, text)


class Copy(TagsTest):
    def test_there_and_back(self):
        ids = (b"CHST", b"CHSU", b"CHSV", b"PTCH", b"genI", b"Sequ", b"adLD", b"StSq", b".mid")
        aiff_with(self.folder / "a.aiff", *((chunk_id, chunk_id + PATCH) for chunk_id in ids))
        self.set("a.aiff", *Edits.ARGUMENTS)
        shutil.copy(MEDIA / "tone-16.aiff", self.folder / "b.aiff")
        self.run_command("tags", "copy", "a.aiff", "a.caf")
        self.run_command("tags", "copy", "a.caf", "b.aiff")
        first, caf, last = (Edits.without(None, shown) for shown in self.tags("a.aiff", "a.caf", "b.aiff"))
        self.assertEqual(caf, first)
        self.assertEqual(last, first)
        self.assertEqual(len(first["chunks"]), len(ids))
        for chunk_id in ids:
            body = self.run_command("chunks", "get", "b.aiff", chunk_id.decode()).stdout
            self.assertEqual(body, chunk_id + PATCH)
        self.assertEqual(self.lines("tags", "copy", "a.aiff", "a.caf"), ["a.caf: unchanged"])
        self.assert_sound()

    def test_losses_are_told_and_the_rest_stays(self):
        self.set("a.aiff", "midiRootNote=60", "genre=Rock")
        self.set("a.caf", "artist=Kept", "title=Old", "transients=7")
        self.assertIn("midiRootNote 60 is not kept", self.run_command("tags", "copy", "a.aiff", "a.caf").stdout.decode())
        shown = self.tags("a.caf")
        self.assertEqual([shown[key] for key in ("genre", "artist", "title")], ["Rock", "Kept", "Old"])
        self.assertEqual(shown["transients"], [{"type": 1, "frame": 7}])
        self.run_command("tags", "remove", "a.aiff")
        self.assertIn("has no loop tags", self.failure("tags", "copy", "a.aiff", "a.caf"))


class GoesBack(TagsTest):
    """What `tags` prints goes back into `tags set`."""

    TEXTS = ["plain", "it's \"quoted\" \\ back\\n", " spaces at both ends ", "two\nlines\n", "tab\there", "$'x'", "$x `y` $(z)", "\x1b[1m", "é\u202e",
             "a=b, c/d", "$'", "'", "\\'", "ends in \\", "*", "-n", "\x7f\u0085"]
    FIELDS = {"beatCount": [1, 8, 2147483647], "midiRootNote": range(48, 60), "keyType": [1, 2, 3, 4],
              "signatureTop": [3, 12], "signatureBottom": [4, 8], "loopFileType": [1, 2], "instrumentType": TEXTS,
              "instrumentSubType": TEXTS, "genre": TEXTS, "title": TEXTS, "artist": TEXTS, "copyright": TEXTS, "comments": TEXTS,
              "descriptors": [["Dry"], ["$'", "Dry"]], "transients": ["0", "1,20,99", "7:3"]}

    def quoted(self, text):
        """The notation of shells, as their user would type it."""
        return "$'" + "".join(f"\\x{byte:02x}" if byte < 128 else chr(byte) for byte in text.encode()).encode("latin-1").decode() + "'"

    def setUp(self):
        super().setUp()
        self.run_command("tags", "remove", *SAMPLES)
        self.clean = {name[-4:]: (self.folder / name).read_bytes() for name in SAMPLES}

    def fresh(self, *names):
        for name in names:
            self.write(name, self.clean[name[-4:]])

    def assert_goes_back(self, name):
        """By lines in one go, by `read -r` in a shell line by line, and by JSON."""
        copies = [f"{road}{name}" for road in ("lines-", "shell-", "json-")]
        self.fresh(*copies)
        lines = [line.split("\t", 1) for line in self.run_command("tags", name).stdout.decode().split("\n")[:-1]]
        self.set(copies[0], *("=".join(line) for line in lines if line[0] != "tempo"))
        script = """a=(); while IFS=$'\\t' read -r k v; do [ $k = tempo ] || a+=("$k=$v"); done < <("$0" tags "$1"); "$0" tags set "$2" "${a[@]}\""""
        subprocess.run(["bash", "-c", script, KTFILES, name, copies[1]], cwd=self.folder, check=True, capture_output=True)
        shown = self.tags(name)
        self.set(copies[2], *(f"{key}={self.json_text(value)}" for key, value in shown.items() if key not in (*SOUND, "tempo", "sources")))
        for copy in self.tags(*copies):
            self.assertEqual({**copy, "path": name}, shown)

    def json_text(self, value):
        if isinstance(value, list):
            return ",".join(f"{each['frame']}:{each['type']}" if isinstance(each, dict) else self.quoted(each) for each in value)
        return self.quoted(value) if isinstance(value, str) and value[:2] == "$'" or str(value) != str(value).strip() else value

    def test_every_field_and_value(self):
        random = Random(1)
        for turn in range(len(self.TEXTS)):
            self.fresh("t.aiff", "t.caf")
            for name in ("t.aiff", "t.caf"):
                arguments = []
                for index, (field, values) in enumerate(self.FIELDS.items()):
                    value = values[(turn + 5 * index) % len(values)]
                    if turn > 3 and random.random() < 0.4 or name == "t.caf" and field in ("loopFileType", "signatureBottom"):
                        continue
                    if name == "t.caf" and field in ("genre", "instrumentType", "instrumentSubType", "descriptors"):
                        value = "Rock"  # what CAF takes for one of its terms
                    if name == "t.caf" and field == "signatureTop":
                        field, value = "signature", "6/8"
                    if name == "t.aiff" and field == "comments":
                        value = value.strip()
                    value = ",".join(map(self.quoted, value)) if isinstance(value, list) else value
                    arguments.append(f"{field}={self.quoted(value) if value in self.TEXTS else value}")
                self.set(name, *arguments)
                self.assert_goes_back(name)

    def test_lists_and_texts_of_others(self):
        aiff_with(self.folder / "a.aiff", (b"basc", BASIC), (b"cate", category(b" Bass ", descriptors=(b"a, b", b" c", b"d'"))),
                  (b"trns", bytes(72) + struct.pack(">I", 2) + struct.pack(">HHI16xHHI16x", 1, 0, 77, 5, 0, 80)))
        self.assertIn("transients\t77,80:5", self.lines("tags", "a.aiff"))
        self.assertIn("descriptors\t$' c', $'a, b', d'", self.lines("tags", "a.aiff"))
        self.assert_goes_back("a.aiff")

    def test_words_and_numbers(self):
        for arguments, expected in ((["key=B minor"], {"midiRootNote": 59, "keyType": 1}), (["key=Bbm"], {"midiRootNote": 58, "keyType": 1}),
                                    (["Key=54 major"], {"midiRootNote": 54, "keyType": 2}), (["key=minor"], {"keyType": 1}),
                                    (["key=Gb", "midiRootNote=54", "mode=Minor", "keyType=1"], {"midiRootNote": 54, "keyType": 1}),
                                    (["key=major and minor"], {"keyType": 4}), (["root-note=C"], {"midiRootNote": 48}),
                                    (["beats=8", "Kind=not a loop"], {"beatCount": 8, "loopFileType": 2}),
                                    (["category=Bass", "Sub-category=Electric"], {"instrumentType": "Bass", "instrumentSubType": "Electric"})):
            self.fresh("a.aiff")
            self.set("a.aiff", *arguments)
            self.assertEqual(Edits.without(None, self.tags("a.aiff")), expected, arguments)
        self.set("a.aiff", "key=A minor", "genre=Rock")
        self.run_command("tags", "remove", "a.aiff", "key", "category", "sub category")
        self.assertEqual(Edits.without(None, self.tags("a.aiff")), {"genre": "Rock"})
        for arguments, said in ((["ctegory=x"], 'did you mean "category"?'), (["tempo=120"], "set beats=N"), (["BPM=1"], "set beats=N"),
                                (["key=A 7"], "a note such as"), (["title=$'x"], "goes on to the next '"), (["title=$'\\q'"], 'no "\\q"'),
                                (["title=$'x' y"], '" y" follows'), (["key=A minor", "mode=major"], "to different values"),
                                (["title=$'\\xff'"], "not valid UTF-8"), (["chunks=CHST (5 bytes)"], "tags copy")):
            self.assertIn(said, self.failure("tags", "set", "a.aiff", *arguments, status=2))


BASIC_UUID = bytes.fromhex("29819273b5bf4aefb78d62d1ef90bb2c")
TRANSIENTS_UUID = bytes.fromhex("0352811b9d5d42e1882d6af61a6b330c")


def pairs(*entries, behind=b""):
    return struct.pack(">I", len(entries)) + b"".join(key + b"\0" + text + b"\0" for key, text in entries) + behind


def comments(*texts):
    """An AIFF "COMT": each with a time stamp and a marker."""
    body = struct.pack(">H", len(texts))
    for index, text in enumerate(texts):
        body += struct.pack(">IhH", 1000 + index, 7 + index, len(text)) + text + b"\0" * (len(text) & 1)
    return body


class WhatIsNotNamedStays(TagsTest):
    """Bytes that the library cannot read, or does not know, outlive an edit of the fields beside them."""

    def chunks(self, name):
        """The bodies of a file's chunks, by id, those of "uuid" by their UUID."""
        content, position, found = (self.folder / name).read_bytes(), 12, {}
        is_caf = content.startswith(b"caff")
        position = 8 if is_caf else 12
        while position < len(content):
            chunk_id = content[position:position + 4]
            size = struct.unpack(">q" if is_caf else ">I", content[position + 4:position + (12 if is_caf else 8)])[0]
            position += 12 if is_caf else 8
            body = content[position:position + size]
            found[body[:16] if chunk_id == b"uuid" else chunk_id] = body[16:] if chunk_id == b"uuid" else body
            position += size + (0 if is_caf else size & 1)
        return found

    def fresh_aiff(self, *chunks):
        shutil.copy(MEDIA / "tone-16.aiff", self.folder / "a.aiff")
        self.run_command("tags", "remove", "a.aiff")
        aiff_with(self.folder / "a.aiff", *chunks)

    def edited(self, name, *words, verb="set"):
        before = self.chunks(name)
        self.run_command("tags", verb, name, *words)
        after = self.chunks(name)
        self.assertEqual({k for k in before if k != b"free" and before[k] != after.get(k)} |
                         {k for k in after if k not in before and k != b"free"}, self.may_change, words)
        return before, after

    def test_one_field_of_an_aiff_file(self):
        random = Random(6)
        noise = bytes(random.randrange(1, 256) for _ in range(400))
        basic = struct.pack(">Ii5h", 3, 8, 57, 1, 6, 8, 1) + noise[:64] + b"tail"
        for version, count_at in ((1, 220), (2, 322)):
            head = bytearray(struct.pack(">I", version) + noise[:count_at - 2])
            for offset, text in ((4, b"Dr\xFCms\0behind"), (54, b"Kick"), (104, b"Jazz\0noise")):
                head[offset:offset + 50] = text.ljust(50, b"\0")
            category_body = bytes(head[:count_at]) + struct.pack(">H", 2) + b"Dry".ljust(50, b"\0") + \
                b"\xFCber".ljust(50, b"\0") + b"behind the descriptors"
            fields = [("beatCount=9", b"basc", 4, 8), ("key=C", b"basc", 8, 10), ("mode=both", b"basc", 10, 12),
                      ("signatureTop=3", b"basc", 12, 14), ("signatureBottom=4", b"basc", 14, 16),
                      ("loopFileType=2", b"basc", 16, 18), ("instrumentType=Bass", b"cate", 4, 54),
                      ("instrumentSubType=X", b"cate", 54, 104), ("genre=Rock", b"cate", 104, 154),
                      ("genre=", b"cate", 104, 154), ("instrumentType=", b"cate", 4, 54)]
            for word, chunk_id, start, end in fields:
                self.fresh_aiff((b"basc", basic), (b"cate", category_body), (b"AUTH", b"J\xFCrgen"),
                                (b"COMT", comments(b"one", b"two")))
                self.may_change = {chunk_id}
                before, after = self.edited("a.aiff", word)
                for body in (before[chunk_id], after[chunk_id]):
                    self.assertEqual(body[:start] + body[end:], before[chunk_id][:start] + before[chunk_id][end:], word)
            self.fresh_aiff((b"basc", basic), (b"cate", category_body))
            self.may_change = {b"cate"}
            before, after = self.edited("a.aiff", "descriptors=A,B,C")
            self.assertEqual(after[b"cate"][:count_at], before[b"cate"][:count_at])
            self.assertEqual(after[b"cate"][count_at:], struct.pack(">H", 3) + b"".join(
                text.ljust(50, b"\0") for text in (b"A", b"B", b"C")) + b"behind the descriptors")

    def test_chunks_of_unknown_layout_refuse_what_is_in_them_and_no_more(self):
        for body, said in ((category(b"Drums", version=3), "version 3"), (category(b"Drums")[:221], "cut short")):
            self.fresh_aiff((b"cate", body))
            self.assertIn(said, self.failure("tags", "set", "a.aiff", "genre=Rock"))
            self.may_change = {b"basc", b"NAME"}
            self.edited("a.aiff", "beatCount=8", "title=T")

    def test_comments_of_others_and_time_stamps(self):
        for texts, word, expected in (
                ((b"one", b"second!"), "comments=other", comments(b" other", b"second!")),
                ((b"one", b"second!"), "comments=odd", comments(b" odd", b"second!")),
                ((b"one", b"second!"), "comments=", comments(b"", b"second!")),
                ((b"one",), "comments=x", comments(b" x")[:10] + b" x" + bytes(8))):
            self.fresh_aiff((b"COMT", comments(*texts)), (b"NAME", b"\xFC"))
            self.may_change = {b"COMT"}
            self.assertEqual(self.edited("a.aiff", word)[1][b"COMT"], expected)
        self.may_change = {b"NAME"}
        self.edited("a.aiff", "title=T")

    def test_further_chunks_of_a_kind(self):
        for value in ("Me", "longer than what was there"):
            self.fresh_aiff((b"AUTH", b"One"), (b"AUTH", b"Two"), (b"CHST", b"strip"), (b"AUTH", b"Three"))
            self.set("a.aiff", "artist=" + value)
            listed = self.record("chunks", "a.aiff")["chunks"]
            content = (self.folder / "a.aiff").read_bytes()
            bodies = [content[chunk["offset"] + 8:][:chunk["size"]].decode() for chunk in listed
                      if chunk["id"] == "AUTH"]
            self.assertEqual(bodies, [value, "Two", "Three"])

    def test_pairs_of_a_caf_file(self):
        basic = [(b"genre", b"R,B"), (b"beat count", b"5000000000"), (b"tempo", b"120,5"), (b"\xFCber", b"caf\xE9"),
                 (b"key signature", b"Cb"), (b"time signature", b"4/0"), (b"category", b"Dr\xFCms"), (b"zz", b""),
                 (b"twice", b"1"), (b"twice", b"2")]
        info = [(b"artist", b"J\xFCrgen"), (b"year", b"1999"), (b"year", b"2000"), (b"\xE9", b"x"), (b"title", b"T")]
        for key in (b"key type", b"key signature"):  # a key without a type, a type without a key
            entries = [(b"key type", b"minor") if each[0] == b"key signature" and key == b"key type" else each
                       for each in basic]
            for word, name, text in (("subcategory=S", "instrumentSubType=S", b"S"), ("genre", "genre=Jazz", b"Jazz"),
                                     ("beat count", "beatCount=8", b"8"), ("key signature", "key=F#", b"F#"),
                                     ("time signature", "signature=3/4", b"3/4"), ("genre", "genre=", b"")):
                pair = word.split("=")[0].encode()
                self.write("b.caf", caf((b"uuid", BASIC_UUID + pairs(*entries, behind=b"rest")),
                                        (b"info", pairs(*info))))
                self.may_change = {BASIC_UUID}
                after = self.edited("b.caf", name)[1][BASIC_UUID]
                expected = [(k, text if k == pair else v) for k, v in entries if k != pair or text]
                if not any(k == pair for k, _ in entries):
                    expected.append((pair, text))
                self.assertEqual(after, pairs(*expected, behind=b"rest"), name)
        for word, entry in (("title=New", (b"title", b"New")), ("artist=Me", (b"artist", b"Me"))):
            self.write("b.caf", caf((b"uuid", BASIC_UUID + pairs(*basic)), (b"info", pairs(*info))))
            self.may_change = {b"info"}
            after = self.edited("b.caf", word)[1][b"info"]
            self.assertEqual(after, pairs(*[entry if each[0] == entry[0] else each for each in info]))

    def test_what_cannot_be_read_can_be_removed(self):
        self.fresh_aiff((b"AUTH", b"J\xFCrgen"), (b"cate", category(b"Dr\xFCms", b"Kick")), (b"trns", b"short"))
        self.may_change = {b"AUTH", b"cate", b"trns"}
        after = self.edited("a.aiff", "artist", "instrumentType", "transients", verb="remove")[1]
        self.assertEqual([after.get(b"AUTH"), after[b"cate"], after.get(b"trns")], [None, category(b"", b"Kick"), None])
        self.write("b.caf", caf((b"info", pairs((b"artist", b"J\xFCrgen"), (b"\xE9", b"x")))))
        self.may_change = {b"info"}
        self.assertEqual(self.edited("b.caf", verb="remove")[1][b"info"], pairs((b"\xE9", b"x")))

    def test_records_of_transients_that_stay(self):
        record = struct.pack(">HHI4I", 5, 6, 50, 1, 2, 3, 4)
        head = struct.pack(">hhhHI15I", 2, 40, 3, 9, 77, *range(15))
        self.fresh_aiff((b"trns", head + struct.pack(">I", 2) + struct.pack(">HHI16x", 1, 0, 7) + record + b"tail"))
        self.may_change = {b"trns"}
        after = self.edited("a.aiff", "transients=50,60")[1][b"trns"]
        self.assertEqual(after[:8] + after[12:72], head[:8] + head[12:])  # but the time of writing
        self.assertEqual(after[72:], struct.pack(">I", 2) + record + struct.pack(">HHI16x", 1, 0, 60) + b"tail")


class Losses(TagsTest):
    """A field that the other kind of file cannot hold costs nothing but itself."""

    def copied(self, source, target, *also):
        result = self.run_command("tags", "copy", source, target)
        return self.tags(target), result.stdout.decode()

    def test_caf_to_aiff(self):
        for comment, kept, said in ((b"white space behind \n", "white space behind", "white space around comments"),
                                    (b"long" * 20000, None, "comments longlong"),
                                    (b"J\xFCrgen", None, "no UTF-8")):
            self.write("b.caf", caf((b"uuid", BASIC_UUID + pairs((b"genre", b"Rock"), (b"category", b"x" * 50))),
                                    (b"info", pairs((b"comments", comment), (b"title", b"T")))))
            shutil.copy(MEDIA / "tone-16.aiff", self.folder / "a.aiff")
            self.run_command("tags", "remove", "a.aiff")
            shown, text = self.copied("b.caf", "a.aiff")
            self.assertEqual([shown.get(key) for key in ("genre", "title", "comments", "instrumentType")],
                             ["Rock", "T", kept, None])
            self.assertIn(said, text)
            result = self.run_command("decode", "b.caf", "-o", "c.aif", "--force")
            shown = self.tags("c.aif")
            self.assertEqual([shown.get(key) for key in ("genre", "title", "comments")], ["Rock", "T", kept])
            self.assertIn(said, result.stderr.decode())

    def test_aiff_to_caf(self):
        for chunk, said in (((b"COMT", comments(b"a\0b")), "NUL"), ((b"AUTH", b"J\xFCrgen"), "no UTF-8"),
                            ((b"cate", category(b"R,B", genre=b"Rock", descriptors=(b"A,B", b"Dry"))),
                             "descriptors A,B is not kept")):
            shutil.copy(MEDIA / "tone-16.aiff", self.folder / "a.aiff")
            self.run_command("tags", "remove", "a.aiff")
            aiff_with(self.folder / "a.aiff", (b"NAME", b"T"), chunk)
            self.write("b.caf", caf())
            shown, text = self.copied("a.aiff", "b.caf")
            self.assertEqual(shown.get("title"), "T")
            self.assertIn(said, text)
        self.assertEqual([shown.get(key) for key in ("genre", "descriptors", "instrumentType")], ["Rock", ["Dry"], None])

    def test_between_files_of_one_kind_bytes_are_copied(self):
        aiff_with(self.folder / "a.aiff", (b"AUTH", b"J\xFCrgen"), (b"cate", category(b"Dr\xFCms")))
        shutil.copy(MEDIA / "tone-16.aiff", self.folder / "b.aiff")
        self.run_command("tags", "copy", "a.aiff", "b.aiff")
        for chunk_id in ("AUTH", "cate"):
            self.assertEqual(*(self.run_command("chunks", "get", name, chunk_id).stdout for name in ("a.aiff", "b.aiff")))
        entries = pairs((b"key signature", b"Cb"), (b"time signature", b"4/0"), (b"genre", b"R,B"))
        self.write("a2.caf", caf((b"uuid", BASIC_UUID + entries)))
        self.write("b2.caf", caf())
        self.run_command("tags", "copy", "a2.caf", "b2.caf")
        self.assertEqual(self.run_command("chunks", "get", "b2.caf", "uuid").stdout[-len(entries):], entries)

    def test_fields_of_transients_are_copied(self):
        head = struct.pack(">hhhHI15I", 2, 40, 3, 0, 77, *bytes(15))
        aiff_with(self.folder / "a.aiff", (b"trns", head + struct.pack(">IHHI16x", 1, 1, 0, 7)))
        self.set("a.caf", "transients=7")
        self.run_command("tags", "copy", "a.aiff", "a.caf")
        body = self.run_command("chunks", "get", "a.caf", "uuid").stdout
        self.assertEqual(body[-32:], struct.pack(">IHHHHqHHQ", 0, 2, 0, 40, 3, 1, 1, 0, 7))
        self.assertEqual(self.lines("tags", "copy", "a.aiff", "a.caf"), ["a.caf: unchanged"])


class Outside(TagsTest):
    """What sox and ffmpeg see after each kind of edit: the samples and the information of others, unchanged."""
    OWN = ("title", "artist", "copyright", "comments")

    def setUp(self):
        super().setUp()
        entries = {"title": "Old", "artist": "Other", "year": "1999", "encoding application": "Sömething", "genre": "G"}
        pairs = b"".join(f"{key}\0{text}\0".encode() for key, text in entries.items())
        info = (b"info", struct.pack(">I", len(entries)) + pairs)
        self.write("i.caf", caf(info, (b"uuid", bytes(20))))
        self.write("j.caf", self.behind((self.folder / "i.caf").read_bytes(), info))
        self.files = [*SAMPLES, "i.caf", "j.caf"]
        self.before = {name: self.seen(name) for name in self.files}
        self.assertEqual(self.before["j.caf"][2]["year"], "1999")

    def behind(self, content, chunk):
        """The CAF file with a chunk behind the samples in the place of the one ahead of them."""
        header = chunk[0] + struct.pack(">q", len(chunk[1])) + chunk[1]
        return content.replace(header, b"") + header

    def seen(self, name):
        def run(*arguments):
            return subprocess.run(arguments, cwd=self.folder, capture_output=True, check=True).stdout
        probed = json.loads(run("ffprobe", "-v", "error", "-of", "json", "-show_format", "-show_streams", name))
        tags = {key.lower(): text for key, text in probed["format"].get("tags", {}).items()}
        stream = {key: probed["streams"][0].get(key) for key in ("codec_name", "sample_rate", "channels")}
        return (run("sox", name, "-t", "raw", "-"), run("ffmpeg", "-v", "error", "-i", name, "-f", "md5", "-"),
                {key: text for key, text in tags.items() if key not in (*self.OWN, "comment", "author")}, stream)

    def test_each_kind_of_edit(self):
        edits = [["set", "genre=Rock", "beatCount=8", "key=F#", "signature=3/4"], ["set", *Edits.ARGUMENTS],
                 ["set", "title=" + "long" * 500], ["set", "title=T"], ["set", "transients=1,2,3"],
                 ["remove", "genre", "artist"], ["remove", "title"], ["copy"], ["remove"]]
        self.write("from.caf", (self.folder / "i.caf").read_bytes())
        self.set("from.caf", "genre=Rock", "title=Copied", "transients=7,9")
        for edit, options in itertools.product(edits, ([], ["--in-place"])):
            first = ["from.caf"] if edit == ["copy"] else []
            self.run_command("tags", edit[0], *first, *self.files, *edit[1:], *options)
            for name in self.files:
                self.assertEqual(self.seen(name), self.before[name], (edit, options, name))


if __name__ == "__main__":
    unittest.main()
