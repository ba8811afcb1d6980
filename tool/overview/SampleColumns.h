// Samples folded into columns: what a picture, or a list of points, shows of each lane of a sound.
#pragma once

#include "tool/overview/SoundLanes.h"
#include "tool/overview/WaveformOutline.h"

#include <cstdint>
#include <vector>

/// The columns of each lane. Frames are given in the order of the sound, without a gap. A frame that two columns share
/// shows in both, so that no peak is drawn lower than it is. Values are samples, full scale being 1; the averages are
/// those of the extremes of runs of 256 frames, or of shorter ones where a column has no more.
class SampleColumns {
public:
    /// Column i is of the frames from `first` + i * `framesPerColumn` on; that is 1 at least.
    SampleColumns(const std::vector<SoundLane>& lanes, int channels, double first, double framesPerColumn,
                  std::size_t columns);

    /// Interleaved frames, the first of which is frame `frame` of the sound.
    void add(const float* samples, std::int64_t frame, std::int64_t frames);

    /// Of a lane, every column. One without a frame is of zeros.
    std::vector<WaveformColumn> take(std::size_t lane);

    /// The frames that the columns reach over.
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
    std::size_t open_ = 0; // the first column that may have frames to come
    std::vector<std::vector<Fold>> folds_;
};
