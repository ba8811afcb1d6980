"""What people see: tables that fit their terminal, whatever scripts the names are written in."""
import os
import shutil
import unicodedata
import unittest

from command import MEDIA, CommandTest

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


if __name__ == "__main__":
    unittest.main()
