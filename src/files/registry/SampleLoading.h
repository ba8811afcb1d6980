// The samples of a whole file in one array, in the memory that they take and no more.
#pragma once

#include "audiofile/CAudioFileIO.h"
#include "files/registry/TContainer.h"

struct LoadedSamples {
    SampleArray samples; // interleaved
    std::uint32_t channels = 0;
    std::uint32_t frames = 0;
};

/// All frames of an open file as floats. A stereo file whose channels are equal in every frame becomes mono: while they
/// are, only the left one is kept. False, with `loaded` as it was, for a file without frames, channels or rate, for one
/// that does not give its frames, and for one whose samples would not fit into the memory that there is.
bool LoadSamples(CAudioFileIO& file, LoadedSamples& loaded);
