"""Folders and lists of files where a file may stand, and the JSON of many files."""
import json
import os
import shutil
import subprocess
import unittest

import schemas
from command import KTFILES, MEDIA, CommandTest, caf, wave

READERS = (["info"], ["tags"], ["chunks"], ["overview"], ["adm"], ["adm", "--check"], ["decode", "-o", "out/"])


class Folders(CommandTest):
    def setUp(self):
        super().setUp()
        for name in ("lib/b.wav", "lib/a/one.aiff", "lib/a/two.caf", "lib/.hidden/no.wav", "lib/.no.wav"):
            (self.folder / name).parent.mkdir(parents=True, exist_ok=True)
            shutil.copy(MEDIA / {".wav": "tone-16.wav", ".aiff": "tone-16.aiff", ".caf": "bell-16-be.caf"}[name[name.rindex("."):]],
                        self.folder / name)
        for name, content in (("cover.jpg", b"\xff\xd8\xff\xe0JFIF"), ("notes.txt", b"hello"), ("empty", b""),
                              ("page.html", b"<html></html>")):
            self.write("lib/" + name, content)
        (self.folder / "lib/up").symlink_to("..", target_is_directory=True)  # holds all of it: passed over
        (self.folder / "lib/gone").symlink_to("nowhere")
        (self.folder / "lib/z.wav").symlink_to("b.wav")
        self.sound = ["lib/a/one.aiff", "lib/a/two.caf", "lib/b.wav", "lib/z.wav"]

    def paths(self, *arguments, **options):
        return [item["path"] for item in self.json(*arguments, **options)]

    def test_what_is_below_a_folder(self):
        for verb, expected in ((["info"], self.sound), (["chunks"], self.sound), (["overview"], self.sound),
                               (["tags"], self.sound), (["decode", "-o", "out/"], self.sound), (["adm"], [])):
            with self.subTest(verb):
                self.assertEqual(self.paths(*verb, "lib"), expected)
                shutil.rmtree(self.folder / "out", ignore_errors=True)

    def test_bad_sound_is_told_and_other_files_are_not(self):
        self.write("lib/bad.wav", b"no sound at all")
        self.write("lib/none.mp3", b"")
        for verb in (["info"], ["overview"], ["decode", "-o", "out/"]):
            errors = self.run_command(*verb, "lib", "-q", status=1).stderr.decode().splitlines()
            self.assertEqual([line.split(": ")[1] for line in errors], ["lib/bad.wav", "lib/none.mp3"], verb)
        self.assertEqual([line.split(": ")[1] for line in
                          self.run_command("chunks", "lib", status=1).stderr.decode().splitlines()], ["lib/bad.wav"])
        # What is named is meant.
        for verb in ("info", "tags"):
            self.assertIn("no audio that can be decoded", self.failure(verb, "lib/cover.jpg"))

    def test_nothing_there(self):
        (self.folder / "none").mkdir()
        self.write("none/page.html", b"<html></html>")
        for verb in READERS:
            result = self.run_command(*verb, "none", "--json")
            self.assertEqual((json.loads(result.stdout), result.stderr), ([], b"ktfiles: none: no file for this verb is there\n"), verb)
            self.assertEqual(self.run_command(*verb, "none", "-q").stderr, b"")
        if os.geteuid() != 0:
            os.chmod(self.folder / "none", 0)
            self.assertIn("permission", self.failure("info", "none"))
            os.chmod(self.folder / "none", 0o700)

    def test_lines_say_which_file(self):
        self.assertTrue(all(line.startswith("lib/") for verb in (["tags"], ["chunks"]) for line in self.lines(*verb, "lib")))
        text, status = self.on_terminal("overview", "lib", NO_COLOR="1")
        self.assertEqual((status, [line.split()[0] for line in text.splitlines()]), (0, self.sound))
        self.assertEqual(self.on_terminal("chunks", "lib/a", NO_COLOR="1")[0].count("\n\n"), 1)

    def test_edits_take_files_only(self):
        before = {path: path.read_bytes() for path in self.folder.rglob("*.*") if path.is_file()}
        for verb in (["tags", "set", "genre=x"], ["tags", "remove"], ["tags", "copy", "lib/a/one.aiff"], ["overview", "--store"]):
            error = self.failure(*verb, "./lib")
            self.assertIn("./lib: is a folder", error)
        for verb in (["chunks", "add"], ["chunks", "remove"]):
            self.assertIn("is a folder", self.failure(*verb, "lib", "note", stdin=b"x"))
        self.assertEqual({path: path.read_bytes() for path in self.folder.rglob("*.*") if path.is_file()}, before)

    def test_adm_documents(self):
        shutil.copy(MEDIA / "harbour-bw64.wav", self.folder / "lib/mix.wav")
        shutil.copy(MEDIA / "harbour.xml", self.folder / "lib")  # XML is of any kind: it is named
        self.assertEqual(self.paths("adm", "lib"), ["lib/mix.wav"])
        self.assertEqual(self.paths("adm", "lib", "lib/harbour.xml"), ["lib/mix.wav", "lib/harbour.xml"])


class Decoding(CommandTest):
    def test_tree_is_mirrored(self):
        for name in ("in/a.wav", "in/below/a.wav", "in/below/b.wav"):
            (self.folder / name).parent.mkdir(parents=True, exist_ok=True)
            self.write(name, wave())
        expected = ["a.aiff", "below/a.aiff", "below/b.aiff"]
        for out, source in (("x/y/", "in"), ("x/y/", "in/"), ("z", "./in//")):
            (self.folder / "z").mkdir(exist_ok=True)
            self.run_command("decode", "--format", "aiff", "-o", out, source, "--force")
            found = sorted(str(path.relative_to(self.folder / out)) for path in (self.folder / out).rglob("*.*"))
            self.assertEqual(found, expected, (out, source))
        # What it wrote before is no source.
        self.run_command("decode", "--format", "aiff", "-o", "in/out/", "in")
        self.run_command("decode", "--format", "aiff", "-o", "in/out", "in", "--force")
        self.assertEqual(len(list((self.folder / "in/out").rglob("*.*"))), 3)
        self.assertIn("is none; one to be made", self.failure("decode", "in", "-o", "file.wav", status=2))

    def test_two_for_one_name(self):
        (self.folder / "in").mkdir()
        for name, content in (("a.caf", caf()), ("a.txt", b"x"), ("a.wav", wave()), ("b.wav", wave())):
            self.write("in/" + name, content)
        for arguments in (["in"], ["in/a.caf", "in/a.wav", "in/b.wav"]):
            result = self.run_command("decode", "-o", "out/", *arguments, "--json", "--force", status=1)
            self.assertEqual([(item["path"], "error" in item) for item in json.loads(result.stdout)],
                             [("in/a.caf", True), ("in/a.wav", True), ("in/b.wav", False)])
            self.assertEqual(result.stderr, b"ktfiles: in/a.wav: in/a.caf would be decoded to out/a.wav too; neither is\n")
            self.assertEqual(os.listdir(self.folder / "out"), ["b.wav"])

    def test_folders_that_came_to_nothing_go(self):
        (self.folder / "in/below").mkdir(parents=True)
        self.write("in/below/bad.wav", b"RIFF")
        self.failure("decode", "in", "-o", "x/y/")
        self.assert_no_litter("in")
        self.write("file", b"")
        self.assertIn("the folder file/x: not a folder", self.failure("decode", "in", "-o", "file/x/"))


class Lists(CommandTest):
    def setUp(self):
        super().setUp()
        for name in ("a.wav", "b c.wav", "new\nline.wav"):
            self.write(name, wave())
        (self.folder / "lib").mkdir()
        self.write("lib/d.wav", wave())

    def paths(self, *arguments, **options):
        return [item["path"] for item in self.json("info", *arguments, **options)]

    def test_lists(self):
        self.write("list", b"a.wav\n\nb c.wav\nlib\n")
        expected = ["a.wav", "b c.wav", "lib/d.wav"]
        self.assertEqual(self.paths("--files-from", "list"), expected)
        self.assertEqual(self.paths("--files-from=-", stdin=b"a.wav\nb c.wav\nlib"), expected)
        self.assertEqual(self.paths("lib/d.wav", "--files-from", "list"), ["lib/d.wav", *expected])
        self.assertEqual(self.paths("-0", "--files-from", "-", stdin=b"new\nline.wav\0a.wav"), ["new\nline.wav", "a.wav"])
        many = 20000  # more than a pipe or one read holds, names cut at any byte
        self.assertEqual(len(self.lines("info", "--files-from", "-", stdin=b"b c.wav\n" * many)), many)

    def test_every_verb_takes_one(self):
        shutil.copy(MEDIA / "tone-16.aiff", self.folder / "x.aiff")
        for verb in (*READERS, ["scan"], ["pair"], ["tags", "set", "genre=Jazz"], ["tags", "remove", "genre"], ["overview", "--store"]):
            with self.subTest(verb):
                result = subprocess.run([KTFILES, *verb, "--files-from", "-", "--json"], cwd=self.folder, input=b"x.aiff\nmissing\n",
                                        capture_output=True)
                self.assertEqual(result.returncode, 1, result.stderr)
                self.assertEqual({"path": "missing", "error": "file not found"}, json.loads(result.stdout)[-1])

    def test_lists_that_are_none(self):
        self.write("empty", b"\n\n")
        self.write("endless", b"x" * 200000)
        for name, why in (("missing", "file not found"), ("lib", "is a folder, not a list of files"), ("empty", "names no file"),
                          ("endless", "is no list of files")):
            for verb in (["info"], ["scan"], ["decode"], ["tags", "set", "genre=x"]):
                error = self.failure(*verb, "--files-from", name)
                self.assertTrue(error.startswith(f"ktfiles: {name}: {why}"), error)
        self.assertIn("standard input: names no file", self.failure("info", "--files-from", "-"))
        self.assertEqual(self.json("info", "--files-from", "missing", status=1), [{"path": "missing", "error": "file not found"}])
        for verb in (["info"], ["scan"], ["chunks"], ["tags"], ["tags", "set", "genre=x"]):
            self.failure(*verb, status=2)
            self.failure(*verb, "--files-from", "", status=2)


class Json(CommandTest):
    def test_lines(self):
        self.write("a.wav", wave())
        for option in ("--jsonl", "--ndjson"):
            result = self.run_command("info", "a.wav", "missing", option, status=1)
            first, second = map(json.loads, result.stdout.decode().splitlines())
            self.assertEqual([first, second], self.json("info", "a.wav", "missing", status=1))
            self.assertEqual(second, {"path": "missing", "error": "file not found"})
        self.failure("info", "a.wav", "--json", "--jsonl", status=2)
        # A record stays on its line whatever is in it.
        for arguments in (["adm", "--lenient", MEDIA / "harbour.xml"], ["chunks", MEDIA / "percussion.wav"],
                          ["project", MEDIA / "Sketch.fuguex"], ["scan", MEDIA], ["pair", MEDIA], ["adm", "--check", MEDIA]):
            lines = self.run_command(*arguments, "--jsonl").stdout.decode().splitlines()
            array = json.loads(self.run_command(*arguments, "--json").stdout)
            self.assertEqual([json.loads(line) for line in lines], array, arguments)

    def test_a_line_comes_as_soon_as_its_file_is_done(self):
        self.write("a.wav", wave())
        lock = subprocess.Popen([KTFILES, "lock", "b.wav"], cwd=self.folder, stdin=subprocess.PIPE, stdout=subprocess.PIPE)
        self.write("b.wav", wave())
        lock.stdout.readline()
        process = subprocess.Popen([KTFILES, "info", "--jsonl", "a.wav", "b.wav", "-q"], cwd=self.folder, stdout=subprocess.PIPE)
        try:
            self.assertEqual(json.loads(process.stdout.readline())["path"], "a.wav")  # while the other is waited for
            self.assertIsNone(process.poll())
        finally:
            lock.communicate(b"")
        self.assertEqual([json.loads(line)["path"] for line in process.communicate()[0].splitlines()], ["b.wav"])

    def test_one_file_that_fails_is_told_in_json(self):
        for arguments in (["chunks", "get", "missing", "note", "-o", "x"], ["chunks", "add", "missing", "note"],
                          ["chunks", "remove", "missing", "note"], ["project", "missing"], ["project", "backup", "missing"]):
            self.assertEqual(json.loads(self.run_command(*arguments, "--json", status=1, stdin=b"x").stdout),
                             [{"path": "missing", "error": "file not found"}], arguments)

    def test_same_keys_for_the_same_things(self):
        """A key that two schemas have means the same in both: it is of one type."""
        seen = {}

        def types(part, common):
            if "$ref" in part:
                return types(common[part["$ref"].rpartition("/")[2]], common)
            return part.get("type", str(sorted(map(str, part.get("enum", [part.get("const")])))))

        common = json.loads((schemas.FOLDER / "common.json").read_text())["$defs"]
        files = sorted(schemas.FOLDER.glob("*.json"))
        self.assertGreater(len(files), 15)
        for file in files:
            if file.stem == "common":
                continue
            schemas.validator(file.stem)  # is one
            for record in json.loads(file.read_text())["$defs"]["record"]["oneOf"]:
                for key, part in record.get("properties", {}).items():
                    if key in ("chunks", "media", "lock", "action"):
                        continue
                    kind = types(part, common)
                    self.assertEqual(seen.setdefault(key, kind), kind, (file.name, key))

    def test_one_file_agrees_with_itself(self):
        shutil.copy(MEDIA / "tone-16.aiff", self.folder / "a.aiff")
        self.run_command("tags", "set", "a.aiff", "beatCount=4", "key=F#", "mode=minor", "signature=4/4")
        records = [self.record(verb, "a.aiff") for verb in ("info", "tags", "scan", "overview", "chunks")]
        records.append(self.record("decode", "a.aiff", "-o", "out.aiff"))
        for key in ("container", "containerName", "fileType", "sampleRate", "channels", "frames", "durationSeconds", "bitsPerSample",
                    "floatingPoint", "fileLength"):
            found = {record[key] for record in records if key in record}
            self.assertEqual(len(found), 1, (key, found))
        tags = records[1]
        self.assertEqual([tags[key] for key in ("key", "mode", "signature", "midiRootNote", "keyType")], ["F#", "minor", "4/4", 54, 1])


if __name__ == "__main__":
    unittest.main()
