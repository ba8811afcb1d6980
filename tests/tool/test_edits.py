"""ktfiles chunks add and remove: what they write, and that nothing else is ever lost."""
import fcntl
import os
import resource
import signal
import struct
import subprocess
import sys
import time
import unittest

from command import KTFILES, CommandTest, caf, chunk, wave

# Holds a lease on a file, as file servers do, and lets go of it when the kernel asks.
LEASE_HOLDER = """
import fcntl, signal, sys, time
file = open(sys.argv[1], "r+b")
signal.pthread_sigmask(signal.SIG_BLOCK, [signal.SIGIO])
fcntl.fcntl(file, fcntl.F_SETLEASE, fcntl.F_WRLCK)
print("held", flush=True)
signal.sigwait([signal.SIGIO])
time.sleep(0.2)
fcntl.fcntl(file, fcntl.F_SETLEASE, fcntl.F_UNLCK)
"""


class Edits(CommandTest):
    def add(self, *arguments, body=b"text", **options):
        return self.run_command("chunks", "add", *arguments, stdin=body, **options)

    def test_content(self):
        plain = wave(frames=100)
        noted = wave(chunk(b"note", b"odd"))
        path = self.write("a.wav", plain)
        self.add("a.wav", "note", body=b"odd")
        self.assertEqual(path.read_bytes(), noted)
        self.write("in", b"longer")
        self.add("a.wav", "note", "--from", "in", "--replace")
        self.assertEqual(path.read_bytes(), wave(chunk(b"note", b"longer")))
        self.add("a.wav", "note")
        self.run_command("chunks", "remove", "a.wav", "note")
        self.assertEqual(path.read_bytes(), plain)
        self.assertIn('has no chunk "note"', self.failure("chunks", "remove", "a.wav", "note"))

        path = self.write("a.caf", caf())
        for body in (b"one", b"two", b"three"):
            self.add("a.caf", "note", body=body)
        self.assertEqual(path.read_bytes(), caf() + b"".join(
            b"note" + struct.pack(">q", len(body)) + body for body in (b"one", b"two", b"three")))
        self.add("a.caf", "note", "--replace", body=b"four")  # every one, though the library removes one at a time
        self.assertEqual(path.read_bytes(), caf() + b"note" + struct.pack(">q", 4) + b"four")
        self.assert_no_litter("a.wav", "a.caf", "in")

    def test_open_ended_caf_data_get_their_size(self):
        path = self.write("a.caf", caf(data_size=-1))
        self.add("a.caf", "note")
        self.assertEqual(path.read_bytes(), caf() + b"note" + struct.pack(">q", 4) + b"text")

    def test_refusals_need_force(self):
        stray = wave() + b"stray sound that nobody counted"
        cases = [  # name, content, verb, id, what is said
            ("uncounted", wave(chunk(b"LIST", bytes(90)), size=236), "add", "note", "its container ends at byte 244, but 98 "
             "bytes follow its chunks (an unfinished recording?), and the new chunk would be written over them"),
            ("unfinished", wave(size=0), "add", "note", "its container ends at byte 8"),
            ("behind", stray, "add", "note", "31 bytes follow its chunks"),
            ("no size", wave()[:40] + bytes(4) + b"few", "add", "note", "3 bytes follow its chunks"),
            ("zero data", wave()[:40] + bytes(4) + b"\1\2\3\4\5\0\0\0" * 25, "add", "note", "is no chunk"),
            ("second", wave(), "add", "fmt", 'it has a chunk "fmt "'),
            ("sound", wave(), "remove", "data", "would be lost"),
            ("caf sound", caf(), "remove", "desc", "would be lost"),
            ("caf cut", caf(data_size=999), "add", "note", "claims more bytes than the file has"),
            ("caf stray", caf() + bytes(12), "add", "note", "12 stray bytes follow"),
        ]
        for name, content, verb, chunk_id, message in cases:
            with self.subTest(name):
                path = self.write(name, content)
                for extra in ([], ["--dry-run"], ["--in-place"]):
                    error = self.failure("chunks", verb, name, chunk_id, *extra, stdin=b"text")
                    self.assertIn(message, error)
                    self.assertIn("--force", error)
                    self.assertEqual(path.read_bytes(), content)
        self.add("uncounted", "note", "--force")
        self.assertEqual((self.folder / "uncounted").read_bytes()[244:256], chunk(b"note", b"text"))
        self.run_command("chunks", "remove", "sound", "data", "--force")
        self.assertEqual([item["id"] for item in self.record("chunks", "sound")["chunks"]], ["fmt ", "free"])

    def test_no_objection_to_what_is_merely_odd(self):
        # Sizes that writers into a pipe leave behind, and a data chunk without its pad byte.
        streamed = wave(size=0xFFFFFFFF)[:40] + struct.pack("<I", 0xFFFFFFFF) + wave()[44:]
        unpadded = wave()[:4] + struct.pack("<I", 235) + wave()[8:40] + struct.pack("<I", 199) + wave()[44:243]
        for content in (streamed, unpadded):
            path = self.write("a.wav", content)
            self.add("a.wav", "note")
            self.assertEqual([item["id"] for item in self.record("chunks", "a.wav")["chunks"]], ["fmt ", "data", "note"])
            self.assertEqual(path.read_bytes()[44:243], wave()[44:243])

    def test_stray_bytes_that_are_no_chunk_are_no_obstacle(self):
        """Neither are they sound, nor is the new chunk lost behind them, on any of the roads."""
        for name, clean, stray in (("a.wav", wave(), b"few"), ("b.wav", wave(size=238), b"\0\0"), ("a.caf", caf(), b"\0"),
                                   ("b.caf", caf(), b"eleven here")):
            for arguments in (["chunks", "add", name, "note"], ["chunks", "add", name, "note", "--replace"],
                              ["chunks", "add", name, "note", "--sidecar", "ovw"], ["overview", name, "--store"]):
                for options in ([], ["--in-place"]):
                    with self.subTest((arguments, options)):
                        path = self.write(name, wave() if name == "b.wav" else clean)
                        self.run_command(*arguments, *options)
                        expected = path.read_bytes()
                        path.write_bytes(clean + stray)
                        self.run_command(*arguments, *options, "--dry-run")
                        self.assertEqual(path.read_bytes(), clean + stray)
                        self.run_command(*arguments, *options)
                        self.assertEqual(path.read_bytes(), expected)

    def test_keeps_what_belongs_to_the_file(self):
        path = self.write("a.wav", wave())
        (self.folder / "link.wav").symlink_to("a.wav")
        os.chmod(path, 0o640)
        if os.geteuid() == 0:
            os.chown(path, 12345, 54321)
        try:
            os.setxattr(path, "user.rating", b"5")
        except OSError:
            pass
        os.utime(path, ns=(1_000_000_001, 2_000_000_002))
        before, attributes = path.stat(), {name: os.getxattr(path, name) for name in os.listxattr(path)}
        self.add("link.wav", "note")
        after = path.stat()
        for field in ("st_mode", "st_uid", "st_gid", "st_atime_ns"):
            self.assertEqual(getattr(after, field), getattr(before, field), field)
        self.assertNotEqual(after.st_ino, before.st_ino)
        self.assertEqual({name: os.getxattr(path, name) for name in os.listxattr(path)}, attributes)
        self.assertTrue((self.folder / "link.wav").is_symlink())

    def test_time_of_the_last_modification(self):
        for options in ([], ["--in-place"]):
            path = self.write("a.wav", wave())
            os.utime(path, (1, 2))
            self.add("a.wav", "note", "--keep-times", *options)
            self.assertEqual(path.stat().st_mtime, 2)
            start = time.time() - 1  # clocks of file systems are coarse
            self.add("a.wav", "more", *options)
            self.assertGreater(path.stat().st_mtime, start)

    def test_an_edit_killed_behind_its_backup_is_finished(self):
        path = self.write("a.wav", wave())
        os.link(path, self.folder / "a.wav.bak")  # what is there between the backup and the rename
        self.assertIn("a.wav.bak is the same file still", self.failure("chunks", "add", "a.wav", "note", "--in-place"))
        self.assertEqual(path.read_bytes(), wave())
        self.assertTrue(self.record("chunks", "add", "a.wav", "note", "--backup")["backup"].endswith("a.wav.bak"))
        for name, why in (("none", "none: file not found"), (".", ". is a folder")):
            self.assertEqual(self.failure("chunks", "add", "a.wav", "note", "--from", name), f"ktfiles: a.wav: {why}\n")
        self.assertEqual((self.folder / "a.wav.bak").read_bytes(), wave())
        self.assertEqual(path.read_bytes(), wave(chunk(b"note", b"")))
        self.assert_no_litter("a.wav", "a.wav.bak")

    def test_a_failed_edit_in_place_leaves_no_tail(self):
        for name, content, whole in (("a.wav", wave(), wave(chunk(b"note", b"text"))),
                                     ("a.caf", caf(), caf() + b"note" + struct.pack(">q", 4) + b"text")):
            path = self.write(name, content)
            for room in (4, 10, 40):  # for parts of the header, and of the body
                limit = len(content) + room
                self.failure("chunks", "add", name, "note", "--in-place", stdin=b"text" * 1000, preexec_fn=lambda: (
                    resource.setrlimit(resource.RLIMIT_FSIZE, (limit, limit))))
                self.assertEqual(path.read_bytes(), content, room)
            self.add(name, "note", "--in-place")
            self.assertEqual(path.read_bytes(), whole)

    def test_standard_error_that_cannot_be_written_ends_no_batch(self):
        self.write("a.wav", wave())
        with open("/dev/full", "wb") as full:
            result = subprocess.run([KTFILES, "info", "none", "a.wav", "none"], cwd=self.folder, stderr=full,
                                    stdout=subprocess.PIPE)
        self.assertEqual((result.returncode, result.stdout.count(b"a.wav")), (1, 1))

    def test_a_lease_of_another_process_is_waited_for(self):
        path = self.write("a.wav", wave())
        holder = subprocess.Popen([sys.executable, "-c", LEASE_HOLDER, path], stdout=subprocess.PIPE)
        if holder.stdout.readline() != b"held\n":
            self.skipTest("this file system has no leases")
        self.add("a.wav", "note")
        self.assertEqual(path.read_bytes(), wave(chunk(b"note", b"text")))
        holder.communicate(timeout=30)

    def test_hard_links_are_not_torn_apart(self):
        path = self.write("a.wav", wave())
        os.link(path, self.folder / "b.wav")
        self.assertIn("2 names (hard links)", self.failure("chunks", "add", "a.wav", "note", stdin=b"text"))
        self.add("a.wav", "note", "--in-place")
        self.assertEqual((self.folder / "b.wav").read_bytes(), wave(chunk(b"note", b"text")))

    def test_backups_are_never_overwritten(self):
        for options in ([], ["--in-place"]):
            path = self.write("a.wav", wave())
            os.utime(path, (1, 2))
            expected = []
            for number in ("", ".1", ".2"):
                expected.append((f"a.wav.bak{number}", path.read_bytes()))
                report = self.record("chunks", "add", "a.wav", "note", "--backup", *options, stdin=b"x")
                self.assertTrue(report["backup"].endswith(expected[-1][0]))
            for name, content in expected:
                self.assertEqual((self.folder / name).read_bytes(), content)
            self.assertEqual((self.folder / "a.wav.bak").stat().st_mtime, 2)
            self.assert_no_litter("a.wav", *(name for name, _ in expected))
            for name, _ in expected:
                os.unlink(self.folder / name)

    def test_failed_writes_leave_the_original(self):
        content = wave(frames=50_000)
        path = self.write("a.wav", content)
        for limit in (4096, len(content) + 8):  # while copying, and while adding
            error = self.failure("chunks", "add", "a.wav", "note", stdin=b"text" * 1000, preexec_fn=lambda: (
                resource.setrlimit(resource.RLIMIT_FSIZE, (limit, limit))))
            self.assertIn("too", error)  # "file too big"
            self.assertEqual(path.read_bytes(), content)
            self.assert_no_litter("a.wav")

    def test_long_names(self):
        for name in ("x" * 255, "ö" * 127):
            path = self.write(name, wave())
            self.add(name, "note")
            self.assertEqual(path.read_bytes(), wave(chunk(b"note", b"text")))
        self.assertIn("bad name", self.failure("chunks", "add", "x" * 256, "note"))


class Interruptions(CommandTest):
    def start_waiting(self, path, *arguments):
        """An edit that waits for the lock on `path`, which we hold through the result's second half."""
        lock = open(path, "r+b")
        fcntl.fcntl(lock, 37, struct.pack("hhqqi4x", fcntl.F_WRLCK, 0, 0, 0, 0))  # F_OFD_SETLK
        edit = subprocess.Popen([KTFILES, "chunks", *arguments], stdin=subprocess.DEVNULL, stdout=subprocess.PIPE,
                                stderr=subprocess.PIPE, cwd=self.folder)
        self.addCleanup(edit.communicate)
        time.sleep(0.3)
        self.assertIsNone(edit.poll())
        return edit, lock

    def test_edits_wait_for_each_other_and_see_each_other(self):
        path = self.write("a.wav", wave())
        edit, lock = self.start_waiting(path, "add", "a.wav", "none")
        self.write("new", wave(chunk(b"note", b"text")))
        os.rename(self.folder / "new", path)  # as another edit ends
        lock.close()
        self.assertEqual(edit.wait(30), 0)
        self.assertEqual(path.read_bytes(), wave(chunk(b"note", b"text"), chunk(b"none", b"")))
        edits = [subprocess.Popen([KTFILES, "chunks", "add", "a.wav", f"n{i:03}", "-q"], stdin=subprocess.DEVNULL,
                                  cwd=self.folder) for i in range(12)]
        self.assertEqual([edit.wait(60) for edit in edits], [0] * 12)
        ids = [item["id"] for item in self.record("chunks", "a.wav")["chunks"]]
        self.assertEqual(sorted(ids[4:]), [f"n{i:03}" for i in range(12)])
        self.assert_no_litter("a.wav")

    def stopped_edit(self, *arguments):
        """A large file, and the process of an edit of it that was stopped before it replaces the file; it goes on by SIGCONT."""
        path = self.folder / "big.wav"
        for _ in range(20):
            path.write_bytes(wave(frames=100_000_000))
            edit = subprocess.Popen([KTFILES, "chunks", "add", "big.wav", "note", "-q", *arguments], cwd=self.folder,
                                    stdin=subprocess.DEVNULL, stderr=subprocess.PIPE)
            self.addCleanup(edit.communicate)
            copy = self.folder / ".big.wav.ktfiles-0"
            while edit.poll() is None and not copy.exists():
                time.sleep(0.001)
            edit.send_signal(signal.SIGSTOP)
            if edit.returncode is None:
                state = os.waitid(os.P_PID, edit.pid, os.WSTOPPED | os.WEXITED | os.WNOWAIT).si_code
                if state == os.CLD_STOPPED and copy.exists():
                    return path, edit
            edit.send_signal(signal.SIGCONT)  # it was faster than we are
            edit.wait(60)
        self.fail("no edit could be stopped")

    def goes_on(self, edit, *signals):
        for number in (*signals, signal.SIGCONT):
            edit.send_signal(number)

    def test_signals_and_kills(self):
        for signal_number in (signal.SIGINT, signal.SIGTERM, signal.SIGHUP):
            path, edit = self.stopped_edit()
            self.goes_on(edit, signal_number)
            self.assertEqual(edit.wait(30), -signal_number)
            self.assert_no_litter("big.wav")
        path, edit = self.stopped_edit()
        edit.kill()
        edit.wait(30)
        self.assertEqual(len(os.listdir(self.folder)), 2)  # nothing can be done about that one but
        foreign = self.write(".big.wav.ktfiles-1", b"another run's, alive")
        with open(foreign, "r+b") as live:
            fcntl.fcntl(live, 37, struct.pack("hhqqi4x", fcntl.F_WRLCK, 0, 0, 0, 0))
            self.run_command("chunks", "add", "big.wav", "note", stdin=b"x")
        self.assert_no_litter("big.wav", foreign.name)

    def test_a_name_that_is_given_away_leads_no_edit_astray(self):
        path, edit = self.stopped_edit()
        victim = self.write("victim", wave())
        name = self.folder / ".big.wav.ktfiles-0"
        os.rename(name, self.folder / "moved")
        name.symlink_to("victim")
        self.goes_on(edit)
        self.assertIn(b"was moved by another program", edit.communicate(timeout=60)[1])
        self.assertEqual(victim.read_bytes(), wave())
        self.assertEqual(path.stat().st_size, len(wave()) - 200 + 200_000_000)

    def test_change_by_others_meanwhile(self):
        path, edit = self.stopped_edit()
        with open(path, "r+b") as file:
            file.seek(60)
            file.write(b"played on")
        self.goes_on(edit)
        self.assertIn(b"changed by another program", edit.communicate(timeout=30)[1])
        self.assertEqual(edit.returncode, 1)
        with open(path, "rb") as file:
            self.assertEqual(file.read(69)[60:], b"played on")
        self.assert_no_litter("big.wav")


if __name__ == "__main__":
    unittest.main()
