// The layout of a waveform picture in pixels, shared by PNG and SVG.
#pragma once

#include "tool/overview/SoundLanes.h"
#include "tool/shared/waveform/WaveformOutline.h"

#include <limits>
#include <optional>
#include <string>
#include <vector>

struct PictureSettings {
    int width = 1800;
    int height = 280;
    int scaleFactor = 1;            // pixels of the PNG per pixel here
    std::optional<double> gain = 0; // decibels; none: the highest peak reaches full scale
    bool scale = false;             // draws an amplitude scale on the left
};

/// The parts of a picture, before anything is drawn in them.
struct PictureFrame {
    /// Reserves room for the lanes' labels, if there are any, and for the scale.
    PictureFrame(const PictureSettings& settings, const std::vector<SoundLane>& lanes);

    int width, height, scaleFactor;
    // The wave's area. The time axis is below it unless the picture is too low; lane names and the amplitude scale are
    // to its left.
    int left = 0, plotWidth = 0, plotHeight = 0;
    bool hasScale = false; // requested, and there is room
    int labelsEnd = 0;     // right edge of the lanes' names; 0 if there is no room for them

    /// Pixel columns in the PNG.
    int columns() const { return plotWidth * scaleFactor; }
    bool hasTimeAxis() const { return plotHeight < height; }
};

/// The least height at which that many lanes can be distinguished.
int leastHeightFor(std::size_t lanes);

/// A lane's part of a sound, with full scale 1: a column for each of the frame's, or if a frame is wider than a column,
/// the samples themselves from the first visible one on, and one beyond the end if it exists.
struct DrawnLane {
    SoundLane lane;
    std::vector<WaveformColumn> columns;
    std::vector<float> samples;
};

struct DrawnSound {
    double from = 0, to = 0; // frames
    double sampleRate = 0;
    float clipping = std::numeric_limits<float>::infinity(); // samples this high are clipped
    std::vector<DrawnLane> lanes;
};

/// Draws the frames from `from` up to `to` of an overview with at least one point per column.
DrawnSound drawnPoints(const Waveform& waveform, double from, double to, const SoundLane& lane,
                       const PictureFrame& frame);

/// Upper and lower edge of the wave; y grows downwards. They are at least a hairline apart.
struct PictureExtent {
    float top = 0, bottom = 0;
};

struct PicturePoint {
    float x = 0, y = 0;
};

struct PictureLane {
    float top = 0, bottom = 0;
    std::vector<PictureExtent> peaks; // one per column of the PNG, from lowest to highest sample
    std::vector<PictureExtent> body;  // one per column, between the averages
    std::vector<PicturePoint> line;   // replaces both: a line through samples
    bool hasDots = false;             // on the samples
};

/// Sound that is clipped in the file, or cut off at the picture's edge.
struct PictureMark {
    float left = 0, top = 0, right = 0, bottom = 0;
    bool isClipping = false;
};

enum class Anchor { start, middle, end };

/// A tick, and its text if it has one. `at` is x on the time axis, y on the amplitude scale.
struct PictureTick {
    float at = 0;
    std::string label;
    // Position and anchor of its label on the time axis.
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
    std::vector<PictureTick> names; // of the lanes, right-aligned at the frame's labelsEnd
    PictureTick unit;               // of the levels, at its own y; no label if there is none
};

/// Strength of the peaks relative to the body.
inline constexpr float kPeakTone = 0.5F;
/// Strength of the amplitude scale's lines behind the wave, relative to its ticks.
inline constexpr float kLevelLineTone = 0.22F;
/// Strength of the time axis and its small ticks relative to the others.
inline constexpr float kAxisLineTone = 0.6F;
inline constexpr int kMajorTickLength = 6, kMinorTickLength = 3, kLevelTickLength = 4;
/// Labels: height of a digit, distance from the top of the strip to the baseline, gap between scale and plot.
inline constexpr float kLabelHeight = 8, kLabelBaseline = 19, kLabelGap = 8;
/// The line through samples and the dots on them.
inline constexpr float kLineWidth = 1.5F, kDotRadius = 2.5F;

/// Lays out the drawing; at least one frame is visible.
WaveformPicture pictureOf(const PictureFrame& frame, const DrawnSound& sound, const PictureSettings& settings);
