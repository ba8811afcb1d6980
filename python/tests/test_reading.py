"""Sound as arrays: judged by libsndfile (soundfile), the standard library's wave, and sox."""

import pathlib
import subprocess
import wave

import ktfiles
import numpy as np
import pytest
import soundfile


@pytest.mark.parametrize(
    "name, subtype",
    [
        ("a.wav", "PCM_U8"),
        ("a.wav", "PCM_16"),
        ("a.wav", "PCM_24"),
        ("a.wav", "PCM_32"),
        ("a.wav", "FLOAT"),
        ("a.wav", "DOUBLE"),
        ("a.aiff", "PCM_16"),
        ("a.caf", "PCM_24"),
        ("a.rf64", "PCM_24"),
        ("a.w64", "PCM_16"),
        ("a.flac", "PCM_16"),
        ("a.flac", "PCM_24"),
    ],
)
@pytest.mark.parametrize("channels", [1, 2, 5])
def test_whole_files_are_what_libsndfile_reads(sound, name, subtype, channels):
    path = sound(name, subtype, channels)
    expected, rate = soundfile.read(path, dtype="float32", always_2d=True)
    with ktfiles.open(path) as f:
        assert (f.sample_rate, f.channels, f.frames) == (rate, channels, len(expected))
        found = f.read()
    assert found.dtype == np.float32 and found.shape == expected.shape and found.flags["C_CONTIGUOUS"]
    np.testing.assert_allclose(found, expected, atol=1e-7 if subtype == "PCM_32" else 0)


def test_samples_are_those_of_the_wave_module(media):
    path = media / "tone-16.wav"
    with wave.open(str(path)) as w:
        stored = np.frombuffer(w.readframes(w.getnframes()), "<i2")
        rate = w.getframerate()
    with ktfiles.open(path) as f:
        assert f.sample_rate == rate
        np.testing.assert_array_equal(f.read()[:, 0] * 32768, stored)


def test_parts_and_blocks_are_those_of_the_whole(sound):
    for path in sound("a.wav"), sound("a.flac"):
        with ktfiles.open(path) as f:
            whole = f.read()
            assert len(whole) == 10000
            for start, frames in (0, 1), (9999, 1), (5000, 100), (17, 4097), (0, 0), (123, None):
                end = None if frames is None else start + frames
                np.testing.assert_array_equal(f.read(start, frames), whole[start:end])
            # Past the end there is less, and then nothing.
            assert f.read(9990, 100).shape == (10, 2)
            assert f.read(10000).shape == (0, 2) and f.read(2**62, 2**62).shape == (0, 2)
            blocks = list(f.blocks(4096))
            assert [len(block) for block in blocks] == [4096, 4096, 1808]
            np.testing.assert_array_equal(np.concatenate(blocks), whole)
            np.testing.assert_array_equal(np.concatenate(list(f.blocks(7, 20, 50))), whole[20:50])
            assert not list(f.blocks(10, 20, 20))


def test_long_compressed_sound_is_the_same_by_several_threads(sound):
    path = sound("a.flac", "PCM_24", frames=1_200_000)
    expected = soundfile.read(path, dtype="float32", always_2d=True)[0]
    for threads in 1, 2:
        with ktfiles.open(path, threads=threads) as f:
            np.testing.assert_array_equal(f.read(), expected)
            np.testing.assert_array_equal(f.read(100_001, 1_050_000), expected[100_001:1_150_001])
            assert f.missing_frames == 0
    content = bytearray(path.read_bytes())
    content[len(content) * 3 // 4] ^= 0xFF
    path.write_bytes(content)
    for threads in 1, 2:
        with ktfiles.open(path, threads=threads) as f:
            found = f.read()
            different = (found != expected).any(axis=1)
            assert 0 < different.sum() <= f.missing_frames < 10000 and not found[different].any()
            f.read()
            assert f.missing_frames < 10000


def test_flac_files_out_of_the_ordinary(sound, tmp_path):
    """What stands around the frames, or is wrong in one, changes nothing in the others."""
    wav, path = sound("a.wav", frames=300_000), tmp_path / "a.flac"
    expected = soundfile.read(wav, dtype="float32", always_2d=True)[0]
    coded = {}
    for size in 192, 4096, 4608, 65535:
        subprocess.run(["flac", "-s", "-f", "--lax", "-b", str(size), "-o", path, wav], check=True)
        coded[size] = path.read_bytes()
    content = coded[4096]
    id3 = b"ID3\4\0\0\0\0\0\x0a" + bytes(10)
    for whole in content, content + b"TAG" + bytes(125), id3 + content, content + b"\xff\xf8" * 50, *coded.values():
        path.write_bytes(whole)
        with ktfiles.open(path) as f:
            np.testing.assert_array_equal(f.read(), expected)
            np.testing.assert_array_equal(f.read(4000, 10), expected[4000:4010])
            np.testing.assert_array_equal(f.read(0, 10), expected[:10])
            assert f.missing_frames == 0
    # The header of a frame in the midst, and what is in one.
    headers = [at for at in range(8192, len(content) - 1) if content[at : at + 2] == b"\xff\xf8" and content[at + 2] >> 4 == 12]
    for at in headers[len(headers) // 2], headers[len(headers) // 2] + 1000:
        path.write_bytes(content[:at] + b"\0\0\0" + content[at + 3 :])
        with ktfiles.open(path) as f:
            found = f.read()
            different = (found != expected).any(axis=1)
            assert found.shape == expected.shape and 0 < different.sum() <= 2 * 4096 and not found[different].any()
            assert f.missing_frames >= different.sum()
    # Cut off: what is there.
    path.write_bytes(content[: len(content) // 2])
    with ktfiles.open(path) as f:
        found = f.read()
        assert 100_000 < len(found) < 200_000
        np.testing.assert_array_equal(found, expected[: len(found)])
    # A header that promises far more than there is.
    path.write_bytes(content[:21] + bytes([content[21] | 15]) + b"\xff\xff\xff\xff" + content[26:])
    with ktfiles.open(path) as f:
        assert len(f.read()) == 300_000


def test_an_open_file_stays_the_one_that_was_opened(sound, tmp_path):
    path = sound("a.wav", frames=30_000)
    with ktfiles.open(path) as f:
        expected = soundfile.read(path, dtype="float32")[0]
        other = sound("b.wav", frames=20_000)
        other.replace(path)
        np.testing.assert_array_equal(f.read(), expected)


def test_arrays_are_the_callers(sound):
    with ktfiles.open(sound("a.wav")) as f:
        first = f.read(5000, 100)
        kept = first.copy()
        first[:] = 0
        np.testing.assert_array_equal(f.read(5000, 100), kept)
    assert kept.any()


def test_what_makes_no_sense_is_a_value_error(sound):
    path = sound("a.wav")
    f = ktfiles.open(path)
    for read in lambda: f.read(-1), lambda: f.read(0, -1), lambda: f.blocks(0), lambda: f.blocks(1, -1):
        with pytest.raises(ValueError):
            read()
    for options in {"sample_rate": 0}, {"sample_rate": float("nan")}, {"channels": 0}:
        with pytest.raises(ValueError):
            ktfiles.open(path, **options)
    with pytest.raises(TypeError):
        f.read("x")
    with pytest.raises(ktfiles.Error):
        ktfiles.open(path, sample_rate=1e12)


def test_a_closed_file_is_of_no_use(sound):
    f = ktfiles.open(sound("a.wav"))
    blocks = f.blocks(100)
    next(blocks)
    with f:
        pass
    assert f.closed
    for use in f.read, f.blocks, f.__enter__, lambda: f.chunks, lambda: f.info, lambda: next(blocks), f.overview:
        with pytest.raises(ValueError):
            use()
    f.close()
    assert f.frames == 10000 and "closed" in repr(f)


def test_other_rates_and_channels(sound):
    path = sound("a.wav", channels=2)
    expected = soundfile.read(path, dtype="float32")[0]
    with ktfiles.open(path, channels=1) as f:
        np.testing.assert_allclose(f.read()[:, 0], expected.mean(axis=1), atol=1e-7)
    with ktfiles.open(path, channels=4) as f:
        found = f.read()
        np.testing.assert_array_equal(found[:, :2], expected)
        assert not found[:, 2:].any()
    with ktfiles.open(path, sample_rate=22050) as f:
        assert (f.sample_rate, f.frames, f.file_sample_rate, f.file_frames) == (22050, 5000, 44100, 10000)
        assert f.duration == pytest.approx(10000 / 44100, abs=1e-4)
        halved = f.read()
    assert len(halved) == 5000


def test_a_tone_at_another_rate_is_that_of_sox(tmp_path):
    tone, other = tmp_path / "tone.wav", tmp_path / "other.wav"
    subprocess.run(["sox", "-n", "-r", "44100", "-b", "24", tone, "synth", "0.5", "sine", "997", "gain", "-6"], check=True)
    subprocess.run(["sox", tone, "-r", "48000", other], check=True)
    expected = soundfile.read(other, dtype="float32", always_2d=True)[0]
    with ktfiles.open(tone, sample_rate=48000) as f:
        found = f.read()
    assert len(found) == len(expected)
    np.testing.assert_allclose(found[500:-500], expected[500:-500], atol=1e-4)


@pytest.mark.parametrize("codec, extension", [("libmp3lame", "mp3"), ("aac", "m4a"), ("libvorbis", "ogg"), ("alac", "m4a")])
def test_compressed_files_are_read_too(sound, tmp_path, codec, extension):
    coded = tmp_path / f"a.{extension}"
    source = sound("a.wav", channels=1, frames=44100)
    subprocess.run(["ffmpeg", "-loglevel", "error", "-i", source, "-c:a", codec, coded], check=True)
    with ktfiles.open(coded) as f:
        found = f.read()
        assert found.shape == (f.frames, 1) and 44100 <= f.frames < 44100 + 3000
        assert abs(found).max() > 0.5
        np.testing.assert_array_equal(f.read(30000, 100), found[30000:30100])


def test_descriptions_are_the_commands(media, command):
    import json

    files = sorted(path for path in media.iterdir() if path.suffix in (".wav", ".aiff", ".aifc", ".caf"))
    told = json.loads(command("info", "--json", *files))
    assert len(told) == len(files) > 10
    for path, record in zip(files, told):
        with ktfiles.open(path) as f:
            info = f.info
            assert f.container == record["container"]
        assert {name: record[name] for name in info} == pytest.approx(info)
        missing = set(record) - set(info)
        assert missing <= {"path", "containerName", "coding", "bitRate", "channelLayout", "promisedFrames", "typeByName",
                           "modified", "stereoPartner", "stereoPartnerExists"}


def test_paths_of_every_kind(sound, tmp_path, monkeypatch):
    path = sound("a.wav")
    odd = tmp_path / "caf\udce9 \udcff.wav"  # names that are not UTF-8
    odd.write_bytes(path.read_bytes())
    monkeypatch.chdir(tmp_path)
    for name in path, str(path), bytes(path), "a.wav", b"a.wav", pathlib.Path("./a.wav"), odd, str(odd), bytes(odd), "~/../a.wav":
        if name == "~/../a.wav":  # no home folder: a name like any other
            (tmp_path / "~").mkdir()
        with ktfiles.open(name) as f:
            assert f.frames == 10000
            assert len(f.chunks) and len(ktfiles.overview(name)) == 40
    with pytest.raises(ValueError):
        ktfiles.open("a\0.wav")
    with pytest.raises(TypeError):
        ktfiles.open(3)
    with pytest.raises(ktfiles.NotFoundError) as caught:
        ktfiles.open(str(odd) + "x")
    assert caught.value.filename == str(odd) + "x"


def test_a_folder_is_told_as_one(tmp_path, sound):
    for read in ktfiles.open, ktfiles.meta, ktfiles.overview, ktfiles.adm, lambda path: ktfiles.chunks(path).list():
        with pytest.raises(IsADirectoryError) as caught:
            read(tmp_path)
        assert (caught.value.filename, caught.value.status) == (str(tmp_path), -50)
    with pytest.raises(ktfiles.Error) as caught:
        ktfiles.open("/dev/null")
    assert not isinstance(caught.value, IsADirectoryError) and caught.value.strerror == "not a file"
    for channels in 0, 2**40:
        with pytest.raises(ValueError):
            ktfiles.open(sound("a.wav"), channels=channels)
