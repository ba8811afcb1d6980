"""What is wrong with a file, as an exception."""

from __future__ import annotations

import errno as _errno
import os
from typing import Dict, Optional, Type


class Error(OSError):
    """What is wrong with one file.

    `filename` is the file, `strerror` says what is wrong, `status` is the library's code for it, never 0, and `errno`
    the system's, or None where it was not the system. A missing file is a `FileNotFoundError` too, and so on for
    `PermissionError`, `IsADirectoryError`, `NotADirectoryError` and `TimeoutError`.
    """

    status: int = -1

    def __str__(self) -> str:
        return f"{self.filename}: {self.strerror}" if self.filename is not None else str(self.strerror)


class NotFoundError(Error, FileNotFoundError):
    """There is no such file."""


class AccessError(Error, PermissionError):
    """The file may not be read, or not be changed."""


class FolderError(Error, IsADirectoryError):
    """A folder where a file is needed."""


class NoFolderError(Error, NotADirectoryError):
    """A file where a folder is needed."""


class TimedOutError(Error, TimeoutError):
    """The file was still in use by others when the time was up."""


for _kind in (Error, NotFoundError, AccessError, FolderError, NoFolderError, TimedOutError):
    _kind.__module__ = "ktfiles"  # as callers name them

_PARAMETER_ERROR = -50  # among others, of a folder where a file is needed

_KINDS: Dict[int, Type[Error]] = {
    _errno.ENOENT: NotFoundError,
    _errno.EACCES: AccessError,
    _errno.EPERM: AccessError,
    _errno.EISDIR: FolderError,
    _errno.ENOTDIR: NoFolderError,
    _errno.ETIMEDOUT: TimedOutError,
}


def make(status: int, errno: int, text: str, path: bytes) -> Error:
    """The exception for a problem of the compiled part."""
    if status == _PARAMETER_ERROR and os.path.isdir(path):
        errno, text = _errno.EISDIR, os.strerror(_errno.EISDIR)
    filename: Optional[str] = os.fsdecode(path)
    error = _KINDS.get(errno, Error)(errno or None, text, filename)
    error.status = status
    return error
