"""Project packages."""

from __future__ import annotations

import os
from typing import Any, Dict, List, NamedTuple, Optional, Tuple

from . import _core
from ._paths import Path, encoded


class Media(NamedTuple):
    """A media file that a project uses."""

    key: str
    """The list that names it: AudioFiles, ImpulsResponsesFiles and so on."""
    path: str
    exists: bool


class Backup(NamedTuple):
    """A backup of an alternative."""

    name: str
    path: str
    date: Any
    """When its project data was changed: a datetime in UTC."""


class Alternative:
    """One alternative of a project. What its metadata does not say is None."""

    def __init__(self, project: _core.Project, key: str, index: Optional[int], name: Optional[str], active: bool):
        self._project = project
        self.key = key
        self.index = index
        """Its number; None where the key is no number, and then nothing else is known of it."""
        self.name = name
        self.active = active
        music = {} if index is None else project.music(index)
        top, bottom = music.get("signature", (0, 0))
        self.tempo: Optional[float] = music.get("tempo") or None
        """Beats per minute."""
        self.sample_rate: Optional[int] = music.get("sample_rate") or None
        self.tracks: Optional[int] = music.get("tracks") or None
        self.music_key: Optional[str] = music.get("key") or None
        self.mode: Optional[str] = music.get("mode") or None
        self.signature: Optional[Tuple[int, int]] = (top, bottom) if top > 0 and bottom > 0 else None

    @property
    def metadata(self) -> Optional[Dict[str, Any]]:
        """The metadata under its own keys."""
        return None if self.index is None else self._project.metadata(self.index)

    @property
    def media(self) -> List[Media]:
        """The files that it uses, kind by kind."""
        return [] if self.index is None else _media(self._project, self.index)

    @property
    def missing(self) -> List[Media]:
        """Those of the files that are not there."""
        return [each for each in self.media if not each.exists]

    @property
    def backups(self) -> List[Backup]:
        """By date."""
        if self.index is None:
            return []
        paths = ((os.fsdecode(path), date) for path, date in self._project.backups(self.index))
        return [Backup(os.path.basename(path), path, date) for path, date in paths]

    def __repr__(self) -> str:
        return f"<ktfiles.Alternative {self.key}: {self.name!r}{', active' if self.active else ''}>"


def _media(project: _core.Project, index: Optional[int]) -> List[Media]:
    return [
        Media(key, os.fsdecode(path), os.path.exists(path)) for key, paths in project.media(index).items() for path in paths
    ]


class Project:
    """What a project package says of itself, read when it is made; nothing is changed."""

    def __init__(self, path: Path) -> None:
        self.name: Path = path
        self._project = _core.Project(encoded(path))
        self.info: Dict[str, Any] = self._project.info
        """The information dictionary under its own keys."""
        self.has_project_folder: bool = self._project.has_project_folder
        """Whether the media lie beside the package, in the project's folder, or in it."""
        self.alternatives: List[Alternative] = [
            Alternative(self._project, *each) for each in self._project.alternatives()
        ]

    @property
    def active(self) -> Optional[Alternative]:
        """The alternative that was open last."""
        return next((each for each in self.alternatives if each.active), None)

    @property
    def media(self) -> List[Media]:
        """The files that any alternative uses, kind by kind."""
        return _media(self._project, None)

    @property
    def missing(self) -> List[Media]:
        """Those of the files that are not there."""
        return [each for each in self.media if not each.exists]

    def __repr__(self) -> str:
        return f"<ktfiles.Project {self.name!r}, {len(self.alternatives)} alternatives>"
