// What a picture shows of a file's samples.
#pragma once

#include "tool/overview/FileOverview.h"
#include "tool/overview/WaveformPicture.h"
#include "tool/shared/input/SoundReader.h"

#include <cstdint>
#include <functional>
#include <vector>

/// The requested part of a sound, in frames.
struct FrameRange {
    std::int64_t from = 0, to = 0;
};

/// The lanes of a picture of that part. The default is the overview's own lane, or each channel by itself if the
/// picture is finer than overviews are and there is room. Throws Failure if there is no room for the lanes.
std::vector<SoundLane> lanesFor(ChannelChoice choice, const AudioFileInfo& info, FrameRange range,
                                const PictureSettings& settings);

/// Reads only the frames of the part. The progress function receives the number since its last call. Throws Failure.
DrawnSound drawnSamples(SoundReader& sound, FrameRange range, const std::vector<SoundLane>& lanes,
                        const PictureFrame& frame, const std::function<void(std::int64_t frames)>& progress);

/// Whether an overview's points are fine enough for such a picture of that part.
bool suffices(const FileOverview& stored, ChannelChoice choice, FrameRange range, const PictureSettings& settings);
