"""ktfiles info, and what all verbs share: usage, output forms, files that cannot be read."""
import json
import os
import re
import struct
import subprocess
import unittest

from command import KTFILES, MEDIA, CommandTest, caf, needs_decoders, wave


class Info(CommandTest):
    def test_describes_files_of_every_container(self):
        # What the files hold was written by other programs; duration is frames over rate.
        files = sorted(str(path) for path in MEDIA.iterdir() if path.suffix in (".wav", ".aiff", ".aifc", ".caf"))
        self.assertGreater(len(files), 5)
        described = self.json("info", *files)
        self.assertEqual([item["path"] for item in described], files)
        for item in described:
            probe = subprocess.run(["soxi", item["path"]], capture_output=True, text=True).stdout
            match = re.search(r"Channels\s+: (\d+)\nSample Rate\s+: (\d+)\n.*?= (\d+) samples", probe, re.DOTALL)
            if not match:  # RF64 and ALAC are beyond that program
                continue
            with self.subTest(item["path"]):
                channels, rate, frames = map(int, match.groups())
                self.assertEqual((item["channels"], item["sampleRate"]), (channels, rate))
                if item.get("bitsPerSample", 0) > 4:  # the count of a compressed file's frames is a matter of padding
                    self.assertEqual(item["frames"], frames)
                    self.assertAlmostEqual(item["durationSeconds"], frames / rate)
                self.assertEqual(item["fileLength"], os.path.getsize(item["path"]))

    @needs_decoders
    def test_compressed_files(self):
        for name, row in (("a.mp3", ["MP3", "1.000000", "44100", "MP3", "2"]),
                          ("a.m4a", ["M4A", "1.000000", "44100", "AAC-LC", "2"]),
                          ("a.flac", ["FLAC", "1.000000", "44100", "FLAC 16-bit", "2"]),
                          ("a.ogg", ["Ogg", "1.000000", "44100", "FLAC 16-bit", "2"])):
            with self.subTest(name):
                path = self.encoded(name, *(("-c:a", "flac") if name == "a.ogg" else ()))
                self.assertEqual(self.lines("info", path), ["\t".join([str(path), *row])])
                item = self.json("info", path)[0]
                self.assertEqual((item["frames"], item["fileLength"]), (44100, path.stat().st_size))
                self.assertFalse({"bitsPerSample", "floatingPoint", "dataOffset"} & set(item))
        # AAC in LOAS, and WAVE behind a tag of MP3.
        item = self.json("info", self.encoded("a.latm", "-c:a", "aac", "-f", "latm"))[0]
        self.assertEqual((item["coding"], item["sampleRate"]), ("AAC-LC", 44100))
        tag = b"ID3\x03\0\0\0\0\0\x0a" + bytes(10)
        self.write("tagged.wav", tag + wave())
        self.assertEqual(self.lines("info", "tagged.wav"), ["tagged.wav\tWAVE\t0.002083\t48000\t16-bit\t1"])
        # A known kind that nothing here decodes is told by its name.
        self.write("a.aac", b"ADIF" + bytes(range(200)))
        self.assertEqual(self.failure("info", "a.aac"), "ktfiles: a.aac: AAC in ADIF: no audio that can be decoded\n")
        # What the library finds by itself needs no module; for the rest the message names what does.
        plain = self.without_decoders()
        proven = ("a.opus", "a.tta", "a.mp2", "a.ac3")
        for name in proven:
            self.encoded(name)
        for name in ("a.mp3", "a.m4a", "a.flac", "a.ogg", *proven):
            self.assertEqual(self.lines("info", name, env=plain), self.lines("info", name))
        self.assertIn("install libktfiles-ffmpeg", self.failure("info", self.encoded("a.wma"), env=plain))

    def test_what_counts_and_what_is_missing(self):
        def extensible(valid):
            return struct.pack("<HHIIHHHHIH", 0xFFFE, 1, 48000, 192000, 4, 32, 22, valid, 4, 1) + bytes.fromhex(
                "000000001000800000AA00389B71")
        body = b"fmt " + struct.pack("<I", 40) + extensible(24) + b"data" + struct.pack("<I", 48000 * 4) + bytes(4800 * 4)
        self.write("cut.wav", b"RIFF" + struct.pack("<I", 60 + 48000 * 4) + b"WAVE" + body)
        text, _ = self.on_terminal("info", "cut.wav", NO_COLOR="1")
        self.assertIn("0:00.100 of 0:01.000  48 kHz  24 in 32-bit", text)
        item = self.json("info", "cut.wav")[0]
        self.assertEqual([item[key] for key in ("isWhole", "missingBytes", "promisedFrames", "frames", "sourceBits", "coding")],
                         [False, 43200 * 4, 48000, 4800, 24, "PCM"])
        self.write("a.wav", wave())
        item = self.json("info", "a.wav")[0]
        self.assertTrue(item["isWhole"])
        self.assertFalse({"missingBytes", "promisedFrames", "bitRate"} & set(item))
        for name, word, options in (("b.wav", "RIFX", ("-B",)), ("b.au", "NeXT", ())):
            subprocess.run(["sox", "a.wav", *options, name], cwd=self.folder, check=True)
            item = self.json("info", name, env=self.without_decoders())[0]
            self.assertEqual([item[key] for key in ("fileType", "coding", "frames", "bitsPerSample")], [word, "PCM", 100, 16])

    @needs_decoders
    def test_profile_and_layout_are_those_that_ffprobe_tells(self):
        six, mono = ("-af", "pan=5.1|c0=c0|c1=c1|c2=c0|c3=c0|c4=c0|c5=c1"), ("-ac", "1")
        for name, options in (("a.m4a", ()), ("six.m4a", six), ("low.aac", ("-ar", "22050")), ("mono.aac", mono),
                              ("six.aac", six), ("a.mp3", ()), ("mono.mp3", mono), ("six.flac", six), ("six.ac3", six),
                              ("six.wv", six), ("six.caf", ("-c:a", "alac", *six)), ("six.ogg", six), ("six.wav", six),
                              ("alac.m4a", ("-c:a", "alac", *six)), ("six.mka", six), ("side.wav", (*six, "-channel_layout", "5.1(side)")),
                              ("three.flac", ("-af", "pan=2.1|c0=c0|c1=c1|c2=c0"))):
            with self.subTest(name):
                path = self.encoded(name, *options, seconds=0.3)
                probed = json.loads(subprocess.run(
                    ["ffprobe", "-v", "error", "-show_streams", "-of", "json", path], capture_output=True).stdout)["streams"][0]
                item = self.json("info", name)[0]
                self.assertEqual(item.get("channelLayout"), re.sub(r"\(.*\)", "", probed.get("channel_layout", "")) or None)
                if probed["codec_name"] == "aac":
                    self.assertEqual(item["coding"], "AAC-" + probed["profile"])
        # Nothing is said where the file says nothing; the names of several speakers together; orders of CAF's own.
        self.write("plain.wav", wave())
        self.assertNotIn("channelLayout", self.json("info", "plain.wav")[0])
        mask = struct.pack("<HHIIHHHHIH", 0xFFFE, 3, 48000, 288000, 6, 16, 22, 16, 0x803, 1) + bytes.fromhex(
            "000000001000800000AA00389B71")
        body = b"WAVEfmt " + struct.pack("<I", 40) + mask + b"data" + struct.pack("<I", 600) + bytes(600)
        self.write("odd.wav", b"RIFF" + struct.pack("<I", len(body)) + body)
        self.assertEqual(self.json("info", "odd.wav")[0]["channelLayout"], "L+R+Tc")
        self.write("order.caf", caf((b"chan", struct.pack(">III", 123 << 16 | 6, 0, 0))))
        self.assertEqual(self.json("info", "order.caf")[0]["channelLayout"], "5.1")

    @needs_decoders
    def test_first_of_several_tracks(self):
        self.encoded("mono.wav", "-ac", "1", seconds=1)
        self.encoded("stereo.wav", seconds=2)
        for name, options in (("a.m4a", ()), ("alac.mov", ("-c:a", "alac")), ("a.mka", ("-c:a", "flac")),
                              ("ac3.mp4", ("-c:a", "ac3")), ("a.ts", ("-c:a", "mp2"))):
            with self.subTest(name):
                subprocess.run(["ffmpeg", "-v", "error", "-i", "mono.wav", "-i", "stereo.wav", "-map", "0", "-map", "1", *options,
                                "-disposition:a:1", "default", name], cwd=self.folder, check=True)
                item = self.json("info", name)[0]
                self.assertEqual((item["channels"], item["audioTracks"], round(item["durationSeconds"])), (1, 2, 1))
                self.assertNotIn("bitRate", item)
                self.assertIn("mono, first of 2 tracks", self.on_terminal("info", "-l", name, NO_COLOR="1")[0])
                self.run_command("decode", name, "-o", "out.wav", "--force", "--quiet")
                out = self.json("info", "out.wav")[0]
                self.assertEqual((out["channels"], out["frames"]), (1, item["frames"]))

    @needs_decoders
    def test_dsd_has_a_rate_of_its_own(self):
        def dsf(rate, data=bytes(range(256)) * 32):
            fmt = b"fmt " + struct.pack("<QIIIIIIQII", 52, 1, 0, 2, 2, rate, 1, len(data) * 4, 4096, 0)
            body = fmt + b"data" + struct.pack("<Q", 12 + len(data)) + data
            return b"DSD " + struct.pack("<QQQ", 28, 28 + len(body), 0) + body
        def dff(rate, data=bytes(range(256)) * 32):
            def chunk(name, content):
                return name + struct.pack(">Q", len(content)) + content + b"\0" * (len(content) & 1)
            prop = b"SND " + chunk(b"FS  ", struct.pack(">I", rate)) + chunk(b"CHNL", b"\0\2SLFTSRGT") + chunk(
                b"CMPR", b"DSD \x0enot compressed")
            body = b"DSD " + chunk(b"FVER", b"\1\5\0\0") + chunk(b"PROP", prop) + chunk(b"DSD ", data)
            return b"FRM8" + struct.pack(">Q", len(body)) + body
        for name, make, rate, word in (("a.dsf", dsf, 2822400, "2.8224"), ("b.dff", dff, 5644800, "5.6448")):
            with self.subTest(name):
                self.write(name, make(rate))
                item = self.json("info", name)[0]
                self.assertEqual([item[key] for key in ("dsdRate", "sampleRate", "coding", "channels", "frames", "isWhole")],
                                 [rate, rate // 8, "DSD", 2, 4096, True])
                line = self.lines("info", name)[0].split("\t")
                self.assertEqual((line[1], line[4]), (name[2:].upper(), f"DSD {word} MHz"))
                subprocess.run(["wavpack", "-q", name, "-o", "packed.wv", "-y"], cwd=self.folder, check=True)
                item = self.json("info", "packed.wv")[0]
                self.assertEqual((item["dsdRate"], item["frames"]), (rate, 4096))
                self.assertIn(f"WavPack DSD {word} MHz", self.lines("info", "packed.wv")[0])

    @needs_decoders
    def test_cut_files_say_what_their_headers_promise(self):
        for name, options in (("a.flac", ()), ("a.mp3", ()), ("a.m4a", ("-movflags", "faststart")), ("b.wv", ()), ("a.tta", ()),
                              ("a.caf", ("-c:a", "alac")), ("ac3.mp4", ("-c:a", "ac3", "-movflags", "faststart")),
                              ("he.m4a", ("-ar", "22050", "-movflags", "faststart"))):
            with self.subTest(name):
                path = self.encoded(name, *options, seconds=3)
                whole = self.json("info", name)[0]
                self.assertTrue(whole["isWhole"])
                self.assertNotIn("promisedFrames", whole)
                content = path.read_bytes()
                if name == "a.caf":  # its packet table moves ahead of the samples
                    data, table = content.index(b"data"), content.rindex(b"pakt")
                    content = content[:data] + content[table:] + content[data:table]
                path.write_bytes(content[:len(content) // 2])
                cut = self.json("info", name)[0]
                self.assertFalse(cut["isWhole"])
                self.assertLess(cut["frames"], whole["frames"])
                self.assertAlmostEqual(cut["promisedFrames"], whole["frames"], delta=4096)  # CAF counts whole packets
                self.assertIn(" of 0:03.0", self.on_terminal("info", name, NO_COLOR="1")[0])

    def test_forms(self):
        self.write("a.wav", wave())
        self.write("ループ音.wav", wave(frames=48000 * 61))
        self.assertEqual(self.lines("info", "a.wav"), ["a.wav\tWAVE\t0.002083\t48000\t16-bit\t1"])
        text, status = self.on_terminal("info", "a.wav", "ループ音.wav", NO_COLOR="1")
        self.assertEqual(status, 0)
        self.assertEqual(text, "FILE          TYPE  DURATION    RATE  FORMAT  CHANNELS\n"
                               "a.wav         WAVE  0:00.002  48 kHz  16-bit  mono\n"
                               "ループ音.wav  WAVE  1:01.000  48 kHz  16-bit  mono\n")
        colored = "\x1b[1m"
        self.assertIn(colored, self.on_terminal("info", "a.wav", NO_COLOR="")[0])
        self.assertNotIn(colored, self.on_terminal("info", "a.wav", "--color", "never")[0])
        self.assertIn(colored, self.run_command("info", "a.wav", "--color=always").stdout.decode())
        self.assertEqual(self.lines("info", "a.wav", "--quiet"), [])

    def test_one_bad_file_does_not_stop_the_others(self):
        good = wave()
        self.write("good.wav", good)
        self.write("empty.wav", b"")
        os.mkfifo(self.folder / "fifo.wav")  # would block whoever opens it
        for length in range(1, 20):
            self.write(f"cut{length}.wav", good[:length])
        bad = ["empty.wav", "fifo.wav", "/dev/zero", "missing.wav", "good.wav/",
               *(f"cut{length}.wav" for length in range(1, 20))]
        result = self.run_command("info", *bad, "good.wav", "--json", status=1)
        items = json.loads(result.stdout)
        self.assertTrue(all(set(item) == {"path", "error"} for item in items[:-1]))
        self.assertEqual(items[-1]["frames"], 100)
        errors = result.stderr.decode().splitlines()
        self.assertEqual(errors, [f"ktfiles: {item['path']}: {item['error']}" for item in items[:-1]])
        self.assertEqual([item["error"] for item in items[:5]],
                         ["is empty", "is a FIFO, not a regular file", "is a device, not a regular file",
                          "file not found", "not a folder"])

    def test_names(self):
        for name in ("-x.wav", "[a,b]", "chunks", "a b%2F#?.wav", "~root"):
            self.write(name, wave())
            with self.subTest(name):
                self.assertEqual(self.json("info", "--", name)[0].get("frames"), 100)
        latin = os.fsencode(self.folder) + b"/caf\xe9\n\x1b[m.wav"
        with open(latin, "wb") as file:
            file.write(wave())
        item = self.record("info", latin)
        self.assertTrue(item["path"].endswith("/caf\\xE9\n\x1b[m.wav"))
        self.assertTrue(self.lines("info", latin)[0].split("\t")[0].endswith("/caf\\xE9\\x0A\\x1B[m.wav"))


class Usage(CommandTest):
    def test_mistakes(self):
        self.write("a.wav", wave())
        for arguments in ((), ("info",), ("chunks",), ("nothing",), ("info", "a.wav", "--nothing"),
                          ("info", "a.wav", "--color", "red"), ("chunks", "get", "a.wav"),
                          ("chunks", "get", "a.wav", "toolong"), ("chunks", "get", "a.wav", ""),
                          ("chunks", "get", "a.wav", "\\xZZ"), ("chunks", "get", "a.wav", "fmt", "more"),
                          ("chunks", "get", "a.wav", "fmt", "--json"), ("help", "nothing")):
            with self.subTest(arguments):
                result = self.run_command(*arguments, status=2)
                self.assertEqual(result.stdout, b"")
                self.assertNotEqual(result.stderr, b"")
        for arguments, verbs in ((("chunks", "get", "a.wav", "toolong"), "chunks get"), (("info", "--nothing"), "info")):
            self.assertTrue(self.run_command(*arguments, status=2).stderr.decode().endswith(f'\nTry "ktfiles help {verbs}".\n'))
        self.assertTrue(self.run_command("nothing", status=2).stderr.endswith(b'\nTry "ktfiles help".\n'))
        for arguments in (("inf",), ("help", "INOF")):
            self.assertIn(b'did you mean "info"?', self.run_command(*arguments, status=2).stderr)
        self.assertNotIn(b"did you mean", self.run_command("nothing", status=2).stderr)
        text = self.run_command("help", "info").stdout.decode()
        self.assertLess(text.index("--check"), text.index("--json"))
        self.assertEqual(self.run_command("-V").stdout, self.run_command("--version").stdout)


class Output(CommandTest):
    def test_failing_output(self):
        files = [str(self.write(f"{i}.wav", wave())) for i in range(3)]
        with open("/dev/full", "wb") as full:
            result = subprocess.run([KTFILES, "info", *files], stdout=full, stderr=subprocess.PIPE)
        self.assertEqual((result.returncode, result.stderr), (1, b"ktfiles: standard output: disk full\n"))
        closed = subprocess.run(["sh", "-c", 'exec "$0" info "$1" >&-', KTFILES, files[0]], stderr=subprocess.PIPE)
        self.assertEqual(closed.returncode, 1)
        # A reader that goes away ends the command, and not its user's patience.
        for ignored in ("", "trap '' PIPE;"):
            script = f'{ignored} {{ "$0" info "$@"; echo $? >&2; }} | true'
            result = subprocess.run(["bash", "-c", script, KTFILES, *files * 5000], stderr=subprocess.PIPE)
            self.assertIn(result.stderr, (b"141\n", b"1\n"))


if __name__ == "__main__":
    unittest.main()
