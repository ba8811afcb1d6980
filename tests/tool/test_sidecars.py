"""ktfiles chunks --sidecar: chunks of files of any kind."""
import os
import struct
import subprocess
import unittest

from command import KTFILES, CommandTest, caf, chunk, wave


class Sidecars(CommandTest):
    def get(self, name, chunk_id="NOTE", **options):
        return self.run_command("chunks", "get", name, chunk_id, "--sidecar", "ovw", **options).stdout

    def add(self, name, body, *options, chunk_id="NOTE"):
        return self.run_command("chunks", "add", name, chunk_id, "--sidecar", "ovw", *options, stdin=body)

    def remove(self, name, *options):
        return self.run_command("chunks", "remove", name, "NOTE", "--sidecar", "ovw", *options)

    def test_a_file_that_is_no_container(self):
        song = b"not a container, whatever its name says"
        self.write("song.mp3", song)
        self.assertIn("has no chunk", self.failure("chunks", "get", "song.mp3", "NOTE", "--sidecar", "ovw"))
        output = self.add("song.mp3", b"abc").stdout.decode()
        self.assertEqual(output, 'song.mp3: added chunk "NOTE", 3 bytes, in song.ktmd\n')
        self.assertEqual(self.get("song.mp3"), b"abc")
        self.add("song.mp3", b"abcd")
        self.add("song.mp3", b"two", chunk_id="TWO")
        self.assertEqual(self.get("song.mp3"), b"abcd")
        self.assertEqual(self.get("song.mp3", "TWO"), b"two")
        self.assertEqual((self.folder / "song.mp3").read_bytes(), song)
        self.assert_no_litter("song.mp3", "song.ktmd")
        # Another program reads the sidecar as an AIFF file without sound.
        subprocess.run(["sox", "-t", "aiff", self.folder / "song.ktmd", "-n"], check=True, capture_output=True)
        self.remove("song.mp3")
        self.assertIn("has no chunk", self.failure("chunks", "get", "song.mp3", "NOTE", "--sidecar", "ovw"))
        self.assertEqual(self.get("song.mp3", "TWO"), b"two")
        self.assertIn("nothing to back up", self.failure("chunks", "add", "song.mp3", "NOTE", "--sidecar", "ovw",
                                                         "--backup", stdin=b"x"))

    def test_a_container_keeps_its_own(self):
        for name, image in (("a.wav", wave()), ("a.caf", caf())):
            with self.subTest(name):
                self.write(name, image)
                self.write("a.ovw", b"an older copy")
                self.add(name, b"abc", "--dry-run")
                self.assertEqual((self.folder / name).read_bytes(), image)
                self.add(name, b"abc")
                self.assertEqual(self.run_command("chunks", "get", name, "NOTE").stdout, b"abc")
                self.assertEqual(self.get(name), b"abc")
                self.assert_no_litter(name)
                self.add(name, b"xy", "--in-place")
                self.assertEqual(self.get(name), b"xy")
                self.remove(name)
                self.failure("chunks", "get", name, "NOTE")
                (self.folder / name).unlink()
        self.assert_no_litter()

    def test_every_copy_in_a_caf_file_is_removed(self):
        self.write("a.caf", caf((b"NOTE", b"1"), (b"NOTE", b"2"), (b"NOTE", b"3")))
        self.assertIn("3 chunks", self.remove("a.caf").stdout.decode())
        self.failure("chunks", "get", "a.caf", "NOTE")

    def test_what_would_cost_sound_is_refused(self):
        self.write("a.wav", wave())
        self.failure("chunks", "remove", "a.wav", "data", "--sidecar", "ovw")
        self.failure("chunks", "add", "a.wav", "fmt", "--sidecar", "ovw", stdin=b"x")
        self.assertEqual((self.folder / "a.wav").read_bytes(), wave())

    def test_a_sidecar_by_the_name_of_the_file(self):
        self.write("a.mp3", b"the music itself")
        self.run_command("chunks", "add", "a.mp3", "NOTE", "--sidecar", "mp3", stdin=b"x")
        self.assertEqual((self.folder / "a.mp3").read_bytes(), b"the music itself")
        self.failure("chunks", "get", "a.mp3", "NOTE", "--sidecar", "a/b", status=2)

    def test_a_container_beside_the_file(self):
        self.write("a.mp3", b"the music itself")
        self.write("a.ovw", wave(chunk(b"NOTE", b"beside")))
        self.assertEqual(self.get("a.mp3"), b"beside")
        self.write("a.ktmd", b"")  # of no bytes: passed over
        self.assertEqual(self.get("a.mp3"), b"beside")
        self.assert_no_litter("a.mp3", "a.ovw", "a.ktmd")

    def test_a_recording_beside_the_file_is_no_older_copy(self):
        aiff = b"AIFF" + chunk(b"COMM", struct.pack(">hIh", 1, 0, 16) + bytes(10), ">")
        for name, content in (("a.mp3", b"the music itself"), ("a.aiff", b"FORM" + struct.pack(">I", len(aiff)) + aiff)):
            for recording in (wave(frames=1000), caf()):
                for verb in ("add", "remove"):
                    for options in ([], ["--dry-run"], ["--in-place"]):
                        with self.subTest((name, verb, options)):
                            self.write(name, content)
                            self.write("a.wav", recording)
                            error = self.failure("chunks", verb, name, "NOTE", "--sidecar", "wav", *options, stdin=b"x")
                            self.assertIn("is an audio file of its own", error)
                            self.assertEqual((self.folder / "a.wav").read_bytes(), recording)
                            self.assertEqual((self.folder / name).read_bytes(), content)
                            self.assert_no_litter(name, "a.wav")
            self.run_command("chunks", "remove", name, "NOTE", "--sidecar", "wav", "--force")
            self.assert_no_litter(name)
            (self.folder / name).unlink()

    def test_the_metadata_sidecar_is_no_raw_one(self):
        self.write("a.mp3", b"the music itself")
        for number in range(3):
            self.run_command("chunks", "add", "a.mp3", f"N{number}", "--sidecar", "ktmd", stdin=b"%d" % number)
        self.run_command("chunks", "remove", "a.mp3", "N1", "--sidecar", "ktmd")
        os.link(self.folder / "a.ktmd", self.folder / "a.hard")  # by another name
        os.symlink("a.ktmd", self.folder / "a.soft")
        for extension in ("ktmd", "hard", "soft"):
            for number in (0, 2):
                self.assertEqual(self.run_command("chunks", "get", "a.mp3", f"N{number}", "--sidecar",
                                                  extension).stdout, b"%d" % number)
            self.failure("chunks", "get", "a.mp3", "N1", "--sidecar", extension)

    def test_open_ended_caf_data_get_their_size_on_every_road(self):
        for options in ([], ["--in-place"]):
            path = self.write("a.caf", caf(data_size=-1))
            self.add("a.caf", b"text", "--dry-run", *options)
            for _ in range(2):
                self.add("a.caf", b"text", *options)
                self.assertEqual(path.read_bytes(), caf() + b"NOTE" + struct.pack(">q", 4) + b"text")

    def test_sidecars_lie_beside_the_target_of_a_link(self):
        (self.folder / "deep").mkdir()
        self.write("deep/a.mp3", b"the music itself")
        (self.folder / "link.mp3").symlink_to("deep/a.mp3")
        self.write("link.ktmd", b"another file's")
        self.add("link.mp3", b"abc")
        self.assertEqual(self.get("link.mp3"), b"abc")
        self.assertEqual(self.get("deep/a.mp3"), b"abc")
        self.remove("link.mp3")
        self.failure("chunks", "get", "deep/a.mp3", "NOTE", "--sidecar", "ovw")
        self.assertEqual((self.folder / "link.ktmd").read_bytes(), b"another file's")

    def test_files_that_share_a_sidecar_lose_nothing(self):
        names = ("s.mp3", "s.ogg")
        for name in names:
            self.write(name, b"music")
        for round_number in range(3):
            edits = [subprocess.Popen([KTFILES, "chunks", "add", name, f"{name[2]}{i:03}", "--sidecar", "ovw", "-q"],
                                      stdin=subprocess.DEVNULL, cwd=self.folder) for i in range(6) for name in names]
            self.assertEqual([edit.wait(120) for edit in edits], [0] * 12)
            ids = [item["id"] for item in self.record("chunks", "s.ktmd")["chunks"]]
            self.assertEqual(sorted(i for i in ids if i[1:].isdigit()),
                             sorted(f"{name[2]}{i:03}" for i in range(6) for name in names))
            self.assert_no_litter("s.ktmd", *names)
            os.unlink(self.folder / "s.ktmd")

    def test_what_interrupted_creations_left_is_made_anew(self):
        path = self.write("a.mp3", b"the music itself")
        os.chmod(path, 0o640)
        self.add("a.mp3", b"abc")
        self.assertEqual((self.folder / "a.ktmd").stat().st_mode & 0o777, 0o640)
        whole = (self.folder / "a.ktmd").read_bytes()
        for length in (0, 1, 4, 12, 19):
            self.write("a.ktmd", whole[:length])
            self.add("a.mp3", b"abc")
            self.assertEqual((self.folder / "a.ktmd").read_bytes(), whole, length)
        for foreign in (b"x", b"somebody's notes, which are no container"):
            self.write("a.ktmd", foreign)
            self.assertIn("is no metadata sidecar", self.failure("chunks", "add", "a.mp3", "NOTE", "--sidecar", "ovw",
                                                                 stdin=b"abc"))
            self.assertEqual((self.folder / "a.ktmd").read_bytes(), foreign)
        self.assert_no_litter("a.mp3", "a.ktmd")


if __name__ == "__main__":
    unittest.main()
