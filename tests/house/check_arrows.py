"""Checks that every #include between rooms follows an arrow of the design, that no room comes back to itself, that classes are
defined where they are declared, and that no public header shows the system.

A shared include root enforces nothing, so this test does. Usage: check_arrows.py SOURCE_ROOT
"""
import pathlib
import re
import sys

# Room -> the rooms that it may include, beside itself. An implementation folder of the platform belongs to the room
# "platform", but only its own .cpp files may include headers of that folder.
ARROWS = {
    "platform/core": set(),
    "platform": {"platform/core"},
    "media/samples": {"platform"},
    "media/containers": {"media/samples", "platform"},
    "media/packets": {"media/containers", "platform"},
    "media/userdata": {"media/containers", "platform"},
    "media/decoding": {"media/packets", "media/userdata", "platform"},
    "media/ffmpeg": {"media/decoding"},
    "media/tags": {"media/containers", "platform"},
    "media/taglib": {"media/tags"},
    "media/loudness": {"media/containers", "platform"},
    "media/ebur128": {"media/loudness"},
    "files": {"platform"},
    "loops/tagging": {"platform/core"},
    "audiofile/metadata": {"loops/tagging", "platform/core"},
    "audiofile": {"files", "loops/tagging", "media/decoding", "platform"},
    "audiofile/fields": {"audiofile", "audiofile/metadata", "media/tags"},
    "loops": {"audiofile", "audiofile/metadata", "files", "loops/tagging", "media/decoding", "platform"},
    "loops/overview": {"audiofile", "files", "media/samples", "platform"},
    "loops/tags": {"loops"},
    "adm": {"platform"},
    "adm/files": {"adm", "audiofile"},
    "project": {"files", "platform"},
    "coordination": {"platform"},
    "files/registry": {"audiofile"},
}
# Of the command, the one source that knows the parser of its command line.
PARSER, PARSER_USER = "<CLI/", "tool/shared/arguments/Verb.cpp"
# What C programs include, and what that may include.
C_HEADER, C_HEADER_INCLUDES = "c/ktfiles.h", {"<stddef.h>", "<stdint.h>"}
# Members that a room above their class's own defines: overviews and tempo are none of a container's business.
MEMBERS_ABOVE = {("CAudioFileIO", "loops"), ("CAudioFileIO", "loops/overview")}
CLASS = re.compile(r"^(?:class|struct)\s+(?:KT_EXPORT\s+)?(\w+)(?:\s+final)?\s*(?::[^;{]*)?\{", re.MULTILINE)
MEMBER = re.compile(r"^(?![ \t#/}])[^;=\n]*?\b(\w+)::~?\w+\([^;]*$", re.MULTILINE)
SYSTEM_HEADER = re.compile(r"<(sys/|linux/|unistd|fcntl|libxml/|uriparser/|zlib|sha2|iconv|pwd|dirent|errno\.h)")
INCLUDE = re.compile(r'^\s*#\s*include\s+(?:"([^"]+)"|(<[^>]+>))', re.MULTILINE)


def room_of(path):
    """The room of a path relative to src/: the longest room name that its folder begins with."""
    folder = path.rsplit("/", 1)[0] if "/" in path else ""
    rooms = [room for room in ARROWS if folder == room or folder.startswith(room + "/")]
    return max(rooms, key=len, default=None)


def reachable(room):
    """What a room may include: the arrows, and whatever those rooms build on."""
    seen, waiting = {room}, [room]
    while waiting:
        for target in ARROWS[waiting.pop()] - seen:
            seen.add(target)
            waiting.append(target)
    return seen


def circles():
    """Rooms that come back to themselves by way of others."""
    for room, targets in ARROWS.items():
        if any(room in reachable(target) for target in targets):
            yield f"room {room} includes itself by way of another"


def classes_of(root):
    """Class -> the rooms whose headers define it."""
    classes = {}
    for header in root.rglob("*.h"):
        room = room_of(header.relative_to(root).as_posix())
        for name in CLASS.findall(header.read_text(encoding="utf-8")):
            classes.setdefault(name, set()).add(room)
    return classes


def strange_members(source, root, classes):
    """Members that a source defines of a class that another room declares."""
    relative = source.relative_to(root).as_posix()
    room = room_of(relative)
    for name in sorted(set(MEMBER.findall(source.read_text(encoding="utf-8")))):
        rooms = classes.get(name)
        if rooms and room not in rooms and (name, room) not in MEMBERS_ABOVE:
            yield f"src/{relative}: defines members of {name}, which {', '.join(sorted(rooms))} declares"


def problems_of(source, root):
    relative = source.relative_to(root).as_posix()
    room = room_of(relative)
    if room is None:
        yield f"src/{relative}: in no room of the design"
        return
    for ours, system in INCLUDE.findall(source.read_text(encoding="utf-8")):
        if system:
            if source.suffix == ".h" and SYSTEM_HEADER.match(system):
                yield f"src/{relative}: a header includes {system}; system headers stay in .cpp files"
            continue
        target = room_of(ours)
        if target not in reachable(room):
            yield f"src/{relative}: room {room} may not include {ours}"
        implementation = target == "platform" and ours.count("/") > room_depth(target)
        if implementation and relative.rsplit("/", 1)[0] != ours.rsplit("/", 1)[0]:
            yield f"src/{relative}: {ours} belongs to an implementation"


def room_depth(room):
    return room.count("/") + 1


def tool_folder(path):
    """The folder of a path in tool/ that speaks for it: a verb's, or "shared" with all below; "" for main.cpp."""
    return path.split("/")[1] if path.count("/") > 1 else ""


def tool_problems(source, top, public):
    """A verb of the command knows the public headers, its own folder and tool/shared; tool/shared knows no verb."""
    relative = source.relative_to(top).as_posix()
    for ours, system in INCLUDE.findall(source.read_text(encoding="utf-8")):
        if system.startswith(PARSER) and relative != PARSER_USER:
            yield f"{relative}: {system} belongs to {PARSER_USER}"
        if ours.startswith("tool/") and relative.startswith("tool/"):
            if tool_folder(ours) not in (tool_folder(relative), "shared"):
                yield f"{relative}: {ours} belongs to another verb"
            elif not (top / ours).exists():
                yield f"{relative}: there is no {ours}"
        elif ours.startswith("binding/") and relative.startswith("python/"):
            if not (top / "python" / ours).exists():
                yield f"{relative}: there is no {ours}"
        elif ours and ours not in public:
            yield f"{relative}: {ours} is no public header"


def binding_problems(source, top, public):
    """The interface for C knows the public headers and its own folder; what it shows to hosts knows the C library alone."""
    relative = source.relative_to(top).as_posix()
    shown = relative == C_HEADER
    for ours, system in INCLUDE.findall(source.read_text(encoding="utf-8")):
        if ours.startswith("c/") and not shown:
            if not (top / ours).exists():
                yield f"{relative}: there is no {ours}"
        elif ours and (shown or ours not in public):
            yield f"{relative}: {ours} is no public header"
        elif shown and system not in C_HEADER_INCLUDES:
            yield f"{relative}: includes {system}"


def main():
    top = pathlib.Path(sys.argv[1])
    root = top / "src"
    problems, count = list(circles()), 0
    classes = classes_of(root)
    for source in sorted([*root.rglob("*.h"), *root.rglob("*.cpp")]):
        count += 1
        problems += problems_of(source, root)
        if source.suffix == ".cpp":
            problems += strange_members(source, root, classes)
    installed = (top / "cmake" / "Install.cmake").read_text(encoding="utf-8")
    media = set(re.search(r"set\(media_headers\s+([^)]*)\)", installed)[1].split())
    public = media | {
        header.relative_to(root).as_posix()
        for room in ARROWS
        if not room.startswith("media/")
        for header in (root / room).glob("*.h")
    }
    for folder in ("tool", "python", "examples"):
        for source in sorted([*(top / folder).rglob("*.h"), *(top / folder).rglob("*.cpp")]):
            count += 1
            problems += tool_problems(source, top, public)
    for source in sorted([*(top / "c").rglob("*.h"), *(top / "c").rglob("*.cpp")]):
        count += 1
        problems += binding_problems(source, top, public)
    for source in sorted((top / "examples").rglob("*.c")):
        count += 1
        problems += [f"{source.name}: {ours} is not what C programs include"
                     for ours, _ in INCLUDE.findall(source.read_text(encoding="utf-8")) if ours]
    problems += [f"cmake/Install.cmake: {header} is not there" for header in media if not (root / header).exists()]
    if count == 0:
        problems.append("no sources found")
    print("\n".join(problems) or f"{count} files, every include along an arrow")
    sys.exit(1 if problems else 0)


main()
