#include "media/decoding/ResamplingDecoder.h"

#include "platform/core/Status.h"

#include <algorithm>
#include <cmath>
#include <numeric>
#include <span>
#include <utility>

namespace platform {

namespace {

constexpr std::size_t kDroppedFrames = 512;

std::uint64_t ceilOfProduct(std::uint64_t frames, std::uint64_t q, std::uint64_t p)
{
    const auto product = static_cast<unsigned __int128>(frames) * q + p - 1;
    return static_cast<std::uint64_t>(std::min<unsigned __int128>(product / p, UINT64_MAX));
}

} // namespace

ResamplingDecoder::ResamplingDecoder(AudioDecoder& source, std::unique_ptr<Resampler> resampler, std::uint32_t channels,
                                     std::uint32_t rate)
    : source_(source),
      resampler_(std::move(resampler)),
      frameFormat_(
          StreamDescription::packedPCM(rate, channels, {.bits = 32, .isFloat = true, .order = std::endian::native}))
{
    const StreamDescription& from = source.frameFormat();
    const auto sourceRate = static_cast<std::uint64_t>(from.sampleRate);
    const std::uint64_t divisor = std::gcd(sourceRate, std::uint64_t{rate});
    p_ = sourceRate / divisor;
    q_ = rate / divisor;
    frameCount_ = ceilOfProduct(source.frameCount(), q_, p_);
    lead_ = (resampler_->reach() + p_ - 1) / p_;
    StreamDescription floats = frameFormat_;
    floats.sampleRate = from.sampleRate;
    converter_ = FrameConverter(from, floats);
    pieceFrames_ = static_cast<std::uint32_t>(converter_.piece());
    raw_.resize(converter_.piece() * from.bytesPerFrame);
    piece_.resize(converter_.piece() * channels);
    dropped_.resize(kDroppedFrames * channels);
}

std::int32_t ResamplingDecoder::seek(std::uint64_t frame)
{
    isAtFrame_ = false;
    frame_ = frame;
    if (frame >= frameCount_) // there is nothing to read
        return kStatusOK;
    const std::uint64_t period = frame / q_;
    const std::uint64_t missing = lead_ - std::min(lead_, period); // the part of the lead before the source
    toDrop_ = frame % q_ + lead_ * q_;
    silence_ = missing * p_;
    std::int32_t status = source_.seek((period - (lead_ - missing)) * p_);
    if (status == kStatusOK)
        status = resampler_->reset();
    isAtFrame_ = status == kStatusOK;
    return status;
}

/// Feeds the resampler a piece: silence before the source's frames, the frames, or silence after them.
std::int32_t ResamplingDecoder::feed()
{
    std::uint32_t frames = pieceFrames_, there = 0, none = 0;
    if (silence_ > 0) {
        frames = static_cast<std::uint32_t>(std::min<std::uint64_t>(frames, silence_));
        silence_ -= frames;
    } else {
        there = frames;
        if (const std::int32_t status = source_.read(there, raw_.data()); status != kStatusOK)
            return status;
        frames = there > 0 ? there : frames;
    }
    const std::span<float> piece = std::span(piece_).first(std::size_t{frames} * frameFormat_.channelsPerFrame);
    if (there > 0)
        converter_.convert(raw_.data(), reinterpret_cast<std::byte*>(piece_.data()), there);
    else
        std::fill(piece.begin(), piece.end(), 0.0F);
    // A NaN or infinity would spread over the filter's whole reach.
    if (converter_.mayGiveNoNumbers())
        std::replace_if(
            piece.begin(), piece.end(), [](float sample) { return !std::isfinite(sample); }, 0.0F);
    return resampler_->convert(piece_.data(), frames, dropped_.data(), none);
}

std::int32_t ResamplingDecoder::drop()
{
    while (toDrop_ > 0) {
        auto made = static_cast<std::uint32_t>(std::min<std::uint64_t>(toDrop_, kDroppedFrames));
        std::int32_t status = resampler_->convert(nullptr, 0, dropped_.data(), made);
        toDrop_ -= made;
        if (status == kStatusOK && made == 0)
            status = feed();
        if (status != kStatusOK)
            return status;
    }
    return kStatusOK;
}

std::int32_t ResamplingDecoder::read(std::uint32_t& frames, void* to)
{
    const auto wanted =
        static_cast<std::uint32_t>(std::min<std::uint64_t>(frames, frameCount_ - std::min(frame_, frameCount_)));
    frames = 0;
    if (wanted == 0)
        return kStatusOK;
    std::int32_t status = isAtFrame_ ? kStatusOK : seek(frame_);
    if (status == kStatusOK)
        status = drop();
    while (status == kStatusOK && frames == 0) {
        std::uint32_t made = wanted;
        status = resampler_->convert(nullptr, 0, static_cast<float*>(to), made);
        frames = status == kStatusOK ? made : 0;
        if (status == kStatusOK && made == 0)
            status = feed();
    }
    frame_ += frames;
    isAtFrame_ = status == kStatusOK;
    return status;
}

} // namespace platform
