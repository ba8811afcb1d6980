"""Makes the project package examples/media/Sketch.fuguex: make_project.py FOLDER

Two alternatives, one of them with a backup; the media are copies of files in FOLDER, but for one that is missing.
"""
import os
import pathlib
import plistlib
import shutil
import sys

media = pathlib.Path(sys.argv[1])
package = media / "Sketch.fuguex"
shutil.rmtree(package, ignore_errors=True)


def property_list(content):
    """As the library writes it: without a DOCTYPE."""
    return b"".join(line for line in plistlib.dumps(content).splitlines(keepends=True) if not line.startswith(b"<!DOCTYPE"))


def write(name, content):
    path = package / name
    path.parent.mkdir(parents=True, exist_ok=True)
    path.write_bytes(content if isinstance(content, bytes) else property_list(content))
    os.utime(path, (1763700000, 1763700000))


write("Resources/ProjectInformation.plist", {
    "BundleVersion": 2,
    "VariantNames": {"0": "Sketch", "1": "Sketch, slower"},
    "VariantNamesV2": {"0": "{PROJECT_NAME}", "1": "{PROJECT_NAME}, slower"},
    "ActiveVariant": 1,
    "HasProjectFolder": False,
    "LastSavedFrom": "make_project 1.0",
})
for index, tempo, data in ((0, 120, b"first idea"), (1, 96, b"second idea")):
    write(f"Alternatives/{index:03}/ProjectData", data)
    write(f"Alternatives/{index:03}/MetaData.plist", {
        "SampleRate": 44100, "BeatsPerMinute": tempo, "SongKey": "F#", "SongGenderKey": "minor",
        "SongSignatureNumerator": 4, "SongSignatureDenominator": 4, "NumberOfTracks": 3 + index, "Version": 1,
        "AudioFiles": ["Audio Files/tone.wav", "/elsewhere/Sketch.fuguex/Media/Audio Files/kick.wav"],
        "ImpulsResponsesFiles": ["Media/Impulse Responses/hall.aiff"][:index],
    })
write("Alternatives/001/Project File Backups/00/ProjectData", b"second idea, before lunch")
write("Media/Audio Files/tone.wav", (media / "tone-16.wav").read_bytes())
write("Media/Audio Files/kick.wav", (media / "kick-24-rf64.wav").read_bytes())
