#include "media/decoding/LinearPCMDecoder.h"

#include "platform/core/Status.h"

#include <cmath>
#include <utility>

namespace platform {

namespace {

using Flag = StreamDescription::Flag;
constexpr std::uint32_t kMaxChannels = 0xFFFF; // the most that WAVE and AIFF can state

/// The packed format of the bytes that hold the samples.
StreamDescription frameFormatOf(const StreamDescription& file)
{
    StreamDescription format = file;
    if (file.channelsPerFrame > 0 && !(file.formatFlags & Flag::isFloat) && file.bitsPerChannel > 0)
        format.bitsPerChannel = file.bytesPerFrame / file.channelsPerFrame * 8;
    format.formatFlags |= Flag::isPacked;
    return format;
}

} // namespace

bool isPackedPCM(const StreamDescription& format)
{
    constexpr std::uint32_t known = Flag::isFloat | Flag::isBigEndian | Flag::isSignedInteger | Flag::isPacked;
    const SampleFormat sample = format.sampleFormat();
    if (!format.isLinearPCM() || (format.formatFlags & ~known) != 0 || !sample.isSupported() ||
        (sample.isUnsigned && sample.bits != 8))
        return false;
    if (!std::isfinite(format.sampleRate) || format.sampleRate < 0)
        return false;
    const std::uint32_t channels = format.channelsPerFrame;
    return channels >= 1 && channels <= kMaxChannels && format.framesPerPacket == 1 &&
           format.bytesPerFrame == channels * static_cast<std::uint32_t>(sample.bytesPerSample()) &&
           format.bytesPerPacket == format.bytesPerFrame;
}

bool LinearPCMDecoder::canDecode(const StreamDescription& fileFormat)
{
    const StreamDescription frames = frameFormatOf(fileFormat);
    return frames.bitsPerChannel >= fileFormat.bitsPerChannel && isPackedPCM(frames);
}

LinearPCMDecoder::LinearPCMDecoder(std::unique_ptr<AudioFile> file, const StreamDescription& fileFormat,
                                   std::uint64_t frameCount)
    : file_(std::move(file)),
      fileFormat_(fileFormat),
      frameFormat_(frameFormatOf(fileFormat)),
      frameCount_(frameCount)
{
    file_->lend();
}

std::int32_t LinearPCMDecoder::seek(std::uint64_t frame)
{
    frame_ = frame;
    return kStatusOK;
}

std::int32_t LinearPCMDecoder::read(std::uint32_t& frames, void* to)
{
    if (frame_ >= frameCount_ || frames == 0) {
        frames = 0;
        return kStatusOK;
    }
    const std::int32_t status = file_->readPackets(frame_, frames, to);
    frame_ += frames;
    return status;
}

} // namespace platform
