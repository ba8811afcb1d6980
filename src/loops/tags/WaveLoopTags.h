// Loop tags of WAVE files, which have no loop chunks: put into "acid" and "smpl", and taken for loop tags.
#pragma once

#include "loops/tags/LoopTags.h"
#include "loops/tags/RawLoopTags.h"

#include <string>
#include <vector>

/// Puts what `source` says of the beats, the root note, the signature and the kind into the chunks of the WAVE file
/// whose tags are `target`: other fields stay, and of a "smpl" that is there its loops. A new "smpl" loops what the
/// source's does, or, of a loop, the whole sound. False for a chunk that is cut short; `chunks` are of no use then.
KT_EXPORT bool assignWaveLoopTags(RawLoopTags& chunks, const LoopTags& source, const LoopTags& target,
                                  platform::Error* error = nullptr);

/// Tags of the open WAVE file, which are `before`, once its chunks are these. None when it cannot be read.
std::optional<LoopTags> loopTagsWithWaveChunks(VireoLoopChunksManager& file, const LoopTags& before,
                                               const RawLoopTags& chunks, platform::Error* error);

/// What of `source` a WAVE file does not give back, in words.
std::vector<std::string> loopTagsLostInWave(const LoopTags& source, const LoopTags& after);

/// What asLoopChunks says of markers.
inline constexpr const char* kLoopMarkersAreLost = "markers are not kept";
/// The tags of a WAVE or AIFC file as loop chunks would hold them, which `tags` then says too: keys in the octave of
/// loop tags. `notKept` lists what those have no room for.
RawLoopTags asLoopChunks(LoopTags& tags, std::vector<std::string>& notKept);
