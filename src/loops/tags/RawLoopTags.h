// The loop tags of a file as the bytes that hold them. An edit changes the bytes of the fields that it names; what the
// library cannot read, and what it does not know, stays beside them as it is.
#pragma once

#include "loops/VireoLoopChunksManager.h"
#include "platform/core/Error.h"
#include "platform/core/Value.h"

#include <map>
#include <optional>

/// Bodies of the chunks, the first of each kind, which is the one that readers take.
struct RawLoopTags {
    FourCC fileType = 0;             // "AIFF", "caff" or "WAVE"
    std::optional<Bytes> basic;      // "basc"; in CAF the pairs of texts after its UUID
    std::optional<Bytes> categories; // "cate"; none in CAF, where they are pairs of `basic`
    std::optional<Bytes> transients; // without a UUID
    std::map<FourCC, Bytes> texts;   // "NAME", "AUTH", "(c) " and "COMT"; in CAF "info"; in WAVE "acid" and "smpl"

    friend bool operator==(const RawLoopTags&, const RawLoopTags&) = default;
};

/// None when something of it cannot be read.
KT_EXPORT std::optional<RawLoopTags> readRawLoopTags(VireoLoopChunksManager& manager, platform::Error* error = nullptr);

/// Writes the chunks that differ, and removes those that are gone; false when that failed.
KT_EXPORT bool writeRawLoopTags(VireoLoopChunksManager& manager, const RawLoopTags& before, const RawLoopTags& after);

/// The combined tags as the library reads them.
KT_EXPORT platform::Dictionary combinedLoopTagsOf(const RawLoopTags& tags);
