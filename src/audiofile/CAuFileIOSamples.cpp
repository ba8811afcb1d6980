// The samples of CAuFileIO, converted piece by piece so that memory does not grow with the file.
#include "audiofile/CAuFileIO.h"

#include "media/samples/SampleConversion.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cstddef>
#include <limits>
#include <memory>
#include <new>

namespace {

constexpr std::int32_t kNoWriteAccess = -54;
constexpr std::int32_t kNoBitDepth = -1;

constexpr std::int64_t kMaxPackets = std::numeric_limits<std::uint32_t>::max(); // and bytes, in one call

using Piece = std::array<std::byte, 64 * 1024>;

} // namespace

/// Kept: the container decides whether 8-bit samples are signed, not the format.
platform::SampleFormat CAuFileIO::FileSamples() const
{
    const int bits = static_cast<int>(std::min<std::int64_t>(BytesPerSample(), 16)) * 8;
    const bool isSwapped = Swapped();
    return {.bits = bits,
            .isFloat = (dataFormat_.formatFlags & platform::StreamDescription::isFloat) != 0,
            .isUnsigned = bits == 8 && isSwapped,
            .order = isSwapped && bits != 8 ? std::endian::big : std::endian::little};
}

bool CAuFileIO::HasPackedSamples() const
{
    return FileSamples().isSupported() && dataFormat_.channelsPerFrame > 0 &&
           BytesPerSample() * dataFormat_.channelsPerFrame == dataFormat_.bytesPerPacket;
}

/// Counts in bytes, because a frame of many channels may be longer than a piece.
std::int32_t CAuFileIO::ReadSamples(float* dest, std::int64_t startFrame, std::int64_t& frames)
{
    if (!file_)
        return kStatusNotOpen;
    if (!HasPackedSamples())
        return platform::AudioHandle::kFormatNotSupported;
    std::uint64_t there = 0;
    if (const std::int32_t status = file_->audioDataPacketCount(there); status != kStatusOK)
        return status;
    const auto start = static_cast<std::uint64_t>(startFrame);
    if (start >= there && frames > 0)
        return kStatusEndOfFile;
    frames = static_cast<std::int64_t>(std::min<std::uint64_t>(static_cast<std::uint64_t>(frames), there - start));

    const platform::SampleFormat format = FileSamples();
    const auto sampleSize = static_cast<std::uint64_t>(format.bytesPerSample());
    const std::uint64_t position = start * dataFormat_.bytesPerPacket;
    const std::uint64_t samples = static_cast<std::uint64_t>(frames) * dataFormat_.channelsPerFrame;
    Piece piece;
    for (std::uint64_t done = 0; done < samples;) {
        const std::uint64_t count = std::min<std::uint64_t>(samples - done, piece.size() / sampleSize);
        auto bytes = static_cast<std::uint32_t>(count * sampleSize);
        if (const std::int32_t status = file_->readBytes(position + done * sampleSize, bytes, piece.data());
            status != kStatusOK)
            return status;
        if (bytes != count * sampleSize) // another process cut the file meanwhile
            return kStatusEndOfFile;
        platform::samplesToFloat(piece.data(), format, dest + done, static_cast<std::size_t>(count));
        done += count;
    }
    return kStatusOK;
}

std::int32_t CAuFileIO::ReadFloat(float* dest, long startFrame, long& frames)
{
    if (dest == nullptr || frames < 0)
        return kStatusParameterError;
    std::int64_t read = frames;
    const std::int32_t status = startFrame < 0 ? kStatusParameterError : ReadSamples(dest, startFrame, read);
    if (status == kStatusOK)
        frames = static_cast<long>(read);
    else
        std::fill_n(dest, static_cast<std::size_t>(frames) * dataFormat_.channelsPerFrame, 0.0F);
    return status;
}

std::int32_t CAuFileIO::WriteFloat(float* src, long startFrame, long frames)
{
    if (openMode_ != kReadWrite)
        return kNoWriteAccess;
    if (src == nullptr || startFrame < 0 || frames < 0 || frames > kMaxPackets)
        return kStatusParameterError;
    if (!file_)
        return kStatusNotOpen;
    if (!HasPackedSamples())
        return platform::AudioHandle::kFormatNotSupported;
    const platform::SampleFormat format = FileSamples();
    const auto samples = static_cast<std::size_t>(frames) * dataFormat_.channelsPerFrame;
    std::size_t size = 0;
    std::unique_ptr<std::byte[]> scratch;
    if (!__builtin_mul_overflow(samples, static_cast<std::size_t>(format.bytesPerSample()), &size))
        scratch.reset(new (std::nothrow) std::byte[size]);
    if (!scratch)
        return kStatusOutOfMemory;
    platform::floatToSamples(src, format, scratch.get(), samples);
    auto packets = static_cast<std::uint32_t>(frames);
    return file_->writePackets(static_cast<std::uint64_t>(startFrame), packets, scratch.get());
}

std::int32_t CAuFileIO::WriteData(const void* data, long startFrame, long frames)
{
    const std::uint32_t bits = dataFormat_.bitsPerChannel, channels = dataFormat_.channelsPerFrame;
    if (bits < 1)
        return kNoBitDepth;
    const std::int64_t sampleSize = (std::int64_t{bits} + 7) / 8;
    std::int64_t size = 0, start = 0;
    if (data == nullptr || startFrame < 0 || frames < 0 ||
        __builtin_mul_overflow(sampleSize * channels, frames, &size) || size > kMaxPackets ||
        __builtin_mul_overflow(sampleSize * channels, startFrame, &start))
        return kStatusParameterError;
    constexpr bool hostIsBig = std::endian::native == std::endian::big;
    if (Swapped() != hostIsBig) // the caller's samples stay swapped: old callers rely on it
        platform::swapSamples(const_cast<void*>(data), static_cast<int>(sampleSize),
                              static_cast<std::size_t>(frames) * channels);
    if (!file_)
        return kStatusNotOpen;
    auto bytes = static_cast<std::uint32_t>(size);
    return file_->writeBytes(static_cast<std::uint64_t>(start), bytes, data);
}
