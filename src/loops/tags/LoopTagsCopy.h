// Everything that makes a loop, carried from one file to another: AIFF, CAF and WAVE in any direction, and from AIFC.
#pragma once

#include "loops/VireoLoopChunks.h"
#include "loops/tags/LoopTags.h"
#include "loops/tags/LoopTagsPlan.h"

#include <memory>
#include <string>

/// The whole loop of a source file.
struct LoopSource {
    LoopTags tags;                                        // as values
    RawLoopTags bytes;                                    // as bytes
    VireoLoopChunkList chunks = VireoLoopChunks::Empty(); // of all kinds
    std::vector<std::string> notKept;                     // what loop tags have no room for, in words

    /// Whether the source has no tags at all.
    bool isEmpty() const { return tags.isEmpty(); }
};

/// Reads a source; null when it cannot be read, or is no file that can have loop tags.
KT_EXPORT std::shared_ptr<LoopSource> readLoopSource(const platform::URLRef& file, platform::Error* error = nullptr);

/// What a copy changes in the file `target`, whose tags are `before`: tags of the source replace those that are
/// there, others stay. A tag that the target has no room for, or that cannot be read between two kinds of file, is
/// reported and costs nothing else.
KT_EXPORT std::optional<LoopTagsPlan> planLoopTagsCopy(const std::shared_ptr<const LoopSource>& source,
                                                       const LoopTags& before, const platform::URLRef& target,
                                                       platform::Error* error = nullptr);
