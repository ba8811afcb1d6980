// Loop tags of WAVE files, which have no loop chunks: put into "acid" and "smpl", and taken for loop tags.
#pragma once

#include "tool/shared/looptags/LoopTags.h"
#include "tool/shared/looptags/RawLoopTags.h"

#include <string>
#include <vector>

/// Puts what `source` says of the beats, the root note, the signature and the kind into the chunks of the WAVE file
/// whose tags are `target`: other fields stay, and of a "smpl" that is there its loops. A new "smpl" loops what the
/// source's does, or, of a loop, the whole sound. Throws Failure for a chunk that is cut short.
void assignWaveTags(RawLoopTags& chunks, const LoopTags& source, const LoopTags& target);

/// Tags of the WAVE file `before` once its chunks are these; throws Failure.
LoopTags tagsWithWaveChunks(const std::string& path, const LoopTags& before, const RawLoopTags& chunks);

/// What of `source` a WAVE file does not give back, in words.
std::vector<std::string> lossesInWave(const LoopTags& source, const LoopTags& after);

/// What asLoopChunks says of markers.
inline constexpr const char* kMarkersAreLost = "markers are not kept";
/// The tags of a WAVE or AIFC file as loop chunks would hold them, which `tags` then says too: keys in the octave of
/// loop tags. `notKept` tells what those have no room for.
RawLoopTags asLoopChunks(LoopTags& tags, std::vector<std::string>& notKept);
