// Loop tags put into the bytes of a file's chunks, field by field.
#pragma once

#include "loops/VireoLoopTransientChunkData.h"
#include "loops/tags/LoopTagFields.h"
#include "loops/tags/RawLoopTags.h"

#include <optional>
#include <span>
#include <string>

/// A field and its new value: null to clear it; of transients an array of frames, with each type other than 1 as an
/// array of frame and type.
struct LoopTagAssignment {
    const LoopTagField* field;
    platform::Value value;
};

/// Puts the values in the place of what the fields hold: other bytes stay. An absent value takes what is there away,
/// also where it cannot be read, and so does one that the container has no form for: reading tells. A chunk in which
/// nothing is left goes. Both parts of a signature belong together in CAF; the one that is not named stays. Transients
/// are not assigned so. False for a chunk whose layout is not known; `tags` are of no use then.
KT_EXPORT bool assignLoopTags(RawLoopTags& tags, std::span<const LoopTagAssignment> assignments,
                              platform::Error* error = nullptr);

/// What a text field holds, as bytes: to its NUL, and of comments the first one's text. None where nothing is.
std::optional<std::string> rawLoopText(const RawLoopTags& tags, const LoopTagField& field);
/// The same of the descriptors, in their order.
std::vector<std::string> rawLoopDescriptors(const RawLoopTags& tags);
/// Title, artist, copyright and comments as the library reads them.
platform::Dictionary loopTextsOf(const RawLoopTags& tags);

/// Between CAF files: the field's pair as it stands; false when there is none. Both parts of a signature are one.
bool copyLoopPair(RawLoopTags& to, const RawLoopTags& from, const LoopTagField& field);
/// The pair's text; none in AIFF files.
std::optional<std::string> loopPairText(const RawLoopTags& tags, const LoopTagField& field);
/// Whether there is a chunk "cate" from which nothing can be taken.
bool hasUnknownLoopCategories(const RawLoopTags& tags);

/// The transients as the bytes have them. The chunk's fields beside the list stay, records of frames that stay too.
void assignLoopTransients(RawLoopTags& tags, const std::vector<VireoLoopTransient>& transients);
/// The fields beside the list.
struct LoopTransientFields {
    std::uint16_t version = 1;
    std::uint16_t detectionPercentage = 0;
    std::uint16_t forceDivision = 0;
    friend bool operator==(const LoopTransientFields&, const LoopTransientFields&) = default;
};
/// None when there is no chunk that can be read.
std::optional<LoopTransientFields> loopTransientFieldsOf(const RawLoopTags& tags);
/// There must be a chunk.
void assignLoopTransientFields(RawLoopTags& tags, const LoopTransientFields& fields);
