"""Checks that the library exports what programs were linked with (docs/guide/abi.md).

Of the interfaces for C, ktf_… and XStream…, the list is exact: symbols.txt, what the library exports, and what the headers
declare are one. Of C++ what symbols-cxx.txt lists must be there, and more may be.

Usage: check_abi.py LIBRARY SOURCE_ROOT VERSION [--write]
"""
import pathlib
import re
import subprocess
import sys

LISTS = {"c": "tests/c/symbols.txt", "cxx": "tests/c/symbols-cxx.txt"}
HEADERS = ["c/ktfiles.h", "src/audiofile/XStream.h"]
STRONG = set("TDBR")  # what templates and inline functions leave behind differs from compiler to compiler
HOW = "scripts/abi-lists writes the lists anew, when that is meant"


def exported(library):
    lines = subprocess.run(["nm", "-D", "--defined-only", library], check=True, capture_output=True, text=True).stdout
    symbols = {fields[2] for fields in map(str.split, lines.splitlines()) if fields[1] in STRONG}
    c = {name for name in symbols if name.startswith(("ktf_", "XStream"))}
    return {"c": c, "cxx": symbols - c}


def declared(root):
    names = set()
    for header in HEADERS:
        text = re.sub(r"//[^\n]*|^#(.*\\\n)*.*", "", (root / header).read_text(encoding="utf-8"), flags=re.MULTILINE)
        names |= set(re.findall(r"\b(?:KTF_API|KT_EXPORT)\b[^;(]*?\b(\w+)\(", text))
    return names


def private_members(root):
    """What no host calls, though it is exported with its class: "Class::name", of the classes at the left margin of headers."""
    hidden, shown = set(), set()
    for header in (root / "src").rglob("*.h"):
        name = access = None
        for line in header.read_text(encoding="utf-8").splitlines():
            if begun := re.match(r"(class|struct) (?:KT_EXPORT )?(\w+)\b[^;]*$", line):
                name, access = begun[2], "private" if begun[1] == "class" else "public"
            elif label := re.match(r"(public|protected|private):", line):
                access = label[1]
            elif name:
                (hidden if access == "private" else shown).update(f"{name}::{each}" for each in re.findall(r"(~?\w+)\(", line))
    return hidden - shown


def spelled(names):
    """Names as people read them."""
    text = "\n".join(sorted(names))
    plain = subprocess.run(["c++filt"], input=text, check=True, capture_output=True, text=True).stdout
    return ["  " + line for line in plain.splitlines()]


def problems_of(library, root, version):
    there = exported(library)
    lists = {kind: set((root / path).read_text(encoding="utf-8").split()) for kind, path in LISTS.items()}
    header = (root / HEADERS[0]).read_text(encoding="utf-8")
    stated = ".".join(re.search(rf"#define KTF_VERSION_{part} (\d+)", header)[1] for part in ("MAJOR", "MINOR", "PATCH"))
    for names, what in (
        (lists["c"] - there["c"], f"{LISTS['c']} lists what is no longer exported, and programs need it; {HOW}"),
        (there["c"] - lists["c"], f"exported for C, but not listed in {LISTS['c']}: {HOW}"),
        (declared(root) - there["c"], "declared for C, but not exported: without a definition, or without extern \"C\""),
        (there["c"] - declared(root), f"exported for C, but declared neither in {' nor in '.join(HEADERS)}"),
        (lists["cxx"] - there["cxx"], f"{LISTS['cxx']} lists what is no longer exported, and hosts need it; {HOW}"),
    ):
        if names:
            yield "\n".join([what, *spelled(names)])
    if stated != version:
        yield f"{HEADERS[0]} says version {stated}, the project {version}"


def write(library, root):
    hidden = private_members(root)
    for kind, names in exported(library).items():
        members = (re.search(r"(\w+::~?\w+)\(", text) for text in spelled(names))
        names = {name for name, member in zip(sorted(names), members) if not member or member[1] not in hidden}
        (root / LISTS[kind]).write_text("".join(name + "\n" for name in sorted(names)), encoding="utf-8")


def main():
    library, root, version = sys.argv[1], pathlib.Path(sys.argv[2]), sys.argv[3]
    if "--write" in sys.argv:
        write(library, root)
    problems = list(problems_of(library, root, version))
    print("\n".join(problems) or f"{len(exported(library)['c'])} functions for C, as declared and listed")
    sys.exit(1 if problems else 0)


main()
