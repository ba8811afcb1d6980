"""Overviews, judged by NumPy over what libsndfile reads."""

import pickle

import ktfiles
import numpy as np
import pytest
import soundfile


def expected_points(path):
    samples = soundfile.read(path, dtype="float32", always_2d=True)[0]
    points = []
    for start in range(0, len(samples), 256):
        part = samples[start : start + 256]
        points.append(np.stack([part.min(axis=0), part.max(axis=0)], axis=1))
    scaled = np.rint(np.array(points) * np.float32(128))
    scaled[..., 0] = np.clip(scaled[..., 0], -127, 0)
    scaled[..., 1] = np.clip(scaled[..., 1], 0, 127)
    return scaled.astype(np.int8)


@pytest.mark.parametrize("name, subtype", [("a.wav", "PCM_U8"), ("a.wav", "PCM_16"), ("a.aiff", "PCM_24"), ("a.wav", "PCM_32"),
                                           ("a.wav", "FLOAT"), ("a.wav", "DOUBLE"), ("a.flac", "PCM_16")])
@pytest.mark.parametrize("channels", [1, 2, 3, 8])
@pytest.mark.parametrize("frames", [1, 255, 256, 50001])
def test_points_are_those_that_numpy_finds(sound, name, subtype, channels, frames):
    path = sound(name, subtype, channels, frames)
    found = ktfiles.overview(path)
    assert found.shape == ((frames + 255) // 256, channels, 2) and found.dtype == np.int8
    assert (found.sample_rate, found.frames) == (44100, frames)
    np.testing.assert_array_equal(found, expected_points(path))


def test_mono_points_are_those_of_the_command(media, command):
    import json

    for name in "tone-16.wav", "drum-8.wav", "percussion.wav":
        record = json.loads(command("overview", "--json", media / name))[0]
        np.testing.assert_array_equal(ktfiles.overview(media / name)[:, 0], np.array(record["points"]).reshape(-1, 2))


def test_columns_keep_the_extremes(sound):
    whole = ktfiles.overview(sound("a.wav", frames=100000))
    assert whole.columns(1000) is whole
    for count in 1, 7, 100, len(whole) - 1:
        folded = whole.columns(count)
        assert len(folded) == count and (folded.sample_rate, folded.frames) == (44100, 100000)
        assert (folded[..., 0].min(axis=0) == whole[..., 0].min(axis=0)).all()
        assert (folded[..., 1].max(axis=0) == whole[..., 1].max(axis=0)).all()
    again = pickle.loads(pickle.dumps(whole))
    assert (again == whole).all() and again.frames == 100000


class Axes:
    """What `plot` asks of Matplotlib's axes, kept."""

    def __init__(self):
        self.filled, self.set = [], {}

    def fill_between(self, x, low, high, **style):
        self.filled.append((x, low, high, style))
        return len(self.filled)

    def __getattr__(self, name):
        return lambda *values: self.set.setdefault(name, values)


def test_plots_have_a_lane_for_each_channel(sound):
    ax = Axes()
    overview = ktfiles.overview(sound("a.wav", frames=44100))
    assert overview.plot(ax, columns=50, color="red") == [1, 2]
    assert ax.set["set_xlim"] == (0, 1.0) and ax.set["set_ylim"] == (-3.0, 1)
    for lane, (x, low, high, style) in zip((0, -2), ax.filled):
        assert len(x) == len(low) == len(high) == 50 and 0 < x[0] < x[-1] < 1
        assert (lane - 1 <= low).all() and (low <= lane).all() and (high <= lane + 1).all() and style["color"] == "red"


def test_matplotlib_takes_a_plot(sound, tmp_path):
    matplotlib = pytest.importorskip("matplotlib")
    matplotlib.use("agg")
    import matplotlib.pyplot

    figure, ax = matplotlib.pyplot.subplots()
    ktfiles.overview(sound("a.wav")).plot(ax)
    figure.savefig(tmp_path / "a.png")
    assert (tmp_path / "a.png").stat().st_size > 1000
