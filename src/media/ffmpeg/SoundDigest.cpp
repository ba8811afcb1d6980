#include "media/ffmpeg/SoundDigest.h"

#include "platform/core/Packed.h"

#include <algorithm>
#include <bit>
#include <cstring>
#include <new>

extern "C" {
#include <libavcodec/codec_par.h>
#include <libavutil/md5.h>
#include <libavutil/mem.h>
}

namespace platform::ffmpeg {

constexpr bool kIsLittle = std::endian::native == std::endian::little;

void SoundDigest::Release::operator()(AVMD5* state) const
{
    av_free(state);
}

std::optional<SoundDigest::Value> SoundDigest::statedBy(const AVCodecParameters& parameters)
{
    constexpr std::size_t streamInfoSize = 34, marker = 8; // "fLaC" and the block's header, which some containers keep
    if (parameters.codec_id != AV_CODEC_ID_FLAC || parameters.extradata == nullptr)
        return std::nullopt;
    auto size = static_cast<std::size_t>(std::max(parameters.extradata_size, 0));
    const std::uint8_t* info = parameters.extradata;
    if (size >= marker && std::memcmp(info, "fLaC", 4) == 0) {
        info += marker;
        size -= marker;
    }
    if (size < streamInfoSize)
        return std::nullopt;
    Value value;
    std::memcpy(value.data(), info + streamInfoSize - value.size(), value.size());
    const bool isSet = std::any_of(value.begin(), value.end(), [](std::byte byte) { return byte != std::byte{0}; });
    return isSet ? std::optional(value) : std::nullopt;
}

SoundDigest::SoundDigest(const Value& stated, const StreamDescription& format, std::uint32_t bits)
    : stated_(stated),
      channels_(format.channelsPerFrame),
      width_(format.bitsPerChannel / 8),
      bits_(bits),
      state_(av_md5_alloc())
{
    if (!state_)
        throw std::bad_alloc();
    av_md5_init(state_.get());
}

void SoundDigest::add(std::uint64_t frame, const std::byte* data, std::size_t frames)
{
    if (frame == 0 && frame_ != 0) {
        av_md5_init(state_.get());
        frame_ = 0;
    }
    if (frame != frame_ || frames == 0)
        return;
    frame_ += frames;
    const std::size_t samples = frames * channels_;
    if (kIsLittle && bits_ == width_ * 8) // already in file layout
        av_md5_update(state_.get(), reinterpret_cast<const std::uint8_t*>(data), samples * width_);
    else
        addPacked(data, samples);
}

void SoundDigest::addPacked(const std::byte* data, std::size_t samples)
{
    constexpr std::size_t piece = 1024;
    const std::uint32_t bytes = (bits_ + 7) / 8, shift = width_ * 8 - bits_;
    std::array<std::uint8_t, piece * sizeof(std::int32_t)> packed;
    for (std::size_t done = 0; done < samples;) {
        const std::size_t count = std::min(piece, samples - done);
        for (std::size_t i = 0; i < count; ++i) {
            std::int32_t sample = 0; // left-aligned
            std::memcpy(reinterpret_cast<char*>(&sample) + (kIsLittle ? sizeof sample - width_ : 0),
                        data + (done + i) * width_, width_);
            sample = inByteOrder(sample >> (32 - width_ * 8 + shift), std::endian::little);
            std::memcpy(packed.data() + i * bytes, &sample, bytes);
        }
        av_md5_update(state_.get(), packed.data(), count * bytes);
        done += count;
    }
}

ConvertingReader::Checksum SoundDigest::result() const
{
    const std::unique_ptr<AVMD5, Release> copy(av_md5_alloc());
    if (!copy)
        return unknown;
    std::memcpy(copy.get(), state_.get(), static_cast<std::size_t>(av_md5_size)); // finishing changes the state
    Value found;
    av_md5_final(copy.get(), reinterpret_cast<std::uint8_t*>(found.data()));
    return found == stated_ ? ConvertingReader::Checksum::same : ConvertingReader::Checksum::differs;
}

} // namespace platform::ffmpeg
