"""The command as a process, and small containers built by hand, for the tests beside this file."""
import atexit
import fcntl
import json
import os
import pathlib
import pty
import re
import resource
import shutil
import signal
import struct
import subprocess
import tempfile
import termios
import threading
import unittest

import schemas

KTFILES = os.environ["KTFILES"]
# Nothing of the tests shows in the user's own folder, and runs side by side do not wait for each other.
os.environ["KTFILES_COORDINATION"] = tempfile.mkdtemp(prefix="ktfiles-coordination-")
os.environ.pop("COLUMNS", None)
# A shell ignores it for what it starts in the background, and so would all that is started here.
signal.signal(signal.SIGINT, signal.default_int_handler)
atexit.register(shutil.rmtree, os.environ["KTFILES_COORDINATION"], ignore_errors=True)
MEDIA = pathlib.Path(os.environ["KTFILES_MEDIA"])
# What the command is linked to.
LINKED = subprocess.run(["ldd", KTFILES], capture_output=True, text=True).stdout
LIBRARY = pathlib.Path(re.search(r"=> (\S*/libKTFiles\.so\S*)", LINKED).group(1))
# With a sanitizer, which reserves more memory than a limit would leave.
INSTRUMENTED = re.search("libasan|libtsan", LINKED) is not None
needs_decoders = unittest.skipUnless((LIBRARY.parent / "ktfiles/libktfiles-decoders.so").exists(),
                                     "the decoder module is not built")


def chunk(chunk_id, body, order="<", size=None):
    header = chunk_id + struct.pack(order + "I", len(body) if size is None else size)
    return header + body + b"\0" * (len(body) & 1)


def wave(*chunks, container=b"RIFF", size=None, frames=100):
    """A 16-bit mono WAVE file with further chunks behind the samples; `size` overrides the container's size field."""
    fmt = chunk(b"fmt ", struct.pack("<HHIIHH", 1, 1, 48000, 96000, 2, 16))
    body = b"WAVE" + fmt + chunk(b"data", (bytes(range(251)) * (frames // 125 + 1))[:frames * 2]) + b"".join(chunks)
    return container + struct.pack("<I", len(body) if size is None else size) + body


def caf(*chunks, data_size=None, samples=b"\1\2" * 100):
    """A 16-bit mono CAF file, `chunks` of (id, body) ahead of the samples; `data_size` overrides their size field."""
    desc = struct.pack(">d4sIIIII", 44100.0, b"lpcm", 2, 2, 1, 1, 16)
    items = [(b"desc", desc), *chunks]
    head = b"caff\0\1\0\0" + b"".join(i + struct.pack(">q", len(b)) + b for i, b in items)
    size = len(samples) + 4 if data_size is None else data_size
    return head + b"data" + struct.pack(">qI", size, 0) + samples


class CommandTest(unittest.TestCase):
    """Each test has a folder of its own, which is the command's working folder and must hold no litter at the end."""

    def setUp(self):
        self.folder = pathlib.Path(tempfile.mkdtemp(prefix="ktfiles-test-"))
        self.addCleanup(shutil.rmtree, self.folder)

    def write(self, name, content):
        path = self.folder / name
        path.write_bytes(content)
        return path

    def run_command(self, *arguments, status=0, stdin=b"", **options):
        result = subprocess.run([KTFILES, *arguments], input=stdin, capture_output=True, cwd=self.folder, timeout=60,
                                **options)
        if status is not None:
            self.assertEqual(result.returncode, status, (arguments, result.stdout, result.stderr))
        if (shape := schemas.shape_of(arguments)) and result.stdout:
            schemas.check(arguments, result.stdout, shape)
        return result

    def with_little_memory(self, *arguments):
        """The results with more and more memory, from where the system can load the command."""
        for megabytes in range(40, 141, 10):
            def limit(size=megabytes << 20):
                resource.setrlimit(resource.RLIMIT_AS, (size, size))
            result = subprocess.run([KTFILES, *arguments], cwd=self.folder, capture_output=True, text=True, preexec_fn=limit, timeout=60)
            if result.returncode != 127:
                yield result

    def without_decoders(self):
        """An environment in which no decoder module lies beside the library."""
        folder = tempfile.mkdtemp(prefix="ktfiles-library-")
        self.addCleanup(shutil.rmtree, folder)
        shutil.copy(LIBRARY, folder)
        return {**os.environ, "LD_LIBRARY_PATH": folder}

    def encoded(self, name, *options, seconds=1, rate=44100):
        """A file of a stereo sine, made by ffmpeg; its frames before they were encoded are seconds x rate."""
        source = f"sine=f=440:r={rate}:d={seconds}"
        subprocess.run(["ffmpeg", "-v", "error", "-f", "lavfi", "-i", source, "-ac", "2", *options, self.folder / name],
                       check=True, stdin=subprocess.DEVNULL)
        return self.folder / name

    def lines(self, *arguments, **options):
        return self.run_command(*arguments, **options).stdout.decode().splitlines()

    def json(self, *arguments, **options):
        return json.loads(self.run_command(arguments[0], "--json", *arguments[1:], **options).stdout)

    def record(self, *arguments, **options):
        """Of JSON that is to tell of one file."""
        one, = self.json(*arguments, **options)
        return one

    def failure(self, *arguments, status=1, **options):
        """The one line on standard error of a run that fails."""
        error = self.run_command(*arguments, status=status, **options).stderr.decode()
        if status == 1:
            self.assertEqual(error.count("\n"), 1, error)
            self.assertTrue(error.startswith("ktfiles: "), error)
        return error

    def on_terminal(self, *arguments, columns=0, **environment):
        """What the command writes to a terminal, of a width that it tells unless that is 0, and its exit status."""
        terminal, ours = pty.openpty()
        process = os.fork()
        if process == 0:
            os.close(terminal)
            os.login_tty(ours)
            os.chdir(self.folder)
            fcntl.ioctl(1, termios.TIOCSWINSZ, struct.pack("HHHH", 24, columns, 0, 0))
            os.execve(KTFILES, [KTFILES, *arguments], {**os.environ, "TERM": "xterm", **environment})
        # Our side stays open until all is read: Linux may drop what was written just before a terminal's last close.
        end, statuses = b"\0end\0", []

        def wait():
            statuses.append(os.waitstatus_to_exitcode(os.waitpid(process, 0)[1]))
            os.write(ours, end)

        waiting = threading.Thread(target=wait)
        waiting.start()
        text = b""
        while not text.endswith(end):
            text += os.read(terminal, 65536)
        waiting.join()
        os.close(ours)
        os.close(terminal)
        return text.removesuffix(end).decode(errors="replace").replace("\r\n", "\n"), statuses[0]

    def assert_no_litter(self, *names):
        self.assertEqual(sorted(os.listdir(self.folder)), sorted(names))
