"""What people see: tables that fit their terminal, whatever scripts the names are written in, and progress."""
import fcntl
import os
import re
import shutil
import signal
import struct
import subprocess
import termios
import time
import unicodedata
import unittest

from command import KTFILES, MEDIA, CommandTest, wave
from typed import screen

NAMES = ("drums and percussion, all of them/a loop of the first day.L.wav", "drums and percussion, all of them/a loop of the first day.R.wav",
         "日本の太鼓ループ/和太鼓アンサンブル.wav", "🎹🥁👍🏽 emoji/beat 🔥.wav", "e\u0301te\u0301 de\u0301compose\u0301.wav", "한국어/\u1112\u1161\u11ab.wav")


def columns_of(text):
    """How many columns a terminal gives the text, by Python's own tables."""
    return sum(0 if unicodedata.category(c) in ("Mn", "Me", "Cf") or 0x1160 <= ord(c) < 0x1200 else
               2 if unicodedata.east_asian_width(c) in "WF" else 1 for c in text)


class Terminal(CommandTest):
    def setUp(self):
        super().setUp()
        for name in NAMES:
            (self.folder / "lib" / name).parent.mkdir(parents=True, exist_ok=True)
            shutil.copy(MEDIA / "tone-16.wav", self.folder / "lib" / name)
            shutil.copy(MEDIA / "bassline.aiff", (self.folder / "lib" / name).with_suffix(".aiff"))

    def table(self, *arguments, columns, **environment):
        text, _ = self.on_terminal(*arguments, columns=columns, NO_COLOR="1", **environment)
        lines, most = text.splitlines(), columns or 80
        self.assertEqual([line for line in lines if columns_of(line) > most], [], (arguments, columns))
        return lines

    def test_tables_fit_and_stay_aligned_and_drop_columns_in_their_order(self):
        orders = {("info",): ["CHANNELS", "RATE", "FORMAT", "TYPE"], ("info", "-l"): ["RATE", "FORMAT", "TYPE", "CHANNELS", "BY NAME", "STEREO PARTNER", "MODIFIED"],
                  ("info", "--md5"): ["CHANNELS", "RATE", "FORMAT", "TYPE"], ("scan",): ["GENRE", "SIGNATURE", "CATEGORY", "BEATS", "KEY"], ("pair",): []}
        for arguments, order in orders.items():
            dropped = []
            for columns in (250, 130, 100, 80, 70, 60, 50, 40, 30):
                titles, *rows = self.table(*arguments, "lib", columns=max(columns, 52 if "--md5" in arguments else 0))
                now = [title for title in order if title not in titles]
                self.assertEqual(now, order[:len(now)], (arguments, columns))
                self.assertEqual(now[:len(dropped)], dropped)
                dropped = now
                self.assertEqual([row for row in rows if "…" in row and columns == 250], [])
                for title in ("DURATION", "MODIFIED", "STATE"):  # begins, or ends, in one column on all lines
                    if title in titles:
                        edge = titles.index(title) + (len(title) if title == "DURATION" else 0)
                        cells = [row for row in rows for at in range(len(row) + 1) if columns_of(row[:at]) == edge and
                                 (row[at - 1:at].isdigit() if title == "DURATION" else row[at - 1] == " " != row[at])]
                        self.assertEqual(cells, rows, (arguments, columns, title))
            self.assertEqual(bool(dropped), bool(order), arguments)

    def test_names_are_shortened_in_the_middle_and_never_within_a_character(self):
        for columns in range(24, 70):
            for line in self.table("info", "lib", columns=columns)[1:]:
                self.assertTrue(line.startswith("lib/") or "…" in line[:6], line)
                head, _, tail = line.partition("…")
                self.assertFalse(tail and unicodedata.combining(tail[0]), line)
                self.assertNotIn("�", line)
        self.assertTrue(any(line.startswith("lib/") and "….L.wav" not in line and "day.L.wav" in line and "…" in line
                            for line in self.table("info", "lib", columns=50)))

    def test_headings_fit_too(self):
        for verb in ("tags", "chunks", "meta"):
            text, _ = self.on_terminal(verb, "lib", columns=56, NO_COLOR="1")
            headings = [line for line in text.splitlines() if re.search(r"\.(wav|aiff)  ", line)]
            self.assertEqual((len(headings), [line for line in headings if columns_of(line) > 56]), (12, []), verb)
            self.assertGreaterEqual(sum("…" in line for line in headings), 4, verb)

    def test_the_width_is_what_columns_says_else_the_terminal_else_80(self):
        self.assertEqual(self.table("info", "lib", columns=200, COLUMNS="50"), self.table("info", "lib", columns=50))
        self.assertEqual(self.table("info", "lib", columns=50, COLUMNS="wide"), self.table("info", "lib", columns=50))
        self.assertEqual(self.table("info", "lib", columns=0), self.table("info", "lib", columns=80))
        self.assertEqual(self.table("info", "lib", columns=80, LC_ALL="C"), self.table("info", "lib", columns=80, LC_ALL="C.UTF-8"))

    def test_in_a_pipe_nothing_is_cut(self):
        for arguments in (["info", "-l"], ["scan"], ["pair"]):
            for color in ([], ["--color", "always"]):
                text = "\n".join(self.lines(*arguments, *color, "lib", env={**os.environ, "COLUMNS": "40"}))
                self.assertNotIn("…", text)
                self.assertIn("drums and percussion, all of them/a loop of the first day.", text)


class Progress(CommandTest):
    """A line on standard error while people wait. What takes long is the digest of a file that is a hole."""

    def setUp(self):
        super().setUp()
        self.slow = ["info", "--md5", "-j", "1"]
        for name in ("slow of the first day.wav", "slow.wav"):
            with open(self.write(name, wave(size=0xFFFFFFF0)), "r+b") as file:
                file.seek(40)
                file.write(struct.pack("<I", 1 << 30))
                file.truncate(44 + (1 << 30))
        self.write("bad.wav", b"")

    def typed(self, command, columns=60, interrupt=False):
        """All that a terminal gets of a shell's command, and the exit status."""
        ours, theirs = os.openpty()
        fcntl.ioctl(theirs, termios.TIOCSWINSZ, struct.pack("HHHH", 24, columns, 0, 0))
        text = b""
        environment = {**os.environ, "TERM": "xterm", "NO_COLOR": "1"}
        with subprocess.Popen(["bash", "-c", f"exec {command}"], stdin=theirs, stdout=theirs, stderr=theirs, cwd=self.folder, env=environment,
                              start_new_session=True, preexec_fn=lambda: fcntl.ioctl(0, termios.TIOCSCTTY)) as process:
            os.close(theirs)
            try:
                while piece := os.read(ours, 65536):
                    text += piece
                    if interrupt and b"left" in text:
                        os.write(ours, b"\3")
                        interrupt = False
            except OSError:  # EIO: the other side is gone
                pass
        os.close(ours)
        return text.decode(), process.returncode

    def test_tells_what_is_done_how_much_of_it_and_the_time_left_and_is_gone(self):
        for names, numbers in (('"slow of the first day.wav" bad.wav slow.wav', "[012] of 3 files"), ("slow.wav", r"\d+%")):
            command = f"{KTFILES} {' '.join(self.slow)} {names}"
            for columns in (80, 44, 24):
                start = time.monotonic()
                text, status = self.typed(command, columns)
                seconds = time.monotonic() - start
                drawn = re.findall("\r(reading[^\r]*)\x1b\\[K", text)
                self.assertGreater(len(drawn), 1, text)
                self.assertLess(len(drawn), 11 * seconds + 10, "ten times a second is enough")
                self.assertEqual([line for line in drawn if len(line) >= columns], [])
                if columns > 24:
                    self.assertRegex(drawn[-1], rf"^reading {numbers}, \d:\d\d left")
                if columns == 80:
                    self.assertRegex(drawn[0], "slow.*wav$")
                self.assertTrue(columns == 44 or ("█" in drawn[-1]) == (columns == 80), drawn[-1])
                self.assertEqual(screen(text), screen(self.typed(command + " 2> >(cat >&2)", columns)[0]))
                self.assertEqual("ktfiles: bad.wav: is empty\n" in screen(text), "bad" in names)
        for quiet in (f"{command} -q", f"{command} 2>/dev/null"):
            self.assertNotIn("reading", self.typed(quiet)[0])

    def test_an_interrupt_clears_the_line(self):
        text, status = self.typed(f"{KTFILES} {' '.join(self.slow)} slow.wav", interrupt=True)
        self.assertEqual((status, screen(text).replace("^C", "")), (-signal.SIGINT, ""))


if __name__ == "__main__":
    unittest.main()
