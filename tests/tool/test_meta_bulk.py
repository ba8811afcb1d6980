"""ktfiles meta export and import: tables of many files, through spreadsheets and back, and what is wrong with them."""
import csv
import io
import json
import os
import random
import re
import signal
import struct
import subprocess
import unittest
from xml.etree import ElementTree

from command import INSTRUMENTED, KTFILES, CommandTest, caf, chunk, wave
from test_meta import CART, IXML, UMID, bext, point
from test_meta_edits import ACID, SAMPLER, aiff

TEXTS = ["plain", 'comma, "quoted"', "=1+1", " blanks ", "two\nlines", "two\r\nlines", "Zoë ¼ 中", "$'odd'", "tab\tand \x1b[31m \x7f", "'", ";", '"', "-", "1.0", "007"]
UNKNOWN = chunk(b"AbCd", bytes(range(256)))


def wave_file(text):
    words = [next(text).encode() for _ in range(12)]
    info = b"INFO" + b"".join(chunk(name, word + b"\0") for name, word in zip((b"ISFT", b"IART", b"IART", b"INAM", b"ICMT"), words))
    info += chunk(b"ICOP", b"Latin-1 K\xe4se\0")
    adtl = b"adtl" + chunk(b"labl", struct.pack("<I", 9) + words[5] + b"\0") + chunk(b"note", struct.pack("<I", 5) + words[6] + b"\0")
    adtl += chunk(b"ltxt", struct.pack("<II4sHHHH", 5, 24, b"rgn ", 49, 7, 1, 2) + words[7] + b"\0")
    ixml = IXML.replace(b"Boom", words[8].replace(b"\r", b"").replace(b"\x1b", b"").strip().replace(b"<", b"&lt;"))
    return wave(chunk(b"bext", bext(words[9][:200], time_reference=48000 * 3600 + 7, history=b"A=PCM,F=48000\r\nA=MPEG1L2\r\n")), UNKNOWN, chunk(b"LIST", info),
                chunk(b"cue ", struct.pack("<I", 2) + point(9, 48) + point(5, 96)), chunk(b"LIST", adtl), chunk(b"smpl", SAMPLER), chunk(b"acid", ACID),
                chunk(b"cart", CART[:-6] + words[10]), chunk(b"iXML", ixml))


def aiff_file(text):
    words = [next(text).encode() for _ in range(8)]
    def pascal(word):
        return bytes([len(word)]) + word + b"\0" * (1 - len(word) % 2)
    comments = b"".join(struct.pack(">IhH", 3000000000, marker, len(word)) + word + b"\0" * (len(word) % 2) for marker, word in ((0, words[0]), (7, words[1])))
    marks = b"".join(struct.pack(">hI", number, position) + pascal(word) for number, position, word in ((7, 10, words[2]), (3, 99, words[3])))
    return aiff((b"COMT", struct.pack(">H", 2) + comments), (b"MARK", struct.pack(">H", 2) + marks), (b"NAME", words[4]), (b"(c) ", b"K\xe4se"),
                (b"ANNO", words[5]), (b"ANNO", words[6]), (b"AUTH", words[7]), (b"AbCd", bytes(9)))


def caf_file(text):
    words = [next(text).encode() for _ in range(4)]
    texts = words[0] + b"\0region\0" + words[1] + b"\0"
    entries = [(7, 0), (8, len(words[0]) + 1), (9, len(words[0]) + 8)]
    marks = b"".join(struct.pack(">4sdI8sI", b"\0\0\0\0", position, number, b"\xff" * 8, 2) for position, number in ((40, 7), (50, 9)))
    return caf((b"info", struct.pack(">I", 2) + b"title\0" + words[2] + b"\0comments\0" + words[3] + b"\0"),
               (b"strg", struct.pack(">I", 3) + b"".join(struct.pack(">Iq", *entry) for entry in entries) + texts), (b"mark", struct.pack(">II", 0, 2) + marks),
               (b"uuid", bytes(40)))


# Of each kind: what makes one, a command line that strips it, and one that says something else everywhere.
KINDS = {
    "wav": (wave_file, ["bext", "info", "cue", "smpl", "acid", "cart", "ixml"],
            ["bext.description=other", "bext.timeReference=1", "bext.umid=", "bext.codingHistory[1]=A=X", "bext.loudnessValue=-1", "info.IART[1]=other", "info.INAM=",
             "cue[0].position=2", "cue[1].note=", "smpl.loop[0].start=1", "smpl.midiUnityNote=3", "acid.tempo=1", "cart.title=other",
             "ixml.PROJECT=other and longer than it was", "ixml.USER[1]=x"]),
    "aiff": (aiff_file, ["NAME", "(c)", "ANNO", "ANNO[1]", "AUTH", "comt", "mark"],
             ["NAME=other", "ANNO[1]=other", "comt[0].text=other", "comt[1].marker=", "mark[0].position=3", "mark[1].name=other"]),
    "caf": (caf_file, ["info", "mark[0]", "mark[1]"], ["info.title=other", "mark[0].position=1", "mark[1].name=other and longer"]),
}


class Bulk(CommandTest):
    def fields(self, *names):
        """What can be set of each file, and a few things that cannot."""
        found = self.json("meta", *names)
        return {item["path"]: sorted((each["field"], each["value"]) for each in item["fields"] if not each["field"].startswith(("cue.", "smpl.samplerData")))
                for item in found}

    def table(self, name):
        with open(self.folder / name, encoding="utf-8-sig", newline="") as file:
            return list(csv.reader(file, strict=True))

    def spreadsheet(self, name, to, delimiter=",", mark=False, quoting=csv.QUOTE_MINIMAL):
        """Written anew, as another program would."""
        with open(self.folder / to, "w", encoding="utf-8-sig" if mark else "utf-8", newline="") as file:
            csv.writer(file, delimiter=delimiter, quoting=quoting).writerows(self.table(name))
        return to

    def test_what_was_exported_is_what_is_imported(self):
        source = random.Random(1)

        def texts():
            while True:
                yield from source.sample(TEXTS, len(TEXTS))
        text, names = texts(), []
        for kind, (make, _, _) in KINDS.items():
            for i in range(2):
                names.append(f"a {i}.{kind}")
                self.write(names[-1], make(text))
        originals = {name: (self.folder / name).read_bytes() for name in names}
        before = self.fields(*names)
        self.run_command("meta", "export", ".", "-o", "t.csv")
        self.run_command("meta", "export", "--xml", "-j3", "-o", "t.xml", *names)
        roads = ["t.csv", "t.xml", self.spreadsheet("t.csv", "semicolons.csv", ";", quoting=csv.QUOTE_ALL), self.spreadsheet("t.csv", "tabs.txt", "\t", mark=True)]
        for road in roads:
            with self.subTest(road):
                for name, content in originals.items():
                    self.write(name, content)
                    self.run_command("meta", "remove", name, *KINDS[name.split(".")[1]][1])
                self.run_command("meta", "import", "-q", "--lenient", road)
                after = self.fields(*names)
                for name in names:  # what no table can know: the rest of a list's chunk, the encoding
                    dropped = {"acid.unknown"} if name.endswith("wav") else set()
                    self.assertEqual([each for each in after[name] if each[0] not in dropped],
                                     [each for each in before["./" + name if "./" + name in before else name] if each[0] not in dropped])
                self.assertEqual(set(line.split(": ")[1] for line in self.lines("meta", "import", "--lenient", road)), {"unchanged"})
                for name, content in originals.items():
                    self.write(name, content)
                    self.run_command("meta", "set", "-q", "--lenient", name, *KINDS[name.split(".")[1]][2])
                edited = {name: (self.folder / name).read_bytes() for name in names}
                self.run_command("meta", "import", "-q", "--lenient", "--empty-removes", road, "--backup")
                self.assertEqual(self.fields(*names), before)
                for name in names:
                    self.assertEqual((self.folder / (name + ".bak")).read_bytes(), edited[name])
                    (self.folder / (name + ".bak")).unlink()
                    sound = originals[name].index(b"data" if not name.endswith("aiff") else b"SSND")
                    self.assertIn(originals[name][sound:sound + 200], (self.folder / name).read_bytes())
                    self.assertIn(UNKNOWN if name.endswith("wav") else b"AbCd" if name.endswith("aiff") else b"uuid", (self.folder / name).read_bytes())

    def imported(self, table, *options, status=0):
        """The records of an import, by path, and what standard error says."""
        content = table if isinstance(table, bytes) else table.encode()
        self.write("table", content)
        result = self.run_command("meta", "import", "--jsonl", "table", *options, status=status)
        return {record["path"]: record for record in map(json.loads, result.stdout.decode().splitlines())}, result.stderr.decode()

    def test_nothing_is_written_while_a_table_has_a_problem(self):
        original = self.write("a.wav", wave(chunk(b"bext", bext(b"old", version=1)))).read_bytes()
        self.write("b.wav", original)
        cases = [  # table, what is said of it, and of which line
            ("name,info.INAM\na.wav,x\n", 'line 1: no column is headed "path"'), ("path,bext.descripton\na.wav,x\n", 'line 1: .*did you mean "bext.description"'),
            ("path,fact.frames\na.wav,3\n", "line 1: .*fact is only read"), ("path,cue[new].position\na.wav,3\n", "line 1: .*counted from 0"),
            ('path,bext.description,info.INAM\na.wav,"two\nlines",x\nb.wav,x\n', "line 4: there are 2 cells, and 3 headings"),
            ("path,info.INAM\na.wav,x\n\n./a.wav,y\n", "line 4: ./a.wav is in line 2 already"), ("path,info.INAM\na.wav,x\n,y\n", "line 3: the name of the file"),
            ("path,info.INAM,\na.wav,x,y\n", "line 2: cell 3 has no heading"), ("FileName,Description,bext.description\na.wav,x,x\n", "line 1: .*of one field"),
            ("path,FileName,info.INAM\na.wav,a.wav,x\n", "line 1: two columns name the files"), ('path,info.INAM\na.wav,"x\nb.wav,y\n', "line 2: a quotation mark is opened"),
            ('path,info.INAM\na.wav,"x"y\n', "line 2: something follows"), ("path,info.INAM\na.wav,$'x\n", "line 2: info.INAM: .*goes on to the next"),
            (b"path,info.INAM\r\na.wav,ok\r\nb.wav,K\xe4se\r\n", "line 3: is not UTF-8; save the table as CSV in UTF-8"),
            ("path\tinfo.INAM\n".encode("utf-16"), "is UTF-16"), (b"path,info.INAM\na.wav,\0\n", "line 2: holds NUL"), ("", "is empty"), ("path,info.INAM\n", "names no file"),
            ("path,bext.originator\na.wav,ok\nb.wav,Zo\u00eb\n", "line 3: bext.originator=Zo\u00eb: ASCII"), ("path,acid.tempo\na.wav,\"97,5\"\n", "line 2: acid.tempo=97,5: a number"),
            ("<metadata><file path='a.wav'><field name='info.INAM'>x</field></file>", "line 1: is no well-formed XML"), ("<html/>", "line 1: <html> stands where <metadata>"),
            ("<metadata>\n<file/></metadata>", "line 2: the name of the file"), ("<metadata><file path='a.wav'><field name='infoo.INAM'/></file></metadata>", "line 1: there is no"),
            ("<metadata><file path='a.wav'>\n<field name='NAME'/><field name='NAME'/></file></metadata>", "line 2: NAME stands twice"),
            ("<!DOCTYPE a [<!ENTITY e 'x'>]><metadata/>", "line 1: is no well-formed XML"),
        ]
        for table, text in cases:
            with self.subTest(table=table):
                _, error = self.imported(table, status=1)
                self.assertRegex(error, "^ktfiles: table: " + text)
                self.assertEqual(error.count("\n"), 1)
        # Spreadsheets reformat these, which --lenient does not take for a wish; all problems are told.
        table = "FileName;OriginationDate;OriginationTime;TimeReference\na.wav;22.11.2026;10:44 AM;1,23E+11\n" + "".join(f"{i}.wav;11/22/26;;\n" for i in range(30))
        records, error = self.imported(table, "--lenient", status=1)
        self.assertEqual([line.split(": ")[2:4] for line in error.splitlines()[:3]],
                         [["line 2", name] for name in ("OriginationDate", "OriginationTime", "TimeReference")])
        self.assertIn("a spreadsheet", error)
        self.assertIn("and 13 more like these; nothing is changed", error)
        self.assertEqual([(self.folder / name).read_bytes() for name in ("a.wav", "b.wav")], [original] * 2)

    def test_a_row_is_all_or_nothing_and_the_others_go_on(self):
        content = wave(chunk(b"bext", bext(b"K\xe4se", version=1, history=b"A=1\n\nA=2\r\n")), chunk(b"cue ", struct.pack("<I", 1) + point(5, 48)))
        for name in "abcde":
            self.write(name + ".wav", content)
        table = ("path,bext.description,bext.originator,cue[0].position,cue[2].position,bext.codingHistory\na.wav,,new,,,\nb.wav,,new,101,,\ngone.wav,,new,,,\n"
                 "c.wav,,new,,9,\nd.wav,K\u00e4se,somebody,48,,\"A=1\r\nA=2\"\ne.wav,,,7,,\"A=1\nA=3\nA=4\"\n")
        records, error = self.imported(table, status=1)
        self.assertEqual({path: [change["field"] for change in record["changes"]] for path, record in records.items() if "changes" in record},
                         {"a.wav": ["bext.originator"], "d.wav": [], "e.wav": ["bext.codingHistory[1]", "bext.codingHistory[2]", "cue[0].position"]})
        self.assertRegex(error, r"\Aktfiles: b\.wav: line 3: cue\[0\]\.position=101: .*\nktfiles: gone\.wav: line 4: file not found\nktfiles: c\.wav: line 5: cue\[2\].position=9: the last is \[0\]; \[1\] adds one\n\Z")
        for name in "bcd":
            self.assertEqual((self.folder / (name + ".wav")).read_bytes(), content)
        self.assertIn(b"A=1\n\nA=3\r\nA=4\r\n", (self.folder / "e.wav").read_bytes())
        # Line ends that a spreadsheet changed are no change, and a text that is changed keeps its own.
        lines = wave(chunk(b"LIST", b"INFO" + chunk(b"ICMT", b"one\r\ntwo\0")))
        self.write("f.wav", lines)
        self.assertEqual(self.imported('path,info.ICMT\nf.wav,"one\ntwo"\n')[0]["f.wav"]["changes"], [])
        self.imported('path,info.ICMT\nf.wav,"one\n2"\n')
        self.assertIn(b"one\r\n2\0", (self.folder / "f.wav").read_bytes())
        before = (self.folder / "a.wav").read_bytes()
        self.imported("path,bext.originator\na.wav,other\n", "--dry-run")
        self.assertEqual((self.folder / "a.wav").read_bytes(), before)

    def test_an_empty_text_is_not_taken_for_the_next(self):
        self.write("a.wav", wave(chunk(b"LIST", b"INFO" + chunk(b"IART", b"\0") + chunk(b"IART", b"one\0") + chunk(b"IART", b"\0") + chunk(b"IART", b"two\0"))))
        self.imported("path,info.IART,info.IART[1],info.IART[2]\na.wav,first,two,three\n")
        self.assertEqual(dict(self.fields("a.wav")["a.wav"]), {"info.IART": "first", "info.IART[1]": "two", "info.IART[2]": "three"})
        self.run_command("meta", "remove", "a.wav", "info.IART[1]")
        self.assertIn(b"INFO" + chunk(b"IART", b"\0") + chunk(b"IART", b"first\0") + chunk(b"IART", b"\0") + chunk(b"IART", b"three\0"), (self.folder / "a.wav").read_bytes())

    def test_an_empty_cell_says_nothing_unless_it_is_asked(self):
        self.write("a.wav", wave(chunk(b"bext", bext(b"old", version=1)), chunk(b"cue ", struct.pack("<I", 2) + point(5, 48) + point(7, 50)), chunk(b"acid", ACID),
                                 chunk(b"smpl", SAMPLER)))
        before = self.fields("a.wav")
        self.run_command("meta", "export", "a.wav", "-o", "t.csv")
        header, row = self.table("t.csv")
        row = ["" if re.match(r"bext.originator$|cue\[0\]|acid|smpl", name) else cell for name, cell in zip(header, row)]
        with open(self.folder / "t.csv", "w", newline="") as file:
            csv.writer(file).writerows([header, row])
        self.assertEqual(self.lines("meta", "import", "t.csv"), ["a.wav: unchanged"])
        self.assertEqual(self.fields("a.wav"), before)
        self.run_command("meta", "import", "t.csv", "--empty-removes")
        after = dict(self.fields("a.wav")["a.wav"])
        self.assertEqual({name: after.get(name) for name in ("bext.originator", "bext.description", "cue[0].id", "cue[1].id", "acid.tempo", "smpl.loop[0].start")},
                         {"bext.originator": None, "bext.description": "old", "cue[0].id": 7, "cue[1].id": None, "acid.tempo": None, "smpl.loop[0].start": None})
        self.assertEqual(after["smpl.midiUnityNote"], 0)  # the chunk stays: it has data that no table has

    def test_columns_of_a_core_document(self):
        header = ("FileName,Description,Originator,OriginatorReference,OriginationDate,OriginationTime,TimeReference (translated),TimeReference,BextVersion,UMID,LoudnessValue,"
                  "LoudnessRange,MaxTruePeakLevel,MaxMomentaryLoudness,MaxShortTermLoudness,CodingHistory,IARL,INAM").split(",")
        row = ["a.wav", "A, b", "me", "REF", "2026-11-22", "10:44:00", "00:00:01.000", "96000", "1", UMID.hex(), "-23.00", "5.00", "-1.5", "", "-20", "A=PCM\r\nA=X", "x", "y"]
        self.write("a.wav", wave())
        self.write("b.wav", wave())
        table = io.StringIO(newline="")
        csv.writer(table).writerows([header, row, ["b.wav", *[""] * 5, "00:00:01.500", *[""] * 11]])
        self.imported(table.getvalue())
        fields = dict(self.fields("a.wav")["a.wav"])
        self.assertEqual([fields.get("bext." + name) for name in ("description", "timeReference", "version", "umid", "loudnessValue", "maxMomentaryLoudness", "codingHistory[1]")],
                         ["A, b", 96000, 2, UMID.hex(), -23, None, "A=X"])
        self.assertEqual((fields["info.IARL"], fields["info.INAM"]), ("x", "y"))
        self.assertEqual(dict(self.fields("b.wav")["b.wav"])["bext.timeReference"], 72000)
        self.assertEqual([record["changes"] for record in self.imported(table.getvalue())[0].values()], [[], []])

    def test_names_of_files_come_back(self):
        for name in (b"=a,\"b\".wav", b"K\xe4se.wav", b"line\nend \x01.wav", "\u00e4 \\x41.wav".encode(), b"<&>'.wav"):
            self.write(os.fsdecode(name), wave())
        for form in ("csv", "xml"):
            self.run_command("meta", "export", "--" + form, ".", "-o", "t." + form)
        text = (self.folder / "t.csv").read_text(encoding="utf-8")
        header, *rows = csv.reader(io.StringIO(text, newline=""))
        with open(self.folder / "t.csv", "w", newline="", encoding="utf-8") as file:
            csv.writer(file).writerows([[*header, "info.INAM"], *([*row, "x"] for row in rows)])
        self.assertEqual(len(rows), 5)
        tree = ElementTree.parse(self.folder / "t.xml")
        for element in tree.getroot():
            ElementTree.SubElement(element, "field", name="info.INAM").text = "y"
        tree.write(self.folder / "t.xml")
        for table, text in (("t.csv", "x"), ("t.xml", "y")):
            self.run_command("meta", "import", table)
            self.assertEqual([item["fields"][0]["value"] for item in self.json("meta", ".")], [text] * 5)

    def test_what_is_exported_and_where_to(self):
        self.write("a.wav", wave(chunk(b"LIST", b"INFO" + chunk(b"INAM", "Zo\u00eb\0".encode())), chunk(b"cue ", struct.pack("<I", 1) + point(5, 48))))
        self.write("b.w64", bytes(3))
        self.write("c.txt", b"no sound")
        self.write("cut.wav", b"RIFF")
        self.encoded("d.mp3")
        (self.folder / "list").write_text("a.wav\0")
        result = self.run_command("meta", "export", "--files-from", "list", "-0", "--only", "info", "--bom")
        self.assertEqual(result.stdout.decode(), "\ufeffpath,info.INAM\r\na.wav,Zo\u00eb\r\n")
        result = self.run_command("meta", "export", ".", "-o", "t.xml", status=1)  # what can be read is there all the same
        self.assertRegex(result.stderr.decode(), r"\A(ktfiles: \./(b\.w64|cut\.wav): .*\n){2}\Z")
        self.assertEqual([element.get("path") for element in ElementTree.parse(self.folder / "t.xml").getroot()], ["./a.wav"])
        table = (self.folder / "t.xml").read_bytes()
        self.assertIn("only read", self.failure("meta", "export", "d.mp3"))
        self.assertIn("--force replaces it", self.failure("meta", "export", "a.wav", "-o", "t.xml"))
        sound = (self.folder / "a.wav").read_bytes()
        self.assertIn("over the file itself", self.failure("meta", "export", "a.wav", "--force", "-o", "a.wav"))
        self.failure("meta", "export", "--json", "a.wav", status=2)
        self.assertEqual(((self.folder / "t.xml").read_bytes(), (self.folder / "a.wav").read_bytes()), (table, sound))
        self.assertEqual(self.lines("meta", "import", "-", stdin=table), ["./a.wav: unchanged"])

    def test_fields_go_from_file_to_file(self):
        plain = iter(TEXTS[:1] * 99)
        source = wave_file(plain).replace(b"SEG1" + struct.pack("<I", 4800), b"SEG1" + struct.pack("<I", 48))
        self.write("a.wav", source)
        theirs = wave(chunk(b"LIST", b"INFO" + chunk(b"IGNR", b"mine\0") + chunk(b"IART", b"theirs\0")), UNKNOWN,
                      chunk(b"cue ", struct.pack("<I", 3) + point(1, 1) + point(2, 2) + point(9, 3)), frames=300)
        self.write("b.wav", theirs.replace(struct.pack("<II", 48000, 96000), struct.pack("<II", 96000, 192000)))
        self.run_command("meta", "copy", "a.wav", "b.wav")
        wanted, found = (dict(self.fields(name)[name]) for name in ("a.wav", "b.wav"))
        moved = {name for name in wanted if re.search(r"position$|timeReference$|loop\[0\]\.(start|end)$|cue\[\d\]\.length$", name)}
        expected = {name: value * 2 if name in moved else value for name, value in wanted.items()} | {"info.IGNR": "mine", "smpl.samplePeriod": 10417, "acid.unknown": 32768}
        self.assertEqual(found, expected)
        self.assertGreater(len(moved), 5)
        self.assertIn(UNKNOWN, (self.folder / "b.wav").read_bytes())
        self.assertEqual([record["changes"] for record in self.json("meta", "copy", "a.wav", "b.wav")], [[]])
        for kind in ("aiff", "caf"):
            self.write("a." + kind, KINDS[kind][0](plain))
            self.write("b." + kind, aiff((b"NAME", b"old")) if kind == "aiff" else caf((b"info", struct.pack(">I", 1) + b"artist\0them\0")))
            self.run_command("meta", "copy", "a." + kind, "b." + kind)
            lists = [{name: value for name, value in self.fields(f"{letter}.{kind}")[f"{letter}.{kind}"]
                      if not name.startswith(("strg", "uuid", "AbCd")) and name != "info.artist" and not (kind == "caf" and name.endswith(".id"))} for letter in "ab"]
            self.assertEqual(*lists)
        self.write("c.aiff", aiff())
        self.write("c.caf", caf())
        left = {record["path"]: record["notCopied"] for record in self.json("meta", "copy", "a.wav", "c.aiff", "c.caf", "--only", "info,cue,bext")}
        self.assertEqual(left, dict.fromkeys(("c.aiff", "c.caf"), ["info.ISFT", "remarks on points and ranges", "bext"]))
        found = dict(self.fields("c.caf")["c.caf"])
        self.assertEqual([found.get(name) for name in ("info.title", "info.artist", "mark[0].position", "mark[0].name", "mark[1].position")], ["plain", "plain", 44, "plain", 88])
        self.assertEqual(dict(self.fields("c.aiff")["c.aiff"])["NAME"], "plain")
        before = (self.folder / "c.aiff").read_bytes()
        self.write("long.wav", wave(chunk(b"cue ", struct.pack("<I", 1) + point(5, 4000)), frames=5000))
        self.assertIn("the sound ends at frame", self.failure("meta", "copy", "long.wav", "c.aiff"))
        self.write("none.wav", wave())
        self.assertIn("no fields that can be copied", self.failure("meta", "copy", "none.wav", "c.aiff"))
        self.assertEqual((self.folder / "c.aiff").read_bytes(), before)

    def test_an_interrupt_is_told_and_leaves_whole_files(self):
        names = [f"{i:04}.wav" for i in range(2000)]  # which takes so long that it is interrupted in between
        old = wave(chunk(b"bext", bext(b"old")))
        for name in names:
            self.write(name, old)
        self.write("t.csv", "path,bext.description\n".encode() + "".join(f"{name},new\n" for name in names).encode())
        with subprocess.Popen([KTFILES, "meta", "import", "t.csv"], cwd=self.folder, stdout=subprocess.PIPE, stderr=subprocess.PIPE, text=True,
                              preexec_fn=lambda: signal.signal(signal.SIGINT, signal.SIG_DFL)) as process:  # which a background job ignores
            told = [process.stdout.readline() for _ in range(10)]
            process.send_signal(signal.SIGINT)
            rest, error = process.communicate(timeout=30)
        self.assertEqual(process.returncode, -signal.SIGINT)
        done = len(told) + rest.count("\n")
        line, name = re.fullmatch(r"ktfiles: t\.csv: stopped at line (\d+): (\S+) is as it was or done, those behind it are as they were\n", error).groups()
        self.assertEqual((int(line) - 2, name), (names.index(name), name))
        self.assertIn(names.index(name) - done, (-1, 0))
        new = old.replace(b"old", b"new")
        content = [(self.folder / each).read_bytes() for each in names]
        self.assertEqual(content[:done], [new] * done)
        self.assertIn(content[names.index(name)], (old, new))
        self.assertEqual(set(content[names.index(name) + 1:]), {old})
        self.assert_no_litter("t.csv", *names)

    @unittest.skipIf(INSTRUMENTED, "sanitizers keep memory")
    def test_memory_is_for_the_table_only(self):
        peaks = []
        for count in (20, 600):
            for i in range(count):
                self.write(f"{i}.wav", wave(chunk(b"LIST", b"INFO" + chunk(b"ICMT", b"x" * 50000)), chunk(b"smpl", SAMPLER)))
            self.write("t.csv", b"path,smpl.midiUnityNote\n" + b"".join(b"%d.wav,%d\n" % (i, count % 7) for i in range(count)))
            for arguments in (["import", "t.csv", "-q", "--in-place"], ["export", ".", "-j2", "-o", "out.csv", "--force", "-q"]):
                process = os.posix_spawn("/bin/sh", ["sh", "-c", 'cd "$0" && exec "$@"', self.folder, KTFILES, "meta", *arguments], os.environ)
                _, status, usage = os.wait4(process, 0)
                self.assertEqual(status, 0)
                peaks.append(usage.ru_maxrss)
        self.assertLess(peaks[2] - peaks[0], 4000)  # KiB
        self.assertLess(peaks[3] - peaks[1], 12000)  # files that wait for their turn


if __name__ == "__main__":
    unittest.main()
