// All that makes a loop, carried from one file to another: AIFF, CAF and WAVE in any direction, and from AIFC.
#pragma once

#include "loops/VireoLoopChunks.h"
#include "loops/tags/LoopTags.h"
#include "loops/tags/LoopTagsPlan.h"

#include <memory>
#include <string>

/// The loop of the file that is copied from, in whole.
struct LoopSource {
    LoopTags tags;
    RawLoopTags bytes;
    VireoLoopChunkList chunks = VireoLoopChunks::Empty();
    std::vector<std::string> notKept; // what of the chunks of others loop tags have no room for, in words

    bool isEmpty() const { return tags.isEmpty(); }
};

/// None when it cannot be read, or is no file that can have loop tags.
KT_EXPORT std::shared_ptr<LoopSource> readLoopSource(const platform::URLRef& file, platform::Error* error = nullptr);

/// What of it changes in the file `target`, whose tags are `before`: each takes the place of what is there, what the
/// source does not have stays. What the target has no room for, or what cannot be read between two kinds of file, is
/// told and costs nothing else.
KT_EXPORT std::optional<LoopTagsPlan> planLoopTagsCopy(const std::shared_ptr<const LoopSource>& source,
                                                       const LoopTags& before, const platform::URLRef& target,
                                                       platform::Error* error = nullptr);
