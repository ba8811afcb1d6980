"""Runs the examples in C, and types what the guide for C shows.

Usage: check_examples.py SOURCE_ROOT FOLDER_OF_PROGRAMS
"""
import json
import pathlib
import re
import shlex
import shutil
import subprocess
import sys
import tempfile
import unittest
import wave

ROOT, PROGRAMS = (pathlib.Path(argument).resolve() for argument in sys.argv[1:3])
PAGE = (ROOT / "docs" / "guide" / "from-c.md").read_text(encoding="utf-8")


class Examples(unittest.TestCase):
    def setUp(self):
        self.folder = pathlib.Path(tempfile.mkdtemp())
        self.addCleanup(shutil.rmtree, self.folder)
        for file in (ROOT / "examples" / "media").iterdir():
            if file.is_file():
                shutil.copy(file, self.folder)

    def run_program(self, name, *arguments, status=0):
        done = subprocess.run([PROGRAMS / name, *arguments], cwd=self.folder, capture_output=True, text=True, check=False)
        self.assertEqual(done.returncode, status, done.stderr)
        return done.stdout + done.stderr

    def test_the_page_shows_the_programs(self):
        shown = re.findall(r"<!-- (\S+) -->\n```c\n(.*?)```", PAGE, re.DOTALL)
        self.assertTrue(shown)
        for path, text in shown:
            self.assertEqual(text, (ROOT / path).read_text(encoding="utf-8"), path)

    def test_the_page_shows_what_they_print(self):
        shown = re.findall(r"```console\n(.*?)```", PAGE, re.DOTALL)
        self.assertTrue(shown)
        for block in shown:
            for command, output in re.findall(r"\$ \./([^\n]*)\n([^$]*)", block):
                self.assertEqual(self.run_program(*shlex.split(command)), output, command)

    def test_fragments_name_what_there_is(self):
        header = (ROOT / "c" / "ktfiles.h").read_text(encoding="utf-8")
        for name in set(re.findall(r"\b(?:ktf|KTF)_\w+", PAGE + (ROOT / "README.md").read_text(encoding="utf-8"))):
            self.assertRegex(header, rf"\b{name}\b")

    def test_samples(self):
        with wave.open(str(self.folder / "tone-16.wav")) as file:
            self.assertEqual((file.getnchannels(), file.getsampwidth()), (1, 2))
            rate, wanted = file.getframerate(), file.readframes(file.getnframes())
        self.run_program("to_pcm", "tone-16.wav", "out.pcm")
        self.assertEqual((self.folder / "out.pcm").read_bytes(), wanted)
        self.run_program("to_pcm", "tone-16.wav", "out.pcm", str(rate), "2")
        both = b"".join(2 * wanted[at : at + 2] for at in range(0, len(wanted), 2))
        self.assertEqual((self.folder / "out.pcm").read_bytes(), both)

    def test_notes(self):
        for text in "recorded on a rainy day", "again":
            self.assertEqual(self.run_program("add_note", "tone-16.wav", text), text + "\n")
        with wave.open(str(self.folder / "tone-16.wav")) as file:
            self.assertGreater(file.getnframes(), 0)

    def test_pictures_and_documents(self):
        rows = self.run_program("overview", "percussion.wav").splitlines()
        self.assertEqual([len(row) for row in rows], [60] * 8)
        heights = ["".join(column).count("#") for column in zip(*rows)]
        self.assertTrue(max(heights) > 4 and min(heights) < 2 and all("".join(c) == "".join(sorted(c)) for c in zip(*rows)))
        self.assertIn("Gulls", json.dumps(json.loads(self.run_program("adm", "harbour-bw64.wav"))))

    def test_a_held_file(self):
        self.assertEqual(self.run_program("hold_file", "tone-16.wav", "echo held"), "held\n")
        self.run_program("hold_file", "tone-16.wav", "./missing 2> /dev/null", status=1)

    def test_failures(self):
        self.assertEqual(self.run_program("describe", "nothing.wav", status=1), "nothing.wav: file not found\n")
        self.assertEqual(self.run_program("to_pcm", "nothing.wav", "out.pcm", status=1), "nothing.wav: file not found\n")
        self.assertFalse((self.folder / "out.pcm").exists())
        self.assertEqual(self.run_program("adm", "tone-16.wav", status=1).count("\n"), 1)
        for program in ("overview", "adm", "hold_file", "add_note"):
            self.run_program(program, status=2)


unittest.main(argv=sys.argv[:1])
