// All that makes a loop, carried from one file to another: AIFF, CAF and WAVE in any direction, and from AIFC.
#pragma once

#include "loops/VireoLoopChunks.h"
#include "tool/shared/looptags/LoopTags.h"
#include "tool/shared/looptags/LoopTagsEdit.h"

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

/// Throws Failure.
std::shared_ptr<LoopSource> readLoopSource(const std::string& path);

/// What of it changes in the file `target`, whose tags are `before`: each takes the place of what is there, what the
/// source does not have stays. What the target has no room for, or what cannot be read between two kinds of file, is
/// told and costs nothing else. Throws Failure.
TagsPlan planTagsCopy(const std::shared_ptr<const LoopSource>& source, const LoopTags& before,
                      const std::string& target);
