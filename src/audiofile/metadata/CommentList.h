// The chunk "COMT" of AIFF and AIFC files: remarks, each with its time. Page: docs/formats/aiff-metadata.md.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

/// A remark.
struct AIFFComment {
    /// The seconds from 1904-01-01, the epoch of `timeStamp`, to 1970-01-01.
    static constexpr std::uint32_t kSecondsTo1970 = 2'082'844'800;

    std::uint32_t timeStamp = 0; // when it was made; in which time zone the source does not say
    std::int16_t marker = 0;     // id of a marker of "MARK"; 0 none
    std::string text;            // at most 65535 bytes; more are not written
    std::byte pad{0};            // behind a text of odd length
    friend bool operator==(const AIFFComment&, const AIFFComment&) = default;
};

/// Published source: Audio Interchange File Format AIFF-C, Comments Chunk. Big-endian: a count of 2 bytes, then for
/// each comment time, marker, size of the text (2), text, and a pad byte behind a text of odd size.
struct KT_EXPORT CommentList {
    static constexpr std::size_t kMostComments = 65535; // more are not written

    /// Null for fewer than 2 bytes.
    static std::optional<CommentList> read(BytesView body);
    /// The body of the chunk: what was read, with the changes since.
    Bytes write() const;
    friend bool operator==(const CommentList&, const CommentList&) = default;

    std::vector<AIFFComment> comments; // those that are there, whole; the last may lack its pad byte
    std::uint16_t missingComments = 0; // stated, and not there: write() states them again
    bool lastIsPadded = true;          // false where the last comment's pad byte was left out
    Bytes behind;                      // what is no whole comment
};
