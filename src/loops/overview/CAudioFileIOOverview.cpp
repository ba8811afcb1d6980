// The overview of a file: read in pieces, as its samples are stored.
#include "audiofile/CAudioFileIO.h"
#include "loops/overview/MDOverview.h"

#include <algorithm>
#include <new>

namespace {

constexpr long kPieceSize = 128 * 1024; // stays in the processor's cache between the read and the fold
constexpr long long kPiecesPerProgress = 32;

// Whole points where a piece holds one.
long framesPerPiece(const AudioFileInfo& info)
{
    const long frames = std::max(kPieceSize / info.bytesPerFrame, 1L);
    return frames < kOverviewFramesPerPoint ? frames : frames - frames % kOverviewFramesPerPoint;
}

std::int32_t addSamples(CAudioFileIO& file, MDOverview& overview, const CAudioFileIO::OverviewProgress& progress)
{
    const AudioFileInfo& info = file.Info();
    const long most = framesPerPiece(info);
    const std::unique_ptr<std::byte[]> piece(new (std::nothrow)
                                                 std::byte[static_cast<std::size_t>(most * info.bytesPerFrame)]);
    if (!piece)
        return kStatusOutOfMemory;
    for (long long frame = 0; frame < info.frames; frame += most) {
        if (progress && frame / most % kPiecesPerProgress == 0 && !progress(frame, info.frames))
            return kStatusUserCancelled;
        const long frames = std::min<long long>(most, info.frames - frame);
        const std::int32_t status =
            file.Read(piece.get(), info.dataOffset + frame * info.bytesPerFrame, frames * info.bytesPerFrame, nullptr);
        if (status != kStatusOK)
            return status;
        overview.AddStored(piece.get(), info.sampleFormat, frame, frames, info.channels);
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
    if (!info.IsLinearPCM() || info.channels > MDOverview::kMostChannels)
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
