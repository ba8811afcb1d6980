// The shape of a waveform across a picture: which of an overview's points each column shows.
#pragma once

#include "loops/overview/OverviewBlock.h"

#include <cstdint>
#include <span>
#include <vector>

/// A file's overview with its timing. Does not own the points.
struct Waveform {
    std::span<const OverviewPoint> points;
    std::int64_t frames = 0;
    double sampleRate = 0; // frames per second, above 0

    double seconds() const { return static_cast<double>(frames) / sampleRate; }
};

/// Lowest and highest value of a column, and the averages of its points' lowest and highest values.
struct WaveformColumn {
    float low = 0, high = 0;
    float meanLow = 0, meanHigh = 0;
};

/// Folds the points between two frames into `columns` columns. A point that two columns share counts in both, so that
/// no peak is drawn too low. `from` is less than `to`, and the points extend to `to`. Values are those of the points,
/// -127 to 127.
std::vector<WaveformColumn> foldedColumns(const Waveform& waveform, double from, double to, int columns);
