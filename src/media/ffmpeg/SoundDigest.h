// The MD5 that FLAC keeps of its sound, reckoned while that is read.
#pragma once

#include "media/decoding/ConvertingReader.h"
#include "platform/core/Bytes.h"

#include <array>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>

struct AVCodecParameters;
struct AVMD5;

namespace platform::ffmpeg {

/// Of samples in their order, each little-endian in as many bytes as its bits need (RFC 9639, section 8.2).
class SoundDigest {
public:
    using Value = std::array<std::byte, 16>;

    /// What a stream says of its sound; nothing where it says none.
    static std::optional<Value> statedBy(const AVCodecParameters& parameters);

    /// Of samples of `bits` bits that stand at the top of those of `format`, integers in the processor's byte order.
    SoundDigest(const Value& stated, const StreamDescription& format, std::uint32_t bits);

    /// Frames from `frame` on; counts only in one run from the first.
    void add(std::uint64_t frame, const std::byte* data, std::size_t frames);
    /// Of `frames` frames in all.
    ConvertingReader::Checksum compare(std::uint64_t frames) const { return frames == frame_ ? result() : unknown; }

private:
    static constexpr auto unknown = ConvertingReader::Checksum::notCompared;
    struct Release {
        void operator()(AVMD5* state) const;
    };
    ConvertingReader::Checksum result() const;
    void addPacked(const std::byte* data, std::size_t samples);

    Value stated_;
    std::uint32_t channels_, width_, bits_; // bytes of a sample here, its bits there
    std::unique_ptr<AVMD5, Release> state_;
    std::uint64_t frame_ = 0; // that comes next
};

} // namespace platform::ffmpeg
