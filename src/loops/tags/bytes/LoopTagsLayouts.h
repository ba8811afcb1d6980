// How AIFF and CAF files hold loop tags: the two halves of LoopTagsPatch, and what they share.
#pragma once

#include "loops/VireoLoopCombinedTagsChunkDataTypes.h"
#include "loops/tags/LoopTagsPatch.h"

#include <algorithm>
#include <iterator>
#include <string_view>

/// The keys of the numbers, as views, so that they compare by their letters.
namespace loopkeys {
inline constexpr std::string_view kBeatCount = VireoLoopCombinedTagsChunkDataBeatCountKey;   // beats in the whole loop
inline constexpr std::string_view kRootNote = VireoLoopCombinedTagsChunkDataMidiRootNoteKey; // a MIDI note
/// 0 none, 1 minor, 2 major, 3 neither, 4 both
inline constexpr std::string_view kKeyType = VireoLoopCombinedTagsChunkDataKeyType;
inline constexpr std::string_view kTop = VireoLoopCombinedTagsChunkDataSignatureTopKey; // beats in a bar
/// the note that is one beat
inline constexpr std::string_view kBottom = VireoLoopCombinedTagsChunkDataSignatureBottomKey;
} // namespace loopkeys

// AIFF: fields of "basc" and "cate", text chunks.

/// assignLoopTags for AIFF.
bool assignAIFFLoopTags(RawLoopTags& tags, std::span<const LoopTagAssignment> assignments, platform::Error* error);
/// rawLoopText for AIFF.
std::optional<std::string> rawAIFFLoopText(const RawLoopTags& tags, const LoopTagField& field);
/// rawLoopDescriptors for AIFF.
std::vector<std::string> rawAIFFLoopDescriptors(const RawLoopTags& tags);

// CAF: pairs of texts. `loopPairText` is in LoopTagsPatch.h.

/// assignLoopTags for CAF.
void assignCAFLoopTags(RawLoopTags& tags, std::span<const LoopTagAssignment> assignments);

// The value of an assignment; 0 and "" when it has another type.

/// The number.
inline std::int64_t assignedLoopNumber(const platform::Value& value)
{
    const auto* number = value.get<std::int64_t>();
    return number != nullptr ? *number : 0;
}

/// The text.
inline std::string assignedLoopText(const platform::Value& value)
{
    const auto* text = value.get<std::string>();
    return text != nullptr ? *text : std::string();
}

/// The texts of a list.
inline std::vector<std::string> assignedLoopTexts(const platform::Value& value)
{
    std::vector<std::string> texts;
    if (const auto* list = value.get<platform::Array>())
        std::ranges::transform(*list, std::back_inserter(texts), assignedLoopText);
    return texts;
}

/// The value under a key; null when there is none.
inline platform::Value loopValueUnder(const platform::Dictionary& values, const char* key)
{
    const auto found = values.find(key);
    return found == values.end() ? platform::Value() : found->second;
}
