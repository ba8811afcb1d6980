"""Edits whose system calls fail one after the other: the old file or the new one, never anything else."""
import os
import shutil
import subprocess
import unittest

from command import KTFILES, CommandTest, caf, chunk, wave

TRACES = shutil.which("strace") and subprocess.run(["strace", "-o", "/dev/null", "true"],
                                                   capture_output=True).returncode == 0
MOST_CALLS = 200
# A sanitizer cannot look for leaks in a process that is traced already.
os.environ["ASAN_OPTIONS"] = os.environ.get("ASAN_OPTIONS", "") + ":detect_leaks=0"


@unittest.skipUnless(TRACES, "strace cannot trace here")
class FailingCalls(CommandTest):
    def run_failing(self, call, error, number, *arguments):
        """The result of a run whose call of that number fails; None when there were not so many."""
        log = self.folder.with_suffix(".log")
        self.addCleanup(log.unlink, missing_ok=True)
        result = subprocess.run(["strace", "-f", "-o", log, "-e", f"trace={call}", "-e",
                                 f"inject={call}:error={error}:when={number}", KTFILES, *arguments],
                                cwd=self.folder, stdin=subprocess.DEVNULL, capture_output=True, timeout=60)
        return result if b"INJECTED" in log.read_bytes() else None

    def sweep(self, call, error, files, changed, old, new, *arguments):
        """`files` are there ahead of each run; `changed` then is `old` where the run failed, `new` where it did not."""
        failed = 0
        for number in range(1, MOST_CALLS):
            for name in os.listdir(self.folder):
                os.unlink(self.folder / name)
            for name, content in files.items():
                self.write(name, content)
            result = self.run_failing(call, error, number, *arguments)
            path = self.folder / changed
            content = path.read_bytes() if path.exists() else None
            if result is None:
                self.assertEqual(content, new)
                break
            stands = result.returncode == 0 or b"is edited, but" in result.stderr
            failed += result.returncode != 0
            self.assertEqual(content, new if stands else old, (call, number, result))
            self.assert_no_litter(*files, *([changed] if content is not None and changed not in files else []))
        else:
            self.fail("never without a failure")
        return failed

    def test_reads(self):
        far = chunk(b"keep", bytes(9000))
        before = wave(far, chunk(b"note", b"gone"), far, chunk(b"last", b"kept"))
        self.assertGreater(self.sweep("pread64", "EIO", {"a.wav": before}, "a.wav", before,
                                      wave(far, far, chunk(b"last", b"kept")), "chunks", "remove", "a.wav", "note"), 2)
        before = caf((b"keep", bytes(9000)), (b"more", bytes(9000)))
        self.assertGreater(self.sweep("pread64", "EIO", {"a.caf": before}, "a.caf", before,
                                      before + b"note" + bytes(8), "chunks", "add", "a.caf", "note"), 2)

    def test_writes(self):
        before, after = wave(chunk(b"keep", b"kept")), wave(chunk(b"keep", b"kept"), chunk(b"note", b""))
        for call, error in (("pwrite64", "ENOSPC"), ("ftruncate", "EIO"), ("fsync", "EIO"), ("renameat", "EIO")):
            self.assertGreater(self.sweep(call, error, {"a.wav": before}, "a.wav", before, after, "chunks", "add",
                                          "a.wav", "note"), 0, call)

    def test_sidecars(self):
        self.write("s.mp3", b"music")
        states = [None]
        for name in ("one", "two"):
            self.run_command("chunks", "add", "s.mp3", name, "--sidecar", "ovw")
            states.append((self.folder / "s.ktmd").read_bytes())
        for old, new, name in ((states[0], states[1], "one"), (states[1], states[2], "two")):
            files = {"s.mp3": b"music", **({"s.ktmd": old} if old else {})}
            for call, error in (("pwrite64", "ENOSPC"), ("fsync", "EIO"), ("pread64", "EIO")):
                self.sweep(call, error, files, "s.ktmd", old, new, "chunks", "add", "s.mp3", name, "--sidecar", "ovw")

    def test_lists_are_whole_or_fail(self):
        for name, content in (("a.wav", wave(*(chunk(b"keep", bytes(9000)) for _ in range(3)))),
                              ("a.caf", caf(*((b"keep", bytes(9000)) for _ in range(3))))):
            self.write(name, content)
            for arguments in (("chunks", name), ("chunks", "--json", name), ("chunks", "get", name, "data")):
                whole = self.run_command(*arguments).stdout
                failed = 0
                for number in range(1, MOST_CALLS):
                    result = self.run_failing("pread64", "EIO", number, *arguments)
                    if result is None:
                        break
                    failed += result.returncode != 0
                    if result.returncode == 0:
                        self.assertEqual(result.stdout, whole, (arguments, number))
                self.assertGreater(failed, 2, arguments)

    def test_no_folder_is_read(self):
        self.write("a.wav", wave())
        log = self.folder.with_suffix(".log")
        self.addCleanup(log.unlink, missing_ok=True)
        subprocess.run(["strace", "-f", "-y", "-o", log, "-e", "trace=getdents64", KTFILES, "chunks", "add", "a.wav", "note"],
                       cwd=self.folder, stdin=subprocess.DEVNULL, check=True, capture_output=True)
        self.assertNotIn(f"<{self.folder}>".encode(), log.read_bytes())


if __name__ == "__main__":
    unittest.main()
