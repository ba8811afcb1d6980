// CAudioFileIO reads compressed data through a converting reader, which opens the file for itself.
#include "audiofile/CAudioFileIO.h"

#include "audiofile/ContainerDescriptions.h"
#include "media/decoding/ConvertingReader.h"

#include <algorithm>
#include <limits>

namespace {

constexpr long kPieceFrames = 64 * 1024;

} // namespace

std::int32_t CAudioFileIO::OpenDecoder(platform::Error* error)
{
    if (!IsOpen())
        return kStatusNotOpen;
    if (!info_.compressed || decoder_)
        return kStatusOK;
    if (IsMemoryFile())
        return kStatusParameterError;
    std::int32_t status = kStatusOK;
    auto decoder = platform::ConvertingReader::open(*URL(), &status, error);
    if (!decoder)
        return status;
    const platform::StreamDescription found = decoder->clientFormat();
    const auto floats = platform::StreamDescription::packedPCM(
        found.sampleRate, found.channelsPerFrame, {.bits = 32, .isFloat = true, .order = std::endian::native});
    if (status = decoder->setClientFormat(floats, error); status != kStatusOK)
        return status;
    constexpr std::uint64_t most = std::numeric_limits<std::int64_t>::max();
    info_.frames = static_cast<std::int64_t>(std::min(decoder->frameCount(), most));
    info_.framesAreStated = false;
    SetSoundFacts(info_, decoder->facts());
    SetSampleRate(info_, found.sampleRate);
    if (const auto channels = static_cast<std::int32_t>(found.channelsPerFrame); channels != info_.channels) {
        info_.channels = channels;
        info_.busFormat = AudioBusFormatForChannels(channels);
    }
    decoder_ = std::move(decoder);
    return kStatusOK;
}

std::int32_t CAudioFileIO::ReadCompressedFrames(float* to, long long frame, long count, long& delivered)
{
    std::int32_t status = OpenDecoder();
    if (status == kStatusOK)
        status = decoder_->seek(frame);
    const std::uint32_t frameSize = decoder_ ? decoder_->clientFormat().bytesPerFrame : 0;
    while (status == kStatusOK && delivered < count) {
        auto frames = static_cast<std::uint32_t>(std::min(count - delivered, kPieceFrames));
        platform::AudioBuffer piece{static_cast<std::uint32_t>(info_.channels), frames * frameSize,
                                    to + delivered * info_.channels};
        status = decoder_->read(frames, {&piece, 1});
        delivered += frames;
        if (status == kStatusOK && frames == 0)
            status = kStatusEndOfFile;
    }
    return status;
}
