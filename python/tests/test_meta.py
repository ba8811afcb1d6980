"""Metadata by field: judged by the command, mutagen and the standard library."""

import json
import subprocess

import ktfiles
import pytest


def test_fields_are_those_of_the_command(media, command, sound, tmp_path):
    coded = tmp_path / "a.mp3"
    subprocess.run(["ffmpeg", "-loglevel", "error", "-i", sound("a.wav"), "-metadata", "title=Ärger", coded], check=True)
    files = [path for path in sorted(media.iterdir()) if path.suffix in (".wav", ".aiff", ".aifc", ".caf")] + [coded]
    names = 0
    for path in files:
        (record,) = json.loads(command("meta", "--json", path))
        assert ktfiles.meta_fields(path) == record["fields"]
        assert ktfiles.meta(path) == {field["field"]: field["value"] for field in record["fields"]}
        names += len(record["fields"])
    assert names > 20
    assert "Ärger" in ktfiles.meta(coded).values()


def test_groups_are_chosen(media):
    path = media / "kick-24-rf64.wav"
    assert set(ktfiles.meta(path, "info")) == {"info.INAM", "info.ISFT"}
    assert set(ktfiles.meta(path, "info", "BEXT")) == set(ktfiles.meta(path))
    assert ktfiles.meta(path, "cart") == {}


def test_tags_of_flac_are_those_of_mutagen(sound):
    mutagen = pytest.importorskip("mutagen")
    path = sound("a.flac")
    file = mutagen.File(path)
    file["TITLE"], file["ARTIST"] = "Bell", ["One", "Two"]
    file.save()
    values = list(ktfiles.meta(path).values())
    assert {"Bell", "One", "Two"} <= set(values)


def test_what_is_no_audio_is_an_error(tmp_path):
    path = tmp_path / "a.wav"
    for content in b"", b"no sound", b"RIFF\0\0\0\0":
        path.write_bytes(content)
        with pytest.raises(ktfiles.Error):
            ktfiles.meta(path)
