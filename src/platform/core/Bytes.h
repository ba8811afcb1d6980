// The two ways in which raw bytes are passed: owned, and looked at.
#pragma once

#include <cstddef>
#include <span>
#include <string_view>
#include <vector>

using Bytes = std::vector<std::byte>;
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
