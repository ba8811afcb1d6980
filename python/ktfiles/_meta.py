"""What files say about themselves."""

from __future__ import annotations

from typing import Any, Dict, List, Union

from . import _core
from ._paths import Path, encoded

Value = Union[str, int, float, None]


def meta(path: Path, *groups: str) -> Dict[str, Value]:
    """What a file says about itself, field by field, under the names that `ktfiles meta --json` has.

        ktfiles.meta("take.wav")["bext.originator"]

    Of WAVE, AIFF and CAF what their chunks say, of other files their tags. With `groups` ("bext", "info", or the id of a
    chunk) only theirs are read. Texts and numbers; of bytes that nobody here knows the first, in hexadecimal; None is a
    number that is none.
    """
    return _core.meta(encoded(path), list(groups))


def meta_fields(path: Path, *groups: str) -> List[Dict[str, Any]]:
    """The same with what is known of each field, in the order of the file: its "words", "seconds", "chunk", "offset"."""
    return _core.meta_fields(encoded(path), list(groups))
