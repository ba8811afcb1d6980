// Edits of loop tags, worked out in memory before anything is written.
#pragma once

#include "loops/tags/LoopTags.h"
#include "loops/tags/RawLoopTags.h"

#include <functional>
#include <string>
#include <vector>

/// One tag, or one chunk that is carried uninterpreted, before and after an edit. Chunks are given by their sizes,
/// transients by their number.
struct LoopTagChange {
    std::string key;      // the tag's name, or the chunk's id
    platform::Value from; // null: absent
    platform::Value to;   // null: absent
};

/// An edit of one file, worked out.
struct LoopTagsPlan {
    LoopTags after;                     // as it will be read from the file
    RawLoopTags bytes;                  // the same as bytes, of the interpreted chunks
    std::vector<LoopTagChange> changes; // what differs
    std::vector<std::string> notKept;   // what the container has no room for, in words
    /// Writes it; false when something could not be written.
    std::function<bool(VireoLoopChunksManager&)> write;
};

/// What differs; transients and carried chunks compare by number and size.
KT_EXPORT std::vector<LoopTagChange> loopTagDifferences(const LoopTags& before, const LoopTags& after);

/// Makes the planned edit to the file itself, and reads it again. False also when the tags then do not read as they
/// should. It is no safe edit (LoopTagsEdit.h).
KT_EXPORT bool carryOutLoopTagsPlan(const platform::URLRef& file, const LoopTagsPlan& plan,
                                    platform::Error* error = nullptr);
