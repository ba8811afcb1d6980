// Loop tags put into the bytes of a file's chunks, field by field.
#pragma once

#include "loops/VireoLoopTransientChunkData.h"
#include "loops/tags/LoopTagFields.h"
#include "loops/tags/RawLoopTags.h"

#include <optional>
#include <span>
#include <string>

/// A field and its new value: null clears it; for transients, an array of frames, or of frame and type for types
/// other than 1.
struct LoopTagAssignment {
    const LoopTagField* field; // borrowed from loopTagFields
    platform::Value value;     // of the field's kind, or null
};

/// Replaces the values of the fields; other bytes stay. A null value, and one that the container has no form for,
/// removes what is there, even if it cannot be read. A chunk that becomes empty is removed. In CAF both parts of a
/// signature are one; the part that is not named stays. Does not assign transients. False for a chunk of unknown
/// layout; `tags` are of no use then.
KT_EXPORT bool assignLoopTags(RawLoopTags& tags, std::span<const LoopTagAssignment> assignments,
                              platform::Error* error = nullptr);

/// The bytes of a text field, up to its NUL, and of comments the first one's text; null for none.
std::optional<std::string> rawLoopText(const RawLoopTags& tags, const LoopTagField& field);
/// The bytes of the descriptors, in their order.
std::vector<std::string> rawLoopDescriptors(const RawLoopTags& tags);
/// Title, artist, copyright and comments as the library reads them.
platform::Dictionary loopTextsOf(const RawLoopTags& tags);

/// Copies the field's pair between CAF files, unchanged; false when there is none. Both parts of a signature are one
/// pair.
bool copyLoopPair(RawLoopTags& to, const RawLoopTags& from, const LoopTagField& field);
/// The pair's text; null in AIFF files.
std::optional<std::string> loopPairText(const RawLoopTags& tags, const LoopTagField& field);
/// Whether there is a chunk "cate" that cannot be read.
bool hasUnknownLoopCategories(const RawLoopTags& tags);

/// Replaces the transients. The chunk's other fields stay, and so do records whose frames stay.
void assignLoopTransients(RawLoopTags& tags, const std::vector<VireoLoopTransient>& transients);
/// The fields of a transients chunk besides the list.
struct LoopTransientFields {
    std::uint16_t version = 1;             // of the chunk
    std::uint16_t detectionPercentage = 0; // of the program that found the transients
    std::uint16_t forceDivision = 0;       // of the program that found the transients
    friend bool operator==(const LoopTransientFields&, const LoopTransientFields&) = default;
};
/// The fields; null when there is no readable chunk.
std::optional<LoopTransientFields> loopTransientFieldsOf(const RawLoopTags& tags);
/// Replaces the fields; there must be a chunk.
void assignLoopTransientFields(RawLoopTags& tags, const LoopTransientFields& fields);
