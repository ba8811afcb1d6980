"""The pictures of ktfiles overview in a browser: an SVG looks there as its PNG does, and no label touches another."""
import html
import json
import math
import os
import re
import shutil
import struct
import subprocess
import unittest

from command import CommandTest, chunk, wave
from picture import pixels_of_png
from test_overview import pcm

BROWSER = shutil.which("chromium-headless-shell") or shutil.which("chromium")
SCRIPT = """<script>
const boxes = [...document.querySelectorAll("body > div")].map(picture => {
    const box = element => { const b = element.getBoundingClientRect(); return [b.left, b.top, b.right, b.bottom]; };
    return {all: box(picture.querySelector("svg")), texts: [...picture.querySelectorAll("text")].map(t => [t.textContent, ...box(t)])};
});
document.body.innerHTML = "<pre id=boxes>" + JSON.stringify(boxes).replaceAll("&", "&amp;").replaceAll("<", "&lt;") + "</pre>";
</script>"""
DAY = 24 * 3600
STEREO, SIX, HOT, LONG, TINY, OLD = "stereo.wav", "six.wav", "hot.wav", "day.wav", "tiny.wav", "old.wav"
PICTURES = (  # the file, and what is asked for
    (STEREO, ()), (STEREO, ("--scale",)), (STEREO, ("--channels", "split", "--scale")), (STEREO, ("--channels", "sum")),
    (STEREO, ("--channels", "2", "--gain", "12", "--scale")), (STEREO, ("--gain", "auto", "--scale", "--colors", "day")),
    (STEREO, ("--scale-factor", "2", "--scale", "--colors", "amber")), (STEREO, ("--start", "1s", "--end", "1.2s", "--colors", "rose")),
    (STEREO, ("--frames", "200", "--scale", "--colors", "ink")), (STEREO, ("--frames", "30", "--channels", "1", "--gain", "20")),
    (STEREO, ("--frames", "30", "--scale-factor", "3", "--height", "90")), (STEREO, ("--gain", "-40", "--scale")),
    *((STEREO, ("--width", str(width), "--height", height, "--scale")) for width in (16, 30, 45, 61, 80, 121, 150) for height in ("8", "20", "73", "150")),
    (SIX, ("--channels", "split", "--scale")), (SIX, ("--channels", "split", "--height", "80")), (SIX, ("--height", "300")),
    (HOT, ("--scale",)), (HOT, ("--gain", "10", "--scale")), (HOT, ("--start", "100", "--frames", "50", "--gain", "3")),
    (LONG, ("--scale",)), (LONG, ("--width", "95")), (LONG, ("--start", "23:59:59.99", "--width", "150")), (LONG, ("--width", "1500", "--height", "75")),
    (TINY, ("--scale",)), (TINY, ("--width", "70")), (TINY, ("--frames", "1")), (TINY, ("--start", "3", "--frames", "4", "--width", "97", "--scale")),
    (OLD, ("--stored", "--scale")))
UNMARKED = "ffffff,000000,000000,ff0000"  # the wave alone: letters are of other fonts in either
SIZE = ("--width", "400", "--height", "160")


@unittest.skipUnless(BROWSER, "NOT PROVEN: no Chromium; scripts/setup test installs it")
class Browser(CommandTest):
    def browse(self, page, *options):
        (self.folder / "page.html").write_text('<meta charset="utf-8"><style>body{margin:0;background:#fff}img,div{display:block}</style><body>' + page, encoding="utf-8")
        return subprocess.run([BROWSER, "--headless", "--no-sandbox", "--disable-gpu", "--hide-scrollbars", f"--user-data-dir={self.folder}/profile",
                               "--force-device-scale-factor=1", *options, "page.html"], cwd=self.folder, capture_output=True, timeout=120, check=True).stdout

    def setUp(self):
        super().setUp()
        swell = [round(9000 * math.sin(i / 9) * math.sin(i / 4000)) for i in range(16000)]
        self.write(STEREO, pcm([v for a in swell for v in (a, a // 3)], 2))
        self.write(SIX, pcm([v // (k + 1) for v in swell for k in range(6)], 6))
        self.write(HOT, pcm([max(-32768, min(32767, round(50000 * math.sin(i / 60) * (1 - i / 4000)))) for i in range(4000)]))
        header = pcm([], rate=100, size=DAY * 200)
        self.write(LONG, header[:4] + struct.pack("<I", DAY * 200 + 36) + header[8:])
        os.truncate(self.folder / LONG, len(header) + DAY * 200)
        with open(self.folder / LONG, "r+b") as file:
            file.seek(len(header) + DAY * 100)
            file.write(pcm(swell * 20)[44:])
        self.write(TINY, pcm([20000, -20000, 5000, 100, 30000, -30000, 0, 0], rate=800))
        points = b"".join(struct.pack("bb", -(i % 100), i % 120) for i in range(800))
        self.write(OLD, wave(chunk(b"LGWV", struct.pack("<II", 256 * 800, 0) + points), frames=256 * 800))

    def draw_all(self):
        """The SVG file and the PNG file of each picture, and what it is of."""
        drawn = []
        for i, (name, options) in enumerate(PICTURES):
            for kind in ("svg", "png"):
                options = options if "--colors" in options else (*options, "--colors", UNMARKED)
                sized = [word for pair in zip(SIZE[::2], SIZE[1::2]) if pair[0] not in options for word in pair]
                self.run_command("overview", name, "--" + kind, f"{i}.{kind}", *sized, *options)
            drawn.append((f"{i}.svg", f"{i}.png", (name, *options)))
        for i, options in enumerate((("--columns", "2", "--colors", UNMARKED), ("--columns", "3", "--width", "90", "--height", "40", "--scale-factor", "2"))):
            self.write("a long name of a file with <&> in it 太鼓.wav", b"RIFF")
            names = [STEREO, HOT, TINY, "a long name of a file with <&> in it 太鼓.wav", OLD]
            for kind in ("svg", "png"):
                self.run_command("overview", *names, "--sheet", f"s{i}.{kind}", *options, status=1)
            drawn.append((f"s{i}.svg", f"s{i}.png", ("sheet", *options)))
        return drawn

    def test_svg_and_png_agree_and_labels_do_not_touch(self):
        drawn = self.draw_all()
        pictures = [greens(self.folder / png) for _, png, _ in drawn]
        width = max(len(rows[0]) for rows in pictures)
        self.browse("".join(f'<img src="{svg}">' for svg, *_ in drawn), "--screenshot=shot.png",
                    f"--window-size={width},{sum(map(len, pictures))}")
        shot, top = greens(self.folder / "shot.png"), 0
        for rows, (svg, _, what) in zip(pictures, drawn):
            here = b"".join(row[:len(rows[0])] for row in shot[top:top + len(rows)])
            top += len(rows)
            with self.subTest(what):
                size = re.search(r'width="(\d+)" height="(\d+)"', (self.folder / svg).read_text(encoding="utf-8")).groups()
                self.assertEqual(size, (str(len(rows[0])), str(len(rows))))
                self.assertGreater(correlation(here, b"".join(rows)), 0.985 if UNMARKED in what else 0.8)
        page = "".join(f"<div>{(self.folder / svg).read_text(encoding='utf-8')}</div>" for svg, *_ in drawn)
        dom = self.browse(page + SCRIPT, "--dump-dom").decode()
        boxes = json.loads(html.unescape(re.search(r"<pre id=\"boxes\">(.*?)</pre>", dom, re.S).group(1)))
        self.assertEqual(len(boxes), len(drawn))
        for picture, (_, _, what) in zip(boxes, drawn):
            with self.subTest(what):
                left, top, right, bottom = picture["all"]
                texts = picture["texts"]
                for text, *box in texts:
                    self.assertTrue(box[0] >= left - 0.5 and box[2] <= right + 0.5 and box[1] >= top - 3 and box[3] <= bottom + 3, (text, box, picture["all"]))
                for i, (text, *a) in enumerate(texts):
                    for other, *b in texts[:i]:
                        self.assertFalse(a[0] < b[2] and b[0] < a[2] and a[1] < b[3] and b[1] < a[3], (text, a, other, b))
        self.assertGreater(sum(len(picture["texts"]) for picture in boxes), 200)


def greens(path):
    """Rows of bytes."""
    flat, width = pixels_of_png(path.read_bytes())
    return [flat[at + 1:at + width * 4:4] for at in range(0, len(flat), width * 4)]


def correlation(a, b):
    """Of two pictures, 1 for the same; of flat ones, whether they are."""
    mean_a, mean_b = sum(a) / len(a), sum(b) / len(b)
    above = sum((x - mean_a) * (y - mean_b) for x, y in zip(a, b))
    below = math.sqrt(sum((x - mean_a) ** 2 for x in a) * sum((y - mean_b) ** 2 for y in b))
    return above / below if below else float(a == b)


if __name__ == "__main__":
    unittest.main()
