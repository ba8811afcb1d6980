"""ktfiles scan: every loop below folders, in order, whatever else lies there."""
import csv
import io
import json
import os
import resource
import shutil
import struct
import subprocess
import unittest

from command import INSTRUMENTED, KTFILES, MEDIA, CommandTest


class Scan(CommandTest):
    def loop(self, name, genre="Rock", original="tone-16.aiff"):
        path = self.folder / name
        path.parent.mkdir(parents=True, exist_ok=True)
        shutil.copy(MEDIA / original, path)
        self.run_command("tags", "set", "./" + name, f"genre={genre}", "beatCount=4", "-q")
        return path

    def paths(self, *arguments, **options):
        return [item["path"] for item in self.json("scan", *arguments, **options)]

    def test_finds_loops_and_nothing_else(self):
        self.loop("lib/b/two.aiff")
        self.loop("lib/a.caf", original="pluck-24-le.caf")
        self.loop("lib/b.aif")
        self.loop("lib/zz", "named like nothing")
        self.loop("lib/.hidden/x.aiff")
        for name in ("tone-16.wav", "tone-fl32.aifc", "tone-16.aiff", "README.md"):
            shutil.copy(MEDIA / name, self.folder / "lib")
        os.mkfifo(self.folder / "lib/fifo.aiff")
        expected = ["lib/a.caf", "lib/b/two.aiff", "lib/b.aif", "lib/zz"]
        self.assertEqual(sorted(self.paths("lib")), sorted(expected))
        self.assertEqual(self.paths("lib/"), self.paths("lib"))
        self.assertEqual(self.json("scan", "lib/b.aif"), self.json("tags", "lib/b.aif"))
        text, status = self.on_terminal("scan", "lib", NO_COLOR="1")
        *table, count = text.splitlines()
        self.assertEqual([line.split()[-1] for line in table], ["FILE", *self.paths("lib")])
        self.assertEqual(count, "4 loops among 8 files")
        self.assertEqual(self.run_command("scan", "lib").stderr, b"")
        self.assertEqual(self.on_terminal("scan", "lib/README.md")[0], "no loops among 1 file\n")
        self.assertEqual(self.on_terminal("scan", "--quiet", "lib")[0], "")
        rows = list(csv.DictReader(io.StringIO(self.run_command("scan", "--csv", "lib").stdout.decode(), newline="")))
        self.assertEqual([(row["path"], row["genre"], row["beatCount"]) for row in rows],
                         [(item["path"], item["genre"], "4") for item in self.json("scan", "lib")])
        self.assertEqual([line.split("\t")[0] for line in self.lines("scan", "lib")], self.paths("lib"))
        self.failure("scan", "lib", "--csv", "--json", status=2)

    def test_bad_files_are_listed_at_the_end(self):
        self.loop("lib/good.aiff")
        for name, content in (("a.aiff", b""), ("b.CAF", b"no caf"), ("c.txt", b"no matter")):
            (self.folder / "lib" / name).write_bytes(content)
        (self.folder / "lib/dangling.aif").symlink_to("nowhere")
        result = self.run_command("scan", "lib", "missing", "--json", status=1)
        found = json.loads(result.stdout)
        self.assertEqual([item["path"] for item in found if "error" not in item], ["lib/good.aiff"])
        self.assertEqual([line.split(": ", 1)[1] for line in result.stderr.decode().splitlines()],
                         [f"{item['path']}: {item['error']}" for item in found if "error" in item])
        self.assertEqual([line.split(": ")[1] for line in result.stderr.decode().splitlines()],
                         ["lib/a.aiff", "lib/b.CAF", "lib/dangling.aif", "missing"])

    def test_links_make_no_circles_and_nothing_is_listed_twice(self):
        self.loop("lib/deep/one.aiff")
        self.loop("outside/two.aiff")
        for link, target in (("lib/deep/up", ".."), ("lib/deep/self", "."), ("lib/above", ".."), ("lib/a", "deep"), ("lib/none", "nowhere"),
                             ("outside/back", "../lib"), ("lib/out", "../outside")):
            (self.folder / link).symlink_to(target)
        self.assertEqual(len(self.paths("lib")), 2)
        self.assertEqual(len(self.paths("lib/deep", "outside", "lib/deep")), 2)

    def test_order_is_stable_whatever_the_threads_do(self):
        original = self.loop("lib/0/0000.aiff").read_bytes()
        for i in range(600):
            path = self.folder / f"lib/{i % 7}/{i:04}.aiff"
            path.parent.mkdir(exist_ok=True)
            # Some take longer: chunks ahead of those looked for.
            junk = (b"junk" + struct.pack(">I", 0)) * (i % 13 * 40)
            body = original[8:12] + junk + original[12:]
            path.write_bytes(b"FORM" + struct.pack(">I", len(body)) + body)
        expected = sorted(f"lib/{i % 7}/{i:04}.aiff" for i in range(600))
        for threads in ("1", "2", "16"):
            self.assertEqual(self.paths("lib", "--threads", threads), expected)
        for stack in () if INSTRUMENTED else (1 << 40, 700 << 20, 300 << 20):  # no room for any thread, or for a few only
            def limit(stack=stack):
                resource.setrlimit(resource.RLIMIT_AS, (2 << 30, 2 << 30))
                resource.setrlimit(resource.RLIMIT_STACK, (stack, stack))
            self.assertEqual(self.paths("lib", "--threads", "16", preexec_fn=limit), expected, stack)

    @unittest.skipIf(INSTRUMENTED, "an instrumented program reserves more memory than that")
    def test_want_of_memory_ends_in_order(self):
        (self.folder / "lib").mkdir(exist_ok=True)
        for number in range(20_000):
            self.write(f"lib/{number:05}{'x' * 220}", b"")
        told = set()
        for verb in ("scan", "info"):
            for result in self.with_little_memory(verb, "lib", "-j", "2", "-q"):
                self.assertIn(result.returncode, (0, 1), (verb, result.stderr))
                told.add(result.stderr)
        self.assertIn("ktfiles: error: out of memory\n", told)

    NASTY = "a\x1b[31m\x7f\u009b31m\u202egnp\u200b\u2028\U000e0041é"

    def test_a_terminal_is_sent_no_commands_and_no_hidden_characters(self):
        name = f"x{self.NASTY}.aiff"
        self.loop("lib/" + name, genre=self.NASTY)
        self.write("lib/bad\u202e.caf", b"x")
        for arguments in (["scan", "lib"], ["scan", "--csv", "lib"], ["scan", "--json", "lib"], ["tags", "lib/" + name],
                          ["tags", "--json", "lib/" + name], ["info", "lib/" + name], ["chunks", "lib/" + name],
                          ["tags", "copy", "lib/bad\u202e.caf", "lib/" + name], ["tags", "set", "lib/" + name, "key=\u202e"],
                          ["chunks", "get", "lib/" + name, "NAME"]):
            text, _ = self.on_terminal(*arguments, NO_COLOR="1")
            self.assertFalse([c for c in text if c in self.NASTY[1:-1] and ord(c) > 126 or ord(c) < 32 and c not in "\r\n"],
                             (arguments, text))
        rows = list(csv.reader(io.StringIO(self.run_command("scan", "--csv", "lib", status=1).stdout.decode(), newline="")))
        self.assertIn(("lib/" + name, self.NASTY, ""), [(row[0], row[rows[0].index("genre")], row[-1]) for row in rows])
        piped = self.run_command("scan", "--json", "lib", status=1)
        self.assertEqual([item["genre"] for item in json.loads(piped.stdout) if "error" not in item], [self.NASTY])
        self.assertNotIn("\u202e", piped.stdout.decode())
        self.assertIn("é", piped.stdout.decode())
        self.assertIn("bad\u202e.caf", piped.stderr.decode())
        self.assertIn("\u202egnp", self.run_command("tags", "lib/" + name).stdout.decode())

    def test_a_reader_that_goes_away_ends_the_scan(self):
        for i in range(3):
            self.loop(f"lib/{i}.aiff")
        with open("/dev/full", "wb") as full:
            result = subprocess.run([KTFILES, "scan", "lib"], stdout=full, stderr=subprocess.PIPE, cwd=self.folder,
                                    timeout=60)
        self.assertEqual((result.returncode, b"disk full" in result.stderr), (1, True))


if __name__ == "__main__":
    unittest.main()
