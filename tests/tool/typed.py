"""Documents whose console blocks are typed on a terminal, in a copy of examples/media, and compared with what they show."""
import difflib
import fcntl
import os
import re
import shutil
import struct
import subprocess
import termios

from command import KTFILES, MEDIA, CommandTest

OMITTED = "⋮"


def blocks(text, language):
    """The fenced blocks of a document in a language, as lists of lines."""
    return [block.splitlines() for block in re.findall(rf"^```{language}\n(.*?)^```", text, re.S | re.M)]


def shown(text):
    """(command, lines that the document shows below it) of all that it has a console do."""
    steps = []
    for line in (line for block in blocks(text, "console") for line in block):
        if line.startswith("$ "):
            steps.append((line[2:], []))
        else:
            steps[-1][1].append(line)
    return [(command, lines[:-1] if lines and not lines[-1] else lines) for command, lines in steps]


def without_what_varies(line):
    """Dates and process ids."""
    return re.sub(r" +\d{2,7}\b(?=  ktfiles)", " PID", re.sub(r"\b\d{4}-\d\d-\d\dT\d\d:\d\d:\d\dZ", "DATE", line))


def screen(text):
    """What is to be seen at the end of all that a terminal got: lines of progress are drawn over, and cleared."""
    lines = []
    for line in text.replace("\r\n", "\n").split("\n"):
        seen = ""
        for part in line.split("\r"):
            kept, *more = part.split("\x1b[K")
            seen = kept + ("" if more else seen[len(kept):]) + "".join(more)
        lines.append(seen)
    return "\n".join(lines)


class TypedTest(CommandTest):
    def setUp(self):
        super().setUp()
        shutil.copytree(MEDIA, self.folder, dirs_exist_ok=True)
        null_device = self.folder.with_suffix(".asound")  # sound goes nowhere, with or without a device
        null_device.write_text("pcm.!default { type null }\nctl.!default { type null }\n", encoding="utf-8")
        self.addCleanup(null_device.unlink)
        self.environment = {**os.environ, "PATH": f"{os.path.dirname(KTFILES)}:{os.environ['PATH']}", "NO_COLOR": "1",
                            "TERM": "xterm", "LC_ALL": "C.UTF-8", "ALSA_CONFIG_PATH": str(null_device)}

    def typed(self, command, columns=100):
        """What a terminal shows after a command."""
        ours, theirs = os.openpty()
        fcntl.ioctl(theirs, termios.TIOCSWINSZ, struct.pack("HHHH", 40, columns, 0, 0))
        with subprocess.Popen(["bash", "-c", command], stdin=theirs, stdout=theirs, stderr=theirs, cwd=self.folder,
                              env=self.environment, start_new_session=True):
            os.close(theirs)
            text = b""
            try:
                while piece := os.read(ours, 65536):
                    text += piece
            except OSError:  # EIO: the other side is gone
                pass
        os.close(ours)
        return screen(text.decode()).splitlines()

    def assert_shows(self, name, text):
        """That each console block of the document, typed in order, shows what it says."""
        for command, expected in shown(text):
            pattern = "".join(r"(?:.*\n)*" if line.strip() == OMITTED else re.escape(without_what_varies(line)) + "\n" for line in expected)
            found = self.typed(command)
            if not re.fullmatch(pattern, "".join(without_what_varies(line) + "\n" for line in found)):
                self.fail("\n".join(difflib.unified_diff(expected, found, f"{name}: {command}", "now", lineterm="")))
