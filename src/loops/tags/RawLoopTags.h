// The loop tags of a file as the bytes that hold them. An edit changes the bytes of the fields that it names; what the
// library cannot read, and what it does not know, stays beside them as it is.
#pragma once

#include "loops/VireoLoopChunksManager.h"
#include "platform/core/Value.h"

#include <map>
#include <optional>

/// Bodies of the chunks, the first of each kind, which is the one that readers take.
struct RawLoopTags {
    FourCC fileType = 0;             // "AIFF", "caff" or "WAVE"
    std::optional<Bytes> basic;      // "basc"; in CAF the pairs of texts behind its UUID
    std::optional<Bytes> categories; // "cate"; none in CAF, where they are pairs of `basic`
    std::optional<Bytes> transients; // without a UUID
    std::map<FourCC, Bytes> texts;   // "NAME", "AUTH", "(c) " and "COMT"; in CAF "info"; in WAVE "acid" and "smpl"

    friend bool operator==(const RawLoopTags&, const RawLoopTags&) = default;
};

/// Throws Failure.
RawLoopTags readRawLoopTags(VireoLoopChunksManager& manager);

/// Writes the chunks that differ, and removes those that are gone; false when that failed.
bool writeRawLoopTags(VireoLoopChunksManager& manager, const RawLoopTags& before, const RawLoopTags& after);

/// The combined tags as the library reads them.
platform::Dictionary combinedTagsOf(const RawLoopTags& tags);
