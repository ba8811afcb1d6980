"""The tags of loops, of one file and of all below folders."""

from __future__ import annotations

import os
from typing import TYPE_CHECKING, Any, Callable, Deque, Dict, Iterator, List, Mapping, Optional, Set, Tuple, Union

from . import _core
from ._errors import Error, make
from ._paths import Path, encoded

if TYPE_CHECKING:
    from concurrent.futures import Future

Tags = Dict[str, Any]
"""Tags by name: numbers, texts and lists."""


def tags(path: Path) -> Tags:
    """What a file says of itself as a loop, under the names that `ktfiles tags --json` has; what it does not say is absent.

    AIFF and CAF files have loop chunks; in WAVE the chunks of samplers are read.
    """
    return _core.tags(encoded(path))


def _assignments(values: Mapping[str, Any]) -> Dict[str, Any]:
    """The values under the names of single fields: a key is a root note and a mode, a signature two numbers."""
    made: Dict[str, Any] = {}
    for name, value in values.items():
        if name == "signature":
            top, bottom = (None, None) if value is None else value.split("/") if isinstance(value, str) else value
            made["signatureTop"], made["signatureBottom"] = (None if each is None else int(each) for each in (top, bottom))
        elif name == "key":
            note, _, mode = (value or "").partition(" ")
            made["midiRootNote"] = note or None
            if mode or value is None:
                made["keyType"] = mode or None
        elif name == "descriptors" and isinstance(value, (list, tuple, set, frozenset)):
            made[name] = [str(each) for each in value]
        else:
            made[name] = value
    return made


def set_tags(
    path: Path,
    values: Optional[Mapping[str, Any]] = None,
    *,
    in_place: bool = False,
    backup: bool = False,
    keep_times: bool = False,
    timeout: Optional[float] = None,
    **named: Any,
) -> Dict[str, Tuple[Any, Any]]:
    """Sets tags of an AIFF or CAF file by name, None removes one; what is not named stays, to the byte.

        ktfiles.set_tags("loop.aiff", genre="Jazz", key="F# minor", signature="4/4", descriptors=["Dry", "Clean"])

    Returns what changed: by name the values before and after. The file is changed as `Chunks.add` does it. A value that the
    tag can never have is a ValueError.
    """
    assignments = _assignments({**(values or {}), **named})
    return _core.set_tags(encoded(path), assignments, in_place, backup, keep_times, timeout)


def remove_tags(
    path: Path,
    *,
    in_place: bool = False,
    backup: bool = False,
    keep_times: bool = False,
    timeout: Optional[float] = None,
) -> Dict[str, Tuple[Any, Any]]:
    """Removes everything that makes a loop of an AIFF or CAF file; returns what changed, as `set_tags`."""
    return _core.remove_tags(encoded(path), in_place, backup, keep_times, timeout)


_OnError = Optional[Callable[[Error], object]]


class _Walk:
    """The files below folders, each once, in the order of their names' bytes; what begins with a dot is left out.

    A link to a folder is followed when it leads out of the folders named, so that no circle is walked.
    """

    def __init__(self, roots: List[bytes], on_error: _OnError) -> None:
        self._roots = roots
        self._resolved = [os.path.realpath(root) for root in roots if os.path.isdir(root)]
        self._seen: Set[Tuple[int, int]] = set()
        self._on_error = on_error

    def __iter__(self) -> Iterator[bytes]:
        for root in self._roots:
            if os.path.isdir(root):
                yield from self._below(root)
            else:
                yield root

    def _below(self, folder: bytes) -> Iterator[bytes]:
        try:
            status = os.stat(folder)
            if (status.st_dev, status.st_ino) in self._seen:
                return
            self._seen.add((status.st_dev, status.st_ino))
            with os.scandir(folder) as found:
                entries = sorted((each for each in found if not each.name.startswith(b".")), key=lambda each: each.name)
        except OSError as error:
            if self._on_error is not None:
                self._on_error(make(-36, error.errno or 0, error.strerror or str(error), folder))
            return
        for entry in entries:
            if entry.is_dir():
                if not entry.is_symlink() or not self._is_inside(os.path.realpath(entry.path)):
                    yield from self._below(entry.path)
            elif entry.is_file() or entry.is_symlink():
                yield entry.path

    def _is_inside(self, target: bytes) -> bool:
        return any(os.path.commonpath((target, root)) == root for root in self._resolved)


_BATCH = 32


def _batches(files: Iterator[bytes]) -> Iterator[List[bytes]]:
    batch: List[bytes] = []
    for file in files:
        batch.append(file)
        if len(batch) == _BATCH:
            yield batch
            batch = []
    if batch:
        yield batch


def scan(
    folder: Union[Path, List[Path]], *, threads: Optional[int] = None, on_error: _OnError = None
) -> Iterator[Tags]:
    """Every loop below a folder, or several: its tags with its "path", as `ktfiles scan --jsonl` has them, in that order.

    Loops come while others are still looked for; files are read by `threads` threads, as many as there are processors
    without it. What cannot be read is passed over; `on_error` is called with each Error, and may raise it.
    """
    folders = folder if isinstance(folder, list) else [folder]
    roots = [encoded(each) for each in folders]
    for root in roots:
        if not os.path.exists(root):
            raise make(-43, 2, os.strerror(2), root)
    return _scan(iter(_Walk(roots, on_error)), threads or os.cpu_count() or 1, on_error)


def _scan(files: Iterator[bytes], threads: int, on_error: _OnError) -> Iterator[Tags]:
    from collections import deque
    from concurrent.futures import ThreadPoolExecutor

    pool = ThreadPoolExecutor(threads, thread_name_prefix="ktfiles.scan")
    waiting: Deque[Tuple[List[bytes], Future[List[Union[None, Tags, Error]]]]] = deque()
    batches = _batches(files)
    try:
        while True:
            while len(waiting) < 2 * threads:
                batch = next(batches, None)
                if batch is None:
                    break
                waiting.append((batch, pool.submit(_core.loops, batch)))
            if not waiting:
                return
            paths, results = waiting.popleft()
            for path, result in zip(paths, results.result()):
                if isinstance(result, Error):
                    if on_error is not None:
                        on_error(result)
                elif result is not None:
                    yield {"path": os.fsdecode(path), **result}
    finally:
        pool.shutdown(wait=False, cancel_futures=True)
