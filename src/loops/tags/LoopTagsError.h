// Errors of reading and changing loop tags.
#pragma once

#include "platform/core/Error.h"
#include "platform/core/Status.h"

#include <cstdint>
#include <string>

/// Codes of the domain "loopTags". A file that cannot be opened, read or written gives an error of the domain
/// "status".
enum class LoopTagsError : std::int64_t {
    unknownFile = 1,  // no WAVE, AIFF or CAF file
    otherFile = 2,    // audio, of a kind that cannot hold the tags
    damagedChunk = 3, // a chunk to change is cut short, or its layout is not known
    badValue = 4,     // a value that the tag can never have
    cannotKeep = 5,   // the container has no form for the value
    wouldLose = 6,    // the edit would change a tag that was not named
    notAsPlanned = 7  // what was written does not read as it should
};

inline constexpr const char* kLoopTagsErrorDomain = "loopTags"; // the domain of LoopTagsError

/// Fills `error`; always false.
inline bool failWith(platform::Error* error, LoopTagsError code, std::string description)
{
    return platform::fail(error, kLoopTagsErrorDomain, static_cast<std::int64_t>(code), std::move(description));
}

/// True for 0; else fills `error`, and false.
inline bool succeeded(std::int32_t status, platform::Error* error)
{
    return status == kStatusOK || platform::fail(error, platform::ErrorDomain::status, status, StatusText(status));
}
