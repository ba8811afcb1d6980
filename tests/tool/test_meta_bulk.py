"""ktfiles meta export and import: tables of many files, through spreadsheets and back, and what is wrong with them."""
import csv
import io
import json
import os
import random
import re
import resource
import signal
import struct
import subprocess
import time
import unittest
from xml.etree import ElementTree

from command import KTFILES, CommandTest, caf, chunk, wave
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


if __name__ == "__main__":
    unittest.main()
