#include "media/ffmpeg/SpanDecoder.h"

#include "media/ffmpeg/FrameFormat.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <cstring>
#include <utility>

namespace platform::ffmpeg {

void SpanDecoder::describe(FourCC fileType, const StreamDescription& fileFormat, const StreamDescription& frameFormat,
                           std::uint64_t first, std::uint64_t frameCount, std::uint64_t packetCount)
{
    handle_.emplace(fileType, fileFormat, packetCount);
    fileFormat_ = fileFormat;
    frameFormat_ = frameFormat;
    first_ = first;
    frameCount_ = frameCount;
}

void SpanDecoder::noteChecksum(const SoundDigest::Value& stated, std::uint32_t bits)
{
    stated_ = stated;
    statedBits_ = bits;
}

void SpanDecoder::compareChecksum()
{
    if (stated_ && statedBits_ > 0 && statedBits_ <= frameFormat_.bitsPerChannel && !digest_)
        digest_.emplace(*stated_, frameFormat_, statedBits_);
}

std::int32_t SpanDecoder::seek(std::uint64_t frame)
{
    frame_ = frame;
    return kStatusOK;
}

std::int32_t SpanDecoder::read(std::uint32_t& frames, void* to)
{
    const std::uint64_t wanted =
        std::min<std::uint64_t>(std::exchange(frames, 0), frameCount_ - std::min(frame_, frameCount_));
    auto* at = static_cast<std::byte*>(to);
    for (std::uint64_t done = 0; done < wanted;) {
        const std::uint64_t number = first_ + frame_ + done;
        if (const std::int32_t status = bring(number); status != kStatusOK) {
            forget();
            return status;
        }
        const bool isSilent = number < held_.start;
        const std::uint64_t run = std::min((isSilent ? held_.start : held_.end) - number, wanted - done);
        if (isSilent) {
            std::memset(at, 0, run * frameFormat_.bytesPerFrame);
            missing_.add(frame_ + done, frame_ + done + run);
        } else {
            interleave(decoded(), number - held_.start, run, frameFormat_, at);
        }
        at += run * frameFormat_.bytesPerFrame;
        done += run;
    }
    if (digest_)
        digest_->add(frame_, static_cast<const std::byte*>(to), wanted);
    frame_ += wanted;
    frames = static_cast<std::uint32_t>(wanted);
    return kStatusOK;
}

/// Decodes until `number` is available or known to be silent.
std::int32_t SpanDecoder::bring(std::uint64_t number)
{
    if (isLost_ || number < silentFrom_ || (number >= held_.end && number - held_.end > reach(number))) {
        isLost_ = true;
        std::uint64_t start = number;
        if (const std::int32_t status = startAt(start); status != kStatusOK)
            return status;
        held_ = {start, start};
        silentFrom_ = start;
        isLost_ = false;
    }
    while (number >= held_.end) {
        silentFrom_ = held_.end;
        if (const std::int32_t status = next(held_); status != kStatusOK)
            return status;
    }
    return kStatusOK;
}

} // namespace platform::ffmpeg
