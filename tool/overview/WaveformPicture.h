// The layout of a waveform picture, in pixels: what the PNG and the SVG have in common.
#pragma once

#include "tool/overview/WaveformOutline.h"

#include <limits>
#include <string>
#include <vector>

struct PictureSettings {
    int width = 1800;
    int height = 280;
    double start = 0; // seconds
    double end = std::numeric_limits<double>::infinity();
    bool scale = false; // an amplitude scale on the left
};

/// The upper and the lower edge of the wave at a place; y grows downwards. Never less than a hairline apart.
struct PictureExtent {
    float top = 0, bottom = 0;
};

/// A place where the edges of a smooth wave bend.
struct PictureVertex {
    float x = 0;
    PictureExtent extent;
};

/// A tick with its text, if any. `at` is x on the time axis, and y on the amplitude scale.
struct PictureTick {
    float at = 0;
    std::string label;
};

struct WaveformPicture {
    int width = 0, height = 0;
    // The wave's part of the picture. The strip of the time axis lies below it unless the picture is too low, the
    // amplitude scale to the left of it where it is asked for.
    int left = 0, plotWidth = 0, plotHeight = 0;

    std::vector<PictureExtent> peaks;  // one per column, from the lowest to the highest sample
    std::vector<PictureExtent> body;   // one per column, between the averages of the points
    std::vector<PictureVertex> smooth; // instead of them, where there are fewer points than columns

    std::vector<PictureTick> times;
    float timeLabelsFrom = 2; // no label of a time begins left of it
    std::vector<PictureTick> levels;
    PictureTick unit; // of the levels, at a y of its own; no label: none

    bool hasTimeAxis() const { return plotHeight < height; }
};

/// How strong the peaks are drawn beside the body.
inline constexpr float kPeakTone = 0.5F;
/// How strong the lines of the amplitude scale are drawn behind the wave, beside its ticks.
inline constexpr float kLevelLineTone = 0.22F;
/// How strong the time axis and its small ticks are drawn beside the others.
inline constexpr float kAxisLineTone = 0.6F;
inline constexpr int kMajorTickLength = 6, kMinorTickLength = 3, kLevelTickLength = 4;
/// Labels: the height of a digit, from the top of the strip down to the baseline, and from the scale to the plot.
inline constexpr float kLabelHeight = 8, kLabelBaseline = 19, kLabelGap = 8;

/// The waveform between `start` and `end` of the settings, clamped to its length. At least one frame must be in sight.
WaveformPicture pictureOf(const Waveform& waveform, const PictureSettings& settings);
