// The MD5 that FLAC stores of its sound, computed while the sound is read.
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

/// Hashes samples in order, each little-endian in as many bytes as its bits need (RFC 9639, section 8.2).
class SoundDigest {
public:
    using Value = std::array<std::byte, 16>;

    /// The digest that a stream states; none if it states none.
    static std::optional<Value> statedBy(const AVCodecParameters& parameters);

    /// For samples of `bits` bits, left-aligned in those of `format`; integers are in the processor's byte order.
    SoundDigest(const Value& stated, const StreamDescription& format, std::uint32_t bits);

    /// Adds frames from number `frame` on; counts only if all frames are added in order from the first.
    void add(std::uint64_t frame, const std::byte* data, std::size_t frames);
    /// Compares after `frames` frames in all.
    ConvertingReader::Checksum compare(std::uint64_t frames) const { return frames == frame_ ? result() : unknown; }

private:
    static constexpr auto unknown = ConvertingReader::Checksum::notCompared;
    struct Release {
        void operator()(AVMD5* state) const;
    };
    ConvertingReader::Checksum result() const;
    void addPacked(const std::byte* data, std::size_t samples);

    Value stated_;
    std::uint32_t channels_, width_, bits_; // bytes per sample here, bits per sample
    std::unique_ptr<AVMD5, Release> state_;
    std::uint64_t frame_ = 0; // number of the next frame
};

} // namespace platform::ffmpeg
