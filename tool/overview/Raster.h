// A raster of palette indices, which stand for the background, the wave, the axis and clipping.
#pragma once

#include "tool/overview/PictureColors.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <vector>

class Raster {
public:
    Raster(int width, int height);

    int width() const { return width_; }
    int height() const { return height_; }
    /// Row by row, without gaps.
    const std::vector<std::uint8_t>& pixels() const { return pixels_; }
    static std::array<Color, 256> palette(const PictureColors& colors);

    /// Draws the wave over the axis, coverage 0 to 1. The stronger of two waves remains; 0 changes nothing.
    void putWave(int x, int y, float coverage)
    {
        if (const int level = static_cast<int>(coverage * kWaveLevels + 0.5F); level > 0) {
            std::uint8_t& pixel = at(x, y);
            pixel = static_cast<std::uint8_t>(pixel <= kWaveLevels ? std::max<int>(pixel, level) : level);
        }
    }
    /// Covers everything else.
    void putMark(int x, int y, bool isClipping) { at(x, y) = isClipping ? kClipping : kWholeAxis; }
    /// Draws a part of the axis, 0 to 1; the stronger of two remains. Ignores positions outside the raster.
    void putAxis(int x, int y, float coverage);
    /// Fills a rectangle in the axis color; edges between pixels are antialiased.
    void fillAxis(float left, float top, float right, float bottom, float tone);

private:
    static constexpr int kWaveLevels = 190; // indices 1 to 190; 0 is the background
    static constexpr std::uint8_t kClipping = 191;
    static constexpr int kAxisLevels = 64; // indices 192 to 255
    static constexpr std::uint8_t kWholeAxis = 255;

    std::uint8_t& at(int x, int y)
    {
        return pixels_[static_cast<std::size_t>(y) * static_cast<std::size_t>(width_) + static_cast<std::size_t>(x)];
    }

    int width_, height_;
    std::vector<std::uint8_t> pixels_;
};

/// Accumulates how much of each pixel in a column is covered by spans.
class ColumnCoverage {
public:
    explicit ColumnCoverage(int rows) : changes_(static_cast<std::size_t>(rows) + 2), coverage_(changes_.size()) {}

    /// Adds `weight` times the span, clipped to the column.
    void add(float top, float bottom, float weight);
    /// The coverage of every row by the spans added since the last call.
    const std::vector<float>& take();

private:
    void addEdge(float y, float weight);

    std::vector<float> changes_; // differences of coverage between rows
    std::vector<float> coverage_;
};
