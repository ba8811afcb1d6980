"""Project packages, judged by plistlib and the command."""

import json
import plistlib

import ktfiles
import pytest


def test_a_package_says_what_its_lists_say(media):
    project = ktfiles.Project(media / "Sketch.fuguex")
    with open(media / "Sketch.fuguex" / "Resources" / "ProjectInformation.plist", "rb") as f:
        info = plistlib.load(f)
    assert {name: project.info[name] for name in info if name != "VariantNamesV2"} == {
        name: value for name, value in info.items() if name != "VariantNamesV2"
    }
    first, second = project.alternatives
    assert project.active is second and (second.name, second.index) == ("Sketch, slower", 1)
    with open(media / "Sketch.fuguex" / "Alternatives" / "001" / "MetaData.plist", "rb") as f:
        metadata = plistlib.load(f)
    assert second.metadata == metadata
    assert second.tempo == metadata["BeatsPerMinute"] == 96 and second.signature == (4, 4)
    assert (second.music_key, second.mode, second.tracks, second.sample_rate) == ("F#", "minor", 4, 44100)


def test_media_and_backups_are_the_commands(media, command):
    project = ktfiles.Project(str(media / "Sketch.fuguex"))
    (record,) = json.loads(command("project", "media", "--json", media / "Sketch.fuguex"))
    assert [m._asdict() for m in project.media] == [
        {"key": m["key"], "path": m["file"], "exists": m["exists"]} for m in record["media"]
    ]
    assert [m.exists for m in project.missing] == [False]
    (record,) = json.loads(command("project", "--json", media / "Sketch.fuguex"))
    for alternative, told in zip(project.alternatives, record["alternatives"]):
        assert (alternative.key, alternative.name, alternative.active) == (told["key"], told["name"], told["active"])
        assert [b.name for b in alternative.backups] == [b["name"] for b in told["backups"]]
        assert [b.date.strftime("%Y-%m-%dT%H:%M:%SZ") for b in alternative.backups] == [b["date"] for b in told["backups"]]
        assert len(alternative.missing) == sum(m["missing"] for m in told["media"])


def test_what_is_no_package_is_an_error(tmp_path):
    with pytest.raises(ktfiles.Error, match="no project package"):
        ktfiles.Project(tmp_path)
