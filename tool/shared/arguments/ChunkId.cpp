#include "tool/shared/arguments/ChunkId.h"

#include <charconv>

namespace {

// Takes the first byte off `text`.
std::optional<unsigned char> takeByte(std::string_view& text)
{
    constexpr std::size_t kEscapeLength = 4;
    if (text.starts_with("\\x") && text.size() >= kEscapeLength) {
        unsigned char value = 0;
        const char* const end = text.data() + kEscapeLength;
        const auto read = std::from_chars(text.data() + 2, end, value, 16);
        text.remove_prefix(kEscapeLength);
        return read.ec == std::errc() && read.ptr == end ? std::optional(value) : std::nullopt;
    }
    const auto value = static_cast<unsigned char>(text.front());
    text.remove_prefix(1);
    return value >= 0x20 && value < 0x7F && value != '\\' ? std::optional(value) : std::nullopt;
}

} // namespace

std::optional<FourCC> chunkIdFromText(std::string_view text)
{
    if (text.empty())
        return std::nullopt;
    FourCC id = 0;
    for (int i = 0; i < 4; ++i) {
        const auto byte = text.empty() ? std::optional<unsigned char>(' ') : takeByte(text);
        if (!byte)
            return std::nullopt;
        id = id << 8 | *byte;
    }
    return text.empty() ? std::optional(id) : std::nullopt;
}
