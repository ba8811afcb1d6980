// Waveforms of an index: overviews of bounded size.
#pragma once

#include "audiofile/CAudioFileIO.h"
#include "tool/shared/library/LibraryRecord.h"

#include <optional>

/// The waveform of an open file: a point for 256 frames, for files of more than 5,625 such points for the smallest
/// number of frames, 256 times a power of two, that gives no more. None for a file without sound that can be read.
std::optional<LibraryOverview> overviewOf(CAudioFileIO& file);
