"""Waveform overviews."""

from __future__ import annotations

from typing import Any, List, Optional

import numpy as np

from . import _core
from ._paths import Path, encoded

FRAMES_PER_POINT: int = _core.FRAMES_PER_POINT


class Overview(np.ndarray[Any, np.dtype[np.int8]]):
    """The lowest and the highest sample of each 256 frames of every channel: int8, (points, channels, 2).

    Full scale is 127, and silence is in every point.
    """

    sample_rate: float
    """Of the sound, in frames per second; 0 where it is not known."""
    frames: int
    """Of the sound."""

    def __array_finalize__(self, made_of: Optional[Any]) -> None:
        self.sample_rate = getattr(made_of, "sample_rate", 0.0)
        self.frames = getattr(made_of, "frames", 0)

    def __reduce__(self) -> Any:
        reduced: Any = super().__reduce__()
        make, arguments, state = reduced
        return make, arguments, (state, self.sample_rate, self.frames)

    def __setstate__(self, state: Any) -> None:
        super().__setstate__(state[0])
        self.sample_rate, self.frames = state[1:]

    def columns(self, count: int) -> Overview:
        """The same folded into at most `count` points."""
        if count < 1:
            raise ValueError("count is not positive")
        if self.ndim != 3 or len(self) <= count:
            return self
        starts = np.arange(count) * len(self) // count
        folded = np.empty((count, *self.shape[1:]), self.dtype).view(Overview)
        folded[..., 0] = np.minimum.reduceat(self[..., 0], starts)
        folded[..., 1] = np.maximum.reduceat(self[..., 1], starts)
        folded.sample_rate, folded.frames = self.sample_rate, self.frames
        return folded

    def plot(self, ax: Any = None, columns: int = 4000, **style: Any) -> List[Any]:
        """Draws the waveform on Matplotlib axes, the current ones without `ax`: a lane for each channel, over seconds.

        `style` goes to `fill_between`, whose results are returned.
        """
        if ax is None:
            import matplotlib.pyplot as pyplot  # type: ignore[import]

            ax = pyplot.gca()
        shown = self.columns(columns)
        scale = self.frames / self.sample_rate if self.sample_rate > 0 else float(len(self))
        times = (np.arange(len(shown)) + 0.5) * (scale / max(len(shown), 1))
        style.setdefault("linewidth", 0.5)
        drawn = []
        for channel in range(shown.shape[1]):
            lane = -2.0 * channel
            low, high = (np.asarray(shown[:, channel, side]) / 127.0 + lane for side in (0, 1))
            drawn.append(ax.fill_between(times, low, high, **style))
        ax.set_xlim(0, scale)
        ax.set_ylim(-2.0 * shown.shape[1] + 1, 1)
        ax.set_yticks([-2.0 * channel for channel in range(shown.shape[1])])
        ax.set_yticklabels([str(channel + 1) for channel in range(shown.shape[1])])
        ax.set_xlabel("seconds")
        return drawn


def overview(path: Path) -> Overview:
    """The overview of a sound file: every channel's lowest and highest sample of each 256 frames."""
    points, sample_rate, frames = _core.overview(encoded(path))
    made = points.view(Overview)
    made.sample_rate, made.frames = sample_rate, frames
    return made
