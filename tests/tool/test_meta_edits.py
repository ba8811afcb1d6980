"""ktfiles meta set and remove: fields as other programs read them, and that nothing that is not named is ever lost."""
import json
import resource
import signal
import struct
import subprocess
import unittest

from command import KTFILES, CommandTest, caf, chunk, wave
from test_meta import CART, IXML, UMID, bext, point

INFO = b"INFO" + chunk(b"IART", b"Somebody\0") + chunk(b"ZzZz", b"kept\0\0") + chunk(b"IART", b"Other\0") + chunk(b"ISFT", b"x\0")
ADTL = b"adtl" + b"".join(chunk(name, struct.pack("<I", 9) + text) for name, text in ((b"labl", b"verse\0"), (b"note", b"loud\0"), (b"file", b"x")))
CUES = struct.pack("<I", 2) + point(5, 48) + point(9, 96)
SAMPLER = struct.pack("<9I", 0, 0, 20833, 60, 0, 25, 0, 1, 3) + struct.pack("<6I", 9, 1, 10, 90, 0, 3) + b"abc"
ACID = struct.pack("<IHHfIHHf", 0, 62, 0x8000, 0, 8, 4, 3, 97.5)


def aiff(*chunks):
    content = b"AIFF" + chunk(b"COMM", struct.pack(">hIh", 1, 100, 16) + bytes.fromhex("400bfa00000000000000"), ">") + b"".join(
        chunk(name, body, ">") for name, body in (*chunks, (b"SSND", bytes(208))))
    return b"FORM" + struct.pack(">I", len(content)) + content


class MetaEdits(CommandTest):
    def fields(self, *arguments):
        return {item["field"]: item["value"] for item in self.record("meta", *arguments)["fields"]}

    def changes(self, *arguments):
        """What an edit says that it changed, by field."""
        return {change["field"]: (change.get("from"), change.get("to")) for change in self.record("meta", *arguments)["changes"]}

    def body(self, name, chunk_id, index=0):
        """The bytes of a chunk, found by the tests themselves."""
        content, found = (self.folder / name).read_bytes(), []
        is_caf, order = content[:4] == b"caff", ">" if content[:4] == b"FORM" else "<"
        at = 8 if is_caf else 12
        while at + 8 <= len(content):
            size, = struct.unpack_from(">q" if is_caf else order + "I", content, at + 4)
            body = at + (12 if is_caf else 8)
            if content[at:at + 4] == chunk_id:
                found.append(content[body:body + size])
            at = body + size + (0 if is_caf else size & 1)
        return found[index]

    def test_bext_fields_change_alone_and_in_place(self):
        history = b"A=PCM,F=48000\r\n\nA=MPEG1L2\r\n" + bytes(5) + b"tail"
        before = bext(b"old", time_reference=7, history=history)
        path = self.write("a.wav", wave(chunk(b"bext", before), chunk(b"note", b"odd"), chunk(b"bext", bext(b"second"))))
        original = path.read_bytes()
        umid = UMID[:12] + b"\x33" + UMID[13:] + bytes(range(32))
        cases = [  # field, value, as it is read, where its bytes stand, the bytes
            ("description", "Take 2\nloud", "Take 2\nloud", 0, b"Take 2\nloud".ljust(256, b"\0")),
            ("originator", "x" * 32, "x" * 32, 256, b"x" * 32), ("originatorReference", "REF", "REF", 288, b"REF".ljust(32, b"\0")),
            ("originationDate", "2024-02-29", "2024-02-29", 320, b"2024-02-29"), ("originationTime", "23:59:59", "23:59:59", 330, b"23:59:59"),
            ("timeReference", "01:00:00:00@25", 172800000, 338, struct.pack("<Q", 172800000)),
            ("timeReference", "5000000000", 5000000000, 338, struct.pack("<Q", 5000000000)),
            ("timeReference", "1:00:00.5", 172824000, 338, struct.pack("<Q", 172824000)),
            ("timeReference", "01:00:00;00@29.97", 172799827, 338, struct.pack("<Q", 172799827)),  # 107,892 pictures
            ("timeReference", "01:00:00:00@23.976", 172972800, 338, struct.pack("<Q", 172972800)),
            ("umid", "0x" + umid.hex(), umid.hex(), 348, umid), ("loudnessValue", "-23.45", -23.45, 412, struct.pack("<h", -2345)),
            ("loudnessRange", "", None, 414, b"\xff\x7f"), ("maxTruePeakLevel", "+1.5", 1.5, 416, struct.pack("<h", 150)),
            ("codingHistory[1]", "A=PCM,W=1", "A=PCM,W=1", 618, b"A=PCM,W=1"),
        ]
        for field, value, shown, at, stored in cases:
            with self.subTest(field, value=value):
                path.write_bytes(original)
                self.run_command("meta", "set", "--in-place", "a.wav", f"bext.{field}={value}")
                expected = bytearray(original)
                start = original.index(before) + at
                expected[start:start + len(stored)] = stored
                self.assertEqual(path.read_bytes(), bytes(expected))
                self.assertEqual(self.fields("a.wav").get("bext." + field), shown)
        path.write_bytes(original)
        self.run_command("meta", "set", "a.wav", "bext.codingHistory[new]=A=MP3", "bext[1].originator=two")
        self.assertEqual(self.body("a.wav", b"bext"), before[:602] + b"A=PCM,F=48000\r\n\nA=MPEG1L2\r\nA=MP3\r\n" + bytes(5) + b"tail")
        self.assertEqual(self.fields("a.wav")["bext[1].originator"], "two")
        self.run_command("meta", "remove", "a.wav", "bext.codingHistory[1]", "bext.description", "bext[1]")
        self.assertEqual(self.body("a.wav", b"bext"), bytes(256) + before[256:602] + b"A=PCM,F=48000\r\n\nA=MP3\r\n" + bytes(5) + b"tail")
        self.assertNotIn("bext[1].version", self.fields("a.wav"))
        self.assert_no_litter("a.wav")

    def test_what_the_standard_does_not_allow_is_refused_before_anything_is_written(self):
        path = self.write("a.wav", wave(chunk(b"bext", bext(b"old", version=1, loudness=(0,) * 5)), chunk(b"cue ", CUES), chunk(b"smpl", SAMPLER),
                                        chunk(b"iXML", IXML)))
        original = path.read_bytes()
        usage = [  # assignment, what is said, whether --lenient takes it
            ("bext.description=" + "x" * 257, "at most 256 bytes fit, these are 257", False), ("bext.description=Zoë", "ASCII", True),
            ("bext.originator=a\nb", "on one line", True), ("bext.originationDate=2026-02-30", "a date of the calendar", True),
            ("bext.originationTime=24:00:00", "a time such as", True), ("bext.umid=0011", "32 or 64 bytes", False),
            ("bext.umid=" + "11" * 32, "begins with 060a2b34", True), ("bext.loudnessValue=-100", "from -99.99 to 99.99", False),
            ("bext.loudnessValue=nan", "from -99.99", False), ("bext.version=3", "from 0 to 2", False),
            ("bext.timeReference=01:00:00:00", "needs its pictures a second", False), ("bext.timeReference=-1", "frames such as", False),
            ("bext.timeReference=00:01:00;00@29.97", "no such drop-frame code", False), ("bext.timeReference=00:00:00:25@25", "a time code such as", False),
            ("bext.timeReference=00:00:00;00@25", "only 29.97 and 59.94", False), ("bext.descripton=x", 'did you mean "bext.description"?', False),
            ("cue[0].lable=x", 'did you mean "cue[N].label"?', False), ("inst.gain=3", "inst is only read", False), ("acid.tempo=fast", "a number from", False),
            ("bext[new].originator=x", '"new" is no index here; [0] is the first', False), ("cue[x].label=x", '"x" is no index', False),
            ("smpl.loop[newer].start=1", '"newer" is no index', False), ("cue[new]=", '"new" is no index', False),
            ("smpl.midiUnityNote=128", "from 0 to 127", False), ("iart=x", 'did you mean "info.IART"?', False),
            ("bext.originator=" + "é" * 99, "é" * 30 + "…: ASCII", False), ("cue[0]=3", "cannot be set, only removed", False),
        ]
        files = [  # of one file
            ("cue[2].label=x", "the last is [1]; [new] adds one", False), ("cue[new].label=x", "a new point needs its position", False),
            ("cue[0].position=101", "the sound ends at frame 100", True), ("cue[0].id=9", "another point has this id", False),
            ("smpl.loop[0].end=5", "its frames would be 10 to 5", True), ("smpl.loop[new].start=5", "needs its start and its end", False),
            ("info.IARTT=x", 'did you mean "IART"?', False), ("info.XXXX=x", "no registered id", True), ("mark[0].name=x", "no field of WAVE files", False),
            ("ixml.USER=x", "there are 2, ixml.USER[0] to [1]", False), ("ixml.TRACK_LIST=x", "it holds elements", False),
            ("ixml.1x=x", "can be no name of an element", False), ("ixml.PROJECT=\x01", "no control characters", False),
            ("bext[2].originator=x", "the last is bext[0]", False), ("cart[1].title=x", "it has no cart", False), ("cue[id 7].label=x", "no point of this id", False),
            ("cue[0].position=", "always there; what goes is cue[0]", False),
        ]
        for assignment, text, is_lenient in usage + files:
            with self.subTest(assignment):
                status = 2 if (assignment, text, is_lenient) in usage else 1
                self.assertIn(text, self.failure("meta", "set", "a.wav", "info.INAM=first", assignment, status=status))
                self.assertEqual(path.read_bytes(), original)
                self.run_command("meta", "set", "--lenient", "--dry-run", "a.wav", assignment, status=0 if is_lenient else status)
        for arguments in (["bext.version=1", "bext.loudnessValue=-23"], ["bext.version=0", "bext.originator=x"]):
            self.assertIn("version", self.failure("meta", "set", "a.wav", *arguments))
        for arguments in (["set", "a.wav"], ["remove", "a.wav"], ["remove", "a.wav", "bext.descr"], ["set", "a.wav", "bext.version=1", "bext.version=2"]):
            self.failure("meta", *arguments, status=2)
        self.assertEqual(path.read_bytes(), original)

    def test_files_of_other_kinds_are_only_read(self):
        self.encoded("a.wav")
        for name, *arguments in (["a.mp3"], ["a.flac"], ["a.ogg"], ["a.opus"], ["a.m4a"], ["a.wv"], ["a.tta"], ["a.wma"], ["a.aac"], ["a.w64"], ["a.au"]):
            subprocess.run(["ffmpeg", "-v", "error", "-i", "a.wav", name], check=True, cwd=self.folder)
        self.write("a.ape", b"MAC \x96\x0f" + bytes(200))
        self.write("x.wav", b"RIFX" + struct.pack(">I", 28) + b"WAVE" + chunk(b"fmt ", struct.pack(">HHIIHH", 1, 1, 8000, 16000, 2, 16), ">") + chunk(b"data", b""))
        self.write("a.rx2", b"CAT \0\0\0\x0cREX2HEAD" + bytes(4))
        (self.folder / "mp3").write_bytes((self.folder / "a.mp3").read_bytes())
        for path in sorted(self.folder.iterdir()):
            content = path.read_bytes()
            if path.name != "a.wav":
                with self.subTest(path.name):
                    self.assertEqual(self.failure("meta", "set", path.name, "info.IART=x").strip(), f"ktfiles: {path.name}: metadata of its kind of file is only "
                                     "read; that of WAVE, RF64, BW64, AIFF, AIFC and CAF files is edited")
                    self.assertEqual(path.read_bytes(), content)
        self.assertIn("id3v2 is only read", self.failure("meta", "set", "a.mp3", "id3v2.TIT2=x", status=2))
        self.write("c.txt", b"no sound")
        self.assertIn("no audio", self.failure("meta", "set", "c.txt", "info.IART=x"))

    def test_what_is_said_of_a_point_follows_its_id_and_goes_with_it(self):
        def said(verse, other=9):
            """Of two points: names, remarks, ranges, a file, a playlist, and loops."""
            items = lambda i: chunk(b"ltxt", struct.pack("<II4s8x", i, 4, b"rgn ")) + chunk(b"file", struct.pack("<II", i, 0) + b"x")
            texts = lambda i: chunk(b"labl", struct.pack("<I", i) + b"verse\0") + chunk(b"note", struct.pack("<I", i) + b"n\0")
            return (b"adtl" + texts(verse) + items(verse) + texts(other), struct.pack("<10I", 3, verse, 4, 1, other, 5, 1, verse, 6, 2),
                    SAMPLER[:28] + struct.pack("<2I", 2, 0) + struct.pack("<12I", verse, 1, 10, 90, 0, 3, other, 1, 10, 90, 0, 3))

        def content(points, adtl, plst, smpl):
            return wave(chunk(b"cue ", points), chunk(b"LIST", adtl), chunk(b"plst", plst), chunk(b"smpl", smpl))
        path = self.write("a.wav", content(CUES, *said(5)))
        changes = self.changes("set", "a.wav", "--in-place", "cue[0].id=7")
        self.assertEqual(path.read_bytes(), content(struct.pack("<I", 2) + point(7, 48) + point(9, 96), *said(7)))
        self.assertEqual(changes, {"cue[0].id": (5, 7), "cue.file": (struct.pack("<II", 5, 0).hex() + "78", struct.pack("<II", 7, 0).hex() + "78"), "smpl.loop[0].cueId": (5, 7), "plst.segment[0].cueId": (5, 7), "plst.segment[2].cueId": (5, 7)})
        # A loop that a step names is as that says.
        path.write_bytes(content(CUES, *said(5)))
        self.assertEqual(self.changes("set", "a.wav", "cue[0].id=7", "smpl.loop[0].cueId=5")["cue[0].id"], (5, 7))
        self.assertEqual(self.fields("a.wav")["smpl.loop[0].cueId"], 5)
        # Removed: names, remarks, range, segments; the loop has places of its own, and nobody sees the file in the list.
        path.write_bytes(content(CUES, *said(5)))
        changes = self.changes("remove", "a.wav", "cue[0]")
        self.assertEqual({name for name in changes if name.startswith("cue")},
                         {"cue[0].id", "cue[0].position", "cue[0].label", "cue[0].note", "cue[0].length", "cue[0].purpose"} | {"cue[0].playlistPosition"} & set(changes))
        self.assertIn("plst.segment[2].cueId", changes)
        adtl, plst, smpl = said(5)
        self.assertEqual([self.body("a.wav", name) for name in (b"LIST", b"plst", b"smpl")],
                         [adtl[:4] + chunk(b"file", struct.pack("<II", 5, 0) + b"x") + adtl[-32:], struct.pack("<4I", 1, 9, 5, 1), smpl])
        # A new point takes no id that something stray is said of, and none is made one of it.
        self.write("a.wav", content(struct.pack("<I", 1) + point(4, 48), *said(5, 6)))
        self.run_command("meta", "set", "a.wav", "cue[new].position=3")
        self.assertEqual(self.fields("a.wav")["cue[1].id"], 7)
        self.run_command("meta", "set", "a.wav", "cue[1].id=5")  # nothing was said of 7, so that what is said of 5 finds its point
        self.assertEqual(self.fields("a.wav")["cue[1].label"], "verse")
        self.assertIn("remove cue[id 6] first", self.failure("meta", "set", "a.wav", "cue[1].id=6"))
        self.run_command("meta", "remove", "a.wav", "cue[id 6]")
        self.run_command("meta", "set", "a.wav", "cue[1].id=6")
        # Of two points of one id the first is meant, as it is shown.
        for verb, left in ((["remove", "cue[1]"], "verse"), (["remove", "cue[0]"], None), (["set", "cue[1].id=8"], "verse")):
            self.write("a.wav", content(struct.pack("<I", 2) + point(5, 48) + point(5, 96), *said(5)))
            self.run_command("meta", verb[0], "a.wav", verb[1])
            self.assertEqual(self.fields("a.wav").get("cue[0].label"), left, verb)
        # Of AIFF: comments, and the loops of "INST".
        marks = struct.pack(">HhI", 2, 1, 10) + b"\2in\0" + struct.pack(">hI", 2, 40) + b"\3out"
        chunks = (b"COMT", struct.pack(">HIhH", 1, 9, 2, 2) + b"hi"), (b"INST", bytes([60, 0, 0, 127, 1, 127]) + struct.pack(">7h", 0, 1, 1, 2, 0, 2, 2))
        self.write("a.aiff", aiff((b"MARK", marks), *chunks))
        self.assertEqual(self.changes("set", "a.aiff", "mark[1].id=7"), {"mark[1].id": (2, 7), "comt[0].marker": (2, 7), "inst.sustainLoop.endMarker": (2, 7)})
        self.assertEqual(self.body("a.aiff", b"INST")[8:], struct.pack(">6h", 1, 1, 7, 0, 2, 2))
        for names in (["mark[1]"], ["mark"]):
            self.write("b.aiff", (self.folder / "a.aiff").read_bytes())
            changes = self.changes("remove", "b.aiff", *names)
            self.assertEqual((changes["inst.sustainLoop.mode"], changes["comt[0].marker"][0]), ((1, 0), 7), changes)

    def test_versions_of_bext_follow_its_fields(self):
        self.write("a.wav", wave())
        self.assertEqual(self.changes("set", "a.wav", "bext.originator=me"), {"bext.originator": (None, "me"), "bext.version": (None, 1),
                                                                            "bext.timeReference": (None, 0)})
        self.assertEqual(self.changes("set", "a.wav", "bext.loudnessValue=-23"), {"bext.loudnessValue": (None, -23), "bext.version": (1, 2)})
        self.assertEqual(self.body("a.wav", b"bext")[412:422], struct.pack("<5h", -2300, *[0x7FFF] * 4))
        self.assertEqual(self.changes("set", "a.wav", "bext.version=1", "bext.loudnessValue="), {"bext.loudnessValue": (-23, None), "bext.version": (2, 1)})
        self.assertEqual(self.body("a.wav", b"bext")[412:422], bytes(10))

    def test_lists_keep_what_is_not_named(self):
        self.write("a.wav", wave(chunk(b"LIST", INFO), chunk(b"cue ", CUES), chunk(b"LIST", ADTL), chunk(b"smpl", SAMPLER), chunk(b"acid", ACID),
                                 chunk(b"cart", CART)))
        set_fields = ("info.IART[1]=Näme", "info.ICMT=new", "cue[1].label=chorus", "cue[new].position=0:00.001", "cue[new].label=third",
                      "cue[new].length=4", "smpl.loop[0].end=91", "smpl.loop[new].start=1", "smpl.loop[new].end=2", "smpl.midiUnityNote=61",
                      "acid.rootNote=63", "acid.tempo=100.25", "cart.title=T", "cart.timer[1].usage=EOD ", "cart.timer[1].position=50",
                      "cart.tagText=$'one\\r\\n'")
        changes = self.changes("set", "a.wav", *set_fields)
        self.assertEqual(changes["info.IART[1]"], ("Other", "Näme"))
        self.assertEqual(changes["acid.flags"], (0, 2))
        self.assertEqual(self.body("a.wav", b"LIST"), b"INFO" + chunk(b"IART", b"Somebody\0") + chunk(b"ZzZz", b"kept\0\0") +
                         chunk(b"IART", "Näme\0".encode()) + chunk(b"ISFT", b"x\0") + chunk(b"ICMT", b"new\0"))
        self.assertEqual(self.body("a.wav", b"cue "), struct.pack("<I", 3) + point(5, 48) + point(9, 96) + point(10, 48))
        self.assertEqual(self.body("a.wav", b"LIST", 1), b"adtl" + chunk(b"labl", struct.pack("<I", 9) + b"chorus\0") + ADTL[4 + 18:] +
                         chunk(b"labl", struct.pack("<I", 10) + b"third\0") + chunk(b"ltxt", struct.pack("<II4s8x", 10, 4, b"rgn ")))
        self.assertEqual(self.body("a.wav", b"smpl"), struct.pack("<9I", 0, 0, 20833, 61, 0, 25, 0, 2, 3) +
                         struct.pack("<12I", 9, 1, 10, 91, 0, 3, 11, 0, 1, 2, 0, 0) + b"abc")
        self.assertEqual(self.body("a.wav", b"acid"), struct.pack("<IHHfIHHf", 2, 63, 0x8000, 0, 8, 4, 3, 100.25))
        self.assertEqual(self.body("a.wav", b"cart"), CART[:4] + b"T".ljust(64, b"\0") + CART[68:692] + b"EOD " + struct.pack("<I", 50) + CART[700:2048] +
                         b"one\r\n\0")
        removed = self.changes("remove", "a.wav", "cue[0]", "cue[2].label", "info.IART", "smpl.loop[0]", "cart.timer[0]")
        self.assertEqual(removed["cue[0].position"], (48, None))
        self.assertEqual(self.body("a.wav", b"cue "), struct.pack("<I", 2) + point(9, 96) + point(10, 48))
        fields = self.fields("a.wav")
        self.assertEqual({name: fields.get(name) for name in ("cue[0].label", "cue[1].label", "cue[1].length", "info.IART", "info.IART[1]", "smpl.loop[0].start",
                                                              "smpl.loop[1].start", "cart.timer[0].usage", "cart.timer[1].usage")},
                         {"cue[0].label": "chorus", "cue[1].label": None, "cue[1].length": 4, "info.IART": "Näme", "info.IART[1]": None,
                          "smpl.loop[0].start": 1, "smpl.loop[1].start": None, "cart.timer[0].usage": None, "cart.timer[1].usage": "EOD "})
        # Whole chunks go by their group; what is not there is no failure, and nothing is written.
        self.run_command("meta", "remove", "a.wav", "info", "cue", "smpl", "acid", "cart")
        self.assertEqual({item["chunk"] for item in self.record("meta", "a.wav")["fields"]}, {"LIST"})  # the item "file"
        before = (self.folder / "a.wav").stat().st_ino
        self.assertEqual(self.lines("meta", "remove", "a.wav", "acid", "info.IART", "cue[7]"), ["a.wav: unchanged"])
        self.assertEqual((self.folder / "a.wav").stat().st_ino, before)

    def test_one_of_several_chunks_goes(self):
        self.write("a.wav", wave(chunk(b"acid", ACID), chunk(b"acid", ACID[:20] + struct.pack("<f", 90)), chunk(b"LIST", INFO), chunk(b"LIST", INFO)))
        changes = self.changes("remove", "a.wav", "acid", "info[1]")
        self.assertEqual((changes["acid.tempo"], changes["info[1].IART"], self.fields("a.wav")["acid.tempo"]), ((97.5, None), ("Somebody", None), 90))
        self.assertFalse([name for name in changes if name.startswith(("acid[1]", "info."))], changes)

    def test_ixml_by_path(self):
        document = (b'\xef\xbb\xbf<?xml version="1.0" encoding="UTF-8"?>\r\n<BWFXML>\n\t<!-- <A> --><PROJECT>a &amp; b</PROJECT>\n\t<TRACK_LIST>\n'
                    b"\t\t<TRACK><NAME>Boom</NAME></TRACK>\n\t</TRACK_LIST>\n\t<EMPTY/>\n\t<A x='1'  y=\"2\">t</A><![CDATA[ <B> ]]>\n</BWFXML>")
        path = self.write("a.wav", wave(chunk(b"iXML", document + bytes(400))))
        size = path.stat().st_size
        self.run_command("meta", "set", "a.wav", "ixml.PROJECT=<Ä> & \"c\"", "ixml.TRACK_LIST.TRACK[new].NAME=Lav", "ixml.EMPTY=full", "ixml.A.@x=it's",
                         "ixml.A.@z=3", "ixml.NEW.DEEP=1")
        changed = document.replace(b"a &amp; b", "&lt;Ä&gt; &amp; \"c\"".encode()).replace(b"</TRACK>\n", b"</TRACK>\n\t\t<TRACK><NAME>Lav</NAME></TRACK>\n")
        changed = changed.replace(b"<EMPTY/>", b"<EMPTY>full</EMPTY>").replace(b"<A x='1'", b"<A z=\"3\" x='it&#39;s'")
        changed = changed.replace(b"t</A>", b"t</A>\n\t<NEW><DEEP>1</DEEP></NEW>")
        self.assertEqual(self.body("a.wav", b"iXML").rstrip(b"\0"), changed)
        self.assertEqual(path.stat().st_size, size)  # what was room is used
        self.run_command("meta", "remove", "a.wav", "ixml.NEW", "ixml.A.@z", "ixml.TRACK_LIST.TRACK[1]")
        self.run_command("meta", "set", "a.wav", "ixml.PROJECT=a & b", "ixml.A.@x=1")
        self.assertEqual(self.body("a.wav", b"iXML").rstrip(b"\0"), document.replace(b"<EMPTY/>", b"<EMPTY>full</EMPTY>"))
        self.write("b.wav", wave())
        self.run_command("meta", "set", "b.wav", "ixml.SPEED.TIMECODE_RATE=25/1")
        self.assertEqual(self.fields("b.wav"), {"ixml.SPEED.TIMECODE_RATE": "25/1"})
        for bad in (b"<A><B></A>", b'<?xml version="1.0" encoding="UTF-16"?><A/>', b"<!DOCTYPE a><A/>", b""):
            path = self.write("c.wav", wave(chunk(b"iXML", bad)))
            self.failure("meta", "set", "c.wav", "ixml.PROJECT=x")
            self.assertEqual(path.read_bytes(), wave(chunk(b"iXML", bad)))

    def test_aiff(self):
        marks = struct.pack(">HhI", 2, 1, 10) + b"\2in\0" + struct.pack(">hI", 2, 40) + b"\3out"
        self.write("a.aiff", aiff((b"NAME", b"old"), (b"ANNO", b"one"), (b"ANNO", b"two"), (b"COMT", struct.pack(">HIhH", 1, 9, 2, 3) + b"odd\7"), (b"MARK", marks),
                                  (b"APPL", b"stockept")))
        self.run_command("meta", "set", "a.aiff", "NAME=Täst", "(c)=2026 me", "ANNO[1]=zwei", "ANNO[new]=three", "comt[new].text=hello",
                         "comt[new].timeStamp=2024-01-01T00:00:00Z", "mark[0].position=11", "mark[new].position=99", "mark[new].name=end")
        self.assertEqual(self.body("a.aiff", b"MARK"), struct.pack(">HhI", 3, 1, 11) + marks[8:] + struct.pack(">hI", 3, 99) + b"\3end")
        self.assertEqual(self.body("a.aiff", b"COMT"), struct.pack(">HIhH", 2, 9, 2, 3) + b"odd\7" + struct.pack(">IhH", 3_786_912_000, 0, 5) + b"hello\0")
        self.assertEqual([self.body("a.aiff", b"ANNO", i) for i in range(3)], [b"one", b"zwei", b"three"])
        self.assertEqual((self.body("a.aiff", b"NAME"), self.body("a.aiff", b"(c) ")), ("Täst".encode(), b"2026 me"))
        tags, = json.loads(subprocess.run(["exiftool", "-j", "-AIFF:all", "a.aiff"], capture_output=True, cwd=self.folder, check=True).stdout)
        self.assertEqual((tags["Copyright"], tags["Comment"]), ("2026 me", "hello"), tags)
        self.run_command("meta", "remove", "a.aiff", "mark[0]", "comt[1]", "ANNO", "(c)", "NAME")
        self.assertEqual({name: value for name, value in self.fields("a.aiff").items() if not name.startswith("appl")},
                         {"ANNO": "zwei", "ANNO[1]": "three", "comt[0].timeStamp": 9, "comt[0].marker": 2, "comt[0].text": "odd", "mark[0].id": 2,
                          "mark[0].position": 40, "mark[0].name": "out", "mark[1].id": 3, "mark[1].position": 99, "mark[1].name": "end"})
        for assignment in ("bext.originator=x", "mark[0].position=1000", "comt[0].marker=7"):
            self.failure("meta", "set", "a.aiff", assignment)

    def test_caf(self):
        marker = struct.pack(">4sdI8sI", b"rbeg", 4.5, 7, b"\xff" * 8, 2)
        texts = struct.pack(">IIqIq", 2, 7, 0, 8, 5) + b"Takt\0Teil\0"
        self.write("a.caf", caf((b"info", struct.pack(">I", 2) + b"title\0A\0k\xe4y\0v\0"), (b"strg", texts), (b"mark", struct.pack(">II", 2, 1) + marker)))
        self.run_command("meta", "set", "a.caf", "info.title=B", "info.track number=3", "mark[0].name=Tak", "mark[new].position=50", "mark[new].name=Ende",
                         "strg[1].text=longer")
        self.assertEqual(self.body("a.caf", b"info"), struct.pack(">I", 3) + b"title\0B\0k\xe4y\0v\0track number\x003\0")
        self.assertEqual(self.body("a.caf", b"mark"), struct.pack(">II", 2, 2) + marker + struct.pack(">IdI8sI", 0, 50, 9, b"\xff" * 8, 0))
        fields = self.fields("a.caf")
        self.assertEqual([fields[f"strg[{i}].text"] for i in range(3)], ["Tak", "longer", "Ende"])
        self.assertEqual((fields["mark[0].name"], fields["mark[1].name"]), ("Tak", "Ende"))
        self.assertIn('did you mean "title"', self.failure("meta", "set", "a.caf", "info.titel=x"))
        self.run_command("meta", "remove", "a.caf", "info.title", "mark[0]")
        self.assertEqual(self.fields("a.caf")["mark[0].name"], "Ende")
        self.assertNotIn("info.title", self.fields("a.caf"))

    def test_other_programs_read_what_was_set(self):
        def output(*command):
            return subprocess.run(command, capture_output=True, cwd=self.folder, check=True, text=True, errors="replace").stdout
        self.encoded("a.wav", "-write_bext", "1", "-metadata", "description=old", "-metadata", "title=Old")
        sound = output("ffmpeg", "-v", "error", "-i", "a.wav", "-f", "md5", "-")
        self.run_command("meta", "set", "a.wav", "bext.description=A description", "bext.originator=somebody", "bext.timeReference=0:00:02",
                         "bext.originationDate=2026-11-22", "bext.originationTime=10:44:00", "info.INAM=A title", "smpl.midiUnityNote=61",
                         "cue[new].position=100", "cue[new].label=here", "cart.title=On air", "acid.tempo=120", "acid.beats=8",
                         "bext.umid=" + UMID.hex(), "bext.codingHistory=A=PCM,F=44100")
        self.assertEqual(output("ffmpeg", "-v", "error", "-i", "a.wav", "-f", "md5", "-"), sound)
        tags, = json.loads(output("exiftool", "-j", "-RIFF:all", "a.wav"))
        self.assertEqual((tags["Description"], tags["Originator"], tags["TimeReference"], tags["Title"], tags["MIDIUnityNote"], tags["Tempo"]),
                         ("A description", "somebody", 88200, "A title", 61, 120), tags)
        probed = json.loads(output("ffprobe", "-v", "error", "-show_format", "-of", "json", "a.wav"))["format"]["tags"]
        self.assertEqual((probed["comment"], probed["time_reference"], probed["title"], probed["date"]),
                         ("A description", "88200", "A title", "2026-11-22"), probed)
        shown = "".join(output("sndfile-info", form, "a.wav") for form in ("--broadcast", "--cart"))
        for line in (r"Description\s*: A description", r"Time ref\s*: 0x0*15888\b", r"Title\s*: On air", r"Coding history\s*: A=PCM"):
            self.assertRegex(shown, line)
        media = json.loads(output("mediainfo", "--Output=JSON", "a.wav"))["media"]["track"][0]
        self.assertEqual((media["Producer"], media["Title"]), ("somebody", "A title"), media)

    def test_changes_fit_a_terminal_and_are_never_none(self):
        self.write("a.wav", wave(chunk(b"bext", bext(b"old")), chunk(b"iXML", b"<A><U/><U>b</U></A>")))
        text, status = self.on_terminal("meta", "set", "a.wav", "bext.description=" + "long " * 40, "info.ICMT=x", columns=60)
        self.assertEqual((status, text.splitlines()[0], text.splitlines()[2]), (0, "a.wav: set 2 fields", "  info.ICMT=x"))
        self.assertLessEqual(max(map(len, text.splitlines())), 60)
        self.assertRegex(text, r"\n  bext\.description=lo.*….*\(was old\)\n")
        self.assertEqual(self.on_terminal("meta", "set", "a.wav", "info.ICMT=y", columns=60)[0], "a.wav: set info.ICMT=y (was x)\n")
        self.assertEqual(self.lines("meta", "remove", "a.wav", "ixml.U[0]"), ['a.wav: removed what no field shows, in "iXML"'])

    def test_files_and_fields_are_told_apart(self):
        for name in ("info.wav", "bext=1.wav"):
            self.write(name, wave(chunk(b"LIST", INFO)))
        (self.folder / "list").write_text("info.wav\n./bext=1.wav\n")
        self.run_command("meta", "set", "--files-from", "list", "info.IART=me", "--backup")
        self.assertEqual([self.fields(name)["info.IART"] for name in ("info.wav", "./bext=1.wav")], ["me", "me"])
        self.assertEqual(self.lines("meta", "remove", "info.wav", "info.IART", "--dry-run"), ["info.wav: would remove info.IART (was me)"])
        self.assertIn("neither a file nor a field", self.failure("meta", "remove", "info.wav", "IARTT", status=2))
        self.assert_no_litter("info.wav", "bext=1.wav", "info.wav.bak", "bext=1.wav.bak", "list")

    def test_damaged_and_unfinished_files_are_not_made_worse(self):
        cases = [  # content, edit that is refused, what is said
            (wave(chunk(b"bext", bytes(500))), "bext.originator=x", 'its chunk "bext" is damaged'),
            (wave(chunk(b"bext", bext(b"cut")))[:-200], "bext.originator=x", "is cut short"),
            (wave(chunk(b"cue ", struct.pack("<I", 3) + point(5, 48))), "cue[new].position=9", 'its chunk "cue " is damaged'),
            (wave(size=0), "info.INAM=x", "(an unfinished recording?)"),
            (wave() + b"stray sound that nobody counted", "info.INAM=x", "bytes follow its chunks"),
        ]
        for content, assignment, text in cases:
            for options in ([], ["--in-place"]):
                path = self.write("a.wav", content)
                self.assertIn(text, self.failure("meta", "set", *options, "a.wav", assignment, *(["cue[new].label=x"] if "cue" in assignment else [])))
                self.assertEqual(path.read_bytes(), content)
        # What keeps its size is written where it stands, whatever follows.
        content = wave(chunk(b"bext", bext(b"old"))) + b"stray sound that nobody counted"
        path = self.write("a.wav", content)
        self.run_command("meta", "set", "a.wav", "bext.description=new")
        self.assertEqual(path.read_bytes(), content.replace(b"old", b"new"))

    def test_a_full_disk_leaves_the_old_file(self):
        """A limit of the size of files, at which writes fail as on a full disk."""
        content = wave(chunk(b"bext", bext(b"old")), chunk(b"LIST", INFO), frames=20000)
        path = self.write("a.wav", content)

        def limited(*arguments):
            def limit():
                signal.signal(signal.SIGXFSZ, signal.SIG_IGN)
                resource.setrlimit(resource.RLIMIT_FSIZE, (len(content) + 100, resource.RLIM_INFINITY))
            return subprocess.run([KTFILES, "meta", "set", *arguments], cwd=self.folder, capture_output=True, preexec_fn=limit, text=True)
        for options in ([], ["--in-place"]):
            result = limited("a.wav", *options, "info.ICMT=" + "long " * 100)
            self.assertEqual((result.returncode, path.read_bytes() == content), (1, True), result.stderr)
            self.assert_no_litter("a.wav")
        self.assertEqual(limited("a.wav", "--in-place", "bext.description=new").returncode, 0)
        self.assertEqual(path.read_bytes(), content.replace(b"old", b"new"))

    def test_a_recording_beyond_4_gib_is_edited_in_place(self):
        """Sparse: nothing of its 5 GiB of sound is read or written."""
        size = 5 << 30
        head = b"RF64" + struct.pack("<I", 0xFFFFFFFF) + b"WAVE" + chunk(b"ds64", struct.pack("<QQQI", size + 754, size, size // 2, 0))
        head += chunk(b"fmt ", struct.pack("<HHIIHH", 1, 1, 48000, 96000, 2, 16)) + chunk(b"bext", bext(b"old")) + b"data" + struct.pack("<I", 0xFFFFFFFF)
        with open(self.folder / "a.wav", "wb") as file:
            file.write(head)
            file.truncate(len(head) + size)
            file.seek(4 + 4 + 4 + 8)
            file.write(struct.pack("<Q", len(head) + size - 8))
        self.run_command("meta", "set", "--in-place", "a.wav", "bext.description=new", "info.INAM=title")
        self.assertEqual({name: value for name, value in self.fields("a.wav").items() if name in ("bext.description", "info.INAM")},
                         {"bext.description": "new", "info.INAM": "title"})
        with open(self.folder / "a.wav", "rb") as file:
            self.assertEqual(file.read(20) + file.read(8)[8:] + file.read(len(head) - 28), head[:20] + head[28:].replace(b"old", b"new"))
            file.seek(len(head) + size)
            self.assertEqual(file.read(), chunk(b"LIST", b"INFO" + chunk(b"INAM", b"title\0")))
        self.assertLess((self.folder / "a.wav").stat().st_blocks * 512, 1 << 20)


if __name__ == "__main__":
    unittest.main()
