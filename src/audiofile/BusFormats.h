// The speakers that the channels of a bus format feed. A speaker is a bit, numbered as in WAVE's channel mask and
// CAF's channel bitmap (published: the extensible WAVE format; the format description of CAF, version 1.0); channels
// come in the order of the bits.
#pragma once

#include "audiofile/AudioFileInfo.h"

#include <cstdint>

/// The speakers of that many channels, as bits; 0 when they are not known. `busFormat` may be undefined.
std::uint32_t SpeakersOf(TAudioBusFormat busFormat, int channels);
/// The bus format of a file whose header names its speakers; undefined when it names none.
KT_EXPORT TAudioBusFormat BusFormatOf(std::uint32_t speakers, int channels);
