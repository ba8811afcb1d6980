"""ktfiles lock and locks: real processes that hold each other back, and the other verbs among them."""
import fcntl
import json
import os
import pathlib
import pty
import select
import shutil
import signal
import subprocess
import sys
import time
import unittest

from command import KTFILES, LIBRARY, MEDIA, CommandTest, chunk, wave

PATIENCE = 30  # seconds until something that must happen is given up

# A command that says "ready", counts SIGINTs, and tells their number and ends when SIGUSR1 or SIGTERM comes.
SIGNALLED = """
import signal, sys
signals = []
for number in (signal.SIGINT, signal.SIGHUP, signal.SIGUSR2):
    signal.signal(number, lambda number, frame: signals.append(number))
def end(number, frame):
    print("got", number, *signals, flush=True)
    sys.exit(7)
for number in (signal.SIGUSR1, signal.SIGTERM):
    signal.signal(number, end)
print("ready", flush=True)
while True:
    signal.pause()
"""


# In a name space of its own, with an empty home and no run-time folder at first.
PLACES = """
import os, pwd, shutil, subprocess, sys
ktfiles, user = sys.argv[1], os.geteuid()
home = pwd.getpwuid(user).pw_dir
for place in (home, "/run/user"):
    if subprocess.run(["mount", "-t", "tmpfs", "-o", f"mode=0700,uid={user}", "tmpfs", place], capture_output=True).returncode:
        sys.exit(77)
if not os.path.exists(ktfiles):
    sys.exit(77)
state, runtime = home + "/.local/state/ktfiles-coordination", f"/run/user/{user}"
def hold():
    process = subprocess.Popen([ktfiles, "lock", "a.wav"], stdin=subprocess.PIPE, stdout=subprocess.PIPE)
    process.stdout.readline()
    return process
def expect_held(process):
    waiting = subprocess.run([ktfiles, "lock", "--timeout", "0.2", "a.wav", "--", "true"], capture_output=True, text=True)
    assert f"still in use by process {process.pid} (" in waiting.stderr, waiting.stderr
    listed = subprocess.run([ktfiles, "locks", "a.wav"], capture_output=True, text=True).stdout
    assert f"\\t{process.pid}\\t" in listed, listed
first = hold()
assert os.stat(state).st_mode & 0o7777 == 0o700
os.mkdir(runtime, 0o700)
expect_held(first)
first.communicate()
second = hold()
assert os.path.isdir(runtime + "/ktfiles-coordination")
shutil.rmtree(runtime)
expect_held(second)
second.communicate()
subprocess.run([ktfiles, "lock", "--timeout", "30", "a.wav", "--", "echo", "good"], check=True)
"""


class LockTest(CommandTest):
    def start(self, *arguments, **options):
        process = subprocess.Popen([KTFILES, *arguments], stdin=subprocess.PIPE, stdout=subprocess.PIPE,
                                   stderr=subprocess.PIPE, cwd=self.folder, **options)

        def end():
            process.kill()
            process.communicate()
        self.addCleanup(end)
        return process

    def hold(self, *arguments):
        """A lock that is held until its input ends."""
        process = self.start("lock", *arguments)
        line = process.stdout.readline().decode()
        self.assertTrue(line.endswith("\theld\n"), (line, process.poll()))
        return process

    def release(self, process):
        error = process.communicate(timeout=PATIENCE)[1].decode()  # on a busy machine they say that they wait
        self.assertEqual([line for line in error.splitlines() if "waiting for process" not in line], [])
        self.assertEqual(process.returncode, 0)

    def parties(self, *files):
        return {(party["role"], party["access"], party["processID"]) for party in self.json("locks", *files)}

    def await_waiting(self, process, file, access):
        """Until the kernel shows that the process waits; it cannot have been let through before."""
        end = time.monotonic() + PATIENCE
        while ("waits", access, process.pid) not in self.parties(file):
            self.assertIsNone(process.poll(), (process.args, process.stderr.read() if process.poll() else ""))
            self.assertLess(time.monotonic(), end, process.args)
        self.assertEqual(select.select([process.stdout], [], [], 0)[0], [])

    def start_waiting(self, file, *options):
        waiter = self.start("lock", *options, file)
        self.await_waiting(waiter, file, "read" if "--read" in options else "write")
        return waiter

    def hand_over(self, holder, *waiters):
        """Each gets the lock when the one before has let go of it."""
        for process in (holder, *waiters):
            if process is not holder:
                self.assertIn(b"held", process.stdout.readline())
            self.release(process)

    def assert_free(self, file):
        self.assertEqual(self.parties(file), set())
        self.run_command("lock", "--timeout", str(PATIENCE), file, "--", "true")


class TwoShells(LockTest):
    def test_who_holds_whom_back(self):
        self.write("a.wav", wave())
        kinds = ("--read", "--write", "--presenter")
        for first in kinds:
            for second in kinds:
                with self.subTest(first=first, second=second):
                    holder = self.hold(first, "a.wav")
                    if first == second == "--read":
                        self.release(self.hold(second, "a.wav"))
                        self.release(holder)
                    else:
                        self.hand_over(holder, self.start_waiting("a.wav", second))
        self.assert_free("a.wav")

    def test_the_path_is_what_is_locked(self):
        (self.folder / "folder").mkdir()
        (self.folder / "link").symlink_to("folder")
        holder = self.hold("folder/new.wav")
        waiter = self.start("lock", "link/../link/new.wav")
        self.await_waiting(waiter, str(self.folder / "link" / "new.wav"), "write")
        self.write("folder/new.wav", wave())
        self.hand_over(holder, waiter, self.start_waiting("folder/new.wav", "--read"))

    def test_timeout(self):
        holder = self.hold("--presenter", "a.wav")
        for seconds in ("0", "0.3"):
            error = self.failure("lock", "--timeout", seconds, "a.wav", "--", "touch", "ran")
            self.assertEqual(error, f"ktfiles: a.wav: still in use by process {holder.pid} (ktfiles) after {seconds} "
                                    "seconds; nothing was run\n")
        self.release(holder)
        self.run_command("lock", "--timeout", str(PATIENCE), "a.wav", "--", "touch", "ran")
        self.assert_no_litter("ran")

    def test_signals_while_waiting_and_holding(self):
        holder = self.hold("a.wav")
        for number in (signal.SIGINT, signal.SIGTERM):
            waiter = self.start("lock", "a.wav", "--", "touch", "ran")
            self.await_waiting(waiter, "a.wav", "write")
            waiter.send_signal(number)
            self.assertEqual(waiter.wait(PATIENCE), -number)
        self.assertEqual(self.parties("a.wav"), {("holds", "write", holder.pid)})
        holder.send_signal(signal.SIGINT)
        self.assertEqual(holder.wait(PATIENCE), -signal.SIGINT)
        self.assert_free("a.wav")
        self.assert_no_litter()


class Commands(LockTest):
    def test_exit_statuses(self):
        self.write("text", b"no program")
        cases = [(["sh", "-c", "exit 3"], 3, ""), (["sh", "-c", "kill -9 $$"], 137, ""), (["true"], 0, ""),
                 (["./nothing"], 127, "ktfiles: ./nothing: file not found\n"),
                 ([""], 127, "ktfiles: : file not found\n"),
                 (["./text"], 126, "ktfiles: ./text: access denied\n")]
        for kind in ("--read", "--write", "--presenter"):
            for command, status, error in cases:
                with self.subTest(kind=kind, command=command):
                    result = self.run_command("lock", kind, "a.wav", "--", *command, status=status)
                    self.assertEqual((result.stdout, result.stderr.decode()), (b"", error))
        self.assert_free("a.wav")

    def test_the_command_is_left_alone(self):
        words = ["", "--", "[a,b]", "--json", "-q", "lock", "a b", "\1[x]"]
        echo = [sys.executable, "-c", "import sys; sys.stdout.write(repr(sys.argv[1:]) + sys.stdin.read())"]
        result = self.run_command("lock", "[a,b]", "--", *echo, *words, stdin=b"input")
        self.assertEqual(result.stdout.decode(), repr(words) + "input")
        # Neither the signals that we hold back nor those that we ignore for ourselves.
        script = "import signal; print(signal.pthread_sigmask(signal.SIG_BLOCK, ()), signal.getsignal(signal.SIGXFSZ))"
        plain, locked = ([sys.executable, "-c", script], [KTFILES, "lock", "a", "--", sys.executable, "-c", script])
        self.assertEqual(*(subprocess.run(command, capture_output=True, cwd=self.folder).stdout
                           for command in (plain, locked)))

    def test_children_are_awaited_where_they_are_ignored(self):
        result = self.run_command("lock", "a.wav", "--", "sh", "-c", "exit 5", status=5,
                                  preexec_fn=lambda: signal.signal(signal.SIGCHLD, signal.SIG_IGN))
        self.assertEqual(result.stderr, b"")

    def test_signals_go_on_to_the_command(self):
        for number in (signal.SIGUSR1, signal.SIGTERM):
            holder = self.start("lock", "a.wav", "--", sys.executable, "-c", SIGNALLED)
            self.assertEqual(holder.stdout.readline(), b"ready\n")
            holder.send_signal(number)
            self.assertEqual(holder.communicate(timeout=PATIENCE)[0].decode().split()[:2], ["got", str(int(number))])
            self.assertEqual(holder.returncode, 7)
        self.assert_free("a.wav")

    def test_the_terminals_interrupt_is_left_to_the_terminal(self):
        alone = "import os; os.setpgrp()\n" + SIGNALLED  # so that what comes has come through us
        process, terminal = pty.fork()
        if process == 0:
            os.chdir(self.folder)
            os.execv(KTFILES, [KTFILES, "lock", "a.wav", "--", sys.executable, "-c", alone])
        text = os.read(terminal, 1000).decode()
        while "ready" not in text:
            text += os.read(terminal, 1000).decode()
        os.write(terminal, b"\x03")
        while "^C" not in text:  # its echo: the signal was sent
            text += os.read(terminal, 1000).decode()
        os.kill(process, signal.SIGUSR1)  # goes on to the command, behind a SIGINT that would
        while "got" not in text or not text.endswith("\n"):
            text += os.read(terminal, 1000).decode()
        self.assertEqual(os.waitstatus_to_exitcode(os.waitpid(process, 0)[1]), 7)
        os.close(terminal)
        self.assertEqual(text.split("got")[1].split(), [str(int(signal.SIGUSR1))])

    def test_edits_under_the_lock_go_on(self):
        path = self.write("a.wav", wave())
        for kind in ("--write", "--presenter"):
            self.run_command("lock", kind, "a.wav", "--", "sh", "-c",
                             f"'{KTFILES}' chunks add a.wav note -q < /dev/null && '{KTFILES}' info a.wav -q")
        self.assertEqual(path.read_bytes(), wave(chunk(b"note", b""), chunk(b"note", b"")))
        self.run_command("lock", "--read", "a.wav", "--", KTFILES, "info", "a.wav")
        error = self.failure("lock", "--read", "a.wav", "--", KTFILES, "chunks", "remove", "a.wav", "note")
        self.assertRegex(error, r"a.wav: is locked for reading by process \d+, which waits for this command")

    def test_the_command_is_known_under_another_name(self):
        self.write("a.wav", wave())
        (self.folder / "linked").symlink_to(KTFILES)
        shutil.copy(KTFILES, self.folder / "copied")
        environment = {**os.environ, "LD_LIBRARY_PATH": str(LIBRARY.parent)}
        for other in ("linked", "copied"):
            self.run_command("lock", "a.wav", "--", "./" + other, "info", "-q", "a.wav", env=environment)
        self.run_command("lock", "a.wav", "--", "env", "-u", "KTFILES_LOCKS", "./linked", "info", "-q", "a.wav")

    def test_a_lock_under_the_lock_is_refused(self):  # it would wait for itself
        for outer in ("--read", "--write", "--presenter"):
            for inner in ("--read", "--write", "--presenter"):
                error = self.failure("lock", outer, "a.wav", "--", "sh", "-c",
                                     f"'{KTFILES}' lock {inner} ./a.wav -- touch ran")
                self.assertRegex(error, r"a.wav: is locked by process \d+ already, which waits for this command; nothing")
        self.run_command("lock", "a.wav", "--", KTFILES, "lock", "b.wav", "--", "touch", "ran")
        self.assert_no_litter("ran")


class OtherVerbs(LockTest):
    def loop(self, name):
        shutil.copy(MEDIA / "tone-16.aiff", self.folder / name)
        self.run_command("tags", "set", name, "title=A bell", "--in-place")
        self.run_command("chunks", "add", name, "note", stdin=b"text")

    def test_each_waits_its_turn(self):
        cases = [  # how others hold the file, what is run, its access
            ("--write", ["info", "a.aiff"], "read"),
            ("--write", ["chunks", "get", "a.aiff", "note"], "read"),
            ("--write", ["overview", "a.aiff"], "read"),
            ("--write", ["chunks", "remove", "a.aiff", "note", "--dry-run"], "read"),
            ("--presenter", ["chunks", "add", "a.aiff", "most", "--in-place"], "write"),
            ("--read", ["tags", "set", "a.aiff", "genre=Jazz"], "write"),
            ("--read", ["tags", "copy", "b.aiff", "a.aiff"], "write"),
            ("--presenter", ["overview", "--store", "a.aiff"], "read"),
            ("--read", ["overview", "--store", "a.aiff"], "write"),  # once the overview is made
        ]
        self.loop("a.aiff")
        shutil.copy(MEDIA / "tone-16.aiff", self.folder / "b.aiff")
        self.run_command("tags", "set", "b.aiff", "title=Another bell")
        for kind, command, access in cases:
            with self.subTest(command):
                holder = self.hold(kind, "a.aiff")
                process = self.start(*command)
                process.stdin.close()
                process.stdin = None
                self.await_waiting(process, "a.aiff", access)
                self.release(holder)
                self.release(process)
        self.assert_free("a.aiff")

    def test_a_long_wait_is_told_and_ends_when_it_must(self):
        self.loop("a.aiff")
        package = self.folder / "Song.fuguex"
        (package / "Resources").mkdir(parents=True)
        (package / "Resources/ProjectInformation.plist").write_text("<plist><dict/></plist>")
        cases = [("a.aiff", ["info", "a.aiff"]),
                 ("Song.fuguex", ["project", "rename-alternative", "Song.fuguex", "0", "x"])]
        for name, command in cases:
            holder = self.hold(name)
            process = self.start(*command)
            line = process.stderr.readline().decode()  # no terminal
            self.assertRegex(line, rf"^ktfiles: .*{name}: waiting for process {holder.pid} \(ktfiles\) \.\.\.$")
            self.release(holder)
            process.communicate(timeout=PATIENCE)
        holder = self.hold("Song.fuguex")
        for verb in (["backup"], ["restore", "00"], ["settle"], ["rename-alternative", "0", "x"], ["dirs", "--create"]):
            error = self.failure("project", verb[0], "--timeout", "0.2", "Song.fuguex", *verb[1:])
            self.assertEqual(error, f"ktfiles: Song.fuguex: still in use by process {holder.pid} (ktfiles) after 0.2 "
                                    "seconds\n")
        self.release(holder)
        for seconds in ("nan", "inf", "-1", "1s", "", "1e9"):
            self.assertIn("time in seconds", self.failure("lock", "--timeout=" + seconds, "a", "--", "true", status=2))

    def test_a_lock_on_the_file_itself_is_named(self):
        path = self.write("a.wav", wave())
        with open(path, "rb") as file:
            fcntl.lockf(file, fcntl.LOCK_SH)
            process = self.start("chunks", "add", "a.wav", "note")
            process.stdin.close()
            process.stdin = None
            self.assertRegex(process.stderr.readline().decode(), rf"a.wav: waiting for process {os.getpid()} \(.*\), "
                             r"which has locked it for reading \.\.\.$")
            fcntl.lockf(file, fcntl.LOCK_UN)
        process.communicate(timeout=PATIENCE)
        self.assertEqual(process.returncode, 0)

    @unittest.skipUnless(os.geteuid() == 0, "only root can spoil another user's folder")
    def test_a_refused_folder(self):
        user = next(user for user in range(54321, 55000) if not os.path.exists(f"/run/user/{user}"))
        spoilt = pathlib.Path(f"/tmp/ktfiles-coordination-{user}")
        path = self.write("a.wav", wave())
        for each in (self.folder, path):
            os.chown(each, user, user)
        spoilt.mkdir()  # root's
        self.addCleanup(spoilt.rmdir)

        def become_user():
            os.setgid(user)
            os.setuid(user)
        if subprocess.run([KTFILES, "--version"], preexec_fn=become_user, capture_output=True).returncode != 0:
            self.skipTest("the command lies where others cannot run it")
        stranger = {"preexec_fn": become_user, "env": self.own_places()}
        error = self.failure("chunks", "add", "a.wav", "note", **stranger)
        self.assertIn("a.wav: other programs cannot be held back from it: coordination folder", error)
        self.assertIn("it belongs to root (user 0)", error)
        self.assertEqual(path.read_bytes(), wave())
        self.run_command("info", "a.wav", **stranger)
        self.assertIn("cannot be locked: ", self.failure("lock", "a.wav", "--", "true", **stranger))
        self.assertIn("coordination folder", self.failure("locks", **stranger))
        chosen = self.folder / "chosen"
        for arguments, env in ((["--coordination", "chosen"], {}), ([], {"KTFILES_COORDINATION": str(chosen)})):
            command = ["chunks", "add", "a.wav", "note", *arguments]
            self.run_command(*command, preexec_fn=become_user, env={**self.own_places(), **env})
            self.assertEqual((chosen.stat().st_uid, chosen.stat().st_mode & 0o777), (user, 0o700))
            shutil.rmtree(chosen)
        self.assertIn("no absolute path", self.failure("locks", env={**os.environ, "KTFILES_COORDINATION": "chosen"}))

    def own_places(self):
        return {name: value for name, value in os.environ.items() if name != "KTFILES_COORDINATION"}

    def test_run_time_folders_that_come_and_go(self):
        result = subprocess.run(["unshare", "-m", sys.executable, "-c", PLACES, KTFILES], capture_output=True, text=True,
                                cwd=self.folder, env=self.own_places(), timeout=2 * PATIENCE)
        if result.returncode == 77 or "unshare" in result.stderr:
            self.skipTest("the places of this user cannot be replaced here")
        self.assertEqual((result.stdout, result.stderr), ("good\n", ""))


class Listing(LockTest):
    def test_forms(self):
        path = self.write("a.wav", wave())
        holder = self.hold("--read", "a.wav")
        waiter = self.start_waiting("a.wav")
        self.assertEqual(self.lines("locks", "a.wav", "nobody's.wav"),
                         [f"a.wav\t{role}\t{access}\t{pid}\tktfiles" for role, access, pid in sorted(
                             [("holds", "read", holder.pid), ("waits", "write", waiter.pid)], key=lambda row: row[2])])
        report = next(party for party in self.json("locks", "a.wav") if party["processID"] == holder.pid)
        item = report.pop("item")
        self.assertEqual(report, {"path": "a.wav", "role": "holds", "access": "read", "processID": holder.pid,
                                  "command": "ktfiles"})
        # Without a file the path is that of the open file, also once another has taken its place.
        for _ in range(2):
            found = [party for party in self.json("locks") if party["item"] == item]
            self.assertEqual({party["path"] for party in found}, {str(path)})
            self.write("b.wav", wave())
            os.rename(self.folder / "b.wav", path)
        text, status = self.on_terminal("locks", "a.wav", NO_COLOR="1")
        self.assertEqual(status, 0)
        self.assertEqual(text.splitlines()[0].split(), ["FILE", "ROLE", "ACCESS", "PROCESS", "COMMAND"])
        self.assertEqual(len(text.splitlines()), 3)
        self.hand_over(holder, waiter)
        self.assertEqual(self.json("locks", "a.wav"), [])


if __name__ == "__main__":
    unittest.main()
