"""ktfiles chunks, and chunks get."""
import os
import struct
import subprocess
import unittest

from command import INSTRUMENTED, KTFILES, CommandTest, caf, chunk, needs_decoders, wave


class List(CommandTest):
    def test_containers(self):
        aiff = b"AIFF" + chunk(b"COMM", bytes(18), ">") + chunk(b"ANNO", b"odd", ">")
        ds64 = chunk(b"ds64", struct.pack("<QQQI", 0, 0, 0, 0))
        cases = {
            "a.wav": (wave(chunk(b"\xa9x\\\0", b"abc")), "RIFF", 256,
                      [("fmt ", 12, 16), ("data", 36, 200), ("\\xA9x\\x5C\\x00", 244, 3)]),
            "b.wav": (b"RF64" + struct.pack("<I", 40) + b"WAVE" + ds64, "RF64", 48, [("ds64", 12, 28)]),
            "c.aiff": (b"FORM" + struct.pack(">I", len(aiff)) + aiff, "FORM", 50, [("COMM", 12, 18), ("ANNO", 38, 3)]),
            "d.caf": (caf((b"info", b"abcd"), data_size=-1), "caff", 284,
                      [("desc", 8, 32), ("info", 52, 4), ("data", 68, 204)]),
        }
        for name, (content, container, end, chunks) in cases.items():
            self.write(name, content)
            with self.subTest(name):
                self.assertEqual(self.record("chunks", name), {
                    "path": name, "container": container, "containerEnd": end, "fileLength": len(content),
                    "chunks": [dict(zip(("id", "offset", "size"), item)) for item in chunks]})
                self.assertEqual(self.lines("chunks", name), ["\t".join(map(str, item)) for item in chunks])
        self.assertEqual(self.lines("chunks", "b.wav", "c.aiff")[0], "b.wav\tds64\t12\t28")
        several = self.json("chunks", "a.wav", "missing", "d.caf", status=1)
        self.assertEqual([item.get("error", item["path"]) for item in several], ["a.wav", "file not found", "d.caf"])

    def test_forms_of_lists_and_sizes_beyond_the_file(self):
        info = chunk(b"LIST", b"INFO" + chunk(b"INAM", b"x\0"))
        self.write("a.wav", wave(info, chunk(b"LIST", b"ad"), chunk(b"LIST", b"a\n\xe4l"), chunk(b"note", b"abc", size=0x7FFFFFFE)))
        self.assertEqual(self.record("chunks", "a.wav")["chunks"][2:], [
            {"id": "LIST", "form": "INFO", "offset": 244, "size": 14}, {"id": "LIST", "offset": 266, "size": 2},
            {"id": "LIST", "form": "a\\x0A\\xE4l", "offset": 276, "size": 4},
            {"id": "note", "offset": 288, "size": 0x7FFFFFFE, "presentBytes": 4}])
        self.assertEqual(self.lines("chunks", "a.wav")[2:4], ["LIST\t244\t14\tINFO", "LIST\t266\t2"])
        table, status = self.on_terminal("chunks", "a.wav")
        self.assertEqual((status, table.splitlines()[-4:-3], table.splitlines()[-1]), (
            0, ["LIST (INFO)     244      14"], "note            288  2147483646, 4 of them in the file"))
        # Every kind of container; in what CAF leaves open all is there.
        samples = chunk(b"COMM", bytes(18), ">") + chunk(b"SSND", b"abc", ">", size=99)
        for name, content, present in (("b.aiff", b"FORM" + struct.pack(">I", 200) + b"AIFF" + samples, 4),
                                       ("c.caf", caf((b"info", b"x"))[:-200], 4), ("d.caf", caf(data_size=-1), None),
                                       ("e.wav", b"RF64" + b"\xff" * 4 + b"WAVE" + chunk(b"ds64", struct.pack("<QQQI", 60, 90, 0, 0)) +
                                        chunk(b"data", b"ab", size=0xFFFFFFFF), 2),
                                       ("f.wav", b"RIFX" + struct.pack(">I", 40) + b"WAVE" + chunk(b"data", b"ab", ">", size=90), 2),
                                       ("g.rx2", b"CAT " + struct.pack(">I", 64) + b"REX2" + chunk(b"HEAD", bytes(20), ">") +
                                        chunk(b"CAT ", b"SLCL", ">", size=80), 4)):
            self.write(name, content)
            last = self.record("chunks", name)["chunks"][-1]
            self.assertEqual((last.get("presentBytes"), last.get("form")), (present, "SLCL" if name == "g.rx2" else None), name)

    @needs_decoders
    def test_what_has_no_chunks_loads_no_decoder(self):
        def loaded(*arguments):
            result = subprocess.run([KTFILES, *arguments], capture_output=True, cwd=self.folder, text=True,
                                    env={**os.environ, "LD_DEBUG": "files"})
            return "libktfiles-decoders" in result.stderr, result.returncode
        for name, options in (("a.ogg", ()), ("a.mka", ()), ("low.aac", ("-ar", "22050"))):
            self.encoded(name, *options, seconds=0.2)
            for arguments in (["chunks", name], ["chunks", "get", name, "fmt"], ["chunks", "remove", name, "note"], ["adm", name],
                              ["chunks", "remove", name, "note", "--sidecar", "xyz"]):
                with self.subTest(arguments):
                    self.assertEqual(loaded(*arguments), (False, 1))
        self.assertEqual(loaded("info", "a.mka"), (True, 0))  # or nothing would be seen

    def test_what_is_no_container(self):
        self.write("text.wav", b"no audio file at all")
        self.write("empty.wav", b"")
        self.write("short.wav", b"RIFF\4\0\0\0WAVEfmt ")
        for name in ("text.wav", "empty.wav", "short.wav", "missing.wav"):
            for arguments in (["chunks", name], ["chunks", "get", name, "fmt"], ["chunks", "remove", name, "note"]):
                self.failure(*arguments)
            self.failure("chunks", "add", name, "note", stdin=b"x")
        self.assert_no_litter("text.wav", "empty.wav", "short.wav")

    def test_containers_that_are_only_read(self):
        def wave64(*chunks):
            name = bytes.fromhex("f3acd3118cd100c04f8edb8a")
            body = b"".join(i + name + struct.pack("<Q", 24 + len(b)) + b + bytes(-len(b) % 8) for i, b in chunks)
            start = b"riff" + bytes.fromhex("2e91cf11a5d628db04c10000") + struct.pack("<Q", 40 + len(body)) + b"wave"
            return start + name + body

        form = struct.pack("<HHIIHH", 1, 1, 8000, 16000, 2, 16)
        self.write("a.w64", wave64((b"fmt ", form), (b"note", b"abc"), (b"data", bytes(20))))
        swapped = struct.pack(">HHIIHH", 1, 1, 8000, 16000, 2, 16)
        chunks = chunk(b"fmt ", swapped, ">") + chunk(b"note", b"abc", ">") + chunk(b"data", bytes(20), ">")
        self.write("a.wav", b"RIFX" + struct.pack(">I", 4 + len(chunks)) + b"WAVE" + chunks)
        for name, container, listing in (
                ("a.w64", "W64f", ["fmt \t40\t16", "note\t80\t3", "data\t112\t20"]),
                ("a.wav", "RIFX", ["fmt \t12\t16", "note\t36\t3", "data\t48\t20"])):
            with self.subTest(name):
                self.assertEqual(self.lines("chunks", name), listing)
                self.assertEqual(self.record("chunks", name)["container"], container)
                self.assertEqual(self.run_command("chunks", "get", name, "note").stdout, b"abc")
                for arguments in (["add", name, "note", "--from", name], ["remove", name, "note"]):
                    self.assertIn("only read", self.failure("chunks", *arguments))
        self.assert_no_litter("a.w64", "a.wav")

    def test_list_is_not_held_in_memory(self):
        self.write("many.wav", wave(chunk(b"note", b"") * 400_000))
        listing = 'ulimit -v $((96 * 1024)); exec "$0" chunks many.wav --json'
        if INSTRUMENTED:
            self.skipTest("an instrumented program reserves more memory than that")
        result = subprocess.run(["sh", "-c", listing, KTFILES], cwd=self.folder, capture_output=True, timeout=120)
        self.assertEqual((result.returncode, result.stdout.count(b'"note"')), (0, 400_000), result.stderr)


class Get(CommandTest):
    def test_body(self):
        self.write("a.wav", wave(chunk(b"note", b"first"), chunk(b"MD5 ", b"\0\1\2"), chunk(b"note", b"last")))
        self.write("a.caf", caf((b"note", b""), (b"note", b"first"), (b"note", b"last"), data_size=-1))
        for name, chunk_id, body in (("a.wav", "note", b"last"), ("a.wav", "MD5", b"\0\1\2"),
                                     ("a.wav", "\\x6Eote", b"last"), ("a.caf", "note", b"first"),
                                     ("a.caf", "data", bytes(4) + b"\1\2" * 100)):
            with self.subTest((name, chunk_id)):
                self.assertEqual(self.run_command("chunks", "get", name, chunk_id).stdout, body)
        self.assertIn('has no chunk "none"', self.failure("chunks", "get", "a.wav", "none"))

    def test_large_body_in_pieces(self):
        big = os.urandom(1 << 20) * 3 + b"tail"
        self.write("a.wav", wave(chunk(b"blob", big)))
        self.assertEqual(self.run_command("chunks", "get", "a.wav", "blob").stdout, big)
        self.write("cut.wav", wave(chunk(b"blob", b"abc", size=0xFFFFFF00)))
        self.assertIn("claims 4294967040 bytes, but 4 are there", self.failure("chunks", "get", "cut.wav", "blob"))

    def test_to_a_file(self):
        self.write("a.wav", wave(chunk(b"note", b"text")))
        (self.folder / "link").symlink_to("out")
        for out, *force in (("out",), ("link", "--force")):  # a new file, then one that is there, through a link
            self.run_command("chunks", "get", "a.wav", "note", "-o", out, *force, preexec_fn=lambda: os.umask(0o027))
            self.assertEqual((self.folder / "out").read_bytes(), b"text")
            self.assertEqual((self.folder / "out").stat().st_mode & 0o777, 0o640)
        recording = self.write("b.wav", wave(frames=9))
        self.assertIn("b.wav exists; --force replaces it", self.failure("chunks", "get", "a.wav", "note", "-o", "b.wav"))
        self.assertEqual(recording.read_bytes(), wave(frames=9))
        recording.unlink()
        self.assertEqual(self.record("chunks", "get", "a.wav", "note", "-o", "/dev/null"),
                         {"path": "a.wav", "id": "note", "offset": 244, "size": 4})
        self.assertIn("over the file itself", self.failure("chunks", "get", "a.wav", "note", "-o", "a.wav"))
        self.assertIn("is a folder", self.failure("chunks", "get", "a.wav", "note", "-o", "."))
        self.assertIn("file not found", self.failure("chunks", "get", "a.wav", "note", "-o", "none/out"))
        self.assert_no_litter("a.wav", "link", "out")

    def test_what_is_replaced_keeps_what_belongs_to_it(self):
        self.write("a.wav", wave(chunk(b"note", b"text")))
        out = self.write("out", b"much longer than what takes its place")
        os.chmod(out, 0o4751)
        if os.geteuid() == 0:
            os.chown(out, 12345, 54321)
            os.chmod(out, 0o4751)
        before = out.stat()
        self.run_command("chunks", "get", "a.wav", "note", "-o", "out", "--force")
        self.assertEqual(out.read_bytes(), b"text")
        for field in ("st_mode", "st_uid", "st_gid"):
            self.assertEqual(getattr(out.stat(), field), getattr(before, field), field)
        os.link(out, self.folder / "other")
        self.write("a.wav", wave(chunk(b"note", b"news")))
        self.run_command("chunks", "get", "a.wav", "note", "-o", "out", "--force")
        self.assertEqual((self.folder / "other").read_bytes(), b"news")
        self.assertTrue(os.path.samefile(out, self.folder / "other"))


if __name__ == "__main__":
    unittest.main()
