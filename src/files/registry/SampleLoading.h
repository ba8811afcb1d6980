// The samples of a whole file in one array of exactly their size.
#pragma once

#include "audiofile/CAudioFileIO.h"
#include "files/registry/TContainer.h"

/// What LoadSamples delivers.
struct LoadedSamples {
    SampleArray samples;        // interleaved
    std::uint32_t channels = 0; // interleaved in `samples`
    std::uint32_t frames = 0;   // samples of each channel
};

/// All frames of an open file as floats. A stereo file whose channels are equal in every frame becomes mono, and
/// needs the memory of one channel. False, and `loaded` unchanged, for a file without frames, channels or rate, for
/// one whose frames cannot be read, and for one whose samples do not fit into free memory.
bool LoadSamples(CAudioFileIO& file, LoadedSamples& loaded);
