// What a picture shows of the samples of a file.
#pragma once

#include "tool/overview/FileOverview.h"
#include "tool/overview/WaveformPicture.h"
#include "tool/shared/input/SoundReader.h"

#include <cstdint>
#include <functional>
#include <vector>

/// The part of a sound that is asked for, in frames.
struct FrameRange {
    std::int64_t from = 0, to = 0;
};

/// The lanes of a picture of that part. Without a choice that is the overview's own lane, and where a picture is finer
/// than overviews are, each channel by itself as long as there is room. Throws Failure for more lanes than there is
/// room for.
std::vector<SoundLane> lanesFor(ChannelChoice choice, const AudioFileInfo& info, FrameRange range,
                                const PictureSettings& settings);

/// Reads the frames of the part and no others. Told how many are done since the last call. Throws Failure.
DrawnSound drawnSamples(SoundReader& sound, FrameRange range, const std::vector<SoundLane>& lanes,
                        const PictureFrame& frame, const std::function<void(std::int64_t frames)>& progress);

/// Whether the points of an overview are as fine as such a picture of that part.
bool suffices(const FileOverview& stored, ChannelChoice choice, FrameRange range, const PictureSettings& settings);
