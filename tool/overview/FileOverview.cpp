#include "tool/overview/FileOverview.h"

#include "loops/overview/MDOverview.h"
#include "loops/overview/StoredOverview.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Progress.h"
#include "tool/shared/output/Terminal.h"
#include "tool/shared/output/UnseenCharacters.h"

#include <fmt/format.h>

#include <cstdio>

namespace {

constexpr double kLowestRate = 0.001, kHighestRate = 1e9; // of what has a place in time

void requireSound(const AudioFileInfo& info)
{
    if (!info.compressed && !info.IsLinearPCM())
        throw Failure("holds samples of a kind that is not read");
    if (info.channels > MDOverview::kMostChannels)
        throw Failure(
            fmt::format("has {} channels; an overview folds {} at most", info.channels, MDOverview::kMostChannels));
    if (info.frames == 0)
        throw Failure("holds no sound");
}

} // namespace

FileOverview FileOverview::computed(const std::string& path, bool showsProgress)
{
    FileOverview overview;
    CAudioFileIO file;
    openAudio(file, path);
    requireDecoder(file);
    overview.info_ = file.Info();
    requireSound(overview.info_);
    if (overview.info_.missingDataSize > 0)
        overview.note_ = fmt::format("ends ahead of its sound, {} bytes of which are missing; what is there is shown",
                                     overview.info_.missingDataSize);
    Progress progress("reading", overview.info_.frames, !showsProgress);
    long long done = 0;
    std::int32_t status = kStatusOK;
    overview.block_ = file.CreateOverview(
        [&](long long framesDone, long long) {
            progress.advance(framesDone - std::exchange(done, framesDone));
            return true;
        },
        &status);
    if (!overview.block_)
        throw Failure(status == kStatusOK ? "no overview can be made of it" : StatusText(status));
    return overview;
}

FileOverview FileOverview::stored(const std::string& path)
{
    FileOverview overview;
    {
        CAudioFileIO file;
        openContainer(file, path, 0);
        overview.info_ = file.Info();
    }
    std::int32_t status = kStatusOK;
    overview.block_ = ReadOverviewFromAudioFile(referenceTo(path), 0, &status);
    if (status == kStatusParameterError)
        throw Failure("its stored overview does not fit the file");
    requireOK(status);
    if (!overview.block_)
        throw Failure("has no stored overview; --store puts one into it");
    return overview;
}

Waveform FileOverview::waveform() const
{
    Waveform waveform;
    waveform.points = {OverviewPointsOf(*block_), OverviewPoints(*block_)};
    // The header of a block counts no further than 32 bits.
    const bool fits = OverviewPointCount(info_.frames) == static_cast<std::int64_t>(waveform.points.size());
    waveform.frames = fits ? info_.frames : OverviewFrames(*block_);
    // A CAF file may claim any rate that a 64-bit float can hold, and times of it are drawn.
    if (!(info_.exactSampleRate >= kLowestRate && info_.exactSampleRate <= kHighestRate))
        throw Failure(fmt::format("has a sample rate of {:g} Hz", info_.exactSampleRate));
    waveform.sampleRate = info_.exactSampleRate;
    return waveform;
}
