"""The files of music projects: sound as NumPy arrays, chunks, tags, overviews, ADM, projects, locks.

    import ktfiles

    with ktfiles.open("loop.wav") as f:
        sound = f.read()          # float32, (frames, channels)
        note = f.chunks.get("note")
"""

from ._adm import adm
from ._chunks import Chunk, Chunks, chunks
from ._errors import AccessError, Error, FolderError, NoFolderError, NotFoundError, TimedOutError
from ._file import AudioFile, open
from ._lock import Lock, lock
from ._meta import meta, meta_fields
from ._overview import FRAMES_PER_POINT, Overview, overview
from ._project import Alternative, Backup, Media, Project
from ._tags import remove_tags, scan, set_tags, tags

__all__ = [
    "AccessError",
    "Alternative",
    "AudioFile",
    "Backup",
    "Chunk",
    "Chunks",
    "Error",
    "FRAMES_PER_POINT",
    "FolderError",
    "Lock",
    "Media",
    "NoFolderError",
    "NotFoundError",
    "Overview",
    "Project",
    "TimedOutError",
    "adm",
    "chunks",
    "lock",
    "meta",
    "meta_fields",
    "open",
    "overview",
    "remove_tags",
    "scan",
    "set_tags",
    "tags",
]
