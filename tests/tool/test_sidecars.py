"""ktfiles chunks --sidecar: chunks of files of any kind."""
import subprocess
import unittest

from command import CommandTest, caf, chunk, wave


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
        self.assertTrue(output.startswith('song.mp3: added chunk "NOTE", 3 bytes, in '), output)
        self.assertTrue(output.endswith("/song.ktmd\n"), output)
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
        self.write("a.ktmd", b"")  # of no bytes: it goes
        self.assertEqual(self.get("a.mp3"), b"beside")
        self.assert_no_litter("a.mp3", "a.ovw")


if __name__ == "__main__":
    unittest.main()
