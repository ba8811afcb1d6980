"""ktfiles meta: what files say about themselves, by field."""
import csv
import io
import json
import os
import random
import re
import struct
import subprocess
import unittest

from command import KTFILES, LIBRARY, CommandTest, caf, chunk, wave
import schemas

UMID = bytes.fromhex("060a2b340101010501010d2013aabbcc") + bytes(range(1, 17))


def bext(description=b"", version=2, time_reference=0, umid=UMID, loudness=(-2300, 500, -100, 0x7FFF, -2048), history=b""):
    texts = description.ljust(256, b"\0") + b"somebody".ljust(32, b"\0") + b"REF-1".ljust(32, b"\0")
    return (texts + b"2026-11-2210:44:00" + struct.pack("<QH", time_reference, version) + umid.ljust(64, b"\0") +
            struct.pack("<5h", *loudness) + bytes(180) + history)


def point(number, position):
    return struct.pack("<II4sIII", number, position, b"data", 0, 0, position)


IXML = """<?xml version="1.0" encoding="UTF-8"?><BWFXML><PROJECT> Fjällräv </PROJECT><TRACK_LIST><TRACK_COUNT>1</TRACK_COUNT>
<TRACK><NAME>Boom</NAME></TRACK></TRACK_LIST><A x="1"/><USER>a</USER><USER>b</USER></BWFXML>""".encode()
CART = (b"0101" + b"A title".ljust(64, b"\0") + bytes(64 * 6 + 10 + 8 + 10 + 8 + 64 * 3) + struct.pack("<i", -32768) +
        b"SEG1" + struct.pack("<I", 4800) + bytes(56 + 276) + b"http://x/".ljust(1024, b"\0") + b"text\r\n")
EVERYTHING = [
    chunk(b"bext", bext(b"It\xe9", time_reference=48000 * 3600, history=b"A=PCM,F=48000\r\n\r\nA=MPEG1L2\r\n\0")),
    chunk(b"iXML", IXML + b"\0\0"),
    chunk(b"LIST", b"adtl" + chunk(b"labl", struct.pack("<I", 9) + b"verse\0") + chunk(b"note", struct.pack("<I", 9) + b"loud\0") +
          chunk(b"ltxt", struct.pack("<II4sHHHH", 5, 240, b"rgn ", 0, 0, 0, 0) + b"all\0") + chunk(b"labl", struct.pack("<I", 7) + b"lost\0")),
    chunk(b"cue ", struct.pack("<I", 3) + point(5, 48) + point(9, 96)),
    chunk(b"LIST", b"INFO" + chunk(b"IART", b"Somebody\0") + chunk(b"IART", "Zoë\0".encode()) + chunk(b"ZzZz", b"x\0")),
    chunk(b"LIST", b"odd " + bytes(4)),
    chunk(b"smpl", struct.pack("<9I", 0, 0, 20833, 60, 0, 25, 0x01020304, 1, 0) + struct.pack("<6I", 9, 1, 10, 99, 0, 3)),
    chunk(b"inst", bytes([61, 0xCE, 6, 0, 127, 1, 127])),
    chunk(b"acid", struct.pack("<IHHfIHHf", 2, 62, 0x8000, 0, 8, 4, 3, 97.5)),
    chunk(b"cart", CART),
    chunk(b"chna", struct.pack("<HHH12s14s11sx", 1, 1, 1, b"ATU_00000001", b"AT_00010001_01", b"AP_00010001")),
    chunk(b"axml", b"<a><audioObject/><audioProgramme/><audioObject/></a>"),
    chunk(b"fact", struct.pack("<I", 100)), chunk(b"PEAK", struct.pack("<IIfI", 1, 0, 0.5, 24)),
    chunk(b"MD5 ", bytes(range(16))), chunk(b"_PMX", b"<x/>\0"), chunk(b"strc", bytes(40)), chunk(b"AbCd", b"to\1you"),
    chunk(b"bext", bext(b"again", version=0)), chunk(b"JUNK", bytes(9)),
]
FIELDS = {
    "bext.description": "It\xe9", "bext.originator": "somebody", "bext.originatorReference": "REF-1", "bext.originationDate": "2026-11-22",
    "bext.originationTime": "10:44:00", "bext.timeReference": 172800000, "bext.version": 2, "bext.umid": UMID.hex(),
    "bext.umidLabel": UMID[:12].hex(), "bext.umidInstance": "aabbcc", "bext.umidMaterial": UMID[16:].hex(), "bext.loudnessValue": -23.0,
    "bext.loudnessRange": 5.0, "bext.maxTruePeakLevel": -1.0, "bext.maxShortTermLoudness": -20.48,
    "bext.codingHistory[0]": "A=PCM,F=48000", "bext.codingHistory[1]": "A=MPEG1L2", "ixml.PROJECT": "Fjällräv",
    "ixml.TRACK_LIST.TRACK_COUNT": "1", "ixml.TRACK_LIST.TRACK[0].NAME": "Boom", "ixml.A.@x": "1", "ixml.USER[0]": "a", "ixml.USER[1]": "b",
    "cue[1].label": "verse", "cue[id 7].label": "lost", "cue[1].note": "loud", "cue[0].length": 240, "cue[0].purpose": "rgn ",
    "cue[0].text": "all", "cue[0].id": 5, "cue[0].position": 48, "cue[1].id": 9, "cue[1].position": 96, "cue.missing": 1,
    "info.IART": "Somebody", "info.IART[1]": "Zoë", "info.ZzZz": "x", "LIST": "6f64642000000000",
    "smpl.manufacturer": 0, "smpl.product": 0, "smpl.samplePeriod": 20833, "smpl.midiUnityNote": 60, "smpl.midiPitchFraction": 0,
    "smpl.smpteFormat": 25, "smpl.smpteOffset": "01:02:03:04", "smpl.loop[0].cueId": 9, "smpl.loop[0].type": 1, "smpl.loop[0].start": 10,
    "smpl.loop[0].end": 99, "smpl.loop[0].fraction": 0, "smpl.loop[0].playCount": 3, "inst.unshiftedNote": 61, "inst.fineTune": -50,
    "inst.gain": 6, "inst.lowNote": 0, "inst.highNote": 127, "inst.lowVelocity": 1, "inst.highVelocity": 127, "acid.flags": 2,
    "acid.rootNote": 62, "acid.beats": 8, "acid.meterNumerator": 3, "acid.meterDenominator": 4, "acid.tempo": 97.5,
    "acid.unknown": 0x8000, "acid.unknown2": 0.0, "cart.version": "0101", "cart.title": "A title", "cart.levelReference": -32768,
    "cart.timer[0].usage": "SEG1", "cart.timer[0].position": 4800, "cart.url": "http://x/", "cart.tagText": "text\r\n", "chna.tracks": 1,
    "chna.uids": 1, "chna.uid[0].track": 1, "chna.uid[0].uid": "ATU_00000001", "chna.uid[0].trackFormat": "AT_00010001_01",
    "chna.uid[0].packFormat": "AP_00010001", "axml": "1 audioProgramme, 2 audioObject", "fact.frames": 100, "peak.version": 1,
    "peak.timeStamp": 0, "peak.channel[0].value": 0.5, "peak.channel[0].position": 24, "md5": bytes(range(16))[::-1].hex(), "xmp": "<x/>",
    "strc": "00" * 32, "AbCd": b"to\1you".hex(), "bext[1].description": "again", "bext[1].originator": "somebody",
    "bext[1].originatorReference": "REF-1", "bext[1].originationDate": "2026-11-22", "bext[1].originationTime": "10:44:00",
    "bext[1].timeReference": 0, "bext[1].version": 0, "bext[1].reserved": UMID.hex(),  # of which version 0 knows nothing
}


class Meta(CommandTest):
    def fields(self, *arguments):
        return {item["field"]: item["value"] for item in self.record("meta", *arguments)["fields"]}

    def test_every_chunk_of_wave(self):
        self.write("a.wav", wave(*EVERYTHING))
        self.assertEqual(self.fields("a.wav"), FIELDS)
        items = {item["field"]: item for item in self.record("meta", "a.wav")["fields"]}
        offsets = {(item["id"], item["offset"]) for item in self.record("chunks", "a.wav")["chunks"]}
        self.assertEqual({(item["chunk"], item["offset"]) for item in items.values()} - offsets, set())
        self.assertEqual(items["cue[1].label"]["chunk"], "LIST")
        self.assertEqual(items["bext.description"]["encoding"], "ISO-8859-1")
        self.assertNotIn("encoding", items["info.IART[1]"])
        self.assertEqual((items["bext.timeReference"]["seconds"], items["smpl.loop[0].type"]["words"], items["info.IART"]["words"],
                          items["strc"]["size"], items["AbCd"]["ascii"]), (3600, "alternating", "Artist", 40, "to.you"))
        # Big-endian, in 64 bits, and what only a cut file holds.
        self.write("b.wav", b"RF64" + struct.pack("<I", 0xFFFFFFFF) + b"WAVE" + chunk(b"ds64", struct.pack("<QQQI", 5000, 200, 100, 0)) +
                   wave(*EVERYTHING)[12:])
        self.assertEqual(self.fields("b.wav"), FIELDS)
        self.write("c.wav", b"RIFX" + struct.pack(">I", 999) + b"WAVE" + chunk(b"fmt ", struct.pack(">HHIIHH", 1, 1, 8000, 16000, 2, 16), ">") +
                   chunk(b"cue ", struct.pack(">III4sIII", 1, 5, 48, b"data", 0, 0, 48), ">") + chunk(b"data", bytes(20), ">"))
        self.assertEqual(self.fields("c.wav"), {"cue[0].id": 5, "cue[0].position": 48})
        self.write("d.wav", wave(chunk(b"bext", bext(b"cut")))[:-200])
        self.assertEqual(set(self.fields("d.wav")), {"bext"})  # 402 bytes of it

    def test_forms_of_output(self):
        self.write("a.wav", wave(*EVERYTHING))
        lines = self.lines("meta", "a.wav")
        self.assertEqual(len(lines), len(FIELDS))
        for line in ("bext.timeReference\t172800000\t1:00:00.000", "bext.loudnessValue\t-23", "cart.tagText\ttext\\x0D\\x0A",
                     "AbCd\t6 bytes: 746f01796f75 |to.you|"):
            self.assertIn(line, lines)
        self.assertEqual(self.lines("meta", "a.wav", "a.wav", "--only", "FACT")[1], "a.wav\tfact.frames\t100\t0:00:00.002")
        self.assertEqual(list(self.fields("a.wav", "--only", "abcd,info")), ["info.IART", "info.IART[1]", "info.ZzZz", "AbCd"])
        for group in sorted({re.match(r"\w+", name)[0] for name in FIELDS}):  # as without it, from those chunks alone
            self.assertEqual(self.fields("a.wav", "--only", group),
                             {name: value for name, value in FIELDS.items() if re.match(r"\w+", name)[0] == group})
        rows = list(csv.DictReader(io.StringIO(self.run_command("meta", "--csv", "a.wav").stdout.decode(), newline="")))
        self.assertEqual([row["field"] for row in rows], list(FIELDS))
        self.assertEqual(next(row["value"] for row in rows if row["field"] == "cart.tagText"), "text\r\n")
        tree, status = self.on_terminal("meta", "a.wav", "--only", "smpl,bext,info", columns=80, NO_COLOR="1")
        self.assertEqual(status, 0)
        for line in ('  bext  "bext" at 244', "    description           It\xe9 [ISO-8859-1]", "    timeReference         172800000 (1:00:00.000)",
                     "    loudnessValue         -23 LUFS", "    IART Artist     Somebody", "    loop[0].end        99 (0:00:00.002)"):
            self.assertIn(line, tree.splitlines())
        for arguments in (["--only", "nonsense"], ["--only", "bext,"], ["--csv", "--json"]):
            self.failure("meta", "a.wav", *arguments, status=2)
        self.write("b.txt", b"no sound")
        self.assertEqual(len(self.json("meta", "a.wav", "b.txt", status=1)), 2)

    def test_aiff(self):
        marks = struct.pack(">HhI", 2, 1, 10) + b"\2in\0" + struct.pack(">hI", 2, 4000) + b"\3out"
        content = b"AIFF" + chunk(b"COMM", struct.pack(">hIh", 1, 100, 16) + bytes.fromhex("400bfa00000000000000"), ">") + b"".join(
            chunk(name, body, ">") for name, body in (
                (b"NAME", b"A n\x8ame"), (b"AUTH", b"me\0"), (b"(c) ", b"2026 me"), (b"ANNO", b"one"), (b"ANNO", b"two"),
                (b"COMT", struct.pack(">HIhH", 1, 3_786_912_000, 2, 4) + b"text"), (b"MARK", marks),
                (b"INST", struct.pack(">6bh3h3h", 60, -5, 0, 127, 1, 127, -6, 1, 1, 2, 0, 0, 0)), (b"AESD", bytes(24)),
                (b"APPL", b"stocdata"), (b"MIDI", b"\xf0\x7e\xf7"), (b"SSND", bytes(208)))
        )
        self.write("a.aiff", b"FORM" + struct.pack(">I", len(content)) + content)
        self.assertEqual(self.fields("a.aiff"), {
            "NAME": "A näme", "AUTH": "me", "(c)": "2026 me", "ANNO": "one", "ANNO[1]": "two", "comt[0].timeStamp": 3_786_912_000,
            "comt[0].marker": 2, "comt[0].text": "text", "mark[0].id": 1, "mark[0].position": 10, "mark[0].name": "in", "mark[1].id": 2,
            "mark[1].position": 4000, "mark[1].name": "out", "inst.baseNote": 60, "inst.detune": -5, "inst.lowNote": 0, "inst.highNote": 127,
            "inst.lowVelocity": 1, "inst.highVelocity": 127, "inst.gain": -6, "inst.sustainLoop.mode": 1, "inst.sustainLoop.beginMarker": 1,
            "inst.sustainLoop.begin": 10, "inst.sustainLoop.endMarker": 2, "inst.sustainLoop.end": 4000, "inst.releaseLoop.mode": 0,
            "aesd": "00" * 24, "appl.signature": "stoc", "appl.data": b"data".hex(), "midi": "f07ef7"})
        self.assertEqual(self.fields("a.aiff", "--only", "inst")["inst.sustainLoop.end"], 4000)  # which "MARK" says
        words = {item["field"]: item.get("words") for item in self.record("meta", "a.aiff")["fields"]}
        self.assertEqual(words["comt[0].timeStamp"], "2024-01-01T00:00:00Z")

    def test_id3_in_chunks(self):
        self.encoded("a.aiff", "-write_id3v2", "1", "-metadata", "title=Ein Täst", "-metadata", "artist=me")
        items = {item["field"]: item for item in self.record("meta", "a.aiff", "--only", "id3")["fields"]}
        if (LIBRARY.parent / "ktfiles/libktfiles-tags.so").exists():
            self.assertEqual((items["id3.TIT2"]["value"], items["id3.TPE1"]["value"], items["id3.TPE1"]["words"]), ("Ein Täst", "me", "ARTIST"))
            self.assertEqual(items["id3.TIT2"]["chunk"], "ID3 ")
            picture = b"\0image/png\0\3\0\x89PNG" + bytes(20 << 20)  # larger than any text is read
            frames = b"".join(name + struct.pack(">IH", len(body), 0) + body for name, body in ((b"TIT2", b"\3Title"), (b"APIC", picture)))
            self.write("b.wav", wave(chunk(b"id3 ", b"ID3\3\0\0" + bytes(len(frames) >> shift & 127 for shift in (21, 14, 7, 0)) + frames)))
            items = {item["field"]: item for item in self.record("meta", "b.wav")["fields"]}
            self.assertEqual((items["id3.TIT2"]["value"], items["id3.APIC"]["size"]), ("Title", 4 + (20 << 20)))
        bare, = json.loads(self.run_command("meta", "--json", "a.aiff", "--only", "id3", env=self.without_decoders()).stdout)
        item, = bare["fields"]
        self.assertEqual((item["ascii"][:3], item["chunk"]), ("ID3", "ID3 "))
        self.assertIn("install libktfiles-taglib", item["words"])

    def test_caf(self):
        marker = struct.pack(">4sdI4bII", b"rbeg", 44100.5, 7, 1, 2, 3, 4, 5, 2)
        texts = struct.pack(">IIqIq", 2, 7, 0, 8, 6) + "Takt\0\0".encode() + b"Teil\0"
        self.write("a.caf", caf(
            (b"info", struct.pack(">I", 2) + b"title\0A\0k\xe4y\0v\0"), (b"strg", texts), (b"mark", struct.pack(">II", 2, 1) + marker),
            (b"regn", struct.pack(">IIIII", 0, 1, 8, 3, 1) + marker),
            (b"inst", struct.pack(">f4Bf4I", 60, 0, 127, 1, 127, -6, 8, 0xFFFFFFFF, 0xFFFFFFFF, 7)), (b"edct", struct.pack(">I", 3)),
            (b"chan", struct.pack(">III", 6553601, 0, 0)), (b"peak", struct.pack(">IfQ", 3, 0.5, 50)), (b"umid", UMID),
            (b"uuid", bytes(range(16)) + b"abc"), (b"zzzz", b"")))
        mark = {"type": "rbeg", "position": 44100.5, "id": 7, "name": "Takt", "timecode": "01:02:03:04+5", "channel": 2}
        self.assertEqual(self.fields("a.caf"), {
            "info.title": "A", "info.k\xe4y": "v", "strg[0].id": 7, "strg[0].text": "Takt", "strg[1].id": 8, "strg[1].text": "Teil",
            "mark.timecodeType": 2, **{f"mark[0].{name}": value for name, value in mark.items()}, "regn.timecodeType": 0, "regn[0].id": 8,
            "regn[0].name": "Teil", "regn[0].flags": 3, **{f"regn[0].marker[0].{name}": value for name, value in mark.items()},
            "inst.baseNote": 60.0, "inst.lowNote": 0, "inst.highNote": 127, "inst.lowVelocity": 1, "inst.highVelocity": 127, "inst.gain": -6.0,
            "inst.startRegion": 8, "inst.instrumentId": 7, "edct.editCount": 3, "chan.layoutTag": 6553601, "chan.bitmap": 0,
            "peak.editCount": 3, "peak.channel[0].value": 0.5, "peak.channel[0].position": 50, "umid": UMID.hex(),
            "umid.label": UMID[:12].hex(), "umid.instance": "aabbcc", "umid.material": UMID[16:].hex(),
            "uuid.id": bytes(range(16)).hex(), "uuid.data": b"abc".hex(), "zzzz": ""})

    def test_tags_of_files_without_chunks(self):
        """As ffprobe reads them, under the keys of each system."""
        tags = ["-metadata", "title=Gänge", "-metadata", "track=3/9"]
        titles = {"mp3": "id3v2.TIT2", "flac": "vorbis.TITLE", "ogg": "vorbis.TITLE", "opus": "vorbis.TITLE", "m4a": "mp4.\xa9nam",
                  "wma": "asf.Title", "wv": "ape.title", "aac": "id3v2.TIT2", "mpc": "ape.Title", "dsf": "id3v2.TIT2"}
        for kind, field in titles.items():
            with self.subTest(kind=kind):
                name = f"a.{kind}"
                if kind == "mpc":
                    self.encoded("mpc.wav", seconds=0.2)
                    subprocess.run(["mpcenc", "--silent", "--tag", "Title=Gänge", "--tag", "Track=3/9", "mpc.wav", name], cwd=self.folder, check=True,
                                   capture_output=True, env={**os.environ, "LC_ALL": "C.UTF-8"})
                elif kind == "dsf":  # the tag of the MP3 behind the samples
                    tag = (self.folder / "a.mp3").read_bytes()[:4096]
                    size = 10 + sum((byte & 127) << shift for byte, shift in zip(tag[6:10], (21, 14, 7, 0)))
                    fmt = b"fmt " + struct.pack("<QIIIIIIQII", 52, 1, 0, 1, 1, 2822400, 1, 32768, 4096, 0)
                    sound = b"data" + struct.pack("<Q", 12 + 4096) + bytes(4096)
                    end = 28 + len(fmt) + len(sound)
                    self.write(name, b"DSD " + struct.pack("<QQQ", 28, end + size, end) + fmt + sound + tag[:size])
                else:
                    self.encoded(name, *tags, *(["-write_id3v2", "1"] if kind == "aac" else []), seconds=0.2)
                fields = self.fields(name)
                self.assertEqual(fields[field], "Gänge")
                self.assertIn("3/9", fields.values())
        self.assertEqual(self.run_command("meta", "-", stdin=(self.folder / "a.mp3").read_bytes(), status=0).stdout.splitlines()[0],
                         "id3v2.TIT2\tGänge".encode())
        self.assertEqual(self.fields("--only", "vorbis", "a.mp3"), {})
        self.write("text.mp3", b"no sound")
        self.assertIn("text.mp3: ", self.failure("meta", "text.mp3"))

    def test_damaged_files_are_read_or_refused(self):
        sources = [wave(*EVERYTHING), caf((b"strg", struct.pack(">I", 60) + struct.pack(">Iq", 1, 0) * 60 + b"a" * 900),
                                          (b"mark", struct.pack(">II", 0, 90) + struct.pack(">4sdI4bII", b"rbeg", 1, 1, 0, 0, 0, 0, 0, 0) * 30))]
        chance = random.Random(17)
        for i in range(120):
            content = bytearray(sources[i % 2])
            for _ in range(chance.choice((1, 3, 30))):
                content[chance.randrange(len(content))] = chance.choice((0, 1, 0x7F, 0x80, 0xFF))
            self.write(f"{i}.{'caf' if i % 2 else 'wav'}", content[:chance.choice((len(content), chance.randrange(len(content))))])
        result = subprocess.run([KTFILES, "meta", "--json", "."], capture_output=True, cwd=self.folder, timeout=60)
        self.assertIn(result.returncode, (0, 1), result.stderr)
        schemas.check(["meta", "--json"], result.stdout, "array")
        self.assertGreater(len(json.loads(result.stdout)), 60)
        # Texts that overlap are not put out again and again.
        entries = struct.pack(">I", 2000) + b"".join(struct.pack(">Iq", i, 0) for i in range(2000)) + b"a" * 100_000
        self.write("overlapping.caf", caf((b"strg", entries)))
        self.assertLess(len(self.run_command("meta", "overlapping.caf").stdout), 400_000)
        # Nor are lists read whose fields would fill the memory.
        self.write("long.wav", wave(chunk(b"cue ", struct.pack("<I", 90_000) + point(1, 2) * 90_000), EVERYTHING[0]))
        long = {item["field"]: item.get("size") for item in self.record("meta", "long.wav")["fields"]}
        self.assertEqual((long["cue"], "bext.description" in long), (4 + 24 * 90_000, True))


if __name__ == "__main__":
    unittest.main()
