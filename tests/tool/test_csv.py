"""CSV: the same as JSON says, for a reader that knows nothing of the command."""
import csv
import io
import json
import os
import shutil
import struct
import unittest

from command import MEDIA, CommandTest, chunk, wave

NASTY = 'comma, "quoted"\nline\r=1+1 é\u202e'


def flat(value, name=None):
    """A cell as a reader of CSV gets it."""
    if name in ("transients", "markers"):
        return str(len(value))
    if name == "loops":
        return ",".join(f"{loop['firstFrame']}-{loop['lastFrame']}" for loop in value)
    if isinstance(value, dict):
        return ",".join(f"{key}={source}" for key, source in value.items())
    if isinstance(value, list):
        return ",".join(flat(item["id"] if isinstance(item, dict) else item) for item in value)
    return json.dumps(value) if isinstance(value, (bool, int, float)) else value


class CSV(CommandTest):
    def setUp(self):
        super().setUp()
        shutil.copytree(MEDIA, self.folder / "media")
        lib = self.folder / "lib"
        lib.mkdir()
        smpl = struct.pack("<9I6I", 0, 0, 0, 57, 0, 0, 0, 1, 0, 0, 0, 10, 90, 0, 0)
        (lib / "sampler.wav").write_bytes(wave(chunk(b"smpl", smpl), chunk(b"cue ", struct.pack("<7I", 1, 1, 5, 0x61746164, 0, 0, 5))))
        for name in (NASTY + ".L.aiff", "=cmd|' C calc'!A0.aiff"):
            shutil.copy(MEDIA / "bassline.aiff", lib / name)
        self.run_command("tags", "set", "lib/=cmd|' C calc'!A0.aiff", "-q", "title=" + 'say "so", 中\n+1', "beatCount=3")
        (lib / "none.wav").write_bytes(b"")
        (lib / "cut.aiff").write_bytes((MEDIA / "bassline.aiff").read_bytes()[:30])
        (lib / os.fsdecode(b"not \xe9\xe6\x97 utf-8.wav")).write_bytes(wave())

    def rows(self, *arguments, status=0):
        """Each row by the names of the columns, as in the header; what is between commas as it was."""
        result = self.run_command(arguments[0], "--csv", *arguments[1:], status=status)
        text = result.stdout.decode()
        self.assertTrue(text.endswith("\r\n"))
        header, *rows = csv.reader(io.StringIO(text, newline=""), strict=True)
        self.assertEqual({len(row) for row in rows} - {len(header)}, set())
        self.assertEqual(header[-1], "error")
        return header, [{name: cell for name, cell in zip(header, row) if cell} for row in rows]

    def test_is_what_json_says(self):
        for arguments in (["info", "-l", "--md5", "media", "lib", "gone.wav"], ["tags", "media/bassline.aiff", "media/tone-16.wav", "lib", "gone.aiff"],
                          ["scan", "media", "lib", "gone"], ["pair", "media", "lib", "gone.L.wav"]):
            found = json.loads(self.run_command(arguments[0], "--json", *arguments[1:], status=None).stdout)
            header, rows = self.rows(*arguments, status=None)
            counted = [{name: flat(value, name) for name, value in item.items()} for item in found]
            if arguments[0] in ("tags", "scan"):
                counted = [item if "error" in item else {"transients": "0", "markers": "0", **item} for item in counted]
            self.assertEqual([{name: value for name, value in item.items() if value != ""} for item in counted], rows, arguments[0])
            self.assertGreater(len(rows), 3 if arguments[0] != "pair" else 0)
            self.assertEqual(self.rows(arguments[0], "media/bassline.aiff", status=None)[0], header)

    def test_findings_have_a_row_each_and_sound_files_one(self):
        found = json.loads(self.run_command("info", "--check", "--json", "media", "lib", status=1).stdout)
        expected = [{"path": item["path"], **{name: flat(value) for name, value in (finding or item).items() if name != "findings"}}
                    for item in found for finding in item.get("findings") or [{}]]
        self.assertEqual(self.rows("info", "--check", "media", "lib", status=1)[1], expected)

    def test_a_header_stands_ahead_of_nothing_too_and_other_forms_are_refused(self):
        self.write("empty", b"")
        (self.folder / "no").mkdir()
        for verb in ("info", "tags", "scan", "pair"):
            self.assertEqual(self.rows(verb, "no", "-q")[1], [])
            error = [{"path": "empty", "error": "names no file"}]
            self.assertEqual(self.rows(verb, "--files-from", "empty", status=1)[1], error)
            for form in ("--json", "--jsonl"):
                self.assertEqual(self.run_command(verb, "--csv", form, "no", status=2).stdout, b"")
            self.assertEqual(self.run_command(verb, "--csv", status=2).stdout, b"")


if __name__ == "__main__":
    unittest.main()
