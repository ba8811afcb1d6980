"""ADM documents (ITU-R BS.2076) as objects whose references are resolved."""

from __future__ import annotations

from typing import TYPE_CHECKING, Any, Dict, List, Mapping, Optional, Sequence, Tuple, Type, TypeVar

from . import _core
from ._paths import Path, encoded

if TYPE_CHECKING:
    import numpy as np
    import numpy.typing as npt


class Element:
    """What all elements have. Times are seconds, and what the document does not say is None."""

    id: str

    def __init__(self, values: Mapping[str, Any]) -> None:
        self.__dict__.update(values)

    def __repr__(self) -> str:
        name = self.__dict__.get("name")
        return f"<ktfiles.adm {type(self).__name__} {self.id}{'' if name is None else f' {name!r}'}>"


class Programme(Element):
    index: int
    name: Optional[str]
    language: Optional[str]
    start: Optional[float]
    end: Optional[float]
    max_ducking_depth: int
    contents: List[Content]
    labels: Dict[str, str]
    """By language."""


class Content(Element):
    index: int
    name: Optional[str]
    language: Optional[str]
    objects: List[Object]
    labels: Dict[str, str]
    dialogue_mode: int
    """0 without dialogue, 1 with, 2 mixed."""
    non_dialogue_content_kind: int
    dialogue_content_kind: int
    mixed_content_kind: int


class Object(Element):
    name: Optional[str]
    start: Optional[float]
    duration: Optional[float]
    dialogue_mode: int
    importance: int
    interact: bool
    disallow_ducking: bool
    pack_formats: List[PackFormat]
    objects: List[Object]
    track_uids: List[TrackUID]
    labels: Dict[str, str]
    gain: float
    """A factor, whatever unit the document has."""
    head_locked: bool
    mute: bool
    polar_offset: Tuple[float, float, float]
    """Azimuth, elevation, distance."""
    cartesian_offset: Tuple[float, float, float]


class PackFormat(Element):
    name: Optional[str]
    type: str
    """DirectSpeakers, Matrix, Objects, HOA, Binaural."""
    importance: int
    absolute_distance: float
    channel_formats: List[ChannelFormat]
    pack_formats: List[PackFormat]


class ChannelFormat(Element):
    name: Optional[str]
    type: str
    blocks: Blocks


class StreamFormat(Element):
    name: Optional[str]
    format: str
    channel_format: Optional[ChannelFormat]
    pack_format: Optional[PackFormat]
    track_formats: List[TrackFormat]


class TrackFormat(Element):
    name: Optional[str]
    format_label: Optional[str]
    format_definition: Optional[str]
    stream_format: Optional[StreamFormat]


class TrackUID(Element):
    index: int
    """Of the track in the file, from 1."""
    sample_rate: Optional[int]
    bit_depth: Optional[int]
    track_format: Optional[TrackFormat]
    channel_format: Optional[ChannelFormat]
    pack_format: Optional[PackFormat]


class Blocks:
    """The blocks of a channel in their order, an entry of each array for each of them."""

    times: npt.NDArray[np.float64]
    """When they begin, in seconds from the start of their object."""
    durations: npt.NDArray[np.float64]
    """In seconds; NaN: as long as the object."""
    gains: npt.NDArray[np.float64]
    """Factors."""
    positions: npt.NDArray[np.float32]
    """(blocks, 3): azimuth and elevation in degrees, distance; or X, Y, Z where `cartesian`."""
    cartesian: npt.NDArray[np.bool_]
    sizes: npt.NDArray[np.float32]
    """(blocks, 3): width, height, depth."""
    diffuse: npt.NDArray[np.float32]
    jumps: npt.NDArray[np.bool_]
    """Whether a block jumps to its position instead of moving there."""
    importances: npt.NDArray[np.float32]
    ids: List[str]
    speaker_labels: List[Optional[str]]
    """Of DirectSpeakers; None of others."""

    def __init__(self, values: Mapping[str, Any]) -> None:
        self.__dict__.update(values)

    def __len__(self) -> int:
        return len(self.times)


_Kind = TypeVar("_Kind", bound=Element)


class Document:
    """An ADM document: its elements by kind, each in the order of the document."""

    def __init__(self, values: Mapping[str, Sequence[Mapping[str, Any]]]) -> None:
        def made(kind: Type[_Kind], elements: Sequence[Mapping[str, Any]]) -> List[_Kind]:
            return [kind(each) for each in elements]

        self.programmes = made(Programme, values["programmes"])
        self.contents = made(Content, values["contents"])
        self.objects = made(Object, values["objects"])
        self.pack_formats = made(PackFormat, values["pack_formats"])
        self.channel_formats = made(ChannelFormat, values["channel_formats"])
        self.stream_formats = made(StreamFormat, values["stream_formats"])
        self.track_formats = made(TrackFormat, values["track_formats"])
        self.track_uids = made(TrackUID, values["track_uids"])
        self._elements: Dict[str, Element] = {}
        for elements in self.__dict__.values():
            if isinstance(elements, list):
                self._elements.update((each.id, each) for each in elements)
        for element in self._elements.values():
            self._resolve(element)
        for channel in self.channel_formats:
            channel.blocks = Blocks(channel.__dict__["blocks"])

    def _resolve(self, element: Element) -> None:
        attributes = element.__dict__
        for name in _LINKS.intersection(attributes):
            attributes[name] = self._elements[attributes[name]] if attributes[name] is not None else None
        for name in _LISTS.intersection(attributes):
            attributes[name] = [self._elements[each] for each in attributes[name]]

    def __getitem__(self, element_id: str) -> Element:
        """The element of an id; KeyError when there is none."""
        return self._elements[element_id]

    def __contains__(self, element_id: object) -> bool:
        return element_id in self._elements

    def __len__(self) -> int:
        return len(self._elements)

    def __repr__(self) -> str:
        return f"<ktfiles.adm Document, {len(self.programmes)} programmes, {len(self.objects)} objects>"


# The attributes that the compiled part gives as an id, and as a list of ids.
_LINKS = {"channel_format", "pack_format", "track_format", "stream_format"}
_LISTS = {"contents", "objects", "pack_formats", "channel_formats", "track_formats", "track_uids"}


def adm(path: Path, *, lenient: bool = False) -> Document:
    """The ADM document in a sound file ("axml"), or in an XML file.

    An error says what is wrong with it, and where. `lenient` lets references pass that lead nowhere, which are left out,
    and blocks of types that are not supported, and reads fractions of seconds as decimals.
    """
    return Document(_core.adm(encoded(path), lenient))
