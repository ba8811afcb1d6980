"""The chunks of a container as a mapping."""

from __future__ import annotations

import re
from collections.abc import MutableMapping
from typing import Iterator, List, NamedTuple, Optional, Union

from . import _core
from ._paths import Path, encoded

Data = Union[bytes, bytearray, memoryview]


class Chunk(NamedTuple):
    """One chunk of a container."""

    id: str
    """Four characters; what is no printable ASCII stands as \\xNN."""
    offset: int
    """Where its header begins, in bytes."""
    body: int
    """Where its bytes begin."""
    size: int
    """How many bytes it says that it has; may run past the end of a damaged file."""


def _code(chunk_id: Union[str, bytes]) -> int:
    """The id as a number; shorter ones end in spaces."""
    if isinstance(chunk_id, str):
        try:
            code = re.sub(r"\\x([0-9A-Fa-f]{2})", lambda found: chr(int(found[1], 16)), chunk_id).encode("latin-1")
        except UnicodeEncodeError:
            code = b""
    else:
        code = bytes(chunk_id)
    if not 1 <= len(code) <= 4:
        raise ValueError(f"no chunk id: {chunk_id!r}; it has one to four characters")
    return int.from_bytes(code.ljust(4), "big")


def _text(code: int) -> str:
    return "".join(
        chr(byte) if 0x20 <= byte < 0x7F and byte != 0x5C else f"\\x{byte:02X}" for byte in code.to_bytes(4, "big")
    )


class Chunks(MutableMapping[str, bytes]):
    """The chunks of a WAVE, RF64, BW64, RIFX, Wave64, AIFF, AIFC or CAF file: their bytes by their ids.

    Of several chunks of one id the mapping shows one, the last (in CAF the first); `list()` tells of all. Every question
    looks at the file as it is then. Changes are made to a copy, which is compared with the original and takes its place.
    """

    def __init__(self, path: Path) -> None:
        self._path = encoded(path)

    def list(self) -> List[Chunk]:
        """All chunks, in the order of the file."""
        return [Chunk(_text(code), offset, body, size) for code, offset, body, size in _core.list_chunks(self._path)]

    def __getitem__(self, chunk_id: Union[str, bytes]) -> bytes:
        found = _core.read_chunk(self._path, _code(chunk_id))
        if found is None:
            raise KeyError(chunk_id)
        return found

    def __contains__(self, chunk_id: object) -> bool:
        if not isinstance(chunk_id, (str, bytes)):
            return False
        try:
            code = _code(chunk_id)
        except ValueError:
            return False
        return any(code == each[0] for each in _core.list_chunks(self._path))

    def __iter__(self) -> Iterator[str]:
        return iter({chunk.id: None for chunk in self.list()})

    def __len__(self) -> int:
        return len({chunk.id for chunk in self.list()})

    def __setitem__(self, chunk_id: Union[str, bytes], data: Data) -> None:
        self.add(chunk_id, data, replace=True)

    def __delitem__(self, chunk_id: Union[str, bytes]) -> None:
        if self.remove(chunk_id) == 0:
            raise KeyError(chunk_id)

    def add(
        self,
        chunk_id: Union[str, bytes],
        data: Data,
        *,
        replace: bool = False,
        force: bool = False,
        in_place: bool = False,
        backup: bool = False,
        keep_times: bool = False,
        timeout: Optional[float] = None,
    ) -> Optional[str]:
        """Puts a chunk behind the last one; with `replace` in the place of all that have its id.

        The file is the old one or the new one whatever happens, unless `in_place` changes the file itself, for recordings
        too large to copy. What would cost sound or other data is refused, unless `force`. `backup` keeps the original
        beside it, and its path is returned. Others who have the file open through this library are waited for, `timeout`
        seconds at most.
        """
        return (
            _core.add_chunk(
                self._path, _code(chunk_id), memoryview(data), replace, force, in_place, backup, keep_times, timeout
            )
            or None
        )

    def remove(
        self,
        chunk_id: Union[str, bytes],
        *,
        force: bool = False,
        in_place: bool = False,
        backup: bool = False,
        keep_times: bool = False,
        timeout: Optional[float] = None,
    ) -> int:
        """Removes every chunk of an id, as `add` changes files; returns how many there were."""
        return _core.remove_chunk(self._path, _code(chunk_id), force, in_place, backup, keep_times, timeout)

    def __repr__(self) -> str:
        return f"<ktfiles.Chunks of {self._path!r}>"


def chunks(path: Path) -> Chunks:
    """The chunks of a container, whether its sound can be read or not."""
    return Chunks(path)
