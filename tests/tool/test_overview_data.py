"""ktfiles overview --format audiowaveform: read by waveform-data, the package by which players read such files."""
import json
import math
import pathlib
import random
import struct
import subprocess
import unittest

from command import CommandTest, chunk, needs_decoders
from test_overview import pcm

JUDGE = next((pathlib.Path(__file__).parents[2] / "build" / "judges").glob("waveform-data@*/node_modules/waveform-data"), None)
SCRIPT = """
const [judge, ...names] = process.argv.slice(1), WaveformData = require(judge), fs = require("fs");
console.log(JSON.stringify(names.map(name => {
    const bytes = fs.readFileSync(name);
    const data = WaveformData.create(name.endsWith(".dat")
        ? bytes.buffer.slice(bytes.byteOffset, bytes.byteOffset + bytes.length) : JSON.parse(bytes));
    const channels = [...Array(data.channels).keys()].map(i => data.channel(i));
    return {rate: data.sample_rate, scale: data.scale, bits: data.bits, length: data.length, seconds: data.duration,
        points: channels.map(c => c.min_array().map((low, i) => [low, c.max_array()[i]]))};
})));
"""


def eighth(value):
    """A 16-bit sample, or the average of some, as 8 bits: rounded half to even."""
    return max(-128, min(127, round(value / 256)))


@unittest.skipUnless(JUDGE, "NOT PROVEN: waveform-data is not there; scripts/setup test installs it from the npm registry")
class Data(CommandTest):
    def judged(self, *names):
        return json.loads(subprocess.run(["node", "-e", SCRIPT, JUDGE, *names], check=True, capture_output=True,
                                         cwd=self.folder).stdout)

    def test_the_judge_reads_what_the_samples_say(self):
        noise = random.Random(5)
        rate, frames = 8000, 5000
        left = [round(noise.uniform(-1, 1) * 32767 * abs(math.sin(i / 700))) for i in range(frames)]
        right = [-32768 if i % 900 < 400 else 32767 if i % 900 < 450 else 5000 for i in range(frames)]
        self.write("a.wav", pcm([v for pair in zip(left, right) for v in pair], 2, rate))
        mean = [(a + b) / 2 for a, b in zip(left, right)]
        for options, lanes, scale, cut in (
                ((), [mean], 256, (0, 5000)),
                (("--channels", "split"), [left, right], 256, (0, 5000)),
                (("--channels", "2", "--frames-per-point", "100"), [right], 100, (0, 5000)),
                (("--channels", "split", "--frames-per-point", "1", "--start", "1000", "--frames", "300"), [left, right], 1, (1000, 1300)),
                (("--channels", "1", "--frames-per-point", "16777216"), [left], 16777216, (0, 5000)),
                (("--channels", "split", "--start", "0.3s", "--end", "0.5s"), [left, right], 256, (2400, 4000))):
            expected = [[[eighth(min(part)), eighth(max(part))]
                         for at in range(*cut, scale) if (part := lane[at:min(at + scale, cut[1])])] for lane in lanes]
            with self.subTest(options):
                for name in ("out.dat", "out.json"):
                    told = self.lines("overview", "a.wav", "--format", "audiowaveform", "-o", name, "--force", *options)
                    self.assertEqual(told, [f"a.wav: written to {name}"])
                length = len(expected[0])
                self.assertEqual(self.judged("out.dat", "out.json"), [{
                    "rate": rate, "scale": scale, "bits": 8, "length": length, "seconds": length * scale / rate,
                    "points": expected}] * 2)
        self.run_command("overview", "a.wav", "--format", "audiowaveform", "-o", "out.dat", "--force", "--channels", "split")
        self.assertEqual(struct.unpack("<6i", (self.folder / "out.dat").read_bytes()[:24]), (2, 1, rate, 256, 20, 2))
        self.assertEqual(self.run_command("overview", "a.wav", "--format", "audiowaveform", "-o", "-", "--channels", "split").stdout,
                         json.dumps(
                             {"version": 2, "channels": 2, "sample_rate": rate, "samples_per_pixel": 256, "bits": 8, "length": 20,
                              "data": list(struct.unpack("80b", (self.folder / "out.dat").read_bytes()[24:]))},
                             separators=(",", ":")).encode() + b"\n")
        self.assertEqual(self.record("overview", "a.wav", "--format", "audiowaveform", "-o", "o.dat")["output"], "o.dat")

    @needs_decoders
    def test_sound_longer_than_a_batch_and_compressed(self):
        self.encoded("a.flac", seconds=8)
        self.run_command("overview", "a.flac", "--format", "audiowaveform", "-o", "a.dat", "--frames-per-point", "64", "--channels", "2")
        subprocess.run(["ffmpeg", "-v", "error", "-i", "a.flac", "a.wav"], cwd=self.folder, check=True, stdin=subprocess.DEVNULL)
        samples = (self.folder / "a.wav").read_bytes()[-8 * 44100 * 4:]
        right = struct.unpack(f"<{len(samples) // 2}h", samples)[1::2]
        self.assertEqual(self.judged("./a.dat")[0]["points"][0],
                         [[eighth(min(right[at:at + 64])), eighth(max(right[at:at + 64]))] for at in range(0, len(right), 64)])


class Points(CommandTest):
    def points(self, *options):
        data = json.loads(self.run_command("overview", "a.wav", "--format", "audiowaveform", "-o", "-", *options).stdout)
        return data["data"]

    def test_any_number_of_channels(self):
        # Some are folded many samples at once, others one by one.
        noise = random.Random(3)
        for channels in (1, 2, 3, 4, 6, 8, 16, 17, 40):
            lanes = [[noise.randrange(-32768 // (1 + k % 5), 32768 // (1 + k % 3)) for _ in range(1234)] for k in range(channels)]
            self.write("a.wav", pcm([lane[i] for i in range(1234) for lane in lanes], channels))
            for frames in (7, 100, 500):
                with self.subTest(channels=channels, frames=frames):
                    self.assertTrue(self.points("--channels", "split", "--frames-per-point", str(frames)) == [
                        eighth(extreme(lane[at:at + frames])) for at in range(0, 1234, frames) for lane in lanes for extreme in (min, max)])

    def test_what_is_no_number_is_silence(self):
        for channels in (1, 3):
            samples = [v for v in (math.nan, 0.5, math.nan, -0.25, *[math.nan] * 300, math.inf, -math.inf) for _ in range(channels)]
            body = struct.pack(f"<{len(samples)}f", *samples)
            chunks = b"WAVE" + chunk(b"fmt ", struct.pack("<HHIIHH", 3, channels, 8000, 32000 * channels, 4 * channels, 32)) + chunk(b"data", body)
            self.write("a.wav", b"RIFF" + struct.pack("<I", len(chunks)) + chunks)
            self.assertEqual(self.points("--channels", "1", "--frames-per-point", "100"), [-32, 64, 0, 0, 0, 0, -128, 127])
            for options in (("--width", "16"), ("--width", "300"), ("--width", "1000"), ("--gain", "auto")):
                svg = self.run_command("overview", "a.wav", "--svg", "-", *options).stdout
                self.assertNotRegex(svg, rb"[^a-z](nan|inf)\b")
                self.run_command("overview", "a.wav", "--png", "-", *options)


class Mistakes(CommandTest):
    def test_mistakes(self):
        self.write("a.wav", pcm([1] * 100))
        form = ("--format", "audiowaveform")
        for arguments in (form, ("-o", "x.dat"), (*form, "-o", "x.wav"), (*form, "-o", "x.dat", "a.wav"),
                          (*form, "-o", "x.dat", "--stored"), (*form, "-o", "-", "--json"), ("--frames-per-point", "2"),
                          (*form, "-o", "x.dat", "--channels", "0"), (*form, "-o", "x.dat", "--channels", "both"),
                          ("--format", "peaks", "-o", "x.dat"), (*form, "-o", "x.dat", "--frames-per-point", "0")):
            with self.subTest(arguments):
                self.run_command("overview", "a.wav", *arguments, status=2)
        self.assertIn("has no channel 2, but 1", self.failure("overview", "a.wav", *form, "-o", "x.dat", "--channels", "2"))
        (self.folder / "link.dat").symlink_to("a.wav")
        self.assertIn("over the file itself", self.failure("overview", "a.wav", *form, "-o", "link.dat"))
        self.assert_no_litter("a.wav", "link.dat")


if __name__ == "__main__":
    unittest.main()
