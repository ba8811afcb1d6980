// The blocks that a WavPack file is made of (David Bryant, "WavPack 4 & 5 Binary File / Block Format", 2020).
#pragma once

#include "platform/core/Bytes.h"

#include <cstddef>
#include <cstdint>
#include <optional>

namespace platform {

/// What stands in a block's header, and of a whole block also in its parts.
struct WavPackBlock {
    static constexpr std::size_t kHeaderSize = 32;
    static constexpr std::size_t kMostSize = std::size_t{1} << 20;
    static constexpr std::uint64_t kUnknown = ~std::uint64_t{0};

    std::uint64_t first = 0;        // the number of its first frame
    std::uint32_t frames = 0;       // 0 of one that holds something else
    std::uint64_t total = kUnknown; // frames of the file; only the first block need know
    bool isInitial = false;         // of those with the same frames: there is a block for every two channels
    bool isFinal = false;
    bool isDSD = false;
    // Of the samples; of the channels those that an initial block tells of all.
    std::uint32_t bits = 0;       // 32 of floats
    std::uint32_t sampleRate = 0; // 0 when it is not told
    std::uint32_t channels = 0;
    std::uint32_t speakers = 0; // as bits of WAVE's channel mask

    std::size_t size = 0; // bytes, the header included

    /// By the first kHeaderSize bytes; none when they begin no block.
    static std::optional<WavPackBlock> parseHeader(BytesView header);
    /// All of it, which ends with its own checksum; none when that is not right. Encoders before version 5 wrote none.
    static std::optional<WavPackBlock> parse(BytesView block);

private:
    bool readParts(BytesView block);
    bool readChannels(BytesView part);
};

} // namespace platform
