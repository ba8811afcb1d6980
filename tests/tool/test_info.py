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
                if item["bitsPerSample"] > 4:  # the count of a compressed file's frames is a matter of padding
                    self.assertEqual(item["frames"], frames)
                    self.assertAlmostEqual(item["durationSeconds"], frames / rate)
                self.assertEqual(item["fileLength"], os.path.getsize(item["path"]))

    @needs_decoders
    def test_compressed_files(self):
        for name, row in (("a.mp3", ["MP3", "1.000000", "44100", "MP3", "2"]),
                          ("a.m4a", ["M4A", "1.000000", "44100", "AAC", "2"]),
                          ("a.flac", ["FLAC", "1.000000", "44100", "FLAC 16-bit", "2"]),
                          ("a.ogg", ["Ogg", "1.000000", "44100", "FLAC 16-bit", "2"])):
            with self.subTest(name):
                path = self.encoded(name, *(("-c:a", "flac") if name == "a.ogg" else ()))
                self.assertEqual(self.lines("info", path), ["\t".join([str(path), *row])])
                item = self.json("info", path)[0]
                self.assertEqual([item[key] for key in ("frames", "bitsPerSample", "fileLength")],
                                 [44100, 0, path.stat().st_size])
        # AAC in LOAS, and WAVE behind a tag of MP3.
        item = self.json("info", self.encoded("a.latm", "-c:a", "aac", "-f", "latm"))[0]
        self.assertEqual((item["coding"], item["sampleRate"]), ("AAC", 44100))
        tag = b"ID3\x03\0\0\0\0\0\x0a" + bytes(10)
        self.write("tagged.wav", tag + wave())
        self.assertEqual(self.lines("info", "tagged.wav"), ["tagged.wav\tWAVE\t0.002083\t48000\t16-bit\t1"])
        # What the library finds by itself needs no module; for the rest the message names what does.
        plain = self.without_decoders()
        for name in ("a.mp3", "a.m4a", "a.flac"):
            self.assertEqual(self.lines("info", name, env=plain), self.lines("info", name))
        self.assertIn("install libktfiles-ffmpeg", self.failure("info", "a.ogg", env=plain))

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
        os.mkdir(self.folder / "folder.wav")
        os.mkfifo(self.folder / "fifo.wav")  # would block whoever opens it
        for length in range(1, 20):
            self.write(f"cut{length}.wav", good[:length])
        bad = ["empty.wav", "folder.wav", "fifo.wav", "/dev/zero", "missing.wav", "good.wav/",
               *(f"cut{length}.wav" for length in range(1, 20))]
        result = self.run_command("info", *bad, "good.wav", "--json", status=1)
        items = json.loads(result.stdout)
        self.assertTrue(all(set(item) == {"path", "error"} for item in items[:-1]))
        self.assertEqual(items[-1]["frames"], 100)
        errors = result.stderr.decode().splitlines()
        self.assertEqual(errors, [f"ktfiles: {item['path']}: {item['error']}" for item in items[:-1]])
        self.assertEqual([item["error"] for item in items[:6]],
                         ["is empty", "is a folder", "is a FIFO, not a regular file", "is a device, not a regular file",
                          "file not found", "not a folder"])

    def test_names(self):
        for name in ("-x.wav", "[a,b]", "chunks", "a b%2F#?.wav", "~root"):
            self.write(name, wave())
            with self.subTest(name):
                self.assertEqual(self.json("info", "--", name)[0].get("frames"), 100)
        latin = os.fsencode(self.folder) + b"/caf\xe9\n\x1b[m.wav"
        with open(latin, "wb") as file:
            file.write(wave())
        result = self.run_command("info", "--json", latin, status=1)
        item = json.loads(result.stdout.decode())[0]  # fails where the output is not UTF-8
        self.assertTrue(item["path"].endswith("/caf\ufffd\n\x1b[m.wav"))
        self.assertEqual(item["error"], "its path is not valid UTF-8")
        self.assertIn("/caf\ufffd\\x0A\\x1B[m.wav: its path", result.stderr.decode())


class Usage(CommandTest):
    def test_mistakes(self):
        self.write("a.wav", wave())
        for arguments in ((), ("info",), ("chunks",), ("info", "-"), ("nothing",), ("info", "a.wav", "--nothing"),
                          ("info", "a.wav", "--color", "red"), ("chunks", "get", "a.wav"),
                          ("chunks", "get", "a.wav", "toolong"), ("chunks", "get", "a.wav", ""),
                          ("chunks", "get", "a.wav", "\\xZZ"), ("chunks", "get", "a.wav", "fmt", "more"),
                          ("chunks", "get", "a.wav", "fmt", "--json"), ("help", "nothing")):
            with self.subTest(arguments):
                result = self.run_command(*arguments, status=2)
                self.assertEqual(result.stdout, b"")
                self.assertNotEqual(result.stderr, b"")


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
