"""ktfiles decode: what it writes as other programs read it, and that nothing half written is ever left."""
import array
import json
import os
import pty
import resource
import shutil
import signal
import struct
import subprocess
import unittest

from command import KTFILES, MEDIA, CommandTest, caf, chunk, wave

FORMATS = ("wav", "aiff", "caf", "raw")
# What ffmpeg makes the sources with, and how deep their samples are.
SOURCES = {
    "u8.wav": ("pcm_u8", 8), "s16.wav": ("pcm_s16le", 16), "s24.wav": ("pcm_s24le", 24), "s32.wav": ("pcm_s32le", 32),
    "f32.wav": ("pcm_f32le", "f32"), "f64.wav": ("pcm_f64le", "f64"), "s8.aiff": ("pcm_s8", 8),
    "s16.aiff": ("pcm_s16be", 16), "s24.aiff": ("pcm_s24be", 24), "sowt.aiff": ("pcm_s16le", 16),
    "f32.aiff": ("pcm_f32be", "f32"), "s8.caf": ("pcm_s8", 8), "be16.caf": ("pcm_s16be", 16),
    "le24.caf": ("pcm_s24le", 24), "f32.caf": ("pcm_f32be", "f32"), "be64.caf": ("pcm_f64be", "f64"),
}
CONTAINERS = {"wav": "WAVE", "aiff": "AIFF", "caf": "CAF", "raw": "raw"}
DEPTHS = {"16": 16, "24": 24, "32": 32, "f32": "f32"}
RAW_CODECS = {8: "u8", 16: "s16le", 24: "s24le", 32: "s32le", "f32": "f32le", "f64": "f64le"}


def ffmpeg(*arguments):
    """The last argument is the output, into which ffmpeg does not write its own name."""
    *options, out = map(str, arguments)
    return subprocess.run(["ffmpeg", "-v", "error", "-nostdin", "-y", *options, "-bitexact", out], check=True,
                          stdout=subprocess.PIPE).stdout


def samples_of(path, depth=None, channels=2):
    """The samples as ffmpeg reads them; of a raw file, with what its name cannot tell."""
    raw = ("-f", RAW_CODECS[depth], "-ac", channels, "-ar", 44100) if depth is not None else ()
    return array.array("d", ffmpeg(*raw, "-i", path, "-f", "f64le", "-c:a", "pcm_f64le", "-"))


def converted(samples, depth):
    """As samples of another depth are: through 32-bit floats, rounded half to even, clamped."""
    floats = array.array("f", samples)
    if not isinstance(depth, int):
        return array.array("d", floats)
    scale = 1 << (depth - 1)
    return array.array("d", (min(max(round(x * scale), -scale), scale - 1) / scale for x in floats))


def sound(frames=1001, channels=2):
    """Noise with both ends of full scale in it, and an odd number of bytes in some formats."""
    noise = array.array("i", os.urandom(frames * channels * 4))
    return array.array("d", [1.0, -1.0, 0.0, 0.5, *(x / (1 << 31) for x in noise[4:])])


def sparse(path, channels, size, rate=48000):
    """A 16-bit RF64 file of `size` bytes of silence, most of which is a hole."""
    size -= size % (channels * 2)
    fmt = chunk(b"fmt ", struct.pack("<HHIIHH", 1, channels, rate, rate * channels * 2, channels * 2, 16))
    ds64 = chunk(b"ds64", struct.pack("<QQQI", size + 72, size, size // channels // 2, 0))
    path.write_bytes(b"RF64\xff\xff\xff\xffWAVE" + ds64 + fmt + b"data\xff\xff\xff\xff")
    os.truncate(path, 80 + size)


@unittest.skipUnless(shutil.which("ffmpeg"), "no ffmpeg")
class Samples(CommandTest):
    def setUp(self):
        super().setUp()
        self.write("base", sound().tobytes())

    def source(self, name):
        ffmpeg("-f", "f64le", "-ac", 2, "-ar", 44100, "-i", self.folder / "base", "-c:a", SOURCES[name][0],
               self.folder / name)
        return samples_of(self.folder / name)

    def assert_decoded(self, options, depth, expected, channels=2):
        """Each format, as other programs read it, holds what is expected."""
        for form in FORMATS:
            with self.subTest(options=options, form=form):
                out = f"out.{form}"
                told = self.json("decode", *options, "-o", out, "--force")[0]
                is_float = isinstance(depth, str)
                container = "AIFC" if form == "aiff" and is_float else CONTAINERS[form]
                self.assertEqual(told, {
                    "path": options[0], "output": out, "containerName": container, "sampleRate": 44100, "channels": channels,
                    "bitsPerSample": int(depth[1:]) if is_float else depth, "floatingPoint": is_float,
                    "frames": len(expected) // channels,
                    "durationSeconds": len(expected) // channels / 44100, "clippedSamples": told["clippedSamples"], "missingFrames": 0,
                    "tags": []})
                found = samples_of(self.folder / out, depth if form == "raw" else None, channels)
                self.assertEqual(found, expected)

    def test_every_container_to_every_other(self):
        for name, (_, depth) in SOURCES.items():
            self.assert_decoded((name,), depth, self.source(name))

    def test_bits(self):
        for name in ("u8.wav", "s24.wav", "s32.wav", "f64.wav", "s16.aiff"):
            expected = self.source(name)
            for option, depth in DEPTHS.items():
                if depth != SOURCES[name][1]:
                    self.assert_decoded((name, "--bits", option), depth, converted(expected, depth))

    def test_channels(self):
        stereo = converted(self.source("f32.wav"), "f32")
        left, right = stereo[0::2], stereo[1::2]
        pairs = list(zip(left, right))
        for channels, frames in ((1, [((l + r) / 2,) for l, r in pairs]), (3, [(l, r, 0.0) for l, r in pairs])):
            expected = array.array("d", array.array("f", [sample for frame in frames for sample in frame]))
            self.assert_decoded(("f32.wav", "--channels", str(channels)), "f32", expected, channels)

    def test_ranges(self):
        whole = self.source("s24.wav")
        for options, first, frames in ((("--start", "0"), 0, 1001), (("--start", "1000"), 1000, 1),
                                       (("--frames", "17"), 0, 17), (("--start", "500", "--frames", "300"), 500, 300),
                                       (("--start", "0.01s", "--frames", "0:00.002"), 441, 88),
                                       (("--start", "500", "--end", "800"), 500, 300),
                                       (("--start", "500", "--end", "0.02s"), 500, 382), (("--frames", "0"), 0, 0)):
            self.run_command("decode", "s24.wav", *options, "-o", "out.wav", "--force")
            self.assertEqual(samples_of(self.folder / "out.wav"), whole[first * 2:(first + frames) * 2], options)
        told = self.run_command("decode", "s24.wav", "--start", "1000", "--frames", "5", "-o", "one.wav")
        self.assertIn(b"only 1 of 5 frames are there", told.stderr)
        self.assertIn("has 1001 frames, and none at 1001", self.failure("decode", "s24.wav", "--start", "1001"))

    def test_blocks_that_follow_each_other(self):
        # Longer than what is read at a time, of few channels and of many.
        for channels, frames in ((1, 200_003), (300, 4001)):
            content = os.urandom(frames * channels * 2)
            fmt = chunk(b"fmt ", struct.pack("<HHIIHH", 1, channels, 8000, 16000 * channels, 2 * channels, 16))
            data = chunk(b"data", content)
            self.write("a.wav", b"RIFF" + struct.pack("<I", 4 + len(fmt) + len(data)) + b"WAVE" + fmt + data)
            raw = ("decode", "a.wav", "-o", "-", "--format", "raw")
            self.assertEqual(self.run_command(*raw).stdout, content)
            floats = array.array("f", self.run_command(*raw, "--bits", "f32", "--start", "77").stdout)
            self.assertEqual([round(x * 32768) for x in floats],
                             list(array.array("h", content[77 * channels * 2:])))

    def test_clipped_samples_are_counted(self):
        loud = array.array("f", [0.0, 1.0, 1.5, -1.0, -1.25, 7.0, float("nan"), 0.5])
        self.write("raw", loud.tobytes())
        ffmpeg("-f", "f32le", "-ac", 1, "-ar", 44100, "-i", self.folder / "raw", "-c:a", "pcm_f32le",
               self.folder / "a.wav")
        result = self.run_command("decode", "a.wav", "-o", "out.raw", "--bits", "16")
        self.assertIn(b"ktfiles: a.wav: 3 samples are clipped", result.stderr)
        self.assertEqual(list(array.array("h", (self.folder / "out.raw").read_bytes())),
                         [0, 32767, 32767, -32768, -32768, 32767, 0, 16384])
        kept = self.run_command("decode", "a.wav", "-o", "kept.raw")
        self.assertEqual((kept.stderr, (self.folder / "kept.raw").read_bytes()), (b"", loud.tobytes()))

    def test_rates(self):
        # A sine keeps its pitch, its level and its place.
        tone = self.folder / "tone.wav"
        ffmpeg("-f", "lavfi", "-i", "sine=1000:r=44100:d=1", "-c:a", "pcm_f32le", tone)
        self.run_command("decode", "tone.wav", "--rate", "44100", "-o", "same.wav")
        self.assertEqual(samples_of(self.folder / "same.wav"), samples_of(tone))
        result = subprocess.run([KTFILES, "decode", "tone.wav", "--rate", "48000", "-o", "a.wav"], cwd=self.folder,
                                capture_output=True)
        if b"install" in result.stderr:
            self.skipTest("built without the decoder module")
        self.assertEqual((result.returncode, result.stderr), (0, b""))
        ours = samples_of(self.folder / "a.wav")
        theirs = samples_of(tone)
        self.assertEqual(len(ours), 48000)
        for frame in range(4800, 43200, 480):  # where both rates have a sample at the same time
            self.assertAlmostEqual(ours[frame], theirs[frame * 441 // 480], delta=1e-3)
        part = self.run_command("decode", "tone.wav", "--rate", "48000", "--start", "10000", "--frames", "1000",
                                "--format", "raw", "-o", "-").stdout
        self.assertEqual(array.array("d", array.array("f", part)), ours[10000:11000])


@unittest.skipUnless(shutil.which("ffmpeg") and shutil.which("lame"), "no ffmpeg, or no lame")
class Compressed(CommandTest):
    FRAMES = 50_001

    def setUp(self):
        super().setUp()
        self.write("base", converted(sound(self.FRAMES), 16).tobytes())
        self.encode("base.wav", "pcm_s16le", "-f", "f64le", "-ac", "2", "-ar", "44100", source="base")
        self.encode("a.flac", "flac")
        result = subprocess.run([KTFILES, "decode", "a.flac", "-o", "-"], cwd=self.folder, capture_output=True)
        if b"install" in result.stderr:
            self.skipTest("built without the decoder module")

    def encode(self, name, codec, *source_format, source="base.wav"):
        if codec == "lame":
            subprocess.run(["lame", "--quiet", self.folder / source, self.folder / name], check=True)
        else:
            ffmpeg(*source_format, "-i", self.folder / source, "-c:a", *codec.split(), self.folder / name)
        return self.folder / name

    def test_the_samples_that_others_decode(self):
        # By the number of frames when the format tells it, else by that of the other decoder. AAC without noise, which
        # each decoder makes up by itself.
        for name, codec, depth, frames in (
                ("a.mp3", "lame", "f32", self.FRAMES), ("a.flac", "flac", 16, self.FRAMES),
                ("deep.flac", "flac -sample_fmt s32", 24, self.FRAMES), ("alac.m4a", "alac", 16, self.FRAMES),
                ("a.m4a", "aac -aac_pns 0", "f32", self.FRAMES), ("a.ogg", "libvorbis", "f32", self.FRAMES),
                ("a.aac", "aac -aac_pns 0", "f32", None), ("law.wav", "pcm_alaw", 16, self.FRAMES)):
            with self.subTest(name):
                theirs = samples_of(self.encode(name, codec))
                told = self.json("decode", name, "-o", "out.wav", "--force")[0]
                ours = samples_of(self.folder / "out.wav")
                self.assertEqual(told["bitsPerSample"], 32 if depth == "f32" else depth)
                self.assertEqual(told["floatingPoint"], depth == "f32")
                self.assertEqual(told["frames"], len(theirs) // 2 if frames is None else frames)
                self.assertEqual(ours, theirs[:len(ours)])
                part = self.run_command("decode", name, "-o", "-", "--format", "raw", "--bits", "f32",
                                        "--start", "12345", "--frames", "6789").stdout
                self.assertEqual(array.array("d", array.array("f", part)), ours[24690:38268])

    def test_damaged_files_give_what_they_have(self):
        for name, codec in (("a.mp3", "lame"), ("a.flac", "flac")):
            content = bytearray(self.encode(name, codec).read_bytes())
            end = content.rindex(content[content.index(b"\xff\xfb" if codec == "lame" else b"\xff\xf8"):][:2])
            content[end:end + 40] = bytes(40)
            self.write("bad", content)
            told = self.json("decode", "bad", "-o", "out.wav", "--force", "--conceal")[0]
            self.assertLess(abs(told["frames"] - self.FRAMES), 6000)
            size, = struct.unpack_from("<I", (self.folder / "out.wav").read_bytes(), 4)
            self.assertEqual(size + 8, os.path.getsize(self.folder / "out.wav"))
            self.assertEqual(len(samples_of(self.folder / "out.wav")), told["frames"] * 2)

    def test_missing_frames_fail_unless_concealed(self):
        whole = samples_of(self.encode("whole.flac", "flac"))
        content = bytearray((self.folder / "whole.flac").read_bytes())
        middle = len(content) // 2
        content[middle:middle + 40] = bytes(40)
        self.write("bad.flac", content)
        content = bytearray((self.folder / "whole.flac").read_bytes())
        content[26] ^= 1  # of the MD5
        self.write("other.flac", content)
        for name, problem in (("bad.flac", "4608 frames cannot be decoded"),
                              ("other.flac", "the sound is not what its checksum says")):
            self.assertIn(f"ktfiles: {name}: {problem}; --conceal", self.failure("decode", name, "-o", "out.wav"))
            self.assertFalse((self.folder / "out.wav").exists())
            told = self.json("decode", name, "-o", "out.wav", "--conceal")[0]
            self.assertEqual(told["missingFrames"], 4608 if name == "bad.flac" else 0)
            different = sum(a != b for a, b in zip(samples_of(self.folder / "out.wav"), whole))
            self.assertLessEqual(different, told["missingFrames"] * 2)
            os.remove(self.folder / "out.wav")

    def test_speakers(self):
        for name, codec in (("a.flac", "flac"), ("a.m4a", "aac"), ("a.ac3", "ac3")):
            self.encode(name, codec + " -ac 6")
            self.run_command("decode", name, "-o", "out.wav", "--force", "--quiet")
            header = (self.folder / "out.wav").read_bytes()[:80]
            mask, = struct.unpack_from("<I", header, header.index(b"fmt ") + 28)
            self.assertEqual(mask, 0x3F, name)

    def test_tags_of_a_compressed_loop(self):
        self.write("loop.caf", (MEDIA / "tone-alac.caf").read_bytes())
        self.run_command("tags", "set", "loop.caf", "beatCount=2", "genre=Jazz", "transients=5,77")
        self.run_command("decode", "loop.caf", "-o", "out.aiff")
        before, after = self.json("tags", "loop.caf")[0], self.json("tags", "out.aiff")[0]
        for key in ("beatCount", "genre", "transients", "tempo"):
            self.assertEqual(after[key], before[key])


class Outputs(CommandTest):
    def test_names(self):
        self.write("a.wav", wave())
        os.makedirs(self.folder / "sub" / "deep.er")
        for source in ("sub/b.L.wav", "sub/deep.er/no_extension", ".wav", "take.2"):
            self.write(source, wave())
        for arguments, outputs in (
                (("sub/b.L.wav", "sub/deep.er/no_extension"), {"b.L.wav": b"RIFF", "no_extension.wav": b"RIFF"}),
                (("a.wav", "--format", "caf"), {"a.caf": b"caff"}),
                ((".wav", "take.2"), {".wav.wav": b"RIFF", "take.2.wav": b"RIFF"}),
                (("a.wav", "sub/b.L.wav", "-o", "new/"), {"new/a.wav": b"RIFF", "new/b.L.wav": b"RIFF"}),
                (("a.wav", "-o", "new", "--format", "aiff"), {"new/a.aiff": b"FORM"}),
                (("a.wav", "-o", "x.AIF"), {"x.AIF": b"FORM"}), (("a.wav", "-o", "x.raw"), {"x.raw": wave()[44:48]}),
                (("a.wav", "-o", "plain"), {"plain": b"RIFF"}),
                (("a.wav", "-o", "odd.mp3", "--format", "caf"), {"odd.mp3": b"caff"})):
            told = self.json("decode", *arguments)
            kinds = {item["output"]: (self.folder / item["output"]).read_bytes()[:4] for item in told}
            self.assertEqual(kinds, outputs)

    def test_existing_files(self):
        self.write("a.wav", wave())
        old = self.write("old.wav", b"old")
        os.chmod(old, 0o640)
        os.symlink("old.wav", self.folder / "link.wav")
        os.link(self.folder / "a.wav", self.folder / "same.wav")
        for out, why in (("old.wav", "old.wav exists; --force replaces it"), ("link.wav", "exists; --force"),
                         ("same.wav", "over the file itself"), ("a.wav", "over the file itself"),
                         ("missing/x.wav", "the folder missing: file not found")):
            self.assertIn(why, self.failure("decode", "a.wav", "-o", out))
        self.assertIn("over the file itself", self.failure("decode", "a.wav", "-o", "same.wav", "--force"))
        self.assertEqual(old.read_bytes(), b"old")
        self.run_command("decode", "a.wav", "-o", "link.wav", "--force")
        self.assertEqual((old.read_bytes(), os.stat(old).st_mode & 0o777), (wave(), 0o640))
        self.assertTrue(os.path.islink(self.folder / "link.wav"))
        self.run_command("decode", "a.wav", "-o", "new.wav", umask=0o027)
        self.assertEqual(os.stat(self.folder / "new.wav").st_mode & 0o777, 0o640)
        self.assert_no_litter("a.wav", "link.wav", "new.wav", "old.wav", "same.wav")

    def test_standard_output_and_devices(self):
        self.write("a.wav", wave(frames=1001))
        for form in FORMATS:
            self.run_command("decode", "a.wav", "-o", f"out.{form}")
            result = self.run_command("decode", "a.wav", "-o", "-", "--format", form)
            self.assertEqual(result.stdout, (self.folder / f"out.{form}").read_bytes())
        self.run_command("decode", "a.wav", "-o", "/dev/null")
        self.assertIn("disk full", self.failure("decode", "a.wav", "-o", "/dev/full"))
        with open("/dev/full", "wb") as full:
            result = subprocess.run([KTFILES, "decode", self.folder / "a.wav", "-o", "-"], stdout=full,
                                    stderr=subprocess.PIPE)
        self.assertEqual((result.returncode, result.stderr), (1, b"ktfiles: standard output: disk full\n"))
        text, status = self.on_terminal("decode", "a.wav", "-o", "-")
        self.assertEqual((status, text.splitlines()[0]), (2, "ktfiles: sound does not go to a terminal: name a file"))

    def test_forms(self):
        self.write("a.wav", wave(frames=48000))
        self.write("bad.wav", b"RIFF")
        line = "a.wav: decoded to x.caf, CAF, 0:01.000, 48 kHz, 16-bit, mono"
        self.assertEqual(self.lines("decode", "a.wav", "-o", "x.caf"), [line])
        self.assertEqual(self.on_terminal("decode", "a.wav", "-o", "x.caf", "--force"), (line + "\n", 0))
        self.assertEqual(self.lines("decode", "a.wav", "-o", "y.caf", "-q"), [])
        told = self.json("decode", "a.wav", "bad.wav", "missing.wav", "-o", "out/", status=1)
        self.assertEqual([set(item) for item in told[1:]], [{"path", "error"}] * 2)
        self.assertEqual(told[0]["frames"], 48000)

    def test_sound_that_is_not_there(self):
        self.write("cut.wav", wave(frames=1000)[:-900])
        for options, told in (((), b"900 bytes of which are missing"), (("-q",), b"")):
            result = self.run_command("decode", "cut.wav", "-o", "out.wav", "--force", *options)
            self.assertIn(told, result.stderr)
            self.assertEqual(bool(told), bool(result.stderr))
            self.assertEqual((self.folder / "out.wav").read_bytes(), wave(frames=550))
        self.write("none.wav", wave(frames=0))
        self.assertEqual(self.json("decode", "none.wav", "-o", "none.aiff")[0]["frames"], 0)
        for name, content, why in (("empty.wav", b"", "is empty"), ("text.wav", b"text" * 100, ""),
                                   ("short.wav", wave()[:30], "")):
            self.write(name, content)
            self.assertIn(why, self.failure("decode", name, "-o", "gone/"))
        for name, why in (("missing.wav", "not found"), ("/dev/zero", "is a device")):
            self.assertIn(why, self.failure("decode", name, "-o", "gone/"))
        self.assert_no_litter("cut.wav", "empty.wav", "none.aiff", "none.wav", "out.wav", "short.wav", "text.wav")

    def test_mistakes(self):
        self.write("a.wav", wave())
        self.write("a.caf", caf())
        os.mkdir(self.folder / "b")
        self.write("b/a.wav", wave())
        for arguments in ((), ("a.wav", "-o", "x.mp3"), ("a.wav", "b/a.wav", "-o", "out.wav"),
                          ("a.wav", "a.caf", "-o", "-"),
                          ("a.wav", "-o", "-", "--json"), ("a.wav", "--bits", "8"), ("a.wav", "--format", "WAV"),
                          ("a.wav", "--rate", "0"), ("a.wav", "--channels", "0"), ("a.wav", "--channels", "9999"),
                          *(("a.wav", "--start", text)
                            for text in ("-1", "1.5", "s", "1:60", "", "1e3", "99999999999999999999")),
                          ("a.wav", "--frames", "x"), ("a.wav", "--frames", "1", "--end", "2"),
                          ("a.wav", "--start", "2", "--end", "2")):
            with self.subTest(arguments):
                self.run_command("decode", *arguments, status=2)
        self.assert_no_litter("a.caf", "a.wav", "b")


class Whole(CommandTest):
    """Files too large to be written in a test, of which the beginning tells, and work that is cut short."""

    def beginning(self, size, form):
        sparse(self.folder / "long.wav", 2, size)
        with subprocess.Popen([KTFILES, "decode", "long.wav", "-o", "-", "--format", form], cwd=self.folder,
                              stdout=subprocess.PIPE, stderr=subprocess.PIPE) as process:
            head = process.stdout.read(200)
            process.stdout.close()
            self.assertEqual((process.wait(30), process.stderr.read()), (-signal.SIGPIPE, b""))
        return head

    def test_long_files(self):
        for size, kind, ids in ((1 << 31, b"RIFF", {b"fmt ": 12, b"data": 36}),
                                (0xFF000000, b"RIFF", {b"JUNK": 12, b"fmt ": 48, b"data": 72}),
                                (5 << 30, b"RF64", {b"ds64": 12, b"fmt ": 48, b"data": 72})):
            head = self.beginning(size, "wav")
            self.assertEqual(head[:4] + head[8:12], kind + b"WAVE")
            for name, at in ids.items():
                self.assertEqual(head[at:at + 4], name)
            written, = struct.unpack_from("<I", head, ids[b"data"] + 4)
            self.assertEqual(written, 0xFFFFFFFF if kind == b"RF64" else size)
            if kind == b"RF64":
                self.assertEqual(struct.unpack_from("<QQQ", head, 20), (size + 72, size, size // 4))
        head = self.beginning(5 << 30, "caf")
        self.assertEqual(head[52:64], b"data" + struct.pack(">q", (5 << 30) + 4))
        self.assertIn("has too much sound for an AIFF file, 5368709120 bytes",
                      self.failure("decode", "long.wav", "-o", "x.aiff"))
        self.assert_no_litter("long.wav")

    def test_full_disk(self):
        content = wave(frames=500_000)
        self.write("a.wav", content)
        for form in FORMATS:
            for limit in (10, 4096, len(content) - 100):
                error = self.failure("decode", "a.wav", "-o", f"out.{form}", preexec_fn=lambda: (
                    resource.setrlimit(resource.RLIMIT_FSIZE, (limit, limit))))
                self.assertIn("the output cannot be written", error)
        self.assert_no_litter("a.wav")

    def test_interruption_leaves_nothing(self):
        # So many channels that mixing them takes minutes, and the output is small.
        sparse(self.folder / "a.wav", 1024, 60 << 30)
        old = self.write("out.wav", b"old")
        for out, options in (("out.wav", ("--force",)), ("new.wav", ())):
            process, terminal = pty.fork()
            if process == 0:
                os.chdir(self.folder)
                os.execv(KTFILES, [KTFILES, "decode", "a.wav", "--channels", "1", "-o", out, *options])
            self.assertIn(b"decoding ", os.read(terminal, 1000))  # the progress bar, after a second
            os.kill(process, signal.SIGINT)
            self.assertEqual(os.waitstatus_to_exitcode(os.waitpid(process, 0)[1]), -signal.SIGINT)
            os.close(terminal)
            self.assert_no_litter("a.wav", "out.wav")
        self.assertEqual(old.read_bytes(), b"old")

    def test_a_source_cut_meanwhile(self):
        source = self.write("a.wav", wave(frames=1_000_000))
        os.mkfifo(self.folder / "out.wav")
        with subprocess.Popen([KTFILES, "decode", "a.wav", "-o", "out.wav"], cwd=self.folder, stdout=subprocess.PIPE,
                              stderr=subprocess.PIPE) as process:
            with open(self.folder / "out.wav", "rb") as fifo:
                self.assertEqual(fifo.read(4), b"RIFF")  # then it waits for its reader
                os.truncate(source, 300_000)
                fifo.read()
            _, error = process.communicate(timeout=30)
            self.assertEqual(process.returncode, 1)
            self.assertEqual(error.count(b"\n"), 1, error)


class Tags(CommandTest):
    TAGS = ("beatCount=4", "key=F#", "mode=minor", "signature=4/4", "instrumentType=Bells", "genre=Ambient",
            "descriptors=Dry,Clean", "title=A bell", "transients=0,1000,2205,4409")
    KEYS = {"beatCount", "midiRootNote", "keyType", "signatureTop", "signatureBottom", "instrumentType", "genre",
            "descriptors", "title"}

    def loop(self, name, media):
        self.write(name, (MEDIA / media).read_bytes())
        self.run_command("tags", "set", name, *self.TAGS)
        if name.endswith(".aiff"):
            self.run_command("chunks", "add", name, ".mid", stdin=b"MThd\0\0\0\6\0\0\0\1\0\x60")
        return self.json("tags", name)[0]

    def test_carried_over(self):
        for name, media in (("loop.aiff", "tone-16.aiff"), ("loop.caf", "bell-16-be.caf")):
            tags = self.loop(name, media)
            for form in ("aiff", "caf"):
                told = self.json("decode", name, "-o", f"out-{name}.{form}", "--bits", "24")[0]
                found = self.json("tags", told["output"])[0]
                with self.subTest(name=name, form=form):
                    for key in (*self.KEYS, "tempo", "transients"):
                        self.assertEqual(found.get(key), tags[key], key)
                    self.assertEqual(found.get("chunks"), tags.get("chunks"))
                    self.assertLessEqual(self.KEYS | {"transients"}, set(told["tags"]))
                    # The program that made the CAF file wrote its name into it, for which AIFF has no place.
                    self.assertEqual(told.get("notKept"), (media[-3:], form) == ("caf", "aiff") and
                                     ["of its texts encoder is not carried over"] or None)
            self.assertRegex(self.lines("decode", name, "-o", "words.caf", "--force")[0], ", with (info, )?its tags$")

    def test_transients_follow_the_rate(self):
        tags = self.loop("loop.aiff", "tone-16.aiff")
        result = subprocess.run([KTFILES, "decode", "loop.aiff", "--rate", "88200", "-o", "x.caf"], cwd=self.folder,
                                capture_output=True)
        if b"install" in result.stderr:
            self.skipTest("built without the decoder module")
        found = self.json("tags", "x.caf")[0]
        self.assertEqual([item["frame"] for item in found["transients"]],
                         [item["frame"] * 2 for item in tags["transients"]])
        self.assertAlmostEqual(found["tempo"], tags["tempo"], delta=0.01)

    def test_tags_that_stay_behind(self):
        self.loop("loop.aiff", "tone-16.aiff")
        for arguments, why in ((("-o", "x.raw"), "raw sound holds none"),
                               (("-o", "x.aiff", "--bits", "f32"), "AIFC holds none"),
                               (("-o", "y.caf", "--start", "1"), "they are true of the whole file only"),
                               (("-o", "z.caf", "--frames", "100"), "they are true of the whole file only"),
                               (("-o", "/dev/null", "--format", "caf"), "they are put into files only")):
            result = self.run_command("decode", "loop.aiff", "--json", "--force", *arguments)
            note = "its tags are not carried over: " + why
            self.assertEqual(result.stderr.decode(), f"ktfiles: loop.aiff: {note}\n")
            told = json.loads(result.stdout)[0]
            self.assertEqual((told["tags"], told["notKept"]), ([], [note]))
            self.assertEqual(self.run_command("decode", "loop.aiff", "-q", "--force", *arguments).stderr, b"")

    def test_other_chunks_that_stay_behind(self):
        self.write("a.wav", wave(chunk(b"bext", b"x" * 602), chunk(b"iXML", b"<a/>"), chunk(b"cue ", bytes(4)),
                                 chunk(b"LIST", b"INFO"), chunk(b"LIST", b"adtl"), chunk(b"LGWV", b"wave")))
        info = (b"info", b"\0\0\0\2title\0T\0year\x001999\0")
        self.write("b.caf", caf((b"mark", b"m"), (b"uuid", bytes(20)), info))
        self.write("c.caf", caf((b"info", b"\0\0\0\1title\0T\0")))
        for name, note in (("a.wav", "bext, iXML are not carried over"), ("b.caf", "uuid is not carried over"),
                           ("c.caf", None)):
            result = self.run_command("decode", name, "-o", "out.caf", "--force", "--json")
            self.assertEqual(result.stderr.decode(), f"ktfiles: {name}: {note}\n" if note else "")
            self.assertEqual(json.loads(result.stdout)[0].get("notKept"), [note] if note else None)

    def test_the_first_read_from_a_pipe_gives_header_and_samples(self):
        self.write("a.wav", wave(frames=20000))
        for options in ((), ("--format", "aiff"), ("--format", "caf")):
            for _ in range(20):
                process = subprocess.Popen([KTFILES, "decode", "a.wav", "-o", "-", *options], cwd=self.folder,
                                           stdout=subprocess.PIPE)
                first = os.read(process.stdout.fileno(), 65536)
                rest = process.stdout.read()
                process.stdout.close()
                self.assertEqual(process.wait(), 0)
                self.assertGreater(len(first), 32768, options)
                self.assertGreater(len(first + rest), 40000)
        for _ in range(20):
            decoder = subprocess.Popen([KTFILES, "decode", "a.wav", "-o", "-"], cwd=self.folder, stdout=subprocess.PIPE)
            judge = subprocess.run(["sox", "-", "-t", "raw", "-"], stdin=decoder.stdout, capture_output=True)
            decoder.stdout.close()
            self.assertEqual((decoder.wait(), judge.returncode, judge.stderr, len(judge.stdout)), (0, 0, b"", 40000))


if __name__ == "__main__":
    unittest.main()
