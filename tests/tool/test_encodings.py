"""Texts that are not UTF-8: meta, tags and decode read the same, by the kind of file."""
import struct
import unittest

from command import CommandTest, chunk, wave

WORDS = "Zoë – œuvre"


def aiff(form, *chunks):
    common = struct.pack(">hIh", 1, 100, 16) + bytes.fromhex("400ebb80000000000000") + (b"NONE\0\0" if form == b"AIFC" else b"")
    body = form + b"".join(chunk(chunk_id, content, ">") for chunk_id, content in ((b"COMM", common), *chunks, (b"SSND", bytes(208))))
    return b"FORM" + struct.pack(">I", len(body)) + body


def aiff_with(form, text):
    pad = b"" if len(text) & 1 else b"\0"
    return aiff(form, (b"NAME", text), (b"AUTH", text), (b"ANNO", text), (b"MARK", struct.pack(">HHIB", 1, 1, 10, len(text)) + text + pad))


def wave_with(text):
    return wave(chunk(b"LIST", b"INFO" + b"".join(chunk(name, text + b"\0") for name in (b"INAM", b"IART", b"ICMT"))),
                chunk(b"cue ", struct.pack("<6I", 1, 1, 10, int.from_bytes(b"data", "little"), 0, 0) + struct.pack("<I", 10)),
                chunk(b"LIST", b"adtl" + chunk(b"labl", struct.pack("<I", 1) + text + b"\0")))


class Encodings(CommandTest):
    def test_three_verbs_read_the_same_text(self):
        mac, latin = WORDS.encode("mac_roman"), b"Zo\xeb \x96 \x9cuvre"
        cases = [("mac.aiff", aiff_with(b"AIFF", mac), WORDS, "macintosh"), ("mac.aifc", aiff_with(b"AIFC", mac), WORDS, "macintosh"),
                 ("latin.wav", wave_with(latin), latin.decode("latin-1"), "ISO-8859-1"), ("utf.wav", wave_with(WORDS.encode()), WORDS, None),
                 ("utf.aiff", aiff_with(b"AIFF", WORDS.encode()), WORDS, None), ("utf.aifc", aiff_with(b"AIFC", WORDS.encode()), WORDS, None)]
        for name, content, words, encoding in cases:
            with self.subTest(name):
                path = self.write(name, content)
                is_wave = name.endswith("wav")
                fields = {item["field"]: item for item in self.record("meta", name)["fields"]}
                names = ("info.INAM", "info.IART", "info.ICMT", "cue[0].label") if is_wave else ("NAME", "AUTH", "ANNO", "mark[0].name")
                self.assertEqual([(fields[field]["value"], fields[field].get("encoding")) for field in names], [(words, encoding)] * 4)
                tags = self.record("tags", name)
                self.assertEqual([tags[key] for key in ("title", "artist", "comments")] + [tags["markers"][0]["name"]], [words] * 4)
                out = "out.aiff" if is_wave else "out.wav"
                self.run_command("decode", "--force", name, "-o", out)
                self.assertEqual((self.folder / out).read_bytes().count(words.encode()), 4)
                # What is set is UTF-8; what is not keeps its bytes.
                first = names[0]
                self.run_command("meta", "set", name, f"{first}=Größe")
                fields = {item["field"]: item for item in self.record("meta", name)["fields"]}
                self.assertEqual([(fields[field]["value"], fields[field].get("encoding")) for field in names],
                                 [("Größe", None)] + [(words, encoding)] * 3)
                self.assertIn("Größe".encode(), path.read_bytes())


if __name__ == "__main__":
    unittest.main()
