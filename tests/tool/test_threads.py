"""Work on several files at once: what is told, and in which order, is what one thread tells."""
import os
import shutil
import signal
import subprocess
import time
import unittest

from command import KTFILES, MEDIA, CommandTest, caf, needs_decoders, wave


class Threads(CommandTest):
    def setUp(self):
        super().setUp()
        self.names = []
        for i in range(60):
            name = f"in/{i % 5}/{i:02}.wav"
            (self.folder / name).parent.mkdir(parents=True, exist_ok=True)
            self.write(name, (wave(frames=(i * 7919) % 30000), b"RIFF", wave(frames=1000)[:-900])[i % 7 if i % 7 < 3 else 0])
        for i in range(6):
            shutil.copy(MEDIA / ("tone-16.aiff", "bell-16-be.caf", "harbour-bw64.wav")[i % 3],
                        self.folder / f"in/{i % 5}/{i}.{('aiff', 'caf', 'wav')[i % 3]}")
        self.write("in/0/note.txt", b"no sound")

    def told(self, *arguments):
        result = subprocess.run([KTFILES, *arguments], cwd=self.folder, capture_output=True)
        return result.stdout, result.stderr, result.returncode

    def test_all_is_told_as_by_one(self):
        for verb in (["info"], ["info", "--jsonl"], ["info", "-l", "--color", "always"], ["tags"], ["tags", "--json"], ["overview"],
                     ["overview", "--json"], ["adm", "--check"], ["adm", "--check", "--json"], ["scan", "--json"],
                     ["decode", "-o", "out/", "--json"], ["decode", "-o", "out/"]):
            outputs = []
            for threads in ("1", "2", "16"):
                outputs.append(self.told(*verb, "in", "in/2/missing.wav", "-j", threads))
                if verb[0] == "decode":
                    files = {path.relative_to(self.folder): path.read_bytes() for path in (self.folder / "out").rglob("*.wav")}
                    self.assertGreater(len(files), 30)
                    outputs[-1] += (files,)
                    shutil.rmtree(self.folder / "out")
            self.assertEqual(outputs[0], outputs[1], verb)
            self.assertEqual(outputs[0], outputs[2], verb)
            self.assertEqual(outputs[0][2], 1)

    def test_overviews_are_stored_one_by_one(self):
        names = sorted(f"in/{i % 5}/{i}.{('aiff', 'caf')[i % 3]}" for i in range(6) if i % 3 < 2)
        os.link(self.folder / names[0], self.folder / "in/other.aiff")
        results = []
        for threads in ("1", "4"):
            shutil.copytree(self.folder / "in", self.folder / "copy")
            self.told("overview", "--store", "--in-place", *names, *names, "in/other.aiff", "-j", threads)  # each twice
            results.append([(self.folder / name).read_bytes() for name in names])
            self.assertTrue(all(b"LGWV" in content or b"ovvw" in content for content in results[-1]))
            shutil.rmtree(self.folder / "in")
            (self.folder / "copy").rename(self.folder / "in")
        self.assertEqual(*results)

    def test_a_signal_leaves_nothing_half_done(self):
        for i in range(8):
            (self.folder / "big").mkdir(exist_ok=True)
            self.write(f"big/{i}.wav", wave(frames=6_000_000))
        for number, delay in ((signal.SIGINT, 0.05), (signal.SIGTERM, 0.1), (signal.SIGHUP, 0.2)):
            process = subprocess.Popen([KTFILES, "decode", "big", "-o", "out/", "--format", "aiff", "--rate", "44100", "-j", "4", "-q"],
                                       cwd=self.folder, stderr=subprocess.PIPE)
            time.sleep(delay)
            process.send_signal(number)
            process.communicate(timeout=30)
            self.assertEqual(process.returncode, -number)
            left = [path.name for path in (self.folder / "out").rglob("*")] if (self.folder / "out").exists() else []
            self.assertFalse([name for name in left if not name.endswith(".aiff") or name.startswith(".")], left)
            shutil.rmtree(self.folder / "out", ignore_errors=True)

    def test_umask_is_minded(self):
        self.run_command("decode", "in/1", "-o", "out/", "-j", "8", "-q", "--force", status=1, preexec_fn=lambda: os.umask(0o027))
        self.assertEqual({path.stat().st_mode & 0o777 for path in (self.folder / "out").rglob("*.wav")}, {0o640})

    def test_mistakes(self):
        for text in ("0", "-1", "x", "257"):
            self.failure("info", "in", "-j", text, status=2)


if __name__ == "__main__":
    unittest.main()
