// The blocks of a WavPack file (David Bryant, "WavPack 4 & 5 Binary File / Block Format", 2020).
#pragma once

#include "platform/core/Bytes.h"

#include <cstddef>
#include <cstdint>
#include <optional>

namespace platform {

/// A block's header and, if the whole block was read, its parts.
struct WavPackBlock {
    static constexpr std::size_t kHeaderSize = 32;
    static constexpr std::size_t kMostSize = std::size_t{1} << 20;
    static constexpr std::uint64_t kUnknown = ~std::uint64_t{0};

    std::uint64_t first = 0;        // number of its first frame
    std::uint32_t frames = 0;       // 0 for a block without sound
    std::uint64_t total = kUnknown; // frames of the file; only the first block must know
    bool isInitial = false;         // first of those with the same frames: each block has two channels
    bool isFinal = false;
    bool isDSD = false;
    // Sample facts; an initial block tells those of all channels.
    std::uint32_t bits = 0;       // 32 for floats
    std::uint32_t sampleRate = 0; // 0 if not stated
    std::uint32_t channels = 0;
    std::uint32_t speakers = 0; // as bits of WAVE's channel mask

    std::size_t size = 0; // bytes, header included

    /// Parses the first kHeaderSize bytes; none if they begin no block.
    static std::optional<WavPackBlock> parseHeader(BytesView header);
    /// Parses a whole block, which ends with its own checksum; none if that is wrong. Encoders before version 5 wrote
    /// none.
    static std::optional<WavPackBlock> parse(BytesView block);

private:
    bool readParts(BytesView block);
    bool readChannels(BytesView part);
};

} // namespace platform
