"""What the pictures of ktfiles overview show beside a whole sound in one lane: single samples, lanes, gain, clipping, labels."""
import math
import os
import re
import struct
import unittest
import xml.etree.ElementTree as ElementTree

from command import CommandTest, chunk, wave
from picture import WhiteOnBlack, decoded_png
from test_overview import PICTURE, TIME_STRIP, pcm

SVG = "{http://www.w3.org/2000/svg}"
CLIPPING = "ffffff,000000,ff0000,0000ff"


def lane_edges(height, lanes=1, lane=0):
    """Centre of a lane, and the height of full scale in it."""
    high = (height - TIME_STRIP) / lanes
    return high * (lane + 0.5), high / 2 - min(max(high * 0.05, 0.5), 12)


class Picture(CommandTest):
    def svg(self, *options):
        return ElementTree.fromstring(self.run_command("overview", "a.wav", "--svg", "-", *options).stdout)

    def png(self, *options, colors=WhiteOnBlack.COLORS):
        return self.run_command("overview", "a.wav", "--png", "-", "--colors", colors, *options).stdout

    def labels(self, *options):
        return [(text.text, float(text.get("x")), float(text.get("y"))) for text in self.svg(*options).iter(SVG + "text")]

    def points(self, path):
        return [tuple(map(float, pair)) for pair in re.findall(r"[ML]([-0-9.]+) ([-0-9.]+)", path.get("d"))]


class Samples(Picture):
    def test_a_line_goes_through_the_samples_and_on_to_the_next(self):
        samples = [round(20000 * math.sin(i * i / 90)) for i in range(500)]
        self.write("a.wav", pcm(samples))
        centre, reach = lane_edges(200)
        for start, frames, has_dots in ((0, 60, True), (100, 300, False), (460, 40, True), (499, 1, True)):
            with self.subTest(start=start, frames=frames):
                options = ("--start", str(start), "--frames", str(frames), "--width", "600", "--height", "200")
                expected = [((i - start) * 600 / frames, centre - samples[i] / 32768 * reach)
                            for i in range(start, min(start + frames + 1, 500))]
                paths = [path for path in self.svg(*options).iter(SVG + "path") if path.get("stroke-linecap")]
                self.assertEqual(len(paths), 1 + has_dots)
                for path in paths:
                    for found, point in zip(self.points(path), expected, strict=True):
                        self.assertAlmostEqual(found[0], point[0], delta=0.006)
                        self.assertAlmostEqual(found[1], point[1], delta=0.006)
                picture = WhiteOnBlack(self.png(*options))
                for x, y in expected[1:-1]:
                    self.assertGreater(picture.rows[int(y)][int(x)][1], 120, (x, y))

    def test_only_the_range_is_read(self):
        # 60 GB, a hole: all of it takes minutes.
        header = pcm([], channels=2)
        length = 60 << 30
        ds64 = chunk(b"ds64", struct.pack("<QQQI", length - 8, length - 80, 0, 0))
        path = self.write("a.wav", b"RF64\xff\xff\xff\xffWAVE" + ds64 + header[12:36] + b"data\xff\xff\xff\xff")
        os.truncate(path, length)
        for frames in ("20", "1000", "2000000"):
            self.png("--start", "15000000000", "--frames", frames)
        self.run_command("overview", "a.wav", "--format", "audiowaveform", "-o", "-", "--start", "15000000000", "--frames", "300")

    def test_stored_overviews_serve_where_they_are_fine_enough(self):
        # The stored one is of another sound, so that its use shows.
        frames = 256 * 400
        points = b"".join(struct.pack("bb", -40, 100) for _ in range(400))
        self.write("a.wav", wave(chunk(b"LGWV", struct.pack("<II", frames, 0) + points), frames=frames))
        centre, reach = lane_edges(200)
        for options, is_stored in ((("--width", "400"), True), (("--width", "200", "--start", "5000"), True), (("--width", "401"), False),
                                   (("--width", "200", "--scale-factor", "3"), False), (("--width", "400", "--gain", "1"), False),
                                   (("--width", "400", "--gain", "auto"), False), (("--width", "400", "--start", "512"), False)):
            top, bottom = WhiteOnBlack(self.png("--stored", "--height", "200", *options)).extent(100)
            with self.subTest(options):
                self.assertEqual(abs(top - (centre - reach * 100 / 127)) < 0.1 and abs(bottom - (centre + reach * 40 / 127)) < 0.1, is_stored)


class Lanes(Picture):
    def six(self, mask):
        samples = [round(5000 * (k + 1)) * (-1) ** i for i in range(20000) for k in range(6)]
        body = struct.pack(f"<{len(samples)}h", *samples)
        fmt = struct.pack("<HHIIHHHHIH", 0xFFFE, 6, 8000, 96000, 12, 16, 22, 16, mask, 1) + bytes.fromhex("000000001000800000aa00389b71")
        chunks = b"WAVE" + chunk(b"fmt ", fmt) + chunk(b"data", body)
        self.write("a.wav", b"RIFF" + struct.pack("<I", len(chunks)) + chunks)

    def test_channels_are_named_and_have_lanes(self):
        size = ("--width", "400", "--height", "447")
        for mask, names in ((0x3F, ["L", "R", "C", "LFE", "Lrs", "Rrs"]), (0, [f"Ch {i}" for i in range(1, 7)])):
            self.six(mask)
            found = [label[0] for label in self.labels(*size, "--channels", "split")][:6]
            self.assertEqual(found, names)
            self.assertEqual([label[0] for label in self.labels(*size)][:6], names)  # finer than overviews
            self.assertEqual(self.labels(*size, "--channels", "4")[0][0], names[3])
            self.assertEqual(self.labels(*size, "--channels", "sum")[0][0], "Sum")
        picture = WhiteOnBlack(self.png(*size, "--channels", "split"))
        column = picture.column(200)
        for lane in range(6):
            centre, reach = lane_edges(447, 6, lane)
            top, bottom = centre - reach * 5000 * (lane + 1) / 32768, centre + reach * 5000 * (lane + 1) / 32768
            covered = [y for y in range(lane * 70, lane * 70 + 70) if column[y] > 0.5]
            self.assertAlmostEqual(covered[0], top, delta=1)
            self.assertAlmostEqual(covered[-1] + 1, bottom, delta=1)
        for choice, value in (("2", 10000), ("6", 30000), ("sum", 17500)):
            centre, reach = lane_edges(447)
            top, bottom = WhiteOnBlack(self.png(*size, "--channels", choice)).extent(200)
            self.assertAlmostEqual(centre - top, reach * value / 32768, delta=0.1)
            self.assertAlmostEqual(bottom - centre, reach * value / 32768, delta=0.1)
        self.assertIn("has no channel 7, but 6", self.failure("overview", "a.wav", "--png", "-", "--channels", "7"))
        self.assertIn("need a --height of 48", self.failure("overview", "a.wav", "--png", "-", "--channels", "split", "--height", "20"))
        self.write("a.wav", pcm([100, 200] * 200000, 2))
        self.assertEqual([label[0] for label in self.labels("--width", "300")][:2], ["L", "R"])
        self.assertEqual([label[0] for label in self.labels("--width", "300", "--channels", "split")][:2], ["L", "R"])
        self.assertNotIn("L", [label[0] for label in self.labels("--width", "100")])


class Gain(Picture):
    def test_gain_moves_the_wave_and_the_scale_tells(self):
        self.write("a.wav", pcm([3276, -3276] * 4000))  # -20 dB
        centre, reach = lane_edges(400)
        for gain, shown, first in (("0", 0.1, "0"), ("6.02", 0.2, "−6"), ("+14", 0.501, "−14"), ("auto", 1, "−20"), ("-6", 0.05, "+6"),
                                   ("13.7", 0.484, "−13.7"), ("18", 0.794, "−18")):
            with self.subTest(gain):
                options = ("--gain", gain, "--height", "400", "--width", "400", "--scale")
                top, bottom = WhiteOnBlack(self.png(*options)).extent(200)
                self.assertAlmostEqual(centre - top, reach * shown, delta=1)
                self.assertAlmostEqual(bottom - centre, reach * shown, delta=1)
                labels = [(text, y) for text, x, y in self.labels(*options) if x == 36]
                self.assertEqual((labels[0][0], labels[-1][0]), (first, first))
                factor = 10 ** ((20 if gain == "auto" else float(gain)) / 20)
                for text, y in labels:
                    if text != "−∞":
                        height = 10 ** (float(text.replace("−", "-")) / 20) * reach * factor
                        self.assertAlmostEqual(abs(centre - (y - 4)), height, delta=reach * 0.01 + 1, msg=text)
        self.write("a.wav", pcm([0] * 1000))
        self.assertEqual([text for text, x, _ in self.labels("--gain", "auto", "--scale") if x == 36][0], "0")

    def marks(self, *options):
        """Columns with the color of clipping, and with that of the axis, in the lane."""
        rows = decoded_png(self.png("--width", "400", "--height", "200", *options, colors=CLIPPING))[:200 - TIME_STRIP]
        return [[x for x in range(400) if any(row[x][:3] == color for row in rows)] for color in ((0, 0, 255), (255, 0, 0))]

    def test_clipping_and_what_the_picture_cuts_are_marked_apart(self):
        quiet, at = [1000, -1000] * 20000, 50 * 100 + 10
        for bits, loud, is_clipping in ((16, 32767, True), (16, -32768, True), (16, 32766, False), (32, 1.0, True), (32, 1.5, True), (32, 0.999, False)):
            with self.subTest(bits=bits, loud=loud):
                samples = quiet[:at] + [loud] + quiet[at + 1:]
                if bits == 16:
                    self.write("a.wav", pcm(samples))
                else:
                    body = struct.pack(f"<{len(samples)}f", *(v / 32768 if v in (1000, -1000) else v for v in samples))
                    chunks = b"WAVE" + chunk(b"fmt ", struct.pack("<HHIIHH", 3, 1, 8000, 32000, 4, 32)) + chunk(b"data", body)
                    self.write("a.wav", b"RIFF" + struct.pack("<I", len(chunks)) + chunks)
                self.assertEqual(self.marks(), [[50] if is_clipping else [], []])
                self.assertEqual(self.marks("--gain", "6"), [[50] if is_clipping else [], [] if is_clipping else [50]])
                self.assertEqual(self.marks("--gain", "40")[1], list(range(400)))
                single = self.marks("--start", str(at), "--frames", "40")
                self.assertEqual(single[0][:2], [0, 1] if is_clipping else [])


class Size(Picture):
    def test_scale_factor(self):
        self.write("a.wav", pcm([round(30000 * math.sin(i / 50) * math.sin(i / 5000)) for i in range(40000)]))
        options = ("--width", "300", "--height", "120", "--scale")
        plain, large = decoded_png(self.png(*options)), decoded_png(self.png(*options, "--scale-factor", "2"))
        self.assertEqual((len(large), len(large[0])), (240, 600))
        axis = [[sum(row[x][0] > row[x][1] + 100 for x in range(len(row))) for row in rows] for rows in (plain, large)]
        line = axis[0].index(max(axis[0]))
        self.assertEqual([y for y, count in enumerate(axis[1]) if count == max(axis[1])], [2 * line, 2 * line + 1])
        root = self.svg(*options, "--scale-factor", "2")
        self.assertEqual([root.get(key) for key in ("width", "height", "viewBox")], ["600", "240", "0 0 300 120"])
        plain_labels, labels = (self.labels(*options, *more) for more in ((), ("--scale-factor", "2")))
        self.assertEqual(plain_labels, labels)
        self.write("b.wav", pcm([0] * 100))
        self.assertEqual(self.lines("overview", "b.wav", "--png", "b.png", *options, "--scale-factor", "4"),
                         ["b.wav: drawn to b.png, 1200 x 480"])


class Sheet(Picture):
    CELL = (64 + 12, 30 + 18 + 12)
    SIZE = ("--width", "64", "--height", "30")

    def cells(self, name):
        """What the cells of a sheet show: where they are, their title, and their texts."""
        root = ElementTree.fromstring((self.folder / name).read_bytes())
        return [((int(cell.get("x")), int(cell.get("y"))), cell.find(SVG + "title").text, [text.text for text in cell.iter(SVG + "text")])
                for cell in root.findall(SVG + "svg")]

    def test_every_file_has_its_cell(self):
        (self.folder / "lib" / "sub").mkdir(parents=True)
        loud = [32000, -32000] * 1000
        for i in range(7):
            self.write(f"lib/{i}.wav", pcm(loud if i % 2 else [0] * 2000))
        self.write("lib/sub/x<&.wav", pcm(loud))
        self.write("lib/none.wav", pcm([]))
        self.write("lib/note.txt", b"text")
        names = [f"{i}.wav" for i in range(7)] + ["none.wav", "sub/x<&.wav"]
        for out, threads in (("a.svg", "1"), ("b.svg", "4"), ("a.png", "4")):
            result = self.run_command("overview", "lib", "--sheet", out, "--columns", "4", *self.SIZE, "-j", threads, "--colors",
                                      WhiteOnBlack.COLORS, status=1)
            self.assertEqual(result.stdout.decode(), f"9 files drawn to {out}, {4 * 76 + 12} x {3 * 60 + 12}\n")
            self.assertEqual(result.stderr.decode(), "ktfiles: lib/none.wav: holds no sound\n")
        self.assertEqual((self.folder / "a.svg").read_bytes(), (self.folder / "b.svg").read_bytes())
        cells = self.cells("a.svg")
        self.assertEqual([cell[:2] for cell in cells], [((12 + i % 4 * 76, 12 + i // 4 * 60), name) for i, name in enumerate(names)])
        self.assertEqual(cells[7][2][:2], ["none.wav", "holds"])
        picture = WhiteOnBlack((self.folder / "a.png").read_bytes())
        for i in range(9):
            column = picture.column(12 + i % 4 * 76 + 32)[12 + i // 4 * 60:][:30]
            if i != 7:
                self.assertAlmostEqual(sum(column), 26 if i == 8 or i % 2 else 1, delta=1, msg=i)
        record = self.json("overview", "lib/0.wav", "lib/none.wav", "--sheet", "c.png", status=1)
        self.assertEqual([item.get("sheet") for item in record], ["c.png", None])

    def test_names_fit_their_cells(self):
        names = ["a very long name that says everything about itself.wav", "W" * 60 + ".wav", "太鼓" * 20 + ".wav", "é" * 3 + ".wav", "e\u0301\u0327o\u0308.wav"]
        for name in names:
            self.write(name, pcm([100] * 1000))
        for width in ("16", "64", "200"):
            self.run_command("overview", *names, "--sheet", "a.svg", "--force", "--width", width, "--height", "72")
            self.run_command("overview", *names, "--sheet", "a.png", "--force", "--width", width, "--height", "72", "--columns", "5", "--colors", WhiteOnBlack.COLORS)
            rows = decoded_png((self.folder / "a.png").read_bytes())
            gaps = [x for i in range(6) for x in range(i * (int(width) + 12), i * (int(width) + 12) + 12)]
            self.assertEqual([(x, y) for y, row in enumerate(rows) for x in gaps if row[x][0] > 120], [], width)
        shown = [texts[-1] for _, _, texts in self.cells("a.svg")]
        self.assertEqual([text.count("…") for text in shown], [1, 1, 1, 0, 0])
        self.assertTrue(all(text.endswith(".wav") for text in shown), shown)

    def test_mistakes_and_bounds(self):
        audio = pcm([100] * 1000)
        self.write("a.wav", audio)
        for arguments in (("--sheet", "x.gif"), ("--sheet", "x.png", "--png", "y.png"), ("--columns", "2"), ("--sheet", "-"), ("--png", "x", "b.wav")):
            self.run_command("overview", "a.wav", *arguments, status=2)
        self.assertIn("is the most", self.failure("overview", *["a.wav"] * 9, "--sheet", "x.png", "--width", "16384", "--columns", "9"))
        self.write("old.png", b"old")
        self.assertIn("exists", self.failure("overview", "a.wav", "--sheet", "old.png"))
        (self.folder / "l.png").symlink_to("a.wav")
        self.assertIn("over a.wav", self.failure("overview", "a.wav", "--sheet", "l.png", "--force", status=2))
        self.assertEqual((self.folder / "a.wav").read_bytes(), audio)
        self.assert_no_litter("a.wav", "old.png", "l.png")


if __name__ == "__main__":
    unittest.main()
