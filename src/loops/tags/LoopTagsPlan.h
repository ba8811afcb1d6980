// Edits of loop tags, worked out in memory before anything is written.
#pragma once

#include "loops/tags/LoopTags.h"
#include "loops/tags/RawLoopTags.h"

#include <functional>
#include <string>
#include <vector>

/// One tag, or one chunk that is carried without being interpreted, before and after an edit; null: absent. Chunks are
/// given by their sizes, transients by their number.
struct LoopTagChange {
    std::string key;
    platform::Value from;
    platform::Value to;
};

/// An edit of one file, worked out.
struct LoopTagsPlan {
    LoopTags after;    // as it will be read from the file
    RawLoopTags bytes; // the same, of those that are interpreted
    std::vector<LoopTagChange> changes;
    std::vector<std::string> notKept; // what the container has no room for, in words
    /// Does it; false when something could not be written.
    std::function<bool(VireoLoopChunksManager&)> write;
};

/// What differs, transients and carried chunks compared by number and size.
KT_EXPORT std::vector<LoopTagChange> loopTagDifferences(const LoopTags& before, const LoopTags& after);

/// Makes the planned edit of the file itself, and reads it again. False also when the tags are then not found as they
/// should be. It is no safe edit (LoopTagsEdit.h).
KT_EXPORT bool carryOutLoopTagsPlan(const platform::URLRef& file, const LoopTagsPlan& plan,
                                    platform::Error* error = nullptr);
