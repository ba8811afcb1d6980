// The overview of a file, made of its samples piece by piece, as they are stored.
#include "audiofile/CAudioFileIO.h"
#include "loops/overview/MDOverview.h"

#include <algorithm>
#include <new>

namespace {

constexpr long kPieceSize = 128 * 1024; // stays in the processor's cache between reading and folding
constexpr long long kPiecesPerProgress = 32;

/// Bytes per frame as it is read: linear PCM as it is stored, other samples as floats from the decoder.
long frameSizeOf(const AudioFileInfo& info)
{
    return info.compressed ? info.channels * long{sizeof(float)} : info.bytesPerFrame;
}

// A whole number of points if a piece holds at least one.
long framesPerPiece(const AudioFileInfo& info)
{
    const long frames = std::max(kPieceSize / frameSizeOf(info), 1L);
    return frames < kOverviewFramesPerPoint ? frames : frames - frames % kOverviewFramesPerPoint;
}

/// Reduces `frames` if compressed data ends before the length that its file promises.
std::int32_t readPiece(CAudioFileIO& file, std::byte* piece, long long frame, long& frames)
{
    const AudioFileInfo& info = file.Info();
    if (!info.compressed)
        return file.Read(piece, info.dataOffset + frame * info.bytesPerFrame, frames * info.bytesPerFrame, nullptr);
    const std::int32_t status = file.ReadFrames(reinterpret_cast<float*>(piece), frame, frames, &frames);
    return status == kStatusEndOfFile ? std::int32_t{kStatusOK} : status;
}

std::int32_t addSamples(CAudioFileIO& file, MDOverview& overview, const CAudioFileIO::OverviewProgress& progress)
{
    const AudioFileInfo& info = file.Info();
    const long most = framesPerPiece(info);
    const std::unique_ptr<std::byte[]> piece(new (std::nothrow)
                                                 std::byte[static_cast<std::size_t>(most * frameSizeOf(info))]);
    if (!piece)
        return kStatusOutOfMemory;
    for (long long frame = 0; frame < info.frames; frame += most) {
        if (progress && frame / most % kPiecesPerProgress == 0 && !progress(frame, info.frames))
            return kStatusUserCancelled;
        const long wanted = std::min<long long>(most, info.frames - frame);
        long frames = wanted;
        if (const std::int32_t status = readPiece(file, piece.get(), frame, frames); status != kStatusOK)
            return status;
        if (!info.compressed)
            overview.AddStored(piece.get(), info.sampleFormat, frame, frames, info.channels);
        else if (frames > 0)
            overview.Add(reinterpret_cast<const float*>(piece.get()), frame, frames, info.channels);
        if (frames < wanted)
            break;
    }
    if (progress && !progress(info.frames, info.frames))
        return kStatusUserCancelled;
    return kStatusOK;
}

std::int32_t createOverview(CAudioFileIO& file, KTMem& block, const CAudioFileIO::OverviewProgress& progress)
{
    const AudioFileInfo& info = file.Info();
    if (!file.IsOpen())
        return kStatusNotOpen;
    if (const std::int32_t status = file.OpenDecoder(); status != kStatusOK)
        return status;
    if ((!info.compressed && !info.IsLinearPCM()) || info.channels > MDOverview::kMostChannels)
        return kStatusParameterError;
    if (info.frames < 1)
        return kStatusEndOfFile;
    if (!block.allocate(OverviewBlockSize(info.frames)))
        return kStatusOutOfMemory;
    MDOverview overview(&block);
    const std::int32_t status = addSamples(file, overview, progress);
    overview.Finalize();
    return status;
}

} // namespace

std::unique_ptr<KTMem> CAudioFileIO::CreateOverview()
{
    return CreateOverview(OverviewProgress());
}

std::unique_ptr<KTMem> CAudioFileIO::CreateOverview(const OverviewProgress& progress, std::int32_t* status)
{
    auto block = std::make_unique<KTMem>();
    const std::int32_t result = createOverview(*this, *block, progress);
    if (status != nullptr)
        *status = result;
    return result == kStatusOK ? std::move(block) : nullptr;
}
