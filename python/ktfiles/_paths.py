"""Paths as callers give them."""

from __future__ import annotations

import os
from typing import Union

Path = Union[str, bytes, "os.PathLike[str]", "os.PathLike[bytes]"]


def encoded(path: Path) -> bytes:
    """The bytes that the file system has, of names that are not UTF-8 too."""
    name = os.fsencode(path)
    if b"\0" in name:
        raise ValueError("embedded null byte")
    return name
