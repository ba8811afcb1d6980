#!/usr/bin/env python3
"""What an index says of files, and how fast, beside exiftool, mediainfo and a script with mutagen.

index_judges.py KTFILES [--files 20000] [--rounds 3] [--folder FOLDER] [--fields-only]

Makes that many audio files of several formats by other programs, all with tags, a few hundred of them different and the rest copies of
other names; measures each program over the same folder, and lists the fields in which they differ, each with who is right. A difference
that nobody has judged ends it with status 1.
"""
import argparse
import collections
import itertools
import json
import math
import os
import pathlib
import random
import resource
import shutil
import subprocess
import sys
import tempfile
import time

RATES = (22050, 44100, 48000, 96000)
GENRES = ("Rock", "Ambient", "House", "Drum & Bass")
FIELDS = ("duration", "rate", "channels", "bits", "title", "artist", "album", "genre", "comment", "tempo")
# A frame of the codings whose length the programs estimate or count in packets, in seconds; else a millisecond.
COARSE = {"mp3": 1152, "ogg": 2048, "opus": 960, "m4a": 1024, "aac": 1024}

MUTAGEN = r"""
import json, os, sys, mutagen
EASY = {"title": ("title", "TIT2", "\xa9nam"), "artist": ("artist", "TPE1", "\xa9ART"), "album": ("album", "TALB", "\xa9alb"), "genre": ("genre", "TCON", "\xa9gen"),
        "comment": ("comment", "description", "COMM", "\xa9cmt"), "tempo": ("bpm", "TBPM", "tmpo")}
def first(tags, names):
    for key in tags.keys() if tags is not None else ():
        if key.lower() in [name.lower() for name in names] or key[:4] == "COMM" == names[-1][:4] or (key.startswith("COMM") and "COMM" in names):
            value = tags[key]
            value = value if isinstance(value, list) else getattr(value, "text", [value])
            return str(value[0]) if value else None
for folder, folders, names in os.walk(sys.argv[1]):
    for name in names:
        path = os.path.join(folder, name)
        try:
            file = mutagen.File(path)
        except mutagen.MutagenError:
            continue
        if file is not None:
            info = file.info
            print(json.dumps({"path": path, "duration": info.length, "rate": getattr(info, "sample_rate", None), "channels": getattr(info, "channels", None),
                              "bits": getattr(info, "bits_per_sample", None), **{key: first(file.tags, names) for key, names in EASY.items()}}))
"""


def tags_of(number):
    words = random.Random(number)
    return {"title": f"Take {number} é", "artist": words.choice(("Anna Berg", "Übung", "The Pines")), "album": f"Sessions {number % 17}",
            "genre": words.choice(GENRES), "comment": f"made for a test, {number}", "tempo": str(words.randint(60, 180))}


def sound_of(number):
    """Rate, channels and seconds of what is encoded."""
    rate = RATES[number // 16 % 4]
    return rate, 1 + number // 7 % 2, round((0.3 + (number * 37 % 100) / 125) * rate) / rate


def as_made(path):
    """What was made, of a copy of the file with the number that its name ends with."""
    number = int(path.stem.rpartition("-")[2])
    rate, channels, seconds = sound_of(number)
    rates = {"mp3": min(rate, 48000), "opus": 48000}
    return common(path, duration=seconds, rate=rates.get(path.suffix[1:], rate), channels=channels,
                  title=tags_of(number)["title"] if path.suffix != ".caf" else None)


def make(folder, number):
    """One file, of the format that is next in turn, by the program that people make it with."""
    rate, channels, seconds = sound_of(number)
    tags, made = tags_of(number), folder / f"source-{number}.wav"

    def run(*command):
        subprocess.run([str(word) for word in command], check=True, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)

    def encode(name, *options, **more):
        words = itertools.chain.from_iterable(("-metadata", f"{key}={value}") for key, value in {**tags, **more}.items() if key != "tempo")
        run("ffmpeg", "-v", "error", "-y", "-i", made, *options, *words, folder / name)
        return folder / name

    run("sox", "-n", "-r", rate, "-c", channels, "-b", "16", made, "synth", f"{seconds:.9f}", "pluck", 40 + number % 40, "gain", "-6")
    path = folder / f"{number:04}"
    kind = number % 16
    comments = [f"{key.upper()}={value}" for key, value in {**tags, "bpm": tags["tempo"]}.items() if key != "tempo"]
    try:
        if kind in (0, 1, 2):
            return encode(path.name + ".wav", "-c:a", ("pcm_s16le", "pcm_s24le", "pcm_f32le")[kind])
        if kind in (3, 4):
            return encode(path.name + ".aiff", "-c:a", ("pcm_s16be", "pcm_s24be")[kind - 3], *(("-write_id3v2", "1") if kind == 4 else ()))
        if kind == 5:
            return encode(path.name + ".caf", "-c:a", "pcm_s16be")
        if kind in (6, 7):
            run("lame", "--quiet", *(("-V2",) if kind == 6 else ("-b", "128")), "--tt", tags["title"], "--ta", tags["artist"], "--tl", tags["album"],
                "--tg", tags["genre"], "--tc", tags["comment"], "--tv", f"TBPM={tags['tempo']}", "--id3v2-only", "--id3v2-utf16", made, f"{path}.mp3")
            return path.with_suffix(".mp3")
        if kind in (8, 9):
            run("flac", "--silent", "-f", *("--tag=" + comment for comment in comments), "-o", f"{path}.flac", made)
            return path.with_suffix(".flac")
        if kind in (10, 11):
            run("oggenc", "-Q", "--utf8", *itertools.chain.from_iterable(("-c", comment) for comment in comments), "-o", f"{path}.ogg", made)
            return path.with_suffix(".ogg")
        if kind == 12:
            run("opusenc", "--quiet", *itertools.chain.from_iterable(("--comment", comment) for comment in comments), made, f"{path}.opus")
            return path.with_suffix(".opus")
        if kind == 13:
            run("wavpack", "-q", "-y", *itertools.chain.from_iterable(("-w", comment) for comment in comments), made, "-o", f"{path}.wv")
            return path.with_suffix(".wv")
        if kind == 14:
            return encode(path.name + ".m4a", "-c:a", "aac")
        return encode(path.name + ".m4a", "-c:a", "alac")
    finally:
        made.unlink()


def make_files(folder, count, different):
    """Files in folders of 200."""
    originals, paths = folder.parent / "originals", []
    originals.mkdir()
    made = [make(originals, number) for number in range(min(count, different))]
    for number in range(count):
        source = made[number % len(made)]
        place = folder / f"{number // 200:04}" / f"{number:05}-{source.name}"
        place.parent.mkdir(parents=True, exist_ok=True)
        shutil.copy(source, place)
        paths.append(place)
    return paths[:len(made)]


def number(text):
    try:
        value = float(str(text).split(" / ")[0])
        return value if math.isfinite(value) else None
    except ValueError:
        return None


def common(path, **values):
    """A record with the fields that are known, numbers as numbers."""
    record = {"path": str(path)}
    for key, value in values.items():
        if key in ("duration", "rate", "channels", "bits", "tempo"):
            value = number(value) if value is not None else None
            value = None if value == 0 and key != "duration" else value
        if value not in (None, ""):
            record[key] = value
    return record


def by_ktfiles(text):
    for line in map(json.loads, text.splitlines()):
        if "state" in line:
            yield common(line["path"], duration=line.get("durationSeconds"), rate=line.get("sampleRate"), channels=line.get("channels"),
                         bits=line.get("bitsPerSample") or line.get("sourceBits"), **{key: line.get(key) for key in ("title", "artist", "album", "genre", "comment", "tempo")})


def by_exiftool(text):
    for line in json.loads(text):
        def first(*keys, line=line):
            return next((line[key] for key in keys if key in line), None)
        rate = first("SampleRate", "AudioSampleRate")
        if line.get("FileType") == "MP3":  # a code, in what the program writes for programs
            rate = None
        yield common(line["SourceFile"], duration=line.get("Duration"), rate=rate,
                     channels=first("NumChannels", "Channels", "AudioChannels"), bits=first("BitsPerSample", "SampleSize", "AudioBitsPerSample"),
                     title=first("Title", "Name"), artist=first("Artist", "Author"), album=first("Album", "Product"), genre=line.get("Genre"),
                     comment=first("Comment", "Annotation", "Description"), tempo=first("BeatsPerMinute", "Bpm"))


def by_mediainfo(text):
    for media in (each["media"] for each in json.loads(text) if each.get("media")):
        tracks = collections.defaultdict(dict)
        for track in media["track"]:
            tracks[track["@type"]].update(track)
        general, audio = tracks["General"], tracks["Audio"]
        yield common(media["@ref"], duration=audio.get("Duration") or general.get("Duration"), rate=audio.get("SamplingRate"), channels=audio.get("Channels"),
                     bits=audio.get("BitDepth"), title=general.get("Title"), artist=general.get("Performer"), album=general.get("Album"),
                     genre=general.get("Genre"), comment=general.get("Comment") or general.get("Description"), tempo=general.get("BPM"))


def by_mutagen(text):
    for line in map(json.loads, text.splitlines()):
        yield common(**line)


def is_same(field, suffix, ours, theirs, rate):
    if field == "duration":
        return abs(ours - theirs) <= max(0.001, COARSE.get(suffix, 0) / (rate or 44100)) + 0.0005
    if isinstance(ours, float) or isinstance(theirs, float):
        return number(theirs) is not None and abs(number(ours) - number(theirs)) < 0.005
    return str(ours).strip() == str(theirs).strip()


def differences(ours, theirs):
    """{(field, suffix): [(path, ours, theirs)]} of fields that both say."""
    found, compared = collections.defaultdict(list), 0
    for path, record in theirs.items():
        mine, suffix = ours.get(path), pathlib.Path(path).suffix[1:]
        for field in FIELDS if mine else ():
            if field in mine and field in record:
                compared += 1
                if not is_same(field, suffix, mine[field], record[field], mine.get("rate")):
                    found[field, suffix].append((path, mine[field], record[field]))
    return compared, found


def missing(ours, theirs):
    """{(field, suffix): [(path, theirs)]} of what only the other one says."""
    found = collections.defaultdict(list)
    for path, record in theirs.items():
        for field in FIELDS:
            if field in record and field not in ours.get(path, {}):
                found[field, pathlib.Path(path).suffix[1:]].append((path, record[field]))
    return found


def measured(command, output=subprocess.DEVNULL):
    """Wall and processor seconds."""
    before, start = resource.getrusage(resource.RUSAGE_CHILDREN), time.monotonic()
    subprocess.run(command, stdout=output, stderr=subprocess.DEVNULL, check=False)
    wall, after = time.monotonic() - start, resource.getrusage(resource.RUSAGE_CHILDREN)
    return wall, after.ru_utime + after.ru_stime - before.ru_utime - before.ru_stime


def programs(ktfiles, folder, database):
    return {"ktfiles index --no-overview": [ktfiles, "index", "--no-overview", folder, "--db", database], "ktfiles index": [ktfiles, "index", folder, "--db", database],
            "mutagen": ["/usr/bin/python3", "-c", MUTAGEN, folder], "mediainfo": ["mediainfo", "--Output=JSON", folder], "exiftool": ["exiftool", "-r", "-json", folder]}


# Who is right where a program says something else, by program, field and suffix; "*" is any field. The maker of the files knows what
# was made: where the index says the same, it is right.
LATIN = "the index: the text is UTF-8, as the program that made the file writes it, and is taken for an older encoding"
JUDGED = {
    **{("exiftool", field, "wav"): LATIN for field in ("title", "artist")},
    **{("exiftool", field, "aiff"): LATIN for field in ("title", "artist")},
    **{("mediainfo", field, suffix): LATIN for field in ("title", "artist") for suffix in ("wav", "aiff")},
    ("exiftool", "duration", "wav"): "the index: exiftool divides the size of the file, with its other chunks, by the rate of bytes",
    ("exiftool", "duration", "mp3"): "the index: silence that the encoder added is no sound; exiftool estimates from the rate of bits",
    ("exiftool", "duration", "ogg"): "the index: exiftool estimates from the rate of bits",
    ("mediainfo", "duration", "mp3"): "the index: silence that the encoder added is no sound; mediainfo counts it",
    ("mediainfo", "duration", "caf"): "the index, which says what was made",
    ("mediainfo", "duration", "wv"): "the index: mediainfo reads the first block only",
    ("exiftool", "*", "caf"): "the index: exiftool knows no CAF, and takes what looks like it in the sound for another format",
    ("exiftool", "rate", "opus"): "the index: Opus is decoded at 48 kHz; the other rate is that of what was encoded, for information (RFC 7845)",
    ("mediainfo", "rate", "opus"): "the index, as beside exiftool",
    ("exiftool", "channels", "m4a"): "the index: the sample entry of AAC says 2 always, the configuration of the decoder says how many there are",
    ("mutagen", "channels", "m4a"): "the index, as beside exiftool",
    **{(program, "no bits", "m4a"): "the index: AAC has no bits; the sample entry says 16 always" for program in ("exiftool", "mutagen")},
}


def verdict(program, field, suffix):
    return next((JUDGED[key] for key in ((program, field, suffix), (program, "*", suffix)) if key in JUDGED), None)


def tell_fields(program, ours, theirs, tell):
    """Lists what differs; how many differences nobody has judged."""
    compared, found = differences(ours, theirs)
    unjudged = 0
    tell(f"{program}: {compared} values compared, {sum(map(len, found.values()))} differ")
    for (field, suffix), examples in sorted(found.items()):
        path, mine, other = examples[0]
        words = verdict(program, field, suffix)
        unjudged += words is None
        tell(f"  {field} of {suffix}, {len(examples)} times: {mine!r}, {program} {other!r}: {words or 'NOT JUDGED: ' + path}")
    for (field, suffix), examples in sorted(missing(ours, theirs).items()):
        words = verdict(program, "no " + field, suffix)
        unjudged += words is None
        tell(f"  {field} of {suffix} is not in the index, {len(examples)} times: {program} {examples[0][1]!r}: {words or 'NOT JUDGED: ' + examples[0][0]}")
    return unjudged


def compare(ktfiles, folder, paths, tell=print):
    """Compares what all programs say of the files below a folder, as far as they are among `paths`; how many differences are not judged."""
    environment = {**os.environ, "LC_ALL": "C.UTF-8"}

    def output(*command):
        return subprocess.run([str(word) for word in command], stdout=subprocess.PIPE, stderr=subprocess.DEVNULL, env=environment, check=False).stdout.decode()

    names = [str(path) for path in paths]

    def chosen(records):
        return {record["path"]: record for record in records if record["path"] in names}

    listed = "\n".join(names)
    records = subprocess.run([ktfiles, "index", "--records", "--no-overview", "--quiet", "--files-from", "-"], input=listed.encode(), stdout=subprocess.PIPE, check=True).stdout
    ours = chosen(by_ktfiles(records.decode()))
    if len(ours) != len(names):
        tell(f"of {len(names)} files {len(ours)} are in the index")
    theirs = {"the maker": {str(path): as_made(path) for path in paths}, "exiftool": chosen(by_exiftool(output("exiftool", "-n", "-json", *names))), "mediainfo": chosen(by_mediainfo(output("mediainfo", "--Output=JSON", *names)))}
    if subprocess.run(["/usr/bin/python3", "-c", "import mutagen"], capture_output=True, check=False).returncode == 0:
        theirs["mutagen"] = chosen(by_mutagen(output("/usr/bin/python3", "-c", MUTAGEN, folder)))
    return abs(len(ours) - len(names)) + sum(tell_fields(program, ours, records, tell) for program, records in theirs.items())


def tell_rates(ktfiles, folder, count, rounds):
    database = folder.parent / "judges.db"
    best = {}
    for _ in range(rounds):
        for name, command in programs(ktfiles, folder, database).items():
            for place in folder.parent.glob("judges.db*"):
                place.unlink()
            times = measured([str(word) for word in command])
            best[name] = min(best.get(name, times), times)
    for name, (wall, processor) in best.items():
        print(f"{name:30} {count / wall:9.0f} files/s  {wall:7.2f} s  {processor:7.2f} s of processors  {1e6 * processor / count:7.0f} µs a file")


def main():
    parser = argparse.ArgumentParser(description=__doc__, formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument("ktfiles")
    parser.add_argument("--files", type=int, default=20_000)
    parser.add_argument("--different", type=int, default=320)
    parser.add_argument("--rounds", type=int, default=3)
    parser.add_argument("--folder", help="where the files are made; by default a temporary folder")
    parser.add_argument("--fields-only", action="store_true")
    arguments = parser.parse_args()
    with tempfile.TemporaryDirectory(dir=arguments.folder) as place:
        folder = pathlib.Path(place).resolve() / "library"
        folder.mkdir()
        paths = make_files(folder, arguments.different if arguments.fields_only else arguments.files, arguments.different)
        if not arguments.fields_only:
            tell_rates(arguments.ktfiles, folder, arguments.files, arguments.rounds)
        sys.exit(1 if compare(arguments.ktfiles, folder, paths) else 0)


if __name__ == "__main__":
    main()
