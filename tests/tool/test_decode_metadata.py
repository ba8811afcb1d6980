"""ktfiles decode: what an output keeps of what stands beside the sound, read back by other programs."""
import hashlib
import json
import re
import struct
import subprocess
import unittest

from command import KTFILES, CommandTest, caf, chunk, needs_decoders, wave

HISTORY = b"A=PCM,F=48000,W=16,M=mono,T=recorder\r\n"
IXML = b"".join(b"<%s>%d</%s>" % (name, value, name) for name, value in (
    (b"FILE_SAMPLE_RATE", 48000), (b"AUDIO_BIT_DEPTH", 16), (b"TIMESTAMP_SAMPLE_RATE", 48000),
    (b"TIMESTAMP_SAMPLES_SINCE_MIDNIGHT_HI", 1), (b"TIMESTAMP_SAMPLES_SINCE_MIDNIGHT_LO", 0xFFFFFFFF))).join((b"<BWFXML>", b"</BWFXML>"))
AXML = b"<ebuCoreMain><audioFormatExtended/></ebuCoreMain>"


def bext(time, history=HISTORY, version=2):
    return chunk(b"bext", b"A harbour".ljust(256, b"\0") + b"Somebody".ljust(32, b"\0") + bytes(32) + b"2026-11-2210:11:12" +
                 struct.pack("<QH64s5h", time, version, b"umid", -2300, 500, -100, -1800, -2000) + bytes(180) + history)


def cues(*points):
    """Of (id, frame)."""
    return chunk(b"cue ", struct.pack("<I", len(points)) + b"".join(
        struct.pack("<II4sIII", point, frame, b"data", 0, 0, frame) for point, frame in points))


def labels(*texts, ranges=()):
    items = [chunk(b"labl", struct.pack("<I", point) + text + b"\0") for point, text in texts]
    items += [chunk(b"ltxt", struct.pack("<II4s8x", point, length, b"rgn ")) for point, length in ranges]
    return chunk(b"LIST", b"adtl" + b"".join(items))


def info(**texts):
    return chunk(b"LIST", b"INFO" + b"".join(chunk(name.encode(), text.encode() + b"\0") for name, text in texts.items()))


class Metadata(CommandTest):
    CHUNKS = (bext(1 << 33), info(INAM="Tïtle", IART="Somebody", ISFT="x"), cues((1, 0), (2, 4800), (7, 9600)),
              labels((1, b"one"), (2, b"two"), (7, b"end"), ranges=((2, 480),)), chunk(b"iXML", IXML), chunk(b"axml", AXML))

    def setUp(self):
        super().setUp()
        self.write("a.wav", wave(*self.CHUNKS, chunk(b"note", b"x"), frames=9600))

    def get(self, name, chunk_id):
        return self.run_command("chunks", "get", name, chunk_id).stdout

    def decode(self, *arguments, out="out.wav"):
        """What is told, and what is there to read."""
        told = json.loads(self.run_command("decode", "a.wav", "-o", out, "--json", "--force", *arguments).stdout)[0]
        self.run_command("info", "--check", out)
        return told

    def cue_frames(self, name="out.wav"):
        shown = subprocess.run(["sndfile-info", name], cwd=self.folder, capture_output=True, text=True).stdout
        return [int(frame) for frame in re.findall(r"Cue ID.*Offset :\s+(\d+)", shown)]

    def test_the_same_sound_keeps_every_byte(self):
        told = self.decode()
        self.assertEqual((told["kept"], told["notKept"]), (["bext", "INFO", "cue", "adtl", "iXML", "axml"], ["note is not carried over"]))
        content = (self.folder / "out.wav").read_bytes()
        self.assertEqual(content, b"RIFF" + struct.pack("<I", len(content) - 8) + wave()[8:36] + b"".join(self.CHUNKS) +
                         wave(frames=9600)[36:])
        self.assertIn("with bext, INFO, cue, adtl, iXML, axml", self.lines("decode", "a.wav", "-o", "other.wav")[0])
        # In a stream, which nobody can go back in, too.
        piped = subprocess.run([KTFILES, "decode", "-q", "a.wav", "-o", "-"], cwd=self.folder, capture_output=True, check=True)
        self.assertEqual(piped.stdout, content)

    def test_sizes_are_right_beyond_4_gib(self):
        """Also where only the chunks beside the sound make it RF64."""
        kept = bext(7) + info(INAM="Long")
        for size in (5 << 30, 0xFFFFFFFF - 8 - len(kept)):
            size -= size % 2
            with open(self.folder / "a.wav", "wb") as file:
                file.write(b"RF64\xff\xff\xff\xffWAVE" + chunk(b"ds64", struct.pack("<QQQI", 72 + len(kept) + size, size, size // 2, 0)))
                file.write(kept + wave()[12:36] + b"data\xff\xff\xff\xff")
                file.truncate(file.tell() + size)
            with subprocess.Popen([KTFILES, "decode", "-q", "a.wav", "-o", "-"], cwd=self.folder, stdout=subprocess.PIPE) as process:
                head = process.stdout.read(80 + len(kept))
                process.stdout.close()
            self.assertEqual((head[:4], head[12:16]), (b"RF64", b"ds64"))
            self.assertEqual(struct.unpack_from("<QQQ", head, 20), (72 + len(kept) + size, size, size // 2))
            self.assertEqual(head[72:-8], kept)
        # In AIFF there is no room for more.
        self.assertIn("has too much sound for an AIFF file", self.failure("decode", "a.wav", "-o", "x.aiff"))

    def test_odd_and_big_endian_sources(self):
        self.write("a.wav", wave(bext(5, HISTORY + b"odd"), chunk(b"iXML", b"<a>" + b"\0"), frames=9600))
        self.decode()
        self.assertEqual(self.get("out.wav", "bext")[602:], HISTORY + b"odd")
        swapped = b"WAVE" + b"".join(chunk(*item, ">") for item in (
            (b"fmt ", struct.pack(">HHIIHH", 1, 1, 48000, 96000, 2, 16)), (b"data", bytes(2000)),
            (b"LIST", b"INFO" + chunk(b"INAM", b"T\0", ">")), (b"cue ", struct.pack(">III4sIII", 1, 3, 700, b"data", 0, 0, 700)),
            (b"LIST", b"adtl" + chunk(b"labl", struct.pack(">I", 3) + b"x\0", ">"))))
        self.write("a.wav", b"RIFX" + struct.pack(">I", len(swapped)) + swapped)
        self.assertEqual(self.decode()["kept"], ["INFO", "cue", "adtl"])
        self.assertEqual((self.get("out.wav", "cue"), self.cue_frames()), (cues((3, 700))[8:], [700]))

    def test_a_part_moves_times_and_drops_what_is_cut_off(self):
        told = self.decode("--start", "0.05s", "--frames", "4800")
        self.assertEqual(told["notKept"], ["axml, note are not carried over", "2 of its markers are cut off"])
        self.assertEqual(self.cue_frames(), [2400])
        told = self.decode("--start", "4800")
        self.assertEqual(self.cue_frames(), [0, 4800])
        self.assertNotIn(b"one", self.get("out.wav", "LIST"))
        body = self.get("out.wav", "bext")
        self.assertEqual(struct.unpack("<Q", body[338:346])[0], (1 << 33) + 4800)
        self.assertEqual(struct.unpack("<5h", body[412:422]), (0x7FFF,) * 5)  # the loudness of the whole
        self.assertEqual(body[602:], HISTORY)  # the samples are those of the file
        self.assertIn(b"HI>2</TIMESTAMP_SAMPLES_SINCE_MIDNIGHT_HI><TIMESTAMP_SAMPLES_SINCE_MIDNIGHT_LO>4799<", self.get("out.wav", "iXML"))

    @needs_decoders
    def test_another_rate_and_depth(self):
        told = self.decode("--rate", "96000", "--bits", "24", "--channels", "2", "--start", "0.1s")
        self.assertEqual(told["kept"], ["bext", "INFO", "cue", "adtl", "iXML"])
        self.assertEqual(self.cue_frames(), [0, 9600])
        self.assertEqual(struct.unpack("<I", self.get("out.wav", "LIST")[-16:-12])[0], 960)  # the range's length
        shown = json.loads(subprocess.run(["exiftool", "-j", "-n", "-charset", "RIFF=UTF8", "out.wav"], cwd=self.folder, capture_output=True).stdout)[0]
        self.assertEqual((shown["TimeReference"], shown["Title"], shown["BwfxmlTimestampSampleRate"]), (2 * (1 << 33) + 9600, "Tïtle", 96000))
        self.assertEqual((shown["BwfxmlFileSampleRate"], shown["BwfxmlAudioBitDepth"]), (96000, 24))
        self.assertEqual(self.get("out.wav", "bext")[602:], HISTORY + b"A=PCM,F=96000,W=24,M=stereo,T=ktfiles decode\r\n")
        # A line that was left open is ended, and what only fills the chunk does not count.
        self.write("a.wav", wave(bext(0, b"A=PCM\0\0\0"), frames=9600))
        self.decode("--bits", "32")
        self.assertEqual(self.get("out.wav", "bext")[602:], b"A=PCM\r\nA=PCM,F=48000,W=32,M=mono,T=ktfiles decode\r\n")

    def test_what_cannot_be_made_true_is_told(self):
        self.write("a.wav", wave(chunk(b"MD5 ", hashlib.md5(wave(frames=9600)[44:]).digest()[::-1]), frames=9600))
        self.assertEqual((self.decode()["kept"], self.decode("--bits", "24")["notKept"]), (["MD5"], ["MD5 is not carried over"]))
        self.write("a.wav", wave(chunk(b"iXML", b"<TRACK/><SYNC_POINT_LOW>5</SYNC_POINT_LOW><TRACK>"), frames=9600))
        told = self.decode("--start", "1", "--channels", "2")
        self.assertEqual(told["notKept"], ["iXML still has times of the whole file at its own rate", "iXML still has the tracks of the file"])
        self.write("a.wav", wave(info(INAM="a"), chunk(b"LIST", b"INFOxxxx", size=99), frames=9600))
        self.assertEqual(self.record("decode", "a.wav", "-o", "out.wav", "--force")["notKept"], ["LIST is not carried over"])
        self.write("a.wav", wave(chunk(b"axml", b'<a sampleRate="48000"/>'), frames=9600))
        self.assertEqual(self.decode("--bits", "32")["notKept"], ["axml still has the sample rates and bit depths of the file"])

    def test_between_containers_and_back(self):
        titles = {"aiff": ("NAME", "Tïtle".encode()), "caf": ("info", None)}
        for form, (name, body) in titles.items():
            told = self.decode(out=f"x.{form}")
            self.assertEqual(told["notKept"], ["bext, iXML, axml, note are not carried over", "of its texts ISFT is not carried over",
                                               "of its markers only places and names are kept"])
            if body:
                self.assertEqual(self.get(f"x.{form}", name), body)
            shown = subprocess.run(["ffprobe", "-v", "error", "-show_entries", "format_tags", "-of", "json", f"x.{form}"],
                                   cwd=self.folder, capture_output=True).stdout
            tags = json.loads(shown)["format"]["tags"]
            self.assertEqual((tags["title"], tags.get("artist", tags.get("author"))), ("Tïtle", "Somebody"))
            told = self.record("decode", f"x.{form}", "-o", f"{form}.wav")
            self.assertEqual((told["kept"], told.get("notKept")), (["INFO", "cue", "adtl"], None))
            self.assertEqual(self.get(f"{form}.wav", "cue"), self.get("a.wav", "cue"))
            self.assertEqual(self.get(f"{form}.wav", "LIST"), labels((1, b"one"), (2, b"two"), (7, b"end"))[8:])
            for other in titles:  # and a part of it, in either
                self.run_command("decode", f"x.{form}", "-o", f"y.{other}", "--start", "4800", "--force")
                self.run_command("decode", f"y.{other}", "-o", "y.wav", "--force")
                self.assertEqual(self.cue_frames("y.wav"), [0, 4800], (form, other))
        marks = subprocess.run(["sndfile-info", "x.aiff"], cwd=self.folder, capture_output=True, text=True).stdout
        self.assertEqual(re.findall(r"Position : (\d+)\s+Name     : (\w+)", marks), [("0", "one"), ("4800", "two"), ("9600", "end")])

    def test_points_in_compressed_sound(self):
        """Their offsets count from the block on that they name, and mean nothing behind the decoder."""
        fmt = chunk(b"fmt ", struct.pack("<HHIIHHHH", 17, 1, 8000, 4055, 256, 4, 2, 505))
        point = chunk(b"cue ", struct.pack("<IIi4sIII", 1, 1, 510, b"data", 0, 256, 5))
        body = b"WAVE" + fmt + chunk(b"fact", struct.pack("<I", 1010)) + chunk(b"data", bytes(512)) + point
        self.write("a.wav", b"RIFF" + struct.pack("<I", len(body)) + body)
        self.assertEqual((self.decode()["kept"], self.get("out.wav", "cue")), (["cue"], cues((1, 510))[8:]))
        self.decode(out="x.aiff")
        self.assertEqual(self.get("x.aiff", "MARK"), struct.pack(">HhIBx", 1, 1, 510, 0))

    def test_remarks_of_aiff(self):
        comments = struct.pack(">HIhH", 2, 7, 0, 3) + b"who\0" + struct.pack(">IhH", 8, 1, 4) + b"mark"
        body = b"AIFF" + b"".join(chunk(*item, ">") for item in (
            (b"COMM", struct.pack(">hIh", 1, 4, 16) + b"\x40\x0e\xbb\x80" + bytes(6)), (b"ANNO", b"one"), (b"COMT", comments),
            (b"ANNO", b"two"), (b"SSND", bytes(16))))
        self.write("a.wav", b"FORM" + struct.pack(">I", len(body)) + body)
        self.decode(out="x.aiff")
        self.assertEqual([line.split()[0] for line in self.lines("chunks", "x.aiff")], ["COMM", "ANNO", "COMT", "ANNO", "SSND"])
        self.assertEqual(self.get("x.aiff", "COMT"), comments)
        self.assertEqual(self.decode(out="x.caf")["notKept"], ["ANNO is not carried over", "of its markers only places and names are kept"])
        self.decode()
        self.assertEqual(self.get("out.wav", "LIST"), info(ICMT="one\nwho\ntwo")[8:])

    def test_texts_in_other_encodings(self):
        name, latin = chunk(b"NAME", b"\x8a", ">"), chunk(b"LIST", b"INFO" + chunk(b"INAM", b"\xe4\0"))
        aiff = b"AIFF" + name + chunk(b"COMT", struct.pack(">HIhH", 1, 0, 0, 3) + b"who\0", ">") + chunk(b"ANNO", b"what", ">") + \
            chunk(b"COMM", struct.pack(">hIh", 1, 4, 16) + b"\x40\x0e\xbb\x80" + bytes(6), ">") + chunk(b"SSND", bytes(16), ">")
        self.write("a.wav", b"FORM" + struct.pack(">I", len(aiff)) + aiff)
        self.decode()
        self.assertEqual(self.get("out.wav", "LIST"), info(INAM="ä", ICMT="who\nwhat")[8:])
        self.write("a.wav", wave(latin, frames=9600))
        self.decode(out="x.caf")
        self.assertEqual(self.get("x.caf", "info"), b"\0\0\0\1title\0\xc3\xa4\0")
        self.decode(out="raw.wav")  # the same container needs none
        self.assertEqual(self.get("raw.wav", "LIST"), latin[8:])


if __name__ == "__main__":
    unittest.main()
