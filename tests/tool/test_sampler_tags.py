"""Loops of WAVE, AIFC and AIFF files without loop chunks: what samplers and sequencers keep in theirs, judged by others."""
import json
import re
import struct
import subprocess
import unittest

from command import CommandTest, caf, chunk

FRAMES = 44100


def acid(flags=6, root=57, beats=8, meter=(6, 8), tempo=480.5, order="<"):
    return struct.pack(order + "IHHfIHHf", flags, root, 0x8000, 0, beats, meter[1], meter[0], tempo)


def smpl(note=60, loops=(), extra=b"", order="<"):
    body = struct.pack(order + "9I", 0, 0, 22675, note, 0, 0, 0, len(loops), len(extra))
    return body + b"".join(struct.pack(order + "6I", i, *loop) for i, loop in enumerate(loops)) + extra


def cues(*frames, order="<"):
    return struct.pack(order + "I", len(frames)) + b"".join(
        struct.pack(order + "II", i, frame) + (b"data" + struct.pack(order + "III", 0, 0, frame)) for i, frame in enumerate(frames))


def label(cue, text):
    return chunk(b"labl", struct.pack("<I", cue) + text + b"\0")


def loop_wave(*chunks, order="<", form=b"RIFF"):
    fmt = struct.pack(order + "HHIIHH", 1, 1, FRAMES, 2 * FRAMES, 2, 16)
    body = b"WAVE" + b"".join(chunk(*each, order) for each in ((b"fmt ", fmt), *chunks, (b"data", b"\1\2" * FRAMES)))
    return form + struct.pack(order + "I", len(body)) + body


def aifx(*chunks, form=b"AIFF"):
    comm = struct.pack(">hIh", 1, FRAMES, 16) + b"\x40\x0e\xac\x44" + bytes(6) + (b"NONE\0\0" if form == b"AIFC" else b"")
    body = form + b"".join(chunk(*each, ">") for each in ((b"COMM", comm), *chunks, (b"SSND", bytes(8 + 2 * FRAMES))))
    return b"FORM" + struct.pack(">I", len(body)) + body


def marks(*markers):
    return struct.pack(">H", len(markers)) + b"".join(
        struct.pack(">hIB", i + 1, frame, len(name)) + name + b"\0" * (1 - len(name) % 2) for i, (frame, name) in enumerate(markers))


ALL = [(b"acid", acid()), (b"smpl", smpl(62, [(0, 0, FRAMES - 1, 0, 0), (1, 10, 20, 0, 3)], b"even")), (b"inst", bytes([64, 0, 0, 0, 127, 1, 127])),
       (b"cue ", cues(0, 22050)), (b"LIST", b"adtl" + label(1, b"Break")),
       (b"LIST", b"INFO" + chunk(b"INAM", b"Caf\xe9\0") + chunk(b"IGNR", b"House\0") + chunk(b"IBPM", b"99\0"))]


class SamplerTags(CommandTest):
    def tags(self, name, content):
        self.write(name, content)
        return self.record("tags", name)

    def said(self, name, *chunks, **options):
        """What the tags say beside what is known of every file."""
        shown = self.tags(name, loop_wave(*chunks, **options))
        return {key: value for key, value in shown.items() if key not in ("path", "fileType", "containerName", "sampleRate", "frames",
                                                                        "durationSeconds", "sources", "key", "signature")}

    def test_others_read_the_same_in_wave(self):
        shown = self.tags("a.wav", loop_wave(*ALL))
        told = subprocess.run(["sndfile-info", "a.wav"], cwd=self.folder, capture_output=True, check=True).stdout.decode(errors="replace")
        for ours, theirs in ((shown["beatCount"], r"Beats +: (\d+)"), (f"0x{shown['midiRootNote']:02X}", r"Root note : (\w+)"),
                             (shown["signature"], r"Meter +: (\S+)"), (f"{shown['tempo']:f}", r"Tempo +: (\S+)")):
            self.assertEqual(str(ours), re.search(theirs, told).group(1), theirs)
        kinds = ("forward", "alternating", "backward")
        self.assertEqual([(loop["firstFrame"], loop["lastFrame"], loop["kind"], loop.get("playCount", 0)) for loop in shown["loops"]],
                         [(int(first), int(last), kinds[int(kind)], int(count)) for kind, first, last, count in re.findall(
                             r"Type : +(\d+) +Start : +(\d+) +End : +(\d+) .*Count : +(\d+)", told)])
        self.assertEqual([str(marker["frame"]) for marker in shown["markers"]], re.findall(r"Blk Start : \d+ +Offset : +(\d+)", told))
        other, = json.loads(subprocess.run(["exiftool", "-j", "-n", "a.wav"], cwd=self.folder, capture_output=True, check=True).stdout)
        self.assertEqual([shown[key] for key in ("beatCount", "midiRootNote", "tempo", "title", "genre")],
                         [other[key] for key in ("Beats", "RootNote", "Tempo", "Title", "Genre")])
        self.assertEqual({key: shown["sources"][key] for key in ("tempo", "midiRootNote", "title")},
                         {"tempo": "acid", "midiRootNote": "acid", "title": "LIST INFO"})
        self.assertEqual([marker.get("name") for marker in shown["markers"]], [None, "Break"])
        text, _ = self.on_terminal("tags", "a.wav", NO_COLOR="1")
        for line in ("Tempo         480.5 BPM  [acid]", "Key           A  [acid]", "Genre         House  [LIST INFO]", "Loop points   2  [smpl]"):
            self.assertIn(f"  {line}\n", text)
        self.assertIn("markers\t0, 22050 Break", self.lines("tags", "a.wav"))

    def test_who_is_heard(self):
        whole = [(0, 0, FRAMES - 1, 0, 0)]
        for chunks, expected in (
                ([(b"acid", acid(flags=1))], {"loopFileType": 2}),  # played once: beats and tempo mean nothing
                ([(b"acid", acid(flags=0)), (b"smpl", smpl(60))], {"loopFileType": 1, "beatCount": 8, "signatureTop": 6, "signatureBottom": 8, "tempo": 480.5}),
                ([(b"smpl", smpl(60)), (b"inst", bytes([64] + [0] * 6))], {"midiRootNote": 60}),
                ([(b"inst", bytes([64] + [0] * 6))], {"midiRootNote": 64}),
                ([(b"acid", acid(tempo=float("nan"), meter=(0, 4)))], {"loopFileType": 1, "beatCount": 8, "midiRootNote": 57, "tempo": 480.0}),
                ([(b"LIST", b"INFO" + chunk(b"IBPM", b" 99.5 \0"))], {"tempo": 99.5}),
                ([(b"acid", acid()[:20]), (b"smpl", b"x"), (b"cue ", b""), (b"inst", b"123456"), (b"LIST", b"IN")], {}),
                ([(b"smpl", smpl(200, [(9, 20, 10, 0, 0)]))], {})):
            self.assertEqual(self.said("b.wav", *chunks), expected, chunks)
        self.assertEqual(self.said("x.wav", (b"acid", acid(order=">")), (b"smpl", smpl(60, whole, order=">")), order=">", form=b"RIFX")["loops"],
                         [{"firstFrame": 0, "lastFrame": FRAMES - 1, "kind": "forward", "source": "smpl"}])

    def test_aiff_and_aifc(self):
        chunks = [(b"MARK", marks((0, b"in"), (22050, b"out"), (30000, b"end\x8a"))),
                  (b"INST", struct.pack(">6bh6h", 57, 0, 0, 127, 1, 127, 0, 2, 1, 2, 0, 0, 0)), (b"NAME", b"Caf\x8e")]
        for name, form in (("a.aiff", b"AIFF"), ("a.aifc", b"AIFC")):
            shown = self.tags(name, aifx(*chunks, form=form))
            self.assertEqual((shown["key"], shown["sources"]["midiRootNote"]), ("A", "INST"))
            self.assertEqual(shown["loops"], [{"firstFrame": 0, "lastFrame": 22049, "kind": "alternating", "source": "INST"}])
            self.assertEqual([(each["frame"], each["name"]) for each in shown["markers"]], [(0, "in"), (22050, "out"), (30000, "endä")])
        self.assertEqual(shown["title"], "Café")  # of AIFF texts the chunks manager reads UTF-8 only
        # Loop chunks are heard first, and an edit does not mix the others in.
        self.run_command("tags", "set", "a.aiff", "key=C", "genre=Rock")
        shown = self.record("tags", "a.aiff")
        self.assertEqual((shown["key"], shown["sources"]["midiRootNote"], len(shown["loops"])), ("C", "basc", 1))
        self.run_command("tags", "remove", "a.aiff")
        self.assertEqual(self.record("tags", "a.aiff")["key"], "A")

    def test_what_scan_takes_for_a_loop(self):
        (self.folder / "lib").mkdir()
        for name, isLoop, chunks in (("acid", True, ALL[:1]), ("once", False, [(b"acid", acid(flags=1)), ALL[1]]), ("plain", False, ALL[2:]),
                                     ("whole", True, [(b"smpl", smpl(60, [(0, 100, FRAMES - 2, 0, 0)]))]),
                                     ("held note", False, [(b"smpl", smpl(60, [(0, 20000, 30000, 0, 0)]))]),
                                     ("no beats", False, [(b"acid", acid(beats=0))])):
            self.write(f"lib/{name}.wav", loop_wave(*chunks))
            self.assertEqual([item["path"] for item in self.json("scan", "lib")], [f"lib/{name}.wav"] if isLoop else [], name)
            (self.folder / f"lib/{name}.wav").rename(self.folder / name)
        self.write("lib/i.aifc", aifx((b"MARK", marks((0, b""), (FRAMES, b""))), (b"INST", struct.pack(">6bh6h", 57, *[0] * 6, 1, 1, 2, 0, 0, 0)), form=b"AIFC"))
        self.write("lib/bad.wav", b"no sound")
        result = self.run_command("scan", "lib", status=1)
        self.assertEqual(result.stdout, b"lib/i.aifc\tAIFC\t\t\tA\t\t\t\t\t\n")
        self.assertIn(b"lib/bad.wav: no audio", result.stderr)

    KEYS = ("tempo", "beatCount", "midiRootNote", "signature", "loopFileType")

    def of_loop(self, name):
        shown = self.record("tags", name)
        return [shown.get(key) for key in self.KEYS]

    def chunk(self, name, chunk_id):
        return self.run_command("chunks", "get", name, chunk_id).stdout

    def test_copies_there_and_back(self):
        self.write("a.aiff", aifx())
        self.write("b.caf", caf(samples=bytes(2 * FRAMES)))
        self.write("c.wav", loop_wave())
        self.run_command("tags", "set", "a.aiff", "key=A minor", "beats=4", "signature=3/4", "genre=Rock", "transients=5")
        copied = self.run_command("tags", "copy", "a.aiff", "c.wav").stdout.decode()
        self.assertIn('keyType, genre, transients are not kept: "acid" and "smpl"', copied)
        self.assertEqual(self.of_loop("c.wav"), self.of_loop("a.aiff"))
        self.assertIn("Root note : 0x39", subprocess.run(["sndfile-info", "c.wav"], cwd=self.folder, capture_output=True).stdout.decode())
        other, = json.loads(subprocess.run(["exiftool", "-j", "-n", "c.wav"], cwd=self.folder, capture_output=True, check=True).stdout)
        self.assertEqual([other[key] for key in ("Beats", "RootNote", "Tempo", "MIDIUnityNote", "NumSampleLoops")], [4, 57, 240, 57, 1])
        self.assertEqual(self.lines("tags", "copy", "a.aiff", "c.wav")[0].split(";")[0], "c.wav: unchanged")
        self.run_command("tags", "copy", "c.wav", "b.caf")
        self.run_command("tags", "remove", "a.aiff")
        self.run_command("tags", "copy", "b.caf", "a.aiff")
        self.assertEqual(self.of_loop("a.aiff"), self.of_loop("c.wav"))
        self.assertEqual(self.of_loop("b.caf")[1:4], self.of_loop("c.wav")[1:4])
        # Roots of other octaves are keys; what follows from beats and length is told where it was stated otherwise.
        self.write("d.wav", loop_wave((b"acid", acid(tempo=100)), *ALL[1:]))
        self.write("e.wav", loop_wave((b"smpl", smpl(74)), (b"LIST", b"INFO" + chunk(b"INAM", b"Flute\0"))))
        told = self.run_command("tags", "copy", "d.wav", "a.aiff").stdout.decode()
        self.assertIn("the tempo 100 is not kept: beats and length make 480; loop points are not kept; markers are not kept", told)
        self.assertIn("the root note 74 is kept as the key D, 50", self.run_command("tags", "copy", "e.wav", "a.aiff").stdout.decode())
        self.assertEqual((self.record("tags", "a.aiff")["key"], self.record("tags", "a.aiff")["title"]), ("D", "Flute"))

    def test_fields_that_are_not_named_stay_in_acid_and_smpl(self):
        self.write("a.aiff", aifx())
        self.run_command("tags", "set", "a.aiff", "key=C#")
        sampler, cue = smpl(62, [(1, 7, 99, 5, 3)], b"maker's own") + b"behind", cues(1, 2)
        self.write("b.wav", loop_wave((b"acid", acid(flags=0x1C) + b"more"), (b"cue ", cue), (b"smpl", sampler)))
        before = self.record("info", "b.wav", "--md5")
        self.run_command("tags", "copy", "a.aiff", "b.wav")
        self.assertEqual(self.chunk("b.wav", "acid"), acid(flags=0x1E, root=49) + b"more")
        self.assertEqual(self.chunk("b.wav", "smpl"), smpl(49, [(1, 7, 99, 5, 3)], b"maker's own") + b"behind")
        self.assertEqual(self.chunk("b.wav", "cue "), cue)
        self.assertEqual(self.record("info", "b.wav", "--md5")["md5"], before["md5"])
        for broken in ((b"acid", b"short"), (b"smpl", b"short")):
            content = self.write("c.wav", loop_wave((b"acid", acid()), broken) if broken[0] == b"smpl" else loop_wave(broken)).read_bytes()
            self.assertIn("is cut short", self.failure("tags", "copy", "a.aiff" if broken[0] == b"smpl" else "b.wav", "c.wav"))
            self.assertEqual((self.folder / "c.wav").read_bytes(), content)

    def test_decode_carries_them(self):
        self.write("a.aiff", aifx())
        self.run_command("tags", "set", "a.aiff", "key=A", "beats=4", "signature=3/4", "title=Ten")
        self.run_command("decode", "a.aiff", "-o", "b.wav", "--rate", "22050")
        self.assertEqual(self.of_loop("b.wav"), self.of_loop("a.aiff"))
        shown = self.record("tags", "b.wav")
        self.assertEqual((shown["loops"][0]["lastFrame"], shown["title"]), (22049, "Ten"))
        self.run_command("decode", "b.wav", "-o", "c.caf")
        self.assertEqual(self.of_loop("c.caf"), self.of_loop("a.aiff"))
        # The root note of an instrument's sample makes no loop of it.
        self.write("d.wav", loop_wave((b"smpl", smpl(62, [(0, 100, 199, 0, 0)])), ALL[-1]))
        self.run_command("decode", "d.wav", "-o", "d.aiff")
        self.assertEqual(self.of_loop("d.aiff"), [None] * 5)
        self.run_command("decode", "d.wav", "-o", "e.wav", "--rate", "22050")
        shown = self.record("tags", "e.wav")
        self.assertEqual((shown["midiRootNote"], [(loop["firstFrame"], loop["lastFrame"]) for loop in shown["loops"]]), (62, [(50, 99)]))
        # A genre goes with the loop's tags into AIFF, which has no text for it.
        for name, head, left in (("f.wav", [(b"acid", acid())], "of its texts album is not"), ("g.wav", [], "of its texts genre, album are not")):
            self.write(name, loop_wave(*head, (b"LIST", b"INFO" + chunk(b"IGNR", b"Blues\0") + chunk(b"IPRD", b"LP\0"))))
            self.assertIn(left, self.run_command("decode", "--force", name, "-o", "f.aiff").stderr.decode())
            self.assertEqual(self.record("tags", "f.aiff").get("genre"), "Blues" if head else None)
        self.run_command("decode", "a.aiff", "-o", "part.wav", "--end", "100")
        self.assertEqual(self.of_loop("part.wav"), [None] * 5)


if __name__ == "__main__":
    unittest.main()
