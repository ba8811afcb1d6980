// Loop tags put into the bytes of a file's chunks, field by field.
#pragma once

#include "loops/VireoLoopTransientChunkData.h"
#include "tool/shared/looptags/LoopTagArguments.h"
#include "tool/shared/looptags/RawLoopTags.h"

#include <optional>
#include <span>
#include <string>

/// Puts the values in the place of what the fields hold: other bytes stay. An absent value takes what is there away,
/// also where it cannot be read, and so does one that the container has no form for: reading tells. A chunk in which
/// nothing is left goes. Both parts of a signature belong together in CAF; the one that is not named stays. Transients
/// are not assigned so. Throws Failure for a chunk whose layout is not known.
void assignTags(RawLoopTags& tags, std::span<const TagAssignment> assignments);

/// What a text field holds, as bytes: to its NUL, and of comments the first one's text. None where nothing is.
std::optional<std::string> rawText(const RawLoopTags& tags, const TagField& field);
/// The same of the descriptors, in their order.
std::vector<std::string> rawDescriptors(const RawLoopTags& tags);
/// Title, artist, copyright and comments as the library reads them.
platform::Dictionary infoTextsOf(const RawLoopTags& tags);

/// Between CAF files: the field's pair as it stands; false when there is none. Both parts of a signature are one.
bool copyPair(RawLoopTags& to, const RawLoopTags& from, const TagField& field);
/// The pair's text; none in AIFF files.
std::optional<std::string> pairText(const RawLoopTags& tags, const TagField& field);
/// Whether there is a chunk "cate" from which nothing can be taken.
bool hasUnknownCategories(const RawLoopTags& tags);

/// The transients as the bytes have them. The chunk's fields beside the list stay, records of frames that stay too.
void assignTransients(RawLoopTags& tags, const std::vector<VireoLoopTransient>& transients);
/// The fields beside the list.
struct TransientFields {
    std::uint16_t version = 1;
    std::uint16_t detectionPercentage = 0;
    std::uint16_t forceDivision = 0;
    friend bool operator==(const TransientFields&, const TransientFields&) = default;
};
/// None when there is no chunk that can be read.
std::optional<TransientFields> transientFieldsOf(const RawLoopTags& tags);
/// There must be a chunk.
void assignTransientFields(RawLoopTags& tags, const TransientFields& fields);
