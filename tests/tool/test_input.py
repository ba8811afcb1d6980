"""What a file may be, and what it may be called: files that hold no sound, standard input, names that are not UTF-8."""
import functools
import json
import os
import resource
import shutil
import signal
import socket
import struct
import subprocess
import time
import unittest

from command import KTFILES, MEDIA, CommandTest, caf, chunk, needs_decoders, wave

SOUND = (["info"], ["info", "--md5"], ["overview"], ["decode", "-o", "-", "--format", "raw"])
CHUNKS = (["chunks"], ["chunks", "get", "data"], ["chunks", "add", "note", "--dry-run"], ["chunks", "remove", "note", "--dry-run"])
TAGS = (["tags"], ["tags", "remove", "--dry-run"])
ALL = (*SOUND, *CHUNKS, *TAGS, ["info", "--check"], ["adm"], ["overview", "--store", "--dry-run"])
UNKNOWN, CUT = "no audio that can be decoded", "ends within its header"


def aiff(*chunks):
    body = b"AIFF" + b"".join(chunks)
    return b"FORM" + struct.pack(">I", len(body)) + body


COMM = chunk(b"COMM", struct.pack(">hIhHQ", 1, 4, 16, 0x400E, 48000 << 48), ">")
SSND = chunk(b"SSND", bytes(16), ">")


def placed(verb, name):
    """The arguments, the file behind the verb and its object."""
    objects = {"get", "add", "remove", "set", "copy"}
    count = 2 if verb[1:] and verb[1] in objects else 1
    return [*verb[:count], name, *verb[count:]]


class Messages(CommandTest):
    def assert_told(self, name, text, verbs, **options):
        for verb in verbs:
            with self.subTest(name=name, verb=verb):
                self.assertEqual(self.failure(*placed(verb, name), stdin=b"x", **options), f"ktfiles: {name}: {text}\n")

    def test_what_files_lack(self):
        whole, sound = wave(), caf()
        encoded = {ext: self.encoded("whole." + ext).read_bytes() for ext in ("flac", "m4a", "w64", "au")}
        boxes = encoded["m4a"]
        for name, content, text, verbs in (
                ("empty.wav", b"", "is empty", ALL),
                ("one.wav", b"R", UNKNOWN, (*SOUND, *CHUNKS, *TAGS)),
                ("text.wav", b"no sound here\n" * 9, UNKNOWN, (*SOUND, *CHUNKS, *TAGS, ["info", "--check"])),
                ("text", b"no sound here\n" * 9, UNKNOWN, (*SOUND, *CHUNKS, *TAGS)),
                ("4.wav", whole[:4], CUT, (*SOUND, *CHUNKS, *TAGS)),
                ("12.wav", whole[:12], CUT, (*SOUND, *CHUNKS)),
                *((f"{count}.wav", whole[:count], CUT, SOUND) for count in (20, 30, 43)),
                ("20.rf64.wav", b"RF64" + b"\xff" * 4 + b"WAVEds64" + struct.pack("<I", 28), CUT, SOUND),
                ("no-fmt.wav", b"RIFF" + struct.pack("<I", len(whole) - 32) + b"WAVE" + whole[36:], "says nowhere what its samples are (no fmt chunk)", SOUND),
                ("no-data.wav", b"RIFF" + struct.pack("<I", 28) + whole[8:36], "no sound (no data chunk)", SOUND),
                ("no-ssnd.aiff", aiff(COMM), "no sound (no SSND chunk)", SOUND),
                ("no-comm.aiff", aiff(SSND), "says nowhere what its samples are (no COMM chunk)", SOUND),
                ("20.aiff", aiff(COMM, SSND)[:20], CUT, SOUND),
                ("no-desc.caf", sound[:8] + sound[52:], "says nowhere what its samples are (no desc chunk)", SOUND),
                ("no-data.caf", sound[:52], "no sound (no data chunk)", SOUND),
                ("30.caf", sound[:30], CUT, SOUND),
                *((f"{count}.flac", encoded["flac"][:count], CUT, SOUND) for count in (4, 20)),
                *((f"{count}.w64", encoded["w64"][:count], CUT, SOUND) for count in (16, 50)),
                ("12.au", encoded["au"][:12], CUT, SOUND),
                ("20.m4a", boxes[:20], CUT, SOUND),
                ("no-moov.m4a", boxes[:boxes.index(b"moov") - 4], "says nowhere where its samples are (no moov box)", SOUND)):
            self.write(name, content)
            self.assert_told(name, text, verbs)
            self.assertEqual(self.json("info", name, status=1), [{"path": name, "error": text}])

    @needs_decoders
    def test_what_only_a_decoder_knows(self):
        self.write("cut.ogg", self.encoded("a.ogg", "-c:a", "libvorbis").read_bytes()[:60])
        self.assert_told("cut.ogg", "Ogg: no audio that can be decoded", SOUND)
        self.write("cut.flac", self.encoded("a.flac").read_bytes()[:60])
        self.assert_told("cut.flac", "its sound cannot be decoded: it is damaged, or cut short", (*SOUND, ["info", "--check"]))

    def test_what_is_no_file(self):
        (self.folder / "gone.wav").symlink_to("nowhere")
        (self.folder / "round.wav").symlink_to("round.wav")
        os.mkfifo(self.folder / "fifo.wav")
        with socket.socket(socket.AF_UNIX) as bound:
            os.chdir(self.folder)  # the address of a socket is short
            bound.bind("socket.wav")
            os.chdir("/")
        for name, text in (("missing.wav", "file not found"), ("gone.wav", "file not found"),
                           ("round.wav", "Too many levels of symbolic links"), ("fifo.wav", "is a FIFO, not a regular file"),
                           ("socket.wav", "is a socket, not a regular file"), ("/dev/null", "is a device, not a regular file")):
            self.assert_told(name, text, [verb for verb in ALL if verb != TAGS[1]])  # which takes a missing file for a key

    @unittest.skipUnless(os.geteuid() == 0, "needs another user")
    def test_what_may_not_be_read(self):
        self.write("secret.wav", wave()).chmod(0)
        self.folder.chmod(0o755)
        nobody = {"user": 65534, "group": 65534, "extra_groups": (), "env": {**os.environ, "KTFILES_COORDINATION": "/nowhere"}}
        self.assert_told("secret.wav", "access denied", (*SOUND, *CHUNKS[:2], *TAGS[:1], ["adm"]), **nobody)

    def test_backups_are_named_as_the_file_was(self):
        (self.folder / "sub").mkdir()
        (self.folder / "link.wav").symlink_to("sub/a.wav")
        for given, backup in (("a.wav", "a.wav.bak"), ("./a.wav", "./a.wav.bak.1"), ("sub/a.wav", "sub/a.wav.bak"),
                              ("sub/../a.wav", "sub/../a.wav.bak"), ("link.wav", str(self.folder / "sub/a.wav.bak"))):
            for leftover in (*self.folder.glob("sub/*.bak*"), *(self.folder.glob("*.bak*") if "1" not in backup else ())):
                leftover.unlink()
            self.write(given.replace("link", "sub/a"), wave())
            said = self.json("chunks", "add", given, "note", "--backup", stdin=b"x")[0]["backup"]
            self.assertEqual(os.path.realpath(said) if given == "link.wav" else said,
                             os.path.realpath(backup) if given == "link.wav" else backup)
            self.assertTrue((self.folder / said).exists())


class StandardInput(CommandTest):
    def test_reads_as_files_do(self):
        shutil.copy(MEDIA / "harbour-bw64.wav", self.folder / "mix")
        shutil.copy(MEDIA / "bell-16-be.caf", self.folder / "bell")
        for name in ("mix", "bell"):
            content = (self.folder / name).read_bytes()
            for verb in (["info"], ["info", "--md5", "--sha256"], ["info", "--check"], ["overview"], ["overview", "--svg", "-"],
                         ["decode", "-o", "-"], ["chunks"], ["chunks", "get", "data"], ["tags"] if name == "bell" else ["adm"]):
                with self.subTest(verb):
                    shape = [] if "-" in verb or "get" in verb else ["--json"]
                    direct = self.run_command(*placed(verb, name), *shape)
                    piped = self.run_command(*placed(verb, "-"), *shape, stdin=content)
                    with open(self.folder / name, "rb") as file:
                        opened = subprocess.run([KTFILES, *placed(verb, "-"), *shape], stdin=file, capture_output=True)
                    for result in (piped, opened):
                        if shape:
                            one, other = ({**json.loads(each.stdout)[0], "path": "", "modified": ""} for each in (direct, result))
                            self.assertEqual(one, other)
                        else:
                            self.assertEqual(result.stdout, direct.stdout.replace(f">{name}<".encode(), b">-<"))
        with open(self.folder / "mix", "rb") as file:  # what is left of it is meant
            file.seek(8)
            self.assertEqual(subprocess.run([KTFILES, "info", "-"], stdin=file, capture_output=True).returncode, 1)

    def test_mistakes(self):
        sound = wave()
        for verb in (["tags", "set", "genre=x"], ["tags", "remove"], ["tags", "copy", "a.aiff"], ["chunks", "add", "note"],
                     ["chunks", "remove", "note"], ["overview", "--store"], ["pair"], ["scan"], ["lock"]):
            with self.subTest(verb):
                self.assertIn("this needs a file's name", self.failure(*placed(verb, "-"), stdin=sound, status=2))
        self.assertIn("is the list", self.failure("info", "-", "--files-from", "-", stdin=sound, status=2))
        self.assertIn("-o OUT names a file", self.failure("decode", "-", stdin=sound, status=2))
        self.assertEqual(self.failure("info", "-"), "ktfiles: -: is empty\n")
        self.assertEqual(self.failure("info", "-", stdin=b"text"), f"ktfiles: -: {UNKNOWN}\n")
        folder = os.open(self.folder, os.O_RDONLY)
        self.addCleanup(os.close, folder)
        self.assertEqual(subprocess.run([KTFILES, "info", "-"], stdin=folder, capture_output=True).stderr,
                         b"ktfiles: -: is a folder\n")

    def test_a_file_of_that_name(self):
        self.write("-", wave(frames=77))
        for arguments, stdin in ((["./-"], b""), (["--files-from", "-"], b"-\n"), (["\\x2D"], b"")):
            self.assertEqual([item["frames"] for item in self.json("info", *arguments, stdin=stdin)], [77])

    def test_more_than_is_kept(self):
        limit = functools.partial(resource.setrlimit, resource.RLIMIT_FSIZE, (1 << 20, 1 << 20))
        self.assertIn("standard input cannot be kept in memory: ", self.failure("info", "-", stdin=bytes(3 << 20), preexec_fn=limit))

    def test_interrupted(self):
        with subprocess.Popen([KTFILES, "decode", "-", "-o", "out.wav"], stdin=subprocess.PIPE, cwd=self.folder) as process:
            process.stdin.write(b"RIFF")
            process.stdin.flush()
            time.sleep(0.2)
            process.send_signal(signal.SIGINT)
            self.assertEqual(process.wait(10), -signal.SIGINT)
        self.assertEqual(os.listdir(self.folder), [])


class Names(CommandTest):
    """In Latin-1 and Shift-JIS, in a folder that is not UTF-8 either."""

    def setUp(self):
        super().setUp()
        self.root = os.fsencode(self.folder)
        os.mkdir(self.root + b"/\xc4")
        self.names = [b"\xc4/caf\xe9.wav", "\u0105/".encode("iso-8859-2") + "\u30d9\u30eb.wav".encode("shift-jis")]
        os.mkdir(self.root + b"/\xb1")
        self.shown = ["\\xC4/caf\\xE9.wav", "\\xB1/\\x83x\\x83\\x8B.wav"]
        for name in self.names:
            self.put(name, wave(frames=50))

    def put(self, name, content):
        with open(self.root + b"/" + name, "wb") as file:
            file.write(content)

    def content(self, name):
        with open(self.root + b"/" + name, "rb") as file:
            return file.read()

    def test_every_reader_takes_them_as_bytes_and_as_they_are_told(self):
        for given in (*zip(self.names, self.shown), *zip(self.shown, self.shown)):
            for verb in (["info"], ["info", "--check"], ["info", "--md5"], ["overview"], ["chunks"], ["decode", "-o", "out.wav", "--force"]):
                with self.subTest(given=given, verb=verb):
                    self.assertEqual(self.record(*verb, given[0])["path"], given[1])
            self.assertEqual(self.lines("info", given[0])[0].split("\t")[0], given[1])
            self.assertEqual(len(self.run_command("chunks", "get", given[0], "data").stdout), 100)
            self.assertEqual(self.failure("adm", given[0]), f'ktfiles: {given[1]}: has no chunk "axml"\n')

    def test_folders_and_lists(self):
        paths = [item["path"] for item in self.json("info", ".")]
        self.assertEqual(sorted(paths), sorted("./" + name for name in self.shown))
        for text in (b"\n".join(self.names), "\n".join(paths).encode()):
            self.assertEqual(len(self.json("info", "--files-from", "-", stdin=text)), 2)
        self.run_command("decode", ".", "-o", "out/", "--format", "aiff")
        self.assertEqual(sorted(os.listdir(self.root + b"/out")), [b"\xb1", b"\xc4"])
        self.assertTrue(os.path.exists(self.root + b"/out/\xc4/caf\xe9.aiff"))
        shutil.copy(MEDIA / "tone-16.aiff", self.root + b"/\xc4/l\xf6p.aiff")
        self.run_command("tags", "set", b"\xc4/l\xf6p.aiff", "genre=Jazz", "beatCount=4")
        self.assertEqual([item["path"] for item in self.json("scan", ".")], ["./\\xC4/l\\xF6p.aiff"])
        self.assertEqual(self.record("tags", "\\xC4/l\\xF6p.aiff")["genre"], "Jazz")

    def test_pictures_name_them(self):
        self.run_command("overview", ".", "--sheet", "out.svg")
        self.assertEqual([name in (self.folder / "out.svg").read_text() for name in self.shown], [True, True])

    def test_edits(self):
        before = self.content(self.names[0])
        report = self.record("chunks", "add", self.shown[0], "note", "--backup", stdin=b"text")
        self.assertEqual((report["path"], report["backup"]), (self.shown[0], self.shown[0] + ".bak"))
        self.assertEqual(self.content(self.names[0] + b".bak"), before)
        self.assertEqual(self.run_command("chunks", "get", self.names[0], "note").stdout, b"text")
        self.run_command("overview", "--store", self.names[0], "--in-place")
        self.assertEqual(sorted(os.listdir(self.root + b"/\xc4")), [b"caf\xe9.wav", b"caf\xe9.wav.bak"])

    def test_backslashes_stay_what_they_are(self):
        # An ordinary name may look like an escaped one, and both files be there.
        self.put(b"\xe4.wav", wave(frames=1))
        self.assertEqual(self.record("info", "\\xE4.wav")["frames"], 1)
        self.put(b"\\xE4.wav", wave(frames=2))
        self.put(b"a\\x5C.wav", wave(frames=3))
        self.put(b"b\\\xff.wav", wave(frames=4))
        expected = {"\\xE4.wav": 2, "\\xE4\\x2E\\x77\\x61\\x76": 1, "a\\x5C.wav": 3, "b\\x5C\\xFF.wav": 4}
        for name, frames in expected.items():
            self.assertEqual(self.record("info", name)["frames"], frames, name)
        found = {item["path"][2:]: item["frames"] for item in self.json("info", ".") if item["frames"] < 50}
        self.assertEqual(found, expected)
        for name in ("c\\x41.wav", "\\xZZ.wav", "\\x00.wav", "\\xC4\\x2Fcaf\\xE9.wav"):
            self.assertEqual(self.failure("info", name), f"ktfiles: {name}: file not found\n")


if __name__ == "__main__":
    unittest.main()
