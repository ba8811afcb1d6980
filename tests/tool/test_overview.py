"""ktfiles overview: sparklines, numbers, pictures compared with the points they show, and stored overviews."""
import json
import math
import os
import pty
import random
import shutil
import signal
import struct
import subprocess
import unittest

from command import KTFILES, MEDIA, CommandTest, caf, chunk, needs_decoders, wave
from picture import WhiteOnBlack, decoded_png, svg_waves

TIME_STRIP = 27
PICTURE = ("--colors", WhiteOnBlack.COLORS)


def pcm(samples, channels=1, rate=8000, size=None):
    """A 16-bit WAVE file; `size` overrides the size of its samples."""
    body = struct.pack(f"<{len(samples)}h", *samples)
    fmt = chunk(b"fmt ", struct.pack("<HHIIHH", 1, channels, rate, rate * channels * 2, channels * 2, 16))
    data = chunk(b"data", body, size=size)
    return b"RIFF" + struct.pack("<I", 4 + len(fmt) + len(data)) + b"WAVE" + fmt + data


def click(frames, at):
    samples = [0] * frames
    samples[at] = 32767
    return samples


class Picture(CommandTest):
    def draw(self, samples, *options, width=600, height=280, channels=1, rate=8000):
        """The points, and the picture of them."""
        self.write("a.wav", pcm(samples, channels, rate))
        size = ("--width", str(width), "--height", str(height))
        png = self.run_command("overview", "a.wav", "--png", "-", *size, *PICTURE, *options).stdout
        self.svg = self.run_command("overview", "a.wav", "--svg", "-", *size, *options).stdout
        return self.record("overview", "a.wav")["points"], WhiteOnBlack(png)

    @staticmethod
    def edges(low, high, height):
        """Where a column from `low` to `high`, in samples of 16 bits, is to begin and end."""
        centre = (height - TIME_STRIP) / 2
        reach = centre - min(max((height - TIME_STRIP) * 0.05, 0.5), 12)
        top, bottom = centre - high / 32768 * reach, centre - low / 32768 * reach
        return (top, bottom) if bottom - top >= 1 else ((top + bottom - 1) / 2, (top + bottom + 1) / 2)

    def assert_edges(self, found, expected, slack=0.06):
        self.assertAlmostEqual(found[0], expected[0], delta=slack)
        self.assertAlmostEqual(found[1], expected[1], delta=slack)

    def test_each_column_shows_the_extremes_of_its_samples(self):
        noise = random.Random(1)
        frames = 256 * 1500 + 77
        samples = [int(noise.uniform(-1, 1) * 32000 * (0.02 + 0.98 * abs(math.sin(i / 9000)))) for i in range(frames)]
        for width, height in ((600, 280), (2170, 90)):  # above and below the frames of a point
            points, picture = self.draw(samples, width=width, height=height)
            self.assertEqual((picture.width, picture.height, len(points)), (width, height, 1501))
            stairs = svg_waves(self.svg)[0][0]
            for x in range(0, width, 3):
                first = x * frames / width
                shown = samples[int(first + 1e-6):math.ceil(first + frames / width - 1e-6)]
                expected = self.edges(min(shown), max(shown), height)
                with self.subTest(x=x, width=width):
                    # Behind a peak that ends within a pixel stands the lighter of two pixels alone: half a pixel.
                    self.assert_edges(picture.extent(x), expected, slack=0.55)
                    ends = [y for corner_x, y in stairs if corner_x == x + 1]
                    self.assertTrue(any(abs(y - expected[0]) < 0.02 for y in ends), (ends, expected))
                    self.assertTrue(any(abs(y - expected[1]) < 0.02 for y in ends), (ends, expected))

    def test_known_signals(self):
        loud = 32000
        upper, lower, silent = self.edges(0, loud, 280), self.edges(-loud, 0, 280), self.edges(0, 0, 280)
        high, low = self.edges(loud, loud, 280), self.edges(-loud, -loud, 280)
        square = [loud if i // 2560 % 2 == 0 else -loud for i in range(25600)]
        for name, samples, channels, expected in (
                ("full", [loud, -loud] * 12800, 1, lambda x: self.edges(-loud, loud, 280)),
                ("square", square, 1, lambda x: high if x // 60 % 2 == 0 else low),
                ("negative", [-loud] * 25600, 1, lambda x: low),
                ("left only", [-loud, 0] * 160000, 2, lambda x: upper),
                ("right only", [0, loud] * 160000, 2, lambda x: lower),
                ("silence", [0] * 25600, 1, lambda x: silent)):
            with self.subTest(name):
                _, picture = self.draw(samples, channels=channels)
                for x in range(60, 600, 12):  # beside the names of the channels, away from the square's flanks
                    if name != "square" or 6 <= x % 60 < 54:
                        self.assert_edges(picture.extent(x), expected(x), slack=0.55 if expected(x) in (high, low) else 0.06)

    def test_a_range_is_cut_out(self):
        points, picture = self.draw(click(80000, 40000), "--start", "0:04", "--end", "6s", width=60)
        tops = [picture.extent(x)[0] for x in range(60)]
        self.assertTrue(29 <= tops.index(min(tops)) <= 31)
        for same in (("--start", "32000", "--end", "48000"), ("--start", "32000", "--frames", "2s"),
                     ("--start", "4s", "--frames", "16000")):
            self.assertEqual(self.draw(click(80000, 40000), *same, width=60)[1].extent(30), picture.extent(30), same)
        _, beyond = self.draw(click(80000, 40000), "--start", "4s", "--end", "100:00", width=60)
        tops = [beyond.extent(x)[0] for x in range(60)]
        self.assertTrue(9 <= tops.index(min(tops)) <= 11)
        self.assertIn("ends at 0:10.000", self.failure("overview", "a.wav", "--svg", "-", "--start", "10s"))

    def test_twelve_hours(self):
        seconds = 12 * 3600
        header = pcm([], rate=100, size=seconds * 200)
        path = self.write("long.wav", header[:4] + struct.pack("<I", seconds * 200 + 36) + header[8:])
        os.truncate(path, len(header) + seconds * 200)
        with open(path, "r+b") as file:
            file.seek(len(header) + seconds * 100 + 2000)  # in the midst of a point of one column only
            file.write(struct.pack("<h", 32767))
        png = self.run_command("overview", "long.wav", "--png", "-", *PICTURE).stdout
        picture = WhiteOnBlack(png)
        tops = [picture.extent(x)[0] for x in range(picture.width)]
        self.assertEqual([x for x in range(picture.width) if tops[x] < 100], [900])
        self.assert_edges(picture.extent(900), self.edges(0, 32767, 280), slack=0.55)
        labels = svg_waves(self.run_command("overview", "long.wav", "--svg", "-").stdout)[1]
        self.assertEqual(labels, [f"{hour}:00:00" for hour in range(13)])


class Output(CommandTest):
    def test_forms(self):
        self.write("a.wav", pcm([0] * 256 + [32767] * 256 + [-16384, 8192]))
        self.write("b&<é.wav", pcm([0] * 100))
        self.write("bad.wav", b"RIFF")
        one = {"path": "a.wav", "sampleRate": 8000, "channels": 1, "frames": 514, "durationSeconds": 0.06425, "framesPerPoint": 256,
               "points": [[0, 0], [0, 127], [-64, 32]]}
        self.assertEqual(self.record("overview", "a.wav"), one)
        several = self.json("overview", "a.wav", "bad.wav", "b&<é.wav", status=1)
        self.assertEqual([several[0], *(set(item) for item in several[1:])], [one, {"path", "error"}, set(one)])
        self.assertEqual(self.lines("overview", "a.wav")[0].split("\t")[:5], ["a.wav", "0.064250", "514", "-64", "127"])
        self.assertEqual(self.lines("overview", "--quiet", "a.wav"), [])
        self.assertIn(b"<title>b&amp;&lt;\xc3\xa9.wav</title>",
                      self.run_command("overview", "b&<é.wav", "--svg", "-").stdout)

    def test_pictures_are_written_whole_or_not_at_all(self):
        audio = pcm([1000] * 5120)
        self.write("a.wav", audio)
        old = self.write("old.png", b"old")
        os.chmod(old, 0o640)
        os.symlink("old.png", self.folder / "link.png")
        for out in ("link.png", "old.png"):
            for option in ("--png", "--svg"):
                self.assertIn("exists; --force replaces it", self.failure("overview", "a.wav", option, out))
        self.assertEqual(old.read_bytes(), b"old")
        self.assertEqual(self.lines("overview", "a.wav", "--png", "link.png", "--svg", "a.svg", "--force"),
                         ["a.wav: drawn to link.png, 1800 x 280", "a.wav: drawn to a.svg, 1800 x 280"])
        self.assertEqual(os.stat(old).st_mode & 0o777, 0o640)
        self.assertTrue(os.path.islink(self.folder / "link.png"))
        self.assertEqual(len(decoded_png(old.read_bytes())), 280)
        for out, why in (("a.wav", "over the file itself"), (".", "is a folder"), ("/dev/full", "disk full"),
                         ("missing/a.png", "folder")):
            self.assertIn(why, self.failure("overview", "a.wav", "--png", out))
        self.assertEqual((self.folder / "a.wav").read_bytes(), audio)
        with open("/dev/full", "wb") as full:
            result = subprocess.run([KTFILES, "overview", self.folder / "a.wav", "--png", "-"], stdout=full,
                                    stderr=subprocess.DEVNULL)
        self.assertEqual(result.returncode, 1)
        self.assert_no_litter("a.svg", "a.wav", "link.png", "old.png")

    def test_files_without_an_overview(self):
        self.write("cut.wav", pcm([5000] * 1000)[:-1000])
        result = self.run_command("overview", "cut.wav")
        self.assertIn("1000 bytes of which are missing", result.stderr.decode())
        self.assertEqual(result.stdout.split(b"\t")[2], b"500")
        self.assertEqual(self.run_command("overview", "cut.wav", "--quiet").stderr, b"")
        for name, content, why in (("none.wav", pcm([]), "holds no sound"), ("text.wav", b"text" * 100, "no "),
                                   ("wide.wav", pcm([0] * 4098, 2049), "2049 channels"),
                                   ("slow.caf", caf().replace(struct.pack(">d", 44100), struct.pack(">d", 1e-300)),
                                    "sample rate of 1e-300 Hz")):
            self.write(name, content)
            for option in ("--json", "--store"):
                self.assertIn(why, self.failure("overview", name, option))
            self.assertEqual((self.folder / name).read_bytes(), content)

    @needs_decoders
    def test_compressed_files(self):
        # FLAC holds the very samples of the WAVE file that is drawn beside it, and MP3 nearly so.
        sound = [round(12000 * math.sin(i / 20) * math.sin(i / 9000)) for i in range(50000)]
        self.write("a.wav", pcm(sound))
        for name in ("a.flac", "a.mp3"):
            subprocess.run(["ffmpeg", "-v", "error", "-i", "a.wav", name], cwd=self.folder, check=True,
                           stdin=subprocess.DEVNULL)
        expected = self.record("overview", "a.wav")
        self.assertEqual(self.record("overview", "a.flac") | {"path": "a.wav"}, expected)
        near = self.record("overview", "a.mp3")
        self.assertEqual(near["frames"], 50000)
        for point, other in zip(near["points"], expected["points"]):
            self.assertTrue(all(abs(a - b) <= 8 for a, b in zip(point, other)), (point, other))
        for name in ("a.flac", "a.mp3"):
            content = (self.folder / name).read_bytes()
            self.assertIn("no container", self.failure("overview", name, "--store"))
            self.assertEqual((self.folder / name).read_bytes(), content)
            self.assertIn("install libktfiles-ffmpeg", self.failure("overview", name, env=self.without_decoders()))
        shutil.copy(MEDIA / "tone-adpcm.wav", self.folder)
        computed = self.record("overview", "tone-adpcm.wav", "--store")
        self.assertTrue(computed["stored"])
        self.assertEqual(self.record("overview", "tone-adpcm.wav", "--stored")["points"], computed["points"])

    def test_mistakes(self):
        self.write("a.wav", wave())
        for arguments in ((), ("a.wav", "a.wav", "--png", "x"), ("a.wav", "--png", "x", "--svg", "x"),
                          ("a.wav", "--png", "-", "--json"), ("a.wav", "--width", "100"), ("a.wav", "--start", "1"),
                          ("a.wav", "--svg", "x", "--width", "15"), ("a.wav", "--svg", "x", "--height", "5000"),
                          ("a.wav", "--svg", "x", "--start", "2", "--end", "2"),
                          ("a.wav", "--svg", "x", "--frames", "2", "--end", "2"), ("a.wav", "--frames", "1"), ("a.wav", "--in-place"),
                          *(("a.wav", "--svg", "x", "--start", time) for time in ("-1", "1:60", "1:2:3:4", "x", "")),
                          *(("a.wav", "--svg", "x", "--colors", colors)
                            for colors in ("red", "fff", "fff,1234", "1,2,3,4")),
                          ("a.wav", "--store", "--stored")):
            with self.subTest(arguments):
                self.run_command("overview", *arguments, status=2)
        self.assert_no_litter("a.wav")


class Store(CommandTest):
    SOUNDS = ("tone-16.wav", "tone-16.aiff", "tone-sowt.aifc", "bell-16-be.caf", "pluck-24-le.caf", "kick-24-rf64.wav")

    def test_stored_overviews_are_read_back(self):
        for name in self.SOUNDS:
            with self.subTest(name):
                original = (MEDIA / name).read_bytes()
                path = self.write(name, original)
                points = self.record("overview", name)["points"]
                self.assertIn("has no stored overview", self.failure("overview", "--stored", name))
                count = f"{len(points)} points"
                self.assertEqual(self.lines("overview", "--store", "--dry-run", name),
                                 [f"{name}: would store its overview, {count}"])
                self.assertEqual(path.read_bytes(), original)
                self.assertIn(f"stored its overview, {count}; backup",
                              self.lines("overview", "--store", "--backup", name)[0])
                self.assertEqual((self.folder / (name + ".bak")).read_bytes(), original)
                self.assertEqual(self.record("overview", "--stored", name)["points"], points)
                self.assertEqual(self.record("overview", name)["points"], points)
                stored = path.read_bytes()
                again = self.record("overview", "--store", "--in-place", name)
                self.assertEqual((again["stored"], again["changed"], again["points"]), (True, False, points))
                self.assertEqual(path.read_bytes(), stored)
        self.assert_no_litter(*self.SOUNDS, *(name + ".bak" for name in self.SOUNDS))

    def test_silence_in_a_caf_file(self):
        path = self.write("a.caf", caf(samples=bytes(1000)))
        self.assertEqual(self.lines("overview", "--store", "a.caf"),
                         ["a.caf: unchanged: a CAF file stores no overview of silence"])
        self.assertEqual(path.read_bytes(), caf(samples=bytes(1000)))

    def test_a_stale_overview_is_replaced(self):
        for where in ("copy", "in place"):
            options = ("--in-place",) if where == "in place" else ()
            self.write("a.wav", wave(chunk(b"LGWV", struct.pack("<IIbb", 100, 0, -3, 3)), frames=100))
            self.assertEqual(self.record("overview", "--stored", "a.wav")["points"], [[-3, 3]])
            self.assertTrue(self.record("overview", "--store", "a.wav", *options)["changed"])
            self.assertNotEqual(self.record("overview", "--stored", "a.wav")["points"], [[-3, 3]])
            ids = [item["id"] for item in self.record("chunks", "a.wav")["chunks"]]
            self.assertEqual(ids.count("LGWV"), 1)

    def test_stored_overviews_that_do_not_fit(self):
        for name, content in (
                ("long.wav", wave(chunk(b"LGWV", bytes(12)), frames=100)),
                ("older.wav", wave(chunk(b"ovwf", bytes(31)), frames=100)),
                ("zero.caf", caf((b"ovvw", struct.pack(">IIhh", 0, 0, 0, 256)))),
                ("cut.wav", wave(chunk(b"LGWV", bytes(10), size=4000), frames=100))):
            self.write(name, content)
            with self.subTest(name):
                self.failure("overview", "--stored", name)
                self.assertEqual((self.folder / name).read_bytes(), content)

    def test_interruption_leaves_the_file_alone(self):
        # So many channels that reading takes minutes, and the overview little memory; the file is a hole.
        header = pcm([], channels=1024)
        length = 60 << 30
        ds64 = chunk(b"ds64", struct.pack("<QQQI", length - 8, length - 80, 0, 0))
        path = self.write("a.wav", b"RF64\xff\xff\xff\xffWAVE" + ds64 + header[12:36] + b"data\xff\xff\xff\xff")
        begin = path.read_bytes()
        os.truncate(path, length)
        process, terminal = pty.fork()
        if process == 0:
            os.chdir(self.folder)
            os.execv(KTFILES, [KTFILES, "overview", "--store", "--in-place", "a.wav"])
        self.assertIn(b"reading ", os.read(terminal, 1000))  # the progress bar, after a second
        os.kill(process, signal.SIGINT)
        self.assertEqual(os.waitstatus_to_exitcode(os.waitpid(process, 0)[1]), -signal.SIGINT)
        os.close(terminal)
        self.assert_no_litter("a.wav")
        with open(path, "rb") as file:
            self.assertEqual(file.read(len(begin)), begin)
        self.assertEqual(os.path.getsize(path), length)


if __name__ == "__main__":
    unittest.main()
