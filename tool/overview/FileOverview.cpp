#include "tool/overview/FileOverview.h"

#include "loops/overview/StoredOverview.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/ClockTime.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Progress.h"

FileOverview FileOverview::described(const SoundReader& sound)
{
    FileOverview overview;
    overview.info_ = sound.info();
    overview.note_ = sound.note();
    return overview;
}

FileOverview FileOverview::computed(SoundReader& sound, bool showsProgress)
{
    FileOverview overview = described(sound);
    Progress progress("reading", overview.info_.frames, !showsProgress);
    long long done = 0;
    std::int32_t status = kStatusOK;
    overview.block_ = sound.file().CreateOverview(
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
    // A block's header counts with 32 bits.
    const bool fits = OverviewPointCount(info_.frames) == static_cast<std::int64_t>(waveform.points.size());
    waveform.frames = fits ? info_.frames : OverviewFrames(*block_);
    waveform.sampleRate = sampleRateOf(info_);
    return waveform;
}

std::string FileOverview::duration() const
{
    return durationText(static_cast<double>(info_.frames) / sampleRateOf(info_));
}
