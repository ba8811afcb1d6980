// Sample access of CAudioFileIO: in pieces, so that a file of any size costs the same memory.
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

// Whether something other than a pad byte lies behind the sample data.
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
    if (mInfo.compressed)
        return ReadCompressedFrames(to, frame, count, delivered);
    if (!mInfo.IsLinearPCM())
        return kStatusParameterError;
    const long long there = std::clamp<long long>(mInfo.frames - frame, 0, count);
    const long long samples = there * mInfo.channels;
    const int sampleSize = mInfo.sampleFormat.bytesPerSample();
    const long long start = mInfo.dataOffset + (there > 0 ? frame * mInfo.bytesPerFrame : 0);
    Piece piece;
    for (long long done = 0; done < samples;) {
        const long long wanted =
            std::min<long long>(samples - done, static_cast<long long>(samplesInPiece(mInfo.sampleFormat)));
        long bytes = 0;
        const std::int32_t status =
            Read(piece.data(), start + done * sampleSize, static_cast<long>(wanted * sampleSize), &bytes);
        const long got = bytes / sampleSize;
        platform::samplesToFloat(piece.data(), mInfo.sampleFormat, to + done, static_cast<std::size_t>(got));
        done += got;
        delivered = static_cast<long>(done / mInfo.channels);
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
    if (!mInfo.IsLinearPCM() || frame < 0 || frame > mInfo.frames || count < 0 || (from == nullptr && count > 0))
        return kStatusParameterError;
    if (const std::int32_t status = PrepareToWrite(frame, count); status != kStatusOK)
        return status;
    const int sampleSize = mInfo.sampleFormat.bytesPerSample();
    const long long start = mInfo.dataOffset + frame * mInfo.bytesPerFrame;
    const long long samples = static_cast<long long>(count) * mInfo.channels;
    const bool extends = start + samples * sampleSize > mInfo.dataOffset + mInfo.dataSize;
    std::int32_t status = kStatusOK;
    long long done = 0;
    Piece piece;
    while (done < samples && status == kStatusOK) {
        const long long next =
            std::min<long long>(samples - done, static_cast<long long>(samplesInPiece(mInfo.sampleFormat)));
        platform::floatToSamples(from + done, mInfo.sampleFormat, piece.data(), static_cast<std::size_t>(next));
        status = Write(piece.data(), start + done * sampleSize, static_cast<long>(next * sampleSize));
        if (status == kStatusOK)
            done += next;
    }
    FramesWritten(frame + done / mInfo.channels);
    if (status != kStatusOK && extends) { // what is left of a frame would pass for a chunk behind the samples
        SetEOF(mInfo.dataOffset + mInfo.dataSize);
        mHeaderDirty = true; // the pad byte may be gone
    }
    return status;
}

// Growing needs a header that can say so, room in the container, and nothing behind the samples that would be lost.
std::int32_t CAudioFileIO::PrepareToWrite(long long frame, long count)
{
    const long long capacity = (MaxAudioFileSize(mInfo.fileType, true) - mInfo.dataOffset) / mInfo.bytesPerFrame;
    if (count <= mInfo.frames - frame)
        return kStatusOK;
    if (frame > capacity || count > capacity - frame)
        return kStatusFileTooBig;
    if (!mHeaderDirty && !HasBuiltHeader())
        return kStatusParameterError;
    const long long end = mInfo.dataOffset + (frame + count) * mInfo.bytesPerFrame;
    if (end > MaxAudioFileSize(mInfo.fileType, mHeaderOption))
        return kStatusFileTooBig;
    return end > mInfo.dataOffset + mInfo.dataSize && isFollowed(*this, mInfo) ? kStatusParameterError : kStatusOK;
}

void CAudioFileIO::FramesWritten(long long frames)
{
    if (frames <= mInfo.frames)
        return;
    mInfo.frames = frames;
    mInfo.dataSize = std::max<std::int64_t>(mInfo.dataSize, frames * mInfo.bytesPerFrame);
    mInfo.fileLength = std::max<std::int64_t>(mInfo.fileLength, mInfo.dataOffset + mInfo.dataSize);
    mHeaderDirty = true;
}
