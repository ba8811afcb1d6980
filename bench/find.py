#!/usr/bin/env python3
"""Times questions to a large index: find.py KTFILES INDEX, of which library_rows.py makes one.

Of each question the least of several runs: processor time of the whole command, and what is left of it without that of
the same command on an index of one file, which is the time in the index. Each is warm: it ran once before."""
import argparse
import os
import pathlib
import tempfile

import library_rows

# The ugly ones are marked: broad words, nothing found by broad conditions, orders that no condition narrows.
QUESTIONS = [
    ("one word", ["velvet"]),
    ("two words", ["velvet", "shaker"]),
    ("a beginning", ["shak"]),
    ("a phrase", ["hi-hat steady"]),
    ("words of a recording", ["take", "overhead"]),
    ("tempo", ["--tempo", "120"]),
    ("tempo and key", ["--tempo", "118..122", "--key", "F# minor", "--kind", "loop"]),
    ("related, by tempo", ["--key", "F# minor", "--tempo", "120", "--related", "--sort", "tempo"]),
    ("category and word", ["--category", "Bass", "warm"]),
    ("genre, by length", ["--genre", "Drum & Bass", "--sort", "duration", "--reverse"]),
    ("artist", ["--artist", None]),
    ("a rare form", ["--format", "rf64", "--rate", "96k", "--channels", "1", "--kind", "one-shot"]),
    ("a rare problem", ["--problem", "padIsMissing", "--longer", "20min"]),
    ("ugly: half of all, by tempo", ["loop", "--sort", "tempo"]),
    ("ugly: half of all, by relevance", ["loop"]),
    ("ugly: the beginning s", ["s", "--sort", "name"]),
    ("ugly: the beginning s, by relevance", ["s"]),
    ("ugly: two of half", ["loop", "samples", "--sort", "size"]),
    ("ugly: one letter and a rare word", ["s", "zz"]),
    ("ugly: all duplicates", ["--duplicates"]),
    ("ugly: duplicates of a word", ["--duplicates", "velvet", "--kind", "one-shot"]),
    ("ugly: any problem, by size", ["--problem", "any", "--sort", "size"]),
    ("ugly: since long ago", ["--since", "2023-12-01", "--sort", "modified", "--reverse"]),
    ("ugly: half in a folder", ["/library/Samples/", "--sort", "path"]),
    ("ugly: half in a folder, by tempo", ["/library/Samples/", "--sort", "tempo", "--reverse"]),
    ("ugly: a word of none in a folder", ["/library/Recordings/", "shaker", "--sort", "tempo"]),
    ("ugly: all, by path", ["--sort", "path", "--reverse"]),
    ("ugly: all, by rate", ["--sort", "rate"]),
    ("ugly: nothing of broad ones", ["loop", "--tempo", "124", "--category", "Vocals", "--longer", "1min"]),
    ("ugly: nothing, two broad words", ["loop", "recordings", "take"]),
    ("ugly: nothing, broad sound", ["--kind", "one-shot", "--longer", "5s"]),
    ("ugly: nothing, broad folder and kind", ["/library/Projects/", "--kind", "loop"]),
    ("ugly: nothing, three broad conditions", ["/library/Samples/", "--longer", "1min", "--channels", "2", "--sort", "key"]),
]


def run(command):
    """Milliseconds of processor time."""
    process = os.fork()
    if process == 0:
        nothing = os.open(os.devnull, os.O_WRONLY)
        os.dup2(nothing, 1)
        os.execv(command[0], command)
    _, status, usage = os.wait4(process, 0)
    if os.waitstatus_to_exitcode(status) == 2:
        raise SystemExit(f"no question: {command}")
    return (usage.ru_utime + usage.ru_stime) * 1000, os.waitstatus_to_exitcode(status)


def least(command, runs):
    run(command)
    times = [run(command) for _ in range(runs)]
    return min(time for time, _ in times), times[0][1]


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("ktfiles")
    parser.add_argument("index")
    parser.add_argument("--runs", type=int, default=7)
    parser.add_argument("--limit", default="50")
    parser.add_argument("--only", default="")
    arguments = parser.parse_args()
    tool = str(pathlib.Path(arguments.ktfiles).resolve())
    with tempfile.TemporaryDirectory() as folder:
        small = os.path.join(folder, "small.db")
        library_rows.fill(small, 100)
        base, _ = least([tool, "find", "--db", small, "--limit", "1"], arguments.runs * 3)
        print(f"{'question':42} {'whole ms':>9} {'in the index':>12}")
        for title, words in QUESTIONS:
            if arguments.only not in title:
                continue
            words = [word if word is not None else artist_in(arguments.index) for word in words]
            time, status = least([tool, "find", "--db", arguments.index, "--limit", arguments.limit, *words], arguments.runs)
            print(f"{title:42} {time:9.1f} {time - base:12.1f}{'  nothing' if status else ''}", flush=True)


def artist_in(index):
    import sqlite3
    with sqlite3.connect(f"file:{index}?mode=ro", uri=True) as database:
        return database.execute("SELECT artist FROM files WHERE artist IS NOT NULL LIMIT 1").fetchone()[0]


if __name__ == "__main__":
    main()
