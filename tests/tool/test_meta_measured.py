"""ktfiles meta set --md5: digests as others reckon them; --loudness: the published cases of EBU Tech 3341 and 3342, and ffmpeg on other sound."""
import hashlib
import math
import os
import re
import shutil
import signal
import struct
import subprocess
import tempfile
import time
import unittest

from command import KTFILES, LIBRARY, CommandTest, caf, chunk, wave
from test_meta import bext

NAMES = ("loudnessValue", "loudnessRange", "maxTruePeakLevel", "maxMomentaryLoudness", "maxShortTermLoudness")
needs_meter = unittest.skipUnless((LIBRARY.parent / "ktfiles/libktfiles-loudness.so").exists(), "the meter is not built")


def period(levels, frequency=1000, phase=0.0):
    """48 frames at 48 kHz: a sine on each channel, at levels in dBFS (None: silence), as 24 bits."""
    frames = (struct.pack("<i", 0 if level is None else round((2 ** 31 - 1) * 10 ** (level / 20) * math.sin(2 * math.pi * frequency * i / 48000 + phase)))[1:]
              for i in range(48) for level in levels)
    return b"".join(frames)


def sound(*parts, mask=None, **tone):
    """A WAVE file of such sines, each part with its levels and its seconds."""
    channels = len(parts[0][0])
    fmt = struct.pack("<HHIIHH", 1 if mask is None else 0xFFFE, channels, 48000, 144000 * channels, 3 * channels, 24)
    if mask is not None:
        fmt += struct.pack("<HHI", 22, 24, mask) + bytes.fromhex("0100000000001000800000aa00389b71")
    body = b"WAVE" + chunk(b"fmt ", fmt) + chunk(b"data", b"".join(period(levels, **tone) * round(1000 * seconds) for levels, seconds in parts))
    return b"RIFF" + struct.pack("<I", len(body)) + body


def stereo(*parts):
    return sound(*(((level, level), seconds) for level, seconds in parts))


@needs_meter
class Loudness(CommandTest):
    def measured(self, name, *arguments):
        """What is stored in the five fields, None where that is "not set"."""
        self.run_command("meta", "set", "--loudness", "--in-place", name, *arguments)
        content = (self.folder / name).read_bytes()
        at = content.rindex(b"bext") + 8
        self.assertEqual(struct.unpack_from("<H", content, at + 346), (2,))
        return [None if value == 0x7FFF else value / 100 for value in struct.unpack_from("<5h", content, at + 412)]

    def test_published_cases_are_measured_as_they_are_told(self):
        surround = (-28, -28, -24, None, -30, -30)
        cases = [  # which field, what it is, how far it may be off (both standards: 0.1 LU, 1 LU), the file
            (0, -23, 0.1, stereo((-23, 20))), (0, -33, 0.1, stereo((-33, 20))),  # Tech 3341, 1 to 6
            (0, -23, 0.1, stereo((-36, 10), (-23, 60), (-36, 10))), (0, -23, 0.1, stereo((-72, 10), (-36, 10), (-23, 60), (-36, 10), (-72, 10))),
            (0, -23, 0.1, stereo((-26, 20), (-20, 20.1), (-26, 20))), (0, -23, 0.1, sound((surround, 20))),
            (0, -23, 0.1, sound((surround, 20), mask=0x60F)),  # with side instead of back speakers
            (4, -23, 0.1, stereo((-20, 1.34), (-30, 1.66), (-20, 1.34), (-30, 1.66))),  # 9
            (3, -23, 0.1, stereo((-20, 0.18), (-30, 0.22), (-20, 0.18), (-30, 0.22), (-20, 0.18), (-30, 0.22))),  # 12
            (1, 10, 0.1, stereo((-20, 20), (-30, 20))), (1, 5, 0.1, stereo((-20, 20), (-15, 20))),  # Tech 3342, 1 to 4
            (1, 20, 0.1, stereo((-40, 20), (-20, 20))), (1, 15, 0.1, stereo((-50, 20), (-35, 20), (-20, 20), (-35, 20), (-50, 20))),
        ]
        for phase in (0, 45, 60, 67.5):  # true peaks: Tech 3341, 15 to 18, of which samples miss up to 3 dB
            frequency = {60: 8000, 67.5: 6000}.get(phase, 12000)
            fade = [((20 * math.log10(step / 80),) * 2, 0.01) for step in range(1, 41)]
            cases.append((2, -6.1, 0.3, sound(*fade, ((-6.02, -6.02), 2), frequency=frequency, phase=math.radians(phase))))
        for index, (field, value, tolerance, content) in enumerate(cases):
            with self.subTest(index):
                self.write("a.wav", content)
                self.assertAlmostEqual(self.measured("a.wav")[field], value, delta=tolerance)

    def test_low_frequency_effects_and_rear_speakers(self):
        self.write("a.wav", sound(((-40, -40, -40, 0, -40, -40), 4)))
        value, _, peak, _, _ = self.measured("a.wav")
        self.assertLess(value, -33)  # which a loud channel of effects does not raise
        self.assertAlmostEqual(peak, 0, delta=0.05)
        # Of 7.1 the sides count by 1.41, the rear ones by 1 (ITU-R BS.1770-4); of 5.1 the rear ones are the surrounds.
        levels = {}
        for mask, place in ((0x63F, 4), (0x63F, 6), (0x3F, 4), (0x60F, 4), (0x63F, 0)):
            channels = [None] * (8 if mask == 0x63F else 6)
            channels[place] = -20
            self.write("b.wav", sound((tuple(channels), 4), mask=mask))
            levels[mask, place] = self.measured("b.wav")[0]
        front = levels.pop((0x63F, 0))
        self.assertEqual({key: round(value - front, 1) for key, value in levels.items()},
                         {(0x63F, 4): 0, (0x63F, 6): 1.5, (0x3F, 4): 1.5, (0x60F, 4): 1.5})

    def test_ffmpeg_measures_the_same(self):
        noise = "anoisesrc=r={rate}:d=20:c={color}:a=0.4:seed=7"
        cases = [  # filters that make the sound, options
            (noise.format(rate=44100, color="pink"), ("-c:a", "pcm_s24le")), (noise.format(rate=48000, color="brown"), ("-ac", "2")),
            (noise.format(rate=96000, color="white") + ",tremolo=f=0.15:d=0.9", ("-ac", "2", "-c:a", "pcm_f32le")),
            ("sine=f=997:r=44100:d=12:beep_factor=3", ("-c:a", "pcm_s16le")), ("sine=f=200:r=192000:d=6", ()),
            ("aevalsrc=0.2*random(0)|0.3*random(1)|0.1*sin(900*t)|0.9*sin(300*t)|0.2*random(2)|0.1*random(3):s=48000:d=12:c=5.1", ("-c:a", "pcm_f64le")),
            (noise.format(rate=48000, color="pink") + ",volume='if(lt(mod(t,8),3),0.01,1)':eval=frame", ("-rf64", "always")),
        ]
        for source, options in cases:
            with self.subTest(source):
                path = self.folder / "a.wav"
                subprocess.run(["ffmpeg", "-v", "error", "-y", "-f", "lavfi", "-i", source, *options, path], check=True, stdin=subprocess.DEVNULL)
                told = subprocess.run(["ffmpeg", "-nostats", "-i", path, "-af", "ebur128=peak=true:metadata=1,ametadata=print:file=-", "-f", "null", "-"],
                                      capture_output=True, text=True, stdin=subprocess.DEVNULL)
                summary = told.stderr[told.stderr.rindex("Summary:"):]
                judge = [float(re.search(key + r":\s*(\S+)", summary)[1]) for key in ("I", "LRA", "Peak")]
                judge += [max(float(value) for value in re.findall(rf"lavfi\.r128\.{key}=(\S+)", told.stdout)) for key in "MS"]
                for name, ours, theirs, tolerance in zip(NAMES, self.measured("a.wav"), judge, (0.1, 0.2, 0.2, 0.1, 0.1)):
                    self.assertAlmostEqual(ours, theirs, delta=tolerance + 0.05, msg=name)  # they are told with one digit

    def test_what_has_no_number_is_not_set_and_is_told(self):
        second = ("shorter than 3 s", [1, 4])
        cases = [(stereo((None, 5)), [("silent", [0, 1, 2, 3, 4])]), (stereo((-20, 1)), [second]),
                 (stereo((-20, 0.2)), [("shorter than 0.4 s", [0, 3]), second]),
                 (stereo((-80, 5)), [("quieter than -70 LUFS", [0, 1])]), (stereo((None, 2), (-100.4, 5)), [("quieter than -70 LUFS", [0, 1]), ("stored", [2, 3, 4])])]
        for content, told in cases:
            with self.subTest(told):
                old = chunk(b"bext", bext(b"kept", loudness=(-100,) * 5))
                self.write("a.wav", content[:4] + struct.pack("<I", len(content) - 8 + len(old)) + content[8:] + old)
                line, = self.lines("meta", "set", "--dry-run", "--loudness", "a.wav")
                record = self.record("meta", "set", "--dry-run", "--loudness", "a.wav")
                for why, fields in told:
                    self.assertIn(why + ", no bext." + NAMES[fields[0]], line)
                    self.assertEqual([item["field"] for item in record["notMeasured"] if item["why"].endswith(why)], ["bext." + NAMES[i] for i in fields])
                self.assertEqual([i for i, value in enumerate(self.measured("a.wav")) if value is None], sorted(sum((fields for _, fields in told), [])))

    def test_other_fields_go_with_it_and_nothing_else_changes(self):
        content = sound(((-20, -23), 4))
        path = self.write("a.wav", content)
        self.run_command("meta", "set", "--dry-run", "--loudness", "a.wav")
        self.assertEqual(path.read_bytes(), content)
        changes = {item["field"]: item.get("to") for item in self.record("meta", "set", "--loudness", "a.wav", "bext.originator=me", "info.INAM=x")["changes"]}
        self.assertEqual((changes["bext.originator"], changes["info.INAM"], changes["bext.version"]), ("me", "x", 2))
        self.assertEqual(path.read_bytes()[8:len(content)], content[8:])
        self.assertTrue(self.lines("meta", "set", "--loudness", "a.wav")[0].endswith(": unchanged"))
        for words in (["bext.loudnessValue=-23"], ["bext.version=1"], ["bext[0].maxTruePeakLevel="]):
            self.failure("meta", "set", "--loudness", "a.wav", *words, status=2)

    def test_sound_that_cannot_be_measured_is_refused(self):
        def pcm(channels, rate, body, tag=1, bits=16, frames=100):
            fmt = struct.pack("<HHIIHH", tag, channels, rate, rate * channels * bits // 8, channels * bits // 8, bits)
            content = b"WAVE" + chunk(b"fmt ", fmt) + chunk(b"data", body * channels * frames)
            return b"RIFF" + struct.pack("<I", len(content)) + content
        cases = [("many.wav", pcm(65, 48000, b"\1\2"), "has 65 channels; loudness is measured of 1 to 64"),
                 ("seven.wav", pcm(7, 48000, b"\1\2"), "does not say where its 7 channels are heard"),
                 ("slow.wav", pcm(1, 15, b"\1\2"), "has a sample rate of 15 Hz"), ("fast.wav", pcm(1, 2822401, b"\1\2"), "has a sample rate of 2822401 Hz"),
                 ("nan.wav", pcm(1, 48000, struct.pack("<f", math.nan), 3, 32), "holds samples that are no numbers"),
                 ("cut.wav", wave()[:-50], "ends ahead of its sound, 50 bytes"), ("empty.wav", pcm(1, 48000, b"", frames=0), "holds no sound"),
                 ("a.caf", caf(), "bext.version is no field of CAF files"), ("missing.wav", None, "")]
        for name, content, text in cases:
            with self.subTest(name):
                path = self.write(name, content) if content is not None else None
                self.assertIn(text, self.failure("meta", "set", "--loudness", name))
                self.assertEqual(path and path.read_bytes(), content)
        self.write("a.wav", sound(((-20,), 1)))
        folder = tempfile.mkdtemp(prefix="ktfiles-library-")
        self.addCleanup(shutil.rmtree, folder)
        shutil.copy(LIBRARY, folder)
        self.assertIn("install libktfiles-ebur128", self.failure("meta", "set", "--loudness", "a.wav", env={**os.environ, "LD_LIBRARY_PATH": folder}))

    def test_a_signal_while_it_measures_leaves_the_file(self):
        path = self.write("a.wav", stereo((-20, 900)))
        for arguments in ([], ["--in-place"], ["--backup"]):
            process = subprocess.Popen([KTFILES, "meta", "set", "--loudness", *arguments, "a.wav"], cwd=self.folder)
            time.sleep(0.5)
            self.assertIsNone(process.poll())
            process.send_signal(signal.SIGINT)
            self.assertEqual(process.wait(), -signal.SIGINT)
            self.assert_no_litter("a.wav")
        self.assertNotIn(b"bext", path.read_bytes()[-4096:])


class Digest(CommandTest):
    def test_it_is_that_of_the_sound_and_is_checked(self):
        def body(name):
            content = (self.folder / name).read_bytes()
            at = content.rindex(b"MD5 ")
            self.assertEqual(struct.unpack_from("<I", content, at + 4), (16,))
            return content[at + 8:at + 24]
        odd = wave()[:28] + struct.pack("<IHH", 48000, 1, 8) + b"data" + struct.pack("<I", 201) + wave()[44:] + b"\7\0"  # a pad byte, which is none of the sound
        odd = odd[:4] + struct.pack("<I", len(odd) - 8) + odd[8:]
        rf64 = b"RF64\xff\xff\xff\xffWAVE" + chunk(b"ds64", struct.pack("<QQQI", 272 - 8, 200, 100, 0)) + wave()[12:40] + b"\xff" * 4 + wave()[44:]
        cases = [("a.wav", wave(chunk(b"note", b"odd"), frames=1000), 44, 2000), ("odd.wav", odd, 44, 201), ("big.wav", rf64, 80, 200),
                 ("none.wav", wave(frames=0), 44, 0), ("old.wav", wave(chunk(b"MD5 ", bytes(16))), 44, 200)]
        for name, content, start, size in cases:
            with self.subTest(name):
                path = self.write(name, content)
                digest = hashlib.md5(content[start:start + size])
                self.run_command("meta", "set", "--md5", "--in-place", name)
                self.assertEqual(body(name), digest.digest()[::-1])
                self.assertEqual(self.lines("meta", "--only", "md5", name), ["md5\t" + digest.hexdigest()])
                told = subprocess.run(["mediainfo", "--Full", path], capture_output=True, text=True).stdout
                self.assertIn(digest.hexdigest().upper(), told) if size else None
                self.assertEqual(path.read_bytes()[start:start + size], content[start:start + size])
                self.assertTrue(self.lines("meta", "set", "--md5", name)[0].endswith(": unchanged"))
                self.run_command("meta", "set", name, "info.INAM=title", "bext.description=later")  # which leaves it true
                self.assertEqual(self.lines("info", "--check", name), [])
                if size:
                    changed = bytearray(path.read_bytes())
                    changed[start + size // 2] ^= 1
                    path.write_bytes(changed)
                    self.assertIn("states another MD5", self.lines("info", "--check", name, status=1)[0])
                self.run_command("meta", "remove", name, "md5")
                self.assertNotIn(b"MD5 ", path.read_bytes())
        for name, content, text in (("a.caf", caf(), "md5 is no field of CAF files"), ("cut.wav", wave()[:-50], "ends ahead of its sound")):
            self.write(name, content)
            self.assertIn(text, self.failure("meta", "set", "--md5", name))
        for words in (["--md5", "a.wav", "md5=" + "0" * 32], ["a.wav", "md5=00"], ["a.wav", "md5=" + "0" * 31], ["a.wav", "md5=" + "0g" * 16]):
            self.failure("meta", "set", *words, status=2)
        self.run_command("meta", "set", "a.wav", "md5=00112233445566778899aabbccddeeff")  # as a list of an archive has it
        self.assertEqual(body("a.wav").hex(), "ffeeddccbbaa99887766554433221100")


if __name__ == "__main__":
    unittest.main()
