#include "tool/overview/Raster.h"

#include <algorithm>
#include <cmath>

Raster::Raster(int width, int height)
    : width_(width),
      height_(height),
      pixels_(static_cast<std::size_t>(width) * static_cast<std::size_t>(height))
{
}

std::array<Color, 256> Raster::palette(const PictureColors& colors)
{
    std::array<Color, 256> palette;
    for (int i = 0; i <= kWaveLevels; ++i)
        palette[static_cast<std::size_t>(i)] =
            mixed(colors.background, colors.wave, static_cast<double>(i) / kWaveLevels);
    for (int i = 1; i <= kAxisLevels; ++i)
        palette[static_cast<std::size_t>(kClipping + i)] =
            mixed(colors.background, colors.axis, static_cast<double>(i) / kAxisLevels);
    palette[kClipping] = colors.clipping;
    return palette;
}

void Raster::putAxis(int x, int y, float coverage)
{
    const int level = static_cast<int>(coverage * kAxisLevels + 0.5F);
    if (level <= 0 || x < 0 || y < 0 || x >= width_ || y >= height_)
        return;
    std::uint8_t& pixel = at(x, y);
    if (pixel == 0 || pixel > kClipping)
        pixel = std::max(pixel, static_cast<std::uint8_t>(kClipping + level));
}

void Raster::fillAxis(float left, float top, float right, float bottom, float tone)
{
    const auto overlap = [](int pixel, float from, float to) {
        return std::clamp(std::min(to, static_cast<float>(pixel) + 1) - std::max(from, static_cast<float>(pixel)), 0.0F,
                          1.0F);
    };
    for (int y = static_cast<int>(std::floor(top)); static_cast<float>(y) < bottom; ++y)
        for (int x = static_cast<int>(std::floor(left)); static_cast<float>(x) < right; ++x)
            putAxis(x, y, tone * overlap(x, left, right) * overlap(y, top, bottom));
}

void ColumnCoverage::add(float top, float bottom, float weight)
{
    const float rows = static_cast<float>(changes_.size() - 2);
    addEdge(std::clamp(top, 0.0F, rows), weight);
    addEdge(std::clamp(bottom, 0.0F, rows), -weight);
}

// Covers everything below the edge, and in its own row the part below it.
void ColumnCoverage::addEdge(float y, float weight)
{
    const auto row = static_cast<std::size_t>(y);
    const float above = y - static_cast<float>(row);
    changes_[row] += weight * (1 - above);
    changes_[row + 1] += weight * above;
}

const std::vector<float>& ColumnCoverage::take()
{
    float sum = 0;
    for (std::size_t i = 0; i < changes_.size(); ++i) {
        sum += changes_[i];
        coverage_[i] = std::clamp(sum, 0.0F, 1.0F);
        changes_[i] = 0;
    }
    return coverage_;
}
