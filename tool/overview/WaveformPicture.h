// The layout of a waveform picture, in pixels: what the PNG and the SVG have in common.
#pragma once

#include "tool/overview/SoundLanes.h"
#include "tool/overview/WaveformOutline.h"

#include <limits>
#include <optional>
#include <string>
#include <vector>

struct PictureSettings {
    int width = 1800;
    int height = 280;
    int scaleFactor = 1;            // pixels of the PNG for each of these
    std::optional<double> gain = 0; // decibels; none: the highest peak reaches full scale
    bool scale = false;             // an amplitude scale on the left
};

/// The parts of a picture, ahead of what is drawn in them.
struct PictureFrame {
    /// Takes room for the labels of the lanes where there are any, and for the scale.
    PictureFrame(const PictureSettings& settings, const std::vector<SoundLane>& lanes);

    int width, height, scaleFactor;
    // The wave's part of the picture. The strip of the time axis lies below it unless the picture is too low, the
    // names of the lanes and the amplitude scale to the left of it.
    int left = 0, plotWidth = 0, plotHeight = 0;
    bool hasScale = false; // asked for, and there is room
    int labelsEnd = 0;     // the right edge of the lanes' names; 0: there is no room for them

    /// Columns of pixels in the PNG.
    int columns() const { return plotWidth * scaleFactor; }
    bool hasTimeAxis() const { return plotHeight < height; }
};

/// The least height at which so many lanes can be told apart.
int leastHeightFor(std::size_t lanes);

/// A lane's part of a sound, full scale being 1: a column for each of the frame's, or where a frame is wider than a
/// column the samples themselves, from the first in sight on, and one beyond the end where there is one.
struct DrawnLane {
    SoundLane lane;
    std::vector<WaveformColumn> columns;
    std::vector<float> samples;
};

struct DrawnSound {
    double from = 0, to = 0; // frames
    double sampleRate = 0;
    float clipping = std::numeric_limits<float>::infinity(); // samples as high as that have no room above them
    std::vector<DrawnLane> lanes;
};

/// Of an overview that has a point for each column at least, the frames from `from` up to `to`.
DrawnSound drawnPoints(const Waveform& waveform, double from, double to, const SoundLane& lane,
                       const PictureFrame& frame);

/// The upper and the lower edge of the wave at a place; y grows downwards. Never less than a hairline apart.
struct PictureExtent {
    float top = 0, bottom = 0;
};

struct PicturePoint {
    float x = 0, y = 0;
};

struct PictureLane {
    float top = 0, bottom = 0;
    std::vector<PictureExtent> peaks; // one per column of the PNG, from the lowest to the highest sample
    std::vector<PictureExtent> body;  // one per column, between the averages
    std::vector<PicturePoint> line;   // instead of them, through the samples
    bool hasDots = false;             // on the samples
};

/// Sound that is clipped in the file, or cut off by the picture's edge.
struct PictureMark {
    float left = 0, top = 0, right = 0, bottom = 0;
    bool isClipping = false;
};

enum class Anchor { start, middle, end };

/// A tick with its text, if any. `at` is x on the time axis, and y on the amplitude scale.
struct PictureTick {
    float at = 0;
    std::string label;
    // Of the label on the time axis: its x, and which part of it is there.
    float labelAt = 0;
    Anchor anchor = Anchor::middle;
};

struct WaveformPicture {
    PictureFrame frame;
    std::vector<PictureLane> lanes;
    std::vector<PictureMark> marks;
    std::vector<float> borders; // y between lanes
    std::vector<PictureTick> times;
    std::vector<PictureTick> levels;
    std::vector<PictureTick> names; // of the lanes, ending at the frame's labelsEnd
    PictureTick unit;               // of the levels, at a y of its own; no label: none
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
/// The line through samples, and the dots on them.
inline constexpr float kLineWidth = 1.5F, kDotRadius = 2.5F;

/// Lays out what is drawn; at least one frame is in sight.
WaveformPicture pictureOf(const PictureFrame& frame, const DrawnSound& sound, const PictureSettings& settings);
