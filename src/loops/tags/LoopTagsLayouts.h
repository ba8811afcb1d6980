// How AIFF and CAF files hold loop tags: the two halves of LoopTagsPatch, and what they share.
#pragma once

#include "tool/shared/looptags/LoopTagsPatch.h"

#include <algorithm>
#include <iterator>

// AIFF: fields of "basc" and "cate", text chunks.

void assignAIFFTags(RawLoopTags& tags, std::span<const TagAssignment> assignments);
std::optional<std::string> rawAIFFText(const RawLoopTags& tags, const TagField& field);
std::vector<std::string> rawAIFFDescriptors(const RawLoopTags& tags);

// CAF: pairs of texts. `pairText` is in LoopTagsPatch.h.

void assignCAFTags(RawLoopTags& tags, std::span<const TagAssignment> assignments);

// What an assignment says; 0 and "" where it says nothing.

inline std::int64_t assignedNumber(const platform::Value& value)
{
    const auto* number = value.get<std::int64_t>();
    return number != nullptr ? *number : 0;
}

inline std::string assignedText(const platform::Value& value)
{
    const auto* text = value.get<std::string>();
    return text != nullptr ? *text : std::string();
}

inline std::vector<std::string> assignedTexts(const platform::Value& value)
{
    std::vector<std::string> texts;
    if (const auto* list = value.get<platform::Array>())
        std::ranges::transform(*list, std::back_inserter(texts), assignedText);
    return texts;
}
