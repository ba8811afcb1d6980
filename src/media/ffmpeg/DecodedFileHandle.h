// The properties of a file that a decoder owns, as callers see them.
#pragma once

#include "media/userdata/AudioFileService.h"

#include <cstdint>

namespace platform::ffmpeg {

/// Answers with type, format and number of packets, if known; no property can be set.
class DecodedFileHandle final : public AudioHandle {
public:
    static constexpr std::uint64_t unknownCount = ~std::uint64_t{0};

    DecodedFileHandle(FourCC type, const StreamDescription& format, std::uint64_t packetCount);
    std::int32_t propertyInfo(FourCC id, std::uint32_t& size, bool& isWritable) override;
    std::int32_t property(FourCC id, std::uint32_t& size, void* data) override;
    std::int32_t setProperty(FourCC id, std::uint32_t size, const void* data) override;

private:
    BytesView valueOf(FourCC id) const;

    FourCC type_;
    StreamDescription format_;
    std::uint64_t packetCount_;
};

} // namespace platform::ffmpeg
