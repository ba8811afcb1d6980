// What a container says of its samples: format, place, number.
#pragma once

#include "media/containers/ContainerLayout.h"
#include "media/samples/StreamDescription.h"

#include <cstdint>
#include <functional>

namespace platform {

struct AudioDescription {
    StreamDescription format;
    std::uint64_t dataOffset = 0;
    std::uint64_t byteCount = 0;
    std::uint64_t packetCount = 0;
};

/// Reads the first `count` bytes of a chunk's body; 0, or a status.
using BodyReader = std::function<std::int32_t(const Chunk& chunk, void* to, std::size_t count)>;

/// Reads "fmt ", "COMM" or "desc" and finds the samples. kStatusIOError when a file has none of these, or when their
/// fields contradict each other.
std::int32_t describeAudio(const BodyReader& readBody, const ContainerLayout& layout, AudioDescription& description);

/// Offset, in the body of "COMM", of the 32-bit frame count.
inline constexpr std::uint64_t kCommonFramesOffset = 2;

/// The bytes of a new file without samples, its audio data last and at offset 4096, filler ahead of it for user data to
/// come. Empty when the container cannot hold the format. Bytes per packet and frames per packet need not be given.
Bytes newAudioFile(FourCC fileType, StreamDescription format);

} // namespace platform
