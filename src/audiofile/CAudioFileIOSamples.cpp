// Sample access of CAudioFileIO, piece by piece so that memory does not grow with the file.
#include "audiofile/CAudioFileIO.h"

#include "audiofile/AudioFileLimits.h"

#include <algorithm>
#include <array>

namespace {

constexpr std::size_t kPieceSize = 64 * 1024;
using Piece = std::array<std::byte, kPieceSize>;

std::size_t samplesInPiece(platform::SampleFormat format)
{
    return kPieceSize / static_cast<std::size_t>(format.bytesPerSample());
}

// Whether the sample data is followed by anything but a pad byte.
bool isFollowed(const CFileIO& file, const AudioFileInfo& info)
{
    return file.GetEOF() > info.dataOffset + info.dataSize + (info.dataSize & 1);
}

} // namespace

std::int32_t CAudioFileIO::ReadFrames(float* to, long long frame, long count, long* framesRead)
{
    long ignored = 0;
    long& delivered = framesRead != nullptr ? *framesRead : ignored;
    delivered = 0;
    if (!IsOpen())
        return kStatusNotOpen;
    if (frame < 0 || count < 0 || (to == nullptr && count > 0))
        return kStatusParameterError;
    if (info_.compressed)
        return ReadCompressedFrames(to, frame, count, delivered);
    if (!info_.IsLinearPCM())
        return kStatusParameterError;
    const long long there = std::clamp<long long>(info_.frames - frame, 0, count);
    const long long samples = there * info_.channels;
    const int sampleSize = info_.sampleFormat.bytesPerSample();
    const long long start = info_.dataOffset + (there > 0 ? frame * info_.bytesPerFrame : 0);
    Piece piece;
    for (long long done = 0; done < samples;) {
        const long long wanted =
            std::min<long long>(samples - done, static_cast<long long>(samplesInPiece(info_.sampleFormat)));
        long bytes = 0;
        const std::int32_t status =
            Read(piece.data(), start + done * sampleSize, static_cast<long>(wanted * sampleSize), &bytes);
        const long got = bytes / sampleSize;
        platform::samplesToFloat(piece.data(), info_.sampleFormat, to + done, static_cast<std::size_t>(got));
        done += got;
        delivered = static_cast<long>(done / info_.channels);
        if (status != kStatusOK)
            return status;
    }
    return there < count ? kStatusEndOfFile : kStatusOK;
}

std::int32_t CAudioFileIO::WriteFrames(const float* from, long long frame, long count)
{
    if (!IsOpen())
        return kStatusNotOpen;
    if (!IsOpenForWriting())
        return kStatusWritePermission;
    if (!info_.IsLinearPCM() || frame < 0 || frame > info_.frames || count < 0 || (from == nullptr && count > 0))
        return kStatusParameterError;
    if (const std::int32_t status = PrepareToWrite(frame, count); status != kStatusOK)
        return status;
    const int sampleSize = info_.sampleFormat.bytesPerSample();
    const long long start = info_.dataOffset + frame * info_.bytesPerFrame;
    const long long samples = static_cast<long long>(count) * info_.channels;
    const bool extends = start + samples * sampleSize > info_.dataOffset + info_.dataSize;
    std::int32_t status = kStatusOK;
    long long done = 0;
    Piece piece;
    while (done < samples && status == kStatusOK) {
        const long long next =
            std::min<long long>(samples - done, static_cast<long long>(samplesInPiece(info_.sampleFormat)));
        platform::floatToSamples(from + done, info_.sampleFormat, piece.data(), static_cast<std::size_t>(next));
        status = Write(piece.data(), start + done * sampleSize, static_cast<long>(next * sampleSize));
        if (status == kStatusOK)
            done += next;
    }
    FramesWritten(frame + done / info_.channels);
    // The part of a frame that was written would look like a chunk after the samples.
    if (status != kStatusOK && extends) {
        SetEOF(info_.dataOffset + info_.dataSize);
        headerDirty_ = true; // the pad byte may have been cut off
    }
    return status;
}

// Growing needs a header that can state the new size, room in the container, and nothing after the samples that would
// be lost.
std::int32_t CAudioFileIO::PrepareToWrite(long long frame, long count)
{
    const long long capacity = (MaxAudioFileSize(info_.fileType, true) - info_.dataOffset) / info_.bytesPerFrame;
    if (count <= info_.frames - frame)
        return kStatusOK;
    if (frame > capacity || count > capacity - frame)
        return kStatusFileTooBig;
    if (!headerDirty_ && !HasBuiltHeader())
        return kStatusParameterError;
    const long long end = info_.dataOffset + (frame + count) * info_.bytesPerFrame;
    if (end > MaxAudioFileSize(info_.fileType, headerOption_))
        return kStatusFileTooBig;
    return end > info_.dataOffset + info_.dataSize && isFollowed(*this, info_) ? kStatusParameterError : kStatusOK;
}

void CAudioFileIO::FramesWritten(long long frames)
{
    if (frames <= info_.frames)
        return;
    info_.frames = frames;
    info_.dataSize = std::max<std::int64_t>(info_.dataSize, frames * info_.bytesPerFrame);
    info_.fileLength = std::max<std::int64_t>(info_.fileLength, info_.dataOffset + info_.dataSize);
    headerDirty_ = true;
}
