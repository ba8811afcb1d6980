"""ADM documents, judged by the standard library's XML parser and the command."""

import json
import xml.etree.ElementTree

import ktfiles
import numpy as np
import pytest


def test_elements_have_their_attributes_and_references(media):
    document = ktfiles.adm(media / "harbour-bw64.wav")
    (programme,) = document.programmes
    assert (programme.name, programme.language, programme.start, programme.end) == ("Evening at the harbour", "en", 0.0, 0.4)
    assert programme.labels["de"] == "Abend am Hafen"
    narration = programme.contents[0]
    (narrator,) = narration.objects
    assert narrator.gain == pytest.approx(10 ** (-3 / 20)) and narrator.start == 0.05
    track = narrator.track_uids[0]
    assert track is document["ATU_00000001"] and track.sample_rate == 8000
    channel = narrator.pack_formats[0].channel_formats[0]
    assert channel is document["AC_00031001"] and channel.type == "Objects" and len(channel.blocks) == 1
    assert "AO_1001" in document and "AO_9999" not in document
    with pytest.raises(KeyError):
        document["AO_9999"]


def test_blocks_are_arrays_of_what_the_xml_says(media):
    blocks = next(c for c in ktfiles.adm(media / "harbour.xml").channel_formats if c.id == "AC_00031002").blocks
    tree = xml.etree.ElementTree.parse(media / "harbour.xml")
    (channel,) = (e for e in tree.iter() if e.get("audioChannelFormatID") == "AC_00031002")
    written = [e for e in channel if e.tag.endswith("audioBlockFormat")]
    assert len(blocks) == len(written) == 8
    assert blocks.ids == [e.get("audioBlockFormatID") for e in written]
    for i, element in enumerate(written):
        positions = {e.get("coordinate"): float(e.text) for e in element if e.tag.endswith("position")}
        assert not blocks.cartesian[i]
        np.testing.assert_allclose(
            blocks.positions[i], [positions["azimuth"], positions["elevation"], positions.get("distance", 1)], rtol=1e-6
        )
    assert blocks.times.dtype == np.float64 and (np.diff(blocks.times) > 0).all()
    assert blocks.times[1] == 0.05 and blocks.durations[0] == 0.05 and blocks.gains[1] == pytest.approx(0.7)


def test_every_element_of_the_command_is_there(media, command):
    document = ktfiles.adm(media / "harbour.xml")
    (record,) = json.loads(command("adm", "--json", media / "harbour.xml"))
    kinds = {"programmes": "audioProgrammeID", "contents": "audioContentID", "objects": "audioObjectID",
             "packFormats": "audioPackFormatID", "channelFormats": "audioChannelFormatID",
             "streamFormats": "audioStreamFormatID", "trackFormats": "audioTrackFormatID", "trackUIDs": "audioTrackUIDID"}
    names = {"packFormats": "pack_formats", "channelFormats": "channel_formats", "streamFormats": "stream_formats",
             "trackFormats": "track_formats", "trackUIDs": "track_uids"}
    for kind, key in kinds.items():
        assert [e.id for e in getattr(document, names.get(kind, kind))] == [e[key] for e in record[kind]]
    for channel, told in zip(document.channel_formats, record["channelFormats"]):
        assert [round(t * 1e6) for t in channel.blocks.times] == [b["rtime"] for b in told["audioBlockFormat"]]


def test_what_is_wrong_is_said_with_its_place(media, tmp_path):
    broken = tmp_path / "broken.xml"
    broken.write_text((media / "harbour.xml").read_text().replace("AO_1002<", "AO_9999<"))
    with pytest.raises(ktfiles.Error, match="line 14: MissingDefinition: 'AO_9999'"):
        ktfiles.adm(broken)
    assert len(ktfiles.adm(broken, lenient=True).objects) == 4
    broken.write_text("<a><b></a>")
    with pytest.raises(ktfiles.Error, match="ParseError"):
        ktfiles.adm(broken)
    with pytest.raises(ktfiles.Error, match="axml"):
        ktfiles.adm(media / "tone-16.wav")
