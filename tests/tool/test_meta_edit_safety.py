"""ktfiles meta set on files that are damaged at random, and cut short at any write: the old metadata or the new, and the sound as it was."""
import itertools
import json
import random
import struct
import subprocess
import unittest

from command import INSTRUMENTED, KTFILES, CommandTest, caf, chunk, wave
from test_failing_calls import TRACES
from test_meta import CART, IXML, bext, point
from test_meta_edits import ACID, ADTL, CUES, INFO, SAMPLER, aiff

MUTANTS = 200 if INSTRUMENTED else 1000  # of each kind; a sanitizer makes each command slow
CAF_MARKS = struct.pack(">II", 2, 2) + struct.pack(">4sdI8sI", b"rbeg", 4.5, 7, b"\xff" * 8, 2) + struct.pack(">IdI8sI", 0, 9, 8, b"\xff" * 8, 0)
CAF_TEXTS = struct.pack(">IIqIq", 2, 7, 0, 8, 5) + b"Takt\0Teil\0"
CAF_INFO = struct.pack(">I", 3) + b"title\0A\0k\xe4y\0v\0artist\0me\0"
AIFF_MARKS = struct.pack(">HhI", 2, 1, 10) + b"\2in\0" + struct.pack(">hI", 2, 40) + b"\3out"
AIFF_COMMENTS = struct.pack(">HIhH", 2, 9, 2, 3) + b"odd\7" + struct.pack(">IhH", 9, 0, 4) + b"even"


def wave_of(*chunks):
    return wave(chunk(b"note", b"odd"), *(chunk(*each) for each in chunks), chunk(b"note", b"behind"))


def aiff_of(*chunks):
    return aiff((b"APPL", b"stockept"), *chunks, (b"APPL", b"stocbehi"))


def caf_of(*chunks):
    return caf((b"note", b"odd"), *chunks, (b"note", b"behind"))


# How a file is made, its chunks of which the first is damaged, what is set: in its place, and growing.
KINDS = {
    "bext": (wave_of, [(b"bext", bext(b"old", history=b"A=PCM\r\nA=MP2\r\n"))], {"bext.description": "new"}, {"bext.codingHistory[new]": "A=MP3,T=a long line"}),
    "info": (wave_of, [(b"LIST", INFO)], {"info.ISFT": "y"}, {"info.ICMT": "a comment"}),
    "cue": (wave_of, [(b"cue ", CUES), (b"LIST", ADTL)], {"cue[1].position": 50}, {"cue[1].label": "a longer label", "cue[0].note": "new"}),
    "adtl": (wave_of, [(b"LIST", ADTL), (b"cue ", CUES)], {"cue[1].label": "VERSE"}, {"cue[0].label": "another", "cue[0].length": 4}),
    "smpl": (wave_of, [(b"smpl", SAMPLER)], {"smpl.loop[0].end": 91}, {"smpl.loop[new].start": 1, "smpl.loop[new].end": 2}),
    "acid": (wave_of, [(b"acid", ACID)], {"acid.tempo": 100.25}, {"acid.beats": 9}),
    "cart": (wave_of, [(b"cart", CART)], {"cart.title": "T"}, {"cart.tagText": "a text that is longer than what was there"}),
    "ixml": (wave_of, [(b"iXML", IXML)], {"ixml.PROJECT": "same size"}, {"ixml.TRACK_LIST.TRACK[new].NAME": "Lav", "ixml.NOTE": "<&>"}),
    "NAME": (aiff_of, [(b"NAME", b"old")], {"NAME": "new"}, {"NAME": "a longer name"}),
    "COMT": (aiff_of, [(b"COMT", AIFF_COMMENTS), (b"MARK", AIFF_MARKS)], {"comt[0].text": "new"}, {"comt[new].text": "a third comment"}),
    "MARK": (aiff_of, [(b"MARK", AIFF_MARKS)], {"mark[0].position": 11}, {"mark[new].position": 99, "mark[new].name": "end"}),
    "CAF info": (caf_of, [(b"info", CAF_INFO)], {"info.title": "B"}, {"info.track number": "3 of 12"}),
    "CAF strg": (caf_of, [(b"strg", CAF_TEXTS), (b"mark", CAF_MARKS)], {"strg[0].text": "Tack"}, {"mark[1].name": "a longer name"}),
    "CAF mark": (caf_of, [(b"mark", CAF_MARKS), (b"strg", CAF_TEXTS)], {"mark[0].position": 5}, {"mark[new].position": 50, "mark[new].name": "Ende"}),
}


def chunks_of(content):
    """Ids and bodies, walked by the tests themselves, without room that nobody uses; all sizes must be right."""
    is_caf, order = content[:4] == b"caff", ">" if content[:4] == b"FORM" else "<"
    assert is_caf or struct.unpack_from(order + "I", content, 4)[0] == len(content) - 8, "size of the container"
    at, chunks = 8 if is_caf else 12, []
    while at < len(content):
        size, = struct.unpack_from(">q" if is_caf else order + "I", content, at + 4)
        body = at + (12 if is_caf else 8)
        assert body + size <= len(content), "a chunk beyond the end"
        if content[at:at + 4] != b"free":
            chunks.append((content[at:at + 4], content[body:body + size]))
        at = body + size + (0 if is_caf else size & 1)
    assert at == len(content), "pad"
    return chunks


def damaged(body, rng):
    body = bytearray(body)
    if body.startswith(b"<?xml") and rng.random() < 0.9:  # other damage leaves nothing of XML that can be edited
        for _ in range(rng.randrange(1, 4)):
            at = rng.randrange(40, len(body) + 1) if rng.random() < 0.3 else body.index(b">", rng.randrange(len(body) - 1)) + 1
            body[at:at] = rng.choice((b" ", b"\n", b"x", "é".encode(), b"&gt;", b"&#10;", b"<!-- <A> -->", b"<![CDATA[<B>]]>", b"<?p <C> ?>", b"<N a='>'  b=\"/>\"/>", b"<M>\n</M >"))
        return bytes(body)
    for _ in range(rng.choice((1, 1, 2, 4, 16))):
        at = rng.randrange(max(len(body), 1))
        match rng.randrange(5) if body else 4:
            case 0: body[at] = rng.randrange(256)
            case 1: body[at] = rng.choice((0, 1, 0x7F, 0x80, 0xFF))
            case 2: body[at:at + 4] = struct.pack(rng.choice("<>") + "I", rng.choice((0, 1, len(body), 0x7FFFFFFF, 0x80000000, 0xFFFFFFFF)))
            case 3: del body[at:at + rng.choice((1, 2, 4, len(body)))]
            case 4: body[at:at] = rng.randbytes(rng.choice((1, 2, 7)))
    return bytes(body)


class SafetyOfMetaEdits(CommandTest):
    def records(self, *arguments):
        """Not held against the schema, which takes longer than all else."""
        result = subprocess.run([KTFILES, *arguments, "--jsonl", "--files-from", "list"], capture_output=True, cwd=self.folder, timeout=300)
        self.assertIn(result.returncode, (0, 1), result.stderr)
        return [json.loads(line) for line in result.stdout.splitlines()]

    def fields(self):
        return [{item["field"]: item["value"] for item in record.get("fields", [])} for record in self.records("meta")]

    def assert_edited_alone(self, content, now, named, changes, before, after, steps):
        self.assertEqual([each for each in chunks_of(now) if each[0] not in named], [each for each in chunks_of(content) if each[0] not in named])
        self.assertEqual({name for name in before | after if before.get(name, self) != after.get(name, self)}, {change["field"] for change in changes})
        for field, value in steps.items():
            if "[new]" not in field:
                self.assertEqual(after[field], value)

    def test_damaged_chunks_are_refused_or_edited_alone(self):
        for kind, (build, chunks, *edits) in KINDS.items():
            rng = random.Random(kind)
            (head, body), *others = chunks
            for steps in edits:
                files = [build((head, damaged(body, rng) if i else body), *others) for i in range(MUTANTS // 2)]
                for i, content in enumerate(files):
                    self.write(f"{i:04}", content)
                (self.folder / "list").write_text("".join(f"{i:04}\n" for i in range(len(files))))
                before = self.fields()
                done = self.records("meta", "set", "--in-place", *(f"{field}={value}" for field, value in steps.items()))
                after = self.fields()
                self.assertNotIn("error", done[0])
                self.assertGreater(sum("error" not in record for record in done), MUTANTS // 20, kind)
                for i, content in enumerate(files):
                    now = (self.folder / f"{i:04}").read_bytes()
                    try:
                        if "error" in done[i]:
                            self.assertEqual(now, content)
                        else:
                            self.assert_edited_alone(content, now, {each[0] for each in chunks}, done[i]["changes"], before[i], after[i], steps)
                    except (AssertionError, KeyError) as error:
                        with self.subTest(kind, steps=steps, number=i, done=done[i]):
                            raise error


@unittest.skipUnless(TRACES, "strace cannot trace here")
class InterruptedEdits(CommandTest):
    def interrupted(self, call, fault, number, *arguments):
        """Whether the edit came to that call, at which it is killed or the disk is full; a kill behind a call is one ahead of the next."""
        log = self.folder.with_suffix(".log")
        self.addCleanup(log.unlink, missing_ok=True)
        result = subprocess.run(["strace", "-f", "-o", log, "-e", f"trace={call}", "-e", f"inject={call}:{fault}:when={number}", KTFILES, "meta",
                                 *arguments], cwd=self.folder, stdin=subprocess.DEVNULL, capture_output=True, timeout=60)
        return any(word in log.read_bytes() for word in (b"killed by SIGKILL", b"INJECTED")), result.returncode

    def state(self, name):
        return {item["field"]: item["value"] for item in self.record("meta", name)["fields"]}, self.run_command("decode", name, "-o", "-", "--format", "raw").stdout

    @staticmethod
    def once(step, state):
        """A chunk that goes behind the sound is there twice in between, the old one first, which counts."""
        return {name: value for name, value in state[0].items() if not name.startswith(step.split(".")[0].split("=")[0] + "[1]")}, state[1]

    def test_the_old_file_or_the_new_one_is_left(self):
        cases = [  # name, content, edit
            ("a.wav", wave_of((b"bext", bext(b"old")), (b"LIST", INFO)), ["set", "bext.description=new"]),
            ("b.wav", wave_of((b"LIST", INFO), (b"keep", bytes(99))), ["set", "info.ICMT=a comment that needs room"]),
            ("c.wav", wave_of((b"iXML", IXML), (b"free", bytes(999))), ["set", "ixml.NOTE=" + "text " * 40]),
            ("d.wav", wave_of((b"smpl", SAMPLER)), ["remove", "smpl"]),
            ("e.aiff", aiff_of((b"NAME", b"old")), ["set", "NAME=a longer name"]),
            ("f.caf", caf_of((b"info", CAF_INFO)), ["set", "info.title=a longer title"]),
        ]
        for (name, content, (verb, step)), (fault, options) in itertools.product(cases[::3] if INSTRUMENTED else cases, (("signal=KILL", []), ("signal=KILL", ["--in-place"]),
                                                                                         ("error=ENOSPC", ["--in-place"]))):
            path = self.write(name, content)
            old = self.state(name)
            self.run_command("meta", verb, *options, name, step)
            new, new_content = self.state(name), path.read_bytes()
            self.assertNotEqual(old[0], new[0])
            interruptions = 0
            for call, number in itertools.product(("pwrite64", "ftruncate", "fsync", "renameat"), range(1, 100)):
                if number == 1:
                    reached = True
                if not reached:
                    continue
                path.write_bytes(content)
                reached, status = self.interrupted(call, fault, number, verb, *options, name, step)
                interruptions += reached
                with self.subTest(name, fault=fault, options=options, call=call, number=number):
                    if not options:
                        self.assertIn(path.read_bytes(), (content, new_content))
                    left = self.once(step, self.state(name))
                    self.assertIn(left, (new,) if status == 0 else (old, new))
                    self.run_command("meta", verb, *options, name, step)  # nothing stands in the way of it
                    self.assertEqual(self.once(step, self.state(name)), new)
                    chunks_of(path.read_bytes())
            self.assertGreater(interruptions, 1)


if __name__ == "__main__":
    unittest.main()
