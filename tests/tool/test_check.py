"""ktfiles info --check, --md5 and --sha256: what is off in files, and digests of their sound."""
import hashlib
import json
import struct
import subprocess
import unittest

from command import KTFILES, MEDIA, CommandTest, caf, chunk, needs_decoders, wave


class Check(CommandTest):
    def make(self, *commands):
        """Not every program has every format."""
        for command in commands:
            subprocess.run(command, shell=True, check=False, cwd=self.folder, stdout=subprocess.DEVNULL,
                           stderr=subprocess.DEVNULL, stdin=subprocess.DEVNULL)

    @needs_decoders
    def test_is_silent_about_what_encoders_write(self):
        # Odd numbers of bytes, too; of AIFF in 24 bits some leave out the last pad byte, and are told.
        self.make("sox -n -r 44100 -b 16 -c 2 a.wav synth 4411s sine 300", "sox -n -r 44100 -b 8 -c 1 b.wav synth 441s sine 300",
                  "sox -n -r 48000 -b 24 -c 1 c.wav synth 444s sine 300")
        for name in "abc":
            self.make(*(f"sox {name}.wav {name}.sox.{kind}" for kind in ("aiff", "aifc", "au", "caf", "w64")),
                      *(f"ffmpeg -i {name}.wav {name}.ff.{kind}" for kind in ("wav", "aiff", "au", "caf", "w64")),
                      *(f"sndfile-convert {name}.wav {name}.sf.{kind}" for kind in ("wav", "aiff", "aifc", "au", "caf", "w64")),
                      f"ffmpeg -i {name}.wav -rf64 always {name}.rf64.wav", f"ffmpeg -i {name}.wav -c:a adpcm_ms {name}.ms.wav",
                      f"ffmpeg -i {name}.wav -c:a adpcm_ima_wav {name}.ima.wav", f"sox {name}.wav -e float {name}.float.wav",
                      f"sox {name}.wav -e u-law {name}.ulaw.wav", f"sox {name}.wav -e gsm {name}.gsm.wav",
                      f"flac {name}.wav -o {name}.flac", f"flac -d {name}.flac -o {name}.flacd.wav",
                      f"flac -d --force-aiff-format {name}.flac -o {name}.flacd.aiff",
                      f"flac -d --force-wave64-format {name}.flac -o {name}.flacd.w64",
                      f"wavpack {name}.wav -o {name}.wv", f"wvunpack {name}.wv -o {name}.wvd.wav",
                      f"wvunpack --caf-be {name}.wv -o {name}.wvd.caf", f"oggenc {name}.wav -o {name}.ogg",
                      f"oggdec {name}.ogg -o {name}.oggd.wav", f"opusenc {name}.wav {name}.opus",
                      f"opusdec {name}.opus {name}.opusd.wav", f"lame {name}.wav {name}.mp3",
                      f"lame --decode {name}.mp3 {name}.lamed.wav", f"mpg123 -w {name}.mpg.wav {name}.mp3",
                      f"{KTFILES} decode {name}.ogg -o {name}.own.wav", f"{KTFILES} decode {name}.ogg -o {name}.own.caf")
        (self.folder / "c.sox.aiff").unlink()
        (self.folder / "c.sox.aifc").unlink()
        files = sorted(path.name for path in self.folder.iterdir())
        self.assertGreater(len(files), 90)
        result = self.run_command("info", "--check", *files)
        self.assertEqual((result.stdout, result.stderr), (b"", b""))

    def test_tells_what_is_off_and_where(self):
        good = wave(chunk(b"note", b"odd"))
        self.write("good.wav", good)
        self.write("cut.wav", good[:-100])
        self.write("fact.caf", caf((b"info", b"\0\0\0\0"), (b"info", b"\0\0\0\0")))
        result = self.run_command("info", "--check", "good.wav", "cut.wav", "fact.caf", status=1)
        self.assertEqual(result.stdout.decode().splitlines(), [
            f'cut.wav: 0: "RIFF" says that it ends at {len(good)}, the file ends at {len(good) - 100}; readers take what is there',
            f'cut.wav: 36: "data" says 200 bytes, {len(good) - 144} are there; readers take what is there, or refuse the file',
            'fact.caf: 68: "info" stands here again, first at 52; readers take one of them'])
        self.assertEqual(result.stderr, b"")
        records = self.json("info", "--check", "good.wav", "cut.wav", status=1)
        self.assertEqual([record["path"] for record in records], ["good.wav", "cut.wav"])
        self.assertEqual(records[0]["findings"], [])
        self.assertEqual([finding["kind"] for finding in records[1]["findings"]], ["containerIsCut", "chunkIsCut"])
        self.assertEqual(records[1]["findings"][1]["offset"], 36)
        self.assertEqual(records[1]["findings"][1]["id"], "data")
        self.write("a.aifc", (MEDIA / "tone-fl32.aifc").read_bytes().replace(b"FVER", b"ever"))
        self.assertEqual(self.lines("info", "--check", "a.aifc", status=1),
                         ['a.aifc: 0: "FVER" is missing; strict readers refuse the file'])
        # What cannot be read at all is an error as ever.
        self.write("none.wav", b"")
        self.assertEqual(self.failure("info", "--check", "none.wav"), "ktfiles: none.wav: is empty\n")

    def test_tells_of_every_file_that_info_calls_cut(self):
        contents = {"wav": wave(chunk(b"note", b"odd")), "caf": caf((b"note", b"odd"))}
        for name in ("kick-24-rf64.wav", "tone-adpcm.wav", "tone-16.aiff", "tone-fl32.aifc", "pluck-24-le.caf"):
            contents[name] = (MEDIA / name).read_bytes()
        for name, content in contents.items():
            for part in range(1, 17):
                self.write(f"{part}.{name}", content[:len(content) * part // 16])
        info, check = ({record["path"]: record for record in json.loads(
            subprocess.run([KTFILES, "info", "--json", *options, "."], cwd=self.folder, capture_output=True).stdout)}
            for options in ((), ("--check",)))
        cut = [path for path, record in info.items() if record.get("isWhole") is False]
        self.assertGreater(len(cut), 50)
        for path in cut:
            self.assertTrue(check[path].get("findings"), path)

    def test_embedded_digest(self):
        # Of the two orders the first is the published one: a number of 128 bits, little-endian, as mediainfo reads it.
        digest = hashlib.md5(wave()[44:]).digest()
        for name, body, kinds in (("a.wav", digest[::-1], []), ("b.wav", digest, []), ("c.wav", bytes(16), ["digestDiffers"]),
                                  ("d.wav", digest[:15], ["digestIsWrong"])):
            self.write(name, wave(chunk(b"MD5 ", body)))
            findings = self.json("info", "--check", name, status=1 if kinds else 0)[0]["findings"]
            self.assertEqual([(one["kind"], one["offset"]) for one in findings], [(kind, 244) for kind in kinds], name)
        shown = subprocess.run(["mediainfo", "--Details=1", self.folder / "a.wav"], capture_output=True, text=True).stdout
        self.assertIn(f"(0x{digest.hex().upper()})", shown)
        # Sound that changes; and sound that lacks some, of which no more is said.
        self.write("e.wav", wave(chunk(b"MD5 ", digest[::-1])).replace(b"\x41\x42", b"\x41\x43", 1))
        self.assertIn(' 244: "MD5 " states another MD5', self.lines("info", "--check", "e.wav", status=1)[0])

    def test_tracks_against_channels_and_document(self):
        def chna(*uids, track=1):
            rows = b"".join(struct.pack("<H12s14s11sx", track + i, uid, b"AT_00010001_01", b"AP_00010001") for i, uid in enumerate(uids))
            return chunk(b"chna", struct.pack("<HH", len(uids), len(uids)) + rows)

        axml = chunk(b"axml", b'<ebuCoreMain><audioFormatExtended><audioTrackUID UID="ATU_00000001"/></audioFormatExtended></ebuCoreMain>')
        one, two = b"ATU_00000001", b"ATU_00000002"
        for name, chunks, texts in (
                ("good.wav", [axml, chna(one)], []), ("common.wav", [chna(one)], []), ("text.wav", [chunk(b"axml", b"<a/>")], []),
                ("channel.wav", [chna(one, track=2)], ["in track 2, and the file 1 channel"]),
                ("undefined.wav", [chna(two), axml], ["'ATU_00000001' is not in", "'ATU_00000002' of the chunk"]),
                ("counts.wav", [chna(one)[:-40] + bytes(40)], ["counts 1 track, and uses 0"]),
                ("more.wav", [chunk(b"chna", chna(one, two)[8:10] + b"\1\0" + chna(one, two)[12:])],
                 ["'ATU_00000002' in track 2", "counts 1 UID, and 1 behind"][1:]),
                ("none.wav", [axml], ["no chunk \"chna\" tells"]), ("broken.wav", [chunk(b"axml", b"<a>\n<b>")], ["beyond its line 2"])):
            self.write(name, wave(*chunks))
            found = self.lines("info", "--check", name, status=1 if texts else 0)
            self.assertEqual(len(found), len(texts), found)
            for line, text in zip(found, texts):
                self.assertIn(text, line)
                self.assertRegex(line, f"^{name}: 244: \"(chna|axml)\" ")
        self.assertEqual([one["kind"] for name in ("none.wav", "broken.wav") for one in
                          self.json("info", "--check", name, status=1)[0]["findings"]], ["tracksDiffer", "documentIsBroken"])

    @needs_decoders
    def test_compressed_files_that_lack_some(self):
        path = self.encoded("a.flac", seconds=3)
        self.assertEqual(self.lines("info", "--check", "a.flac"), [])
        path.write_bytes(path.read_bytes()[:-20000])
        (line,) = self.lines("info", "--check", "a.flac", status=1)
        self.assertRegex(line, r"^a.flac: promises 132300 frames, \d+ are there; readers take what is there$")


class Digests(CommandTest):
    def test_are_of_the_samples_alone(self):
        samples = bytes(range(200))
        self.write("a.wav", wave(chunk(b"bext", bytes(602))))
        sound = wave()[44:]
        rows = self.lines("info", "--md5", "--sha256", "a.wav")
        self.assertEqual(rows[0].split("\t")[-2:], [hashlib.md5(sound).hexdigest(), hashlib.sha256(sound).hexdigest()])
        self.write("a.caf", caf(samples=samples))
        self.assertEqual(self.json("info", "--md5", "a.caf")[0]["md5"], hashlib.md5(samples).hexdigest())

    @needs_decoders
    def test_agree_with_flac(self):
        self.encoded("a.wav", "-c:a", "pcm_s16le")
        subprocess.run(["flac", "--totally-silent", "a.wav"], check=True, cwd=self.folder)
        stated = subprocess.run(["metaflac", "--show-md5sum", "a.flac"], check=True, cwd=self.folder, capture_output=True,
                                text=True).stdout.strip()
        records = self.json("info", "--md5", "a.wav", "a.flac")
        self.assertEqual([record["md5"] for record in records], [stated, stated])
        # Of an MP3 nobody keeps one; SHA-256 is not FLAC's.
        self.encoded("a.mp3")
        records = self.json("info", "--md5", "--sha256", "a.mp3", "a.flac")
        self.assertEqual([("md5" in record, "sha256" in record) for record in records], [(False, False), (True, False)])


if __name__ == "__main__":
    unittest.main()
