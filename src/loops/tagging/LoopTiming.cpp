#include "loops/tagging/LoopTiming.h"

#include "loops/tagging/CAFPayloads.h"
#include "loops/tagging/Chunks.h"

#include <algorithm>
#include <charconv>
#include <cstring>

namespace tagging {

std::optional<LoopTiming> LoopTimingInAIFF(BytesView chunk)
{
    constexpr std::int16_t loopFile = 1;
    if (chunk.size() < sizeof(BasicTaggingChunk))
        return std::nullopt;
    BasicTaggingChunk basic;
    std::memcpy(&basic, chunk.data(), sizeof basic);
    SwapBasicTaggingChunkToHost(&basic);
    return LoopTiming{basic.beatCount, basic.fileType == loopFile};
}

std::optional<LoopTiming> LoopTimingInCAF(BytesView payload)
{
    if (payload.size() < sizeof(std::uint32_t))
        return std::nullopt;
    LoopTiming timing;
    TimeSignature signature;
    ForEachCAFInfoString(payload, [&](std::string_view key, std::string_view value) {
        const std::string_view first = value.substr(0, value.find(','));
        if (key == "beat count")
            timing.beatCount = NumberAtStartOf(first);
        else if (key == "time signature")
            signature = TimeSignatureIn(first);
    });
    timing.isLoop = signature.top != 0 && timing.beatCount > 0;
    return timing;
}

std::int32_t NumberAtStartOf(std::string_view text)
{
    return static_cast<std::int32_t>(std::clamp<std::int64_t>(LongNumberAtStartOf(text), INT32_MIN, INT32_MAX));
}

std::int64_t LongNumberAtStartOf(std::string_view text)
{
    text.remove_prefix(std::min(text.find_first_not_of(" \t"), text.size()));
    if (text.starts_with('+'))
        text.remove_prefix(1);
    std::int64_t number = 0;
    const auto result = std::from_chars(text.data(), text.data() + text.size(), number);
    if (result.ec == std::errc::result_out_of_range)
        return text.starts_with('-') ? INT64_MIN : INT64_MAX;
    return number;
}

TimeSignature TimeSignatureIn(std::string_view text)
{
    const std::size_t slash = text.find('/');
    if (text.size() < 3 || slash == std::string_view::npos || text.find('/', slash + 1) != std::string_view::npos)
        return {};
    return {NumberAtStartOf(text.substr(0, slash)), NumberAtStartOf(text.substr(slash + 1))};
}

} // namespace tagging
