// Which speakers the channels of a bus format feed. A speaker is a bit, as WAVE's channel mask and CAF's channel bitmap
// number them (published: the extensible WAVE format; the format description of CAF, version 1.0); channels stand in
// the order of the bits.
#pragma once

#include "audiofile/AudioFileInfo.h"

#include <cstdint>

/// The speakers of that many channels; 0 when it is open which they are. `busFormat` may be undefined.
std::uint32_t SpeakersOf(TAudioBusFormat busFormat, int channels);
/// The bus format of a file whose header names its speakers; undefined when it names none.
KT_EXPORT TAudioBusFormat BusFormatOf(std::uint32_t speakers, int channels);
