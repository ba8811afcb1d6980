// Raw bytes, owned and looked at.
#pragma once

#include <cstddef>
#include <span>
#include <string_view>
#include <vector>

/// Bytes that their holder owns.
using Bytes = std::vector<std::byte>;
/// Bytes that somebody else owns, valid as long as those.
using BytesView = std::span<const std::byte>;

/// The bytes of `text`, without a terminator.
inline BytesView bytesOf(std::string_view text)
{
    return std::as_bytes(std::span(text.data(), text.size()));
}

/// `bytes` seen as characters; the bytes must outlive the result.
inline std::string_view textOf(BytesView bytes)
{
    return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
}
