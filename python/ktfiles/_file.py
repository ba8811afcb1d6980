"""Sound files, read as NumPy arrays."""

from __future__ import annotations

import os
from types import TracebackType
from typing import TYPE_CHECKING, Any, Dict, Iterator, Optional, Type

from . import _core
from ._chunks import Chunks
from ._overview import Overview, overview
from ._paths import Path, encoded

if TYPE_CHECKING:
    import numpy as np
    import numpy.typing as npt

_MOST_CHANNELS = 1024


class AudioFile:
    """A sound file that is open for reading; `ktfiles.open` makes it.

    Rate, channels and frames are those that `read` gives: of the file, unless others were asked for. Any thread may use
    it; reads of one file take turns, reads of several run side by side.
    """

    def __init__(
        self,
        path: Path,
        *,
        sample_rate: Optional[float] = None,
        channels: Optional[int] = None,
        threads: int = 1,
    ) -> None:
        if sample_rate is not None and not sample_rate > 0:
            raise ValueError("sample_rate is not positive")
        if channels is not None and not 1 <= channels <= _MOST_CHANNELS:
            raise ValueError(f"channels is not 1 to {_MOST_CHANNELS}")
        if threads < 1:
            raise ValueError("threads is not positive")
        given = encoded(path)
        # Wherever the process goes later.
        self._path = given if given.startswith(b"/") or not given else os.path.join(os.getcwdb(), given)
        self.name: Path = path
        """The path as it was given."""
        self._reader = _core.Reader(given, sample_rate, channels, threads)
        self._info: Optional[Dict[str, Any]] = None

    @property
    def sample_rate(self) -> int:
        """Frames per second, rounded."""
        return round(self._reader.sample_rate)

    @property
    def exact_sample_rate(self) -> float:
        """Frames per second, of files that hold a fraction too."""
        return self._reader.sample_rate

    @property
    def channels(self) -> int:
        return self._reader.channels

    @property
    def frames(self) -> int:
        return self._reader.frames

    @property
    def duration(self) -> float:
        """In seconds."""
        return self._reader.frames / self._reader.sample_rate

    @property
    def file_sample_rate(self) -> float:
        """The file's own rate, whatever was asked for."""
        return self._reader.file_sample_rate

    @property
    def file_channels(self) -> int:
        """The file's own channels, whatever was asked for."""
        return self._reader.file_channels

    @property
    def file_frames(self) -> int:
        """The file's own frames, whatever rate was asked for."""
        return self._reader.file_frames

    @property
    def missing_frames(self) -> int:
        """Of the frames read so far, those that are damaged or not there: they were read as silence."""
        return self._reader.missing_frames

    @property
    def container(self) -> str:
        """The four characters of the container: RIFF, RF64, BW64, FORM, caff, flac, MPG3."""
        return str(self.info["container"])

    @property
    def info(self) -> Dict[str, Any]:
        """What the file is, under the names that `ktfiles info --json` has."""
        self._require_open()
        if self._info is None:
            self._info = _core.describe(self._path)
        return dict(self._info)

    @property
    def chunks(self) -> Chunks:
        """The chunks of the container, which can be changed: `f.chunks["bext"]`, `f.chunks.add("note", b"...")`.

        What is open here stays the file as it was opened.
        """
        self._require_open()
        return Chunks(self._path)

    def read(self, start: int = 0, frames: Optional[int] = None) -> npt.NDArray[np.float32]:
        """`frames` frames from `start` on, or all that follow, as floats in [-1, 1): an array (frames, channels).

        Fewer at the end of the file, and none past it.
        """
        return self._reader.read(start, frames)

    def blocks(
        self, frames: int = 65536, start: int = 0, stop: Optional[int] = None
    ) -> Iterator[npt.NDArray[np.float32]]:
        """The frames from `start` to `stop`, or the end, in arrays of `frames` frames; the last may have fewer."""
        if frames < 1:
            raise ValueError("frames is not positive")
        if start < 0:
            raise ValueError("start is negative")
        self._require_open()
        return self._blocks(frames, start, self.frames if stop is None else min(stop, self.frames))

    def _blocks(self, frames: int, start: int, stop: int) -> Iterator[npt.NDArray[np.float32]]:
        while start < stop:
            block = self.read(start, min(frames, stop - start))
            if len(block) == 0:
                return
            yield block
            start += len(block)

    def overview(self) -> Overview:
        """Of each 256 frames of every channel the lowest and the highest; `ktfiles.overview` says more."""
        self._require_open()
        return overview(self._path)

    def close(self) -> None:
        """Closes the file; waits for a read that is under way. Once more does nothing."""
        self._reader.close()

    @property
    def closed(self) -> bool:
        return self._reader.closed

    def _require_open(self) -> None:
        if self._reader.closed:
            raise ValueError("the file is closed")

    def __enter__(self) -> AudioFile:
        self._require_open()
        return self

    def __exit__(
        self,
        kind: Optional[Type[BaseException]],
        error: Optional[BaseException],
        traceback: Optional[TracebackType],
    ) -> None:
        self.close()

    def __repr__(self) -> str:
        state = "closed" if self.closed else f"{self.frames} frames, {self.sample_rate} Hz, {self.channels} channels"
        return f"<ktfiles.AudioFile {self.name!r}, {state}>"


def open(
    path: Path,
    *,
    sample_rate: Optional[float] = None,
    channels: Optional[int] = None,
    threads: int = 1,
) -> AudioFile:
    """Opens a sound file of any format that the library reads or decodes.

    With `sample_rate` and `channels` frames come at another rate, and in other channels: one goes to all, all are averaged
    to one, else surplus channels are left out and missing ones silent. A long read of compressed sound is decoded by `threads` threads
    at most, as far as there are processors that nothing else here is read on.
    """
    return AudioFile(path, sample_rate=sample_rate, channels=channels, threads=threads)
