"""Coordinated access to files."""

from __future__ import annotations

import os
from types import TracebackType
from typing import Optional, Type

from . import _core
from ._paths import Path, encoded

# Where the command meets others too.
if os.environ.get("KTFILES_COORDINATION"):
    _core.set_coordination_folder(os.fsencode(os.environ["KTFILES_COORDINATION"]))


class Lock:
    """Coordinated access to a file while it is held: whoever else asks through this library waits.

    Readers share a file, a writer has it alone. Edits of this package take write access by themselves, and go through
    under a lock for writing of this process. Bound are only those who use the library; the file itself stays open to
    everybody. The lock goes with the process, however that ends.
    """

    def __init__(self, path: Path, write: bool = False, timeout: Optional[float] = None) -> None:
        self.name: Path = path
        self._timeout = timeout
        self._lock = _core.Lock(encoded(path), write)

    def acquire(self) -> None:
        """Waits for the access; TimeoutError after `timeout` seconds. ValueError when it is held already."""
        if not self._lock.acquire(self._timeout):
            raise ValueError("the lock is held already")

    def release(self) -> None:
        """ValueError when it is not held."""
        if not self._lock.release():
            raise ValueError("the lock is not held")

    @property
    def held(self) -> bool:
        return self._lock.held

    def __enter__(self) -> Lock:
        self.acquire()
        return self

    def __exit__(
        self,
        kind: Optional[Type[BaseException]],
        error: Optional[BaseException],
        traceback: Optional[TracebackType],
    ) -> None:
        self._lock.release()


def lock(path: Path, write: bool = False, timeout: Optional[float] = None) -> Lock:
    """A context manager that holds coordinated access to a file: `with ktfiles.lock(path, write=True): ...`"""
    return Lock(path, write, timeout)
