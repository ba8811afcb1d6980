#include "audiofile/metadata/CAFTextPairs.h"

#include "loops/tagging/CAFPayloads.h"
#include "platform/core/ByteWriter.h"

#include <algorithm>

CAFTextPairs::CAFTextPairs(BytesView payload)
{
    std::size_t size = sizeof(std::uint32_t);
    tagging::ForEachCAFInfoString(payload, [&](std::string_view key, std::string_view value) {
        pairs_.emplace_back(key, value);
        size += key.size() + value.size() + 2;
    });
    const BytesView behind = payload.subspan(std::min(size, payload.size()));
    behind_.assign(behind.begin(), behind.end());
}

const std::string* CAFTextPairs::find(std::string_view key) const
{
    const auto found = std::ranges::find(pairs_, key, &std::pair<std::string, std::string>::first);
    return found == pairs_.end() ? nullptr : &found->second;
}

void CAFTextPairs::set(std::string_view key, std::string_view value)
{
    const auto first = std::ranges::find(pairs_, key, &std::pair<std::string, std::string>::first);
    if (first == pairs_.end()) {
        pairs_.emplace_back(key, value);
        return;
    }
    first->second = value;
    pairs_.erase(std::remove_if(first + 1, pairs_.end(), [&](const auto& pair) { return pair.first == key; }),
                 pairs_.end());
}

void CAFTextPairs::erase(std::string_view key)
{
    std::erase_if(pairs_, [&](const auto& pair) { return pair.first == key; });
}

Bytes CAFTextPairs::payload() const
{
    ByteWriter writer;
    writer.write(static_cast<std::uint32_t>(pairs_.size()));
    for (const auto& [key, value] : pairs_)
        for (const std::string_view text : {std::string_view(key), std::string_view(value)}) {
            writer.write(bytesOf(text));
            writer.writeZeros(1);
        }
    writer.write(behind_);
    return writer.take();
}
