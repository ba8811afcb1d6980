// Folds samples into the columns of a picture, or the points of a list, for each lane of a sound.
#pragma once

#include "tool/overview/SoundLanes.h"
#include "tool/shared/waveform/WaveformOutline.h"

#include <cstdint>
#include <vector>

/// The columns of each lane. Frames are added in order, without gaps. A frame that two columns share counts in both, so
/// that no peak is drawn too low. Values are samples with full scale 1; averages are those of the extremes of runs of
/// 256 frames, or of shorter runs if a column has fewer.
class SampleColumns {
public:
    /// Column i begins at frame `first` + i * `framesPerColumn`; the latter is at least 1.
    SampleColumns(const std::vector<SoundLane>& lanes, int channels, double first, double framesPerColumn,
                  std::size_t columns);

    /// Adds interleaved frames, beginning with frame number `frame` of the sound.
    void add(const float* samples, std::int64_t frame, std::int64_t frames);

    /// All columns of a lane. A column without frames is zero.
    std::vector<WaveformColumn> take(std::size_t lane);

    /// The frames that the columns cover.
    std::int64_t firstFrame() const { return begin(0); }
    std::int64_t endFrame() const { return end(columns_ - 1); }

private:
    struct Fold {
        float low = 0, high = 0;
        double lowSum = 0, highSum = 0; // weighted by frames
        std::int64_t frames = 0;
    };

    std::int64_t begin(std::size_t column) const;
    std::int64_t end(std::size_t column) const;

    const std::vector<SoundLane>& lanes_;
    int channels_;
    double first_, framesPerColumn_;
    std::size_t columns_;
    std::size_t open_ = 0; // first column that may still get frames
    std::vector<std::vector<Fold>> folds_;
};
