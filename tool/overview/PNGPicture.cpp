#include "tool/overview/PNGPicture.h"

#include "tool/overview/LabelFont.h"
#include "tool/overview/PNGFile.h"

#include <algorithm>
#include <cmath>

namespace {

// Draws in pixels of the PNG, `factor` by `factor` for each of the picture's.
class PictureDrawing {
public:
    PictureDrawing(Raster& raster, const WaveformPicture& picture, int x, int y)
        : raster_(raster),
          picture_(picture),
          frame_(picture.frame),
          factor_(picture.frame.scaleFactor),
          scale_(static_cast<float>(picture.frame.scaleFactor)),
          x_(x * factor_),
          y_(y * factor_)
    {
    }

    void draw()
    {
        drawScale();
        for (const PictureLane& lane : picture_.lanes)
            if (lane.line.empty())
                drawColumns(lane);
            else
                drawLine(lane);
        for (const PictureMark& mark : picture_.marks)
            drawMark(mark);
        for (const PictureTick& name : picture_.names)
            drawText(name.label, static_cast<float>(frame_.labelsEnd), name.labelAt, Anchor::end);
        if (frame_.hasTimeAxis())
            drawTimeAxis();
    }

private:
    void drawColumns(const PictureLane& lane)
    {
        const int first = static_cast<int>(lane.top * scale_),
                  rows = static_cast<int>(std::ceil(lane.bottom * scale_)) - first;
        const auto at = [&](float y) { return y * scale_ - static_cast<float>(first); };
        ColumnCoverage peak(rows), body(rows);
        for (int column = 0; column < frame_.columns(); ++column) {
            const auto index = static_cast<std::size_t>(column);
            const PictureExtent &outer = lane.peaks[index], &inner = lane.body[index];
            peak.add(at(outer.top), at(outer.bottom), 1);
            body.add(at(inner.top), at(inner.bottom), 1);
            const auto& peaks = peak.take();
            const auto& bodies = body.take();
            const int top = std::max(static_cast<int>(std::min(at(outer.top), at(inner.top))), 0);
            const int end = std::min(static_cast<int>(std::max(at(outer.bottom), at(inner.bottom))) + 1, rows);
            for (int y = top; y < end; ++y) {
                const auto row = static_cast<std::size_t>(y);
                raster_.putWave(x_ + frame_.left * factor_ + column, y_ + first + y,
                                bodies[row] + kPeakTone * std::max(peaks[row] - bodies[row], 0.0F));
            }
        }
    }

    // Sets every pixel near the line according to its distance.
    void drawLine(const PictureLane& lane)
    {
        const float reach = kLineWidth / 2 * scale_;
        if (lane.line.size() == 1)
            drawSegment(lane, lane.line[0], {lane.line[0].x + 1, lane.line[0].y}, reach);
        for (std::size_t i = 1; i < lane.line.size(); ++i)
            drawSegment(lane, lane.line[i - 1], lane.line[i], reach);
        if (lane.hasDots)
            for (const PicturePoint& point : lane.line)
                drawSegment(lane, point, point, kDotRadius * scale_);
    }

    void drawSegment(const PictureLane& lane, PicturePoint from, PicturePoint to, float reach)
    {
        const float x0 = from.x * scale_, y0 = from.y * scale_, dx = to.x * scale_ - x0, dy = to.y * scale_ - y0;
        const float length = dx * dx + dy * dy, top = std::min(y0, y0 + dy), bottom = std::max(y0, y0 + dy);
        const auto clamped = [](float value, int low, int high) {
            return static_cast<int>(std::clamp(value, static_cast<float>(low), static_cast<float>(high)));
        };
        const int plot = frame_.left * factor_, end = frame_.width * factor_;
        const int firstRow = static_cast<int>(lane.top * scale_), lastRow = static_cast<int>(lane.bottom * scale_);
        for (int x = clamped(x0 - reach - 1, plot, end); x < clamped(x0 + dx + reach + 2, plot, end); ++x) {
            // On a steep line over many rows, only rows near the line in this column count.
            const float near = dx > 0 ? std::clamp((static_cast<float>(x) + 0.5F - x0) / dx, 0.0F, 1.0F) : 0;
            const float spread = (dx > 0 ? std::abs(dy / dx) * (reach + 1) : std::abs(dy)) + reach + 1;
            const float centre = y0 + near * dy;
            const int begin = clamped(std::max(top - reach - 1, centre - spread), firstRow, lastRow);
            const int stop = clamped(std::min(bottom + reach + 2, centre + spread + 1), firstRow, lastRow);
            for (int y = begin; y < stop; ++y) {
                const float px = static_cast<float>(x) + 0.5F - x0, py = static_cast<float>(y) + 0.5F - y0;
                const float part = length > 0 ? std::clamp((px * dx + py * dy) / length, 0.0F, 1.0F) : 0;
                const float distance = std::hypot(px - part * dx, py - part * dy);
                raster_.putWave(x_ + x, y_ + y, std::clamp(reach + 0.5F - distance, 0.0F, 1.0F));
            }
        }
    }

    void drawMark(const PictureMark& mark)
    {
        const auto pixel = [this](float at) { return static_cast<int>(std::lround(at * scale_)); };
        const int bottom = std::max(pixel(mark.bottom), pixel(mark.top) + 1);
        for (int y = pixel(mark.top); y < std::min(bottom, frame_.plotHeight * factor_); ++y)
            for (int x = pixel(mark.left); x < std::max(pixel(mark.right), pixel(mark.left) + 1); ++x)
                if (x < frame_.width * factor_)
                    raster_.putMark(x_ + x, y_ + y, mark.isClipping);
    }

    void drawTimeAxis()
    {
        const auto top = static_cast<float>(frame_.plotHeight);
        fill(static_cast<float>(frame_.left), top, static_cast<float>(frame_.width), top + 1, kAxisLineTone);
        for (const PictureTick& tick : picture_.times) {
            const float x = std::floor(tick.at); // a crisp line
            const int length = tick.label.empty() ? kMinorTickLength : kMajorTickLength;
            fill(x, top, x + 1, top + 1 + static_cast<float>(length), tick.label.empty() ? kAxisLineTone : 1);
            drawText(tick.label, tick.labelAt, top + kLabelBaseline, tick.anchor);
        }
    }

    void drawScale()
    {
        const auto left = static_cast<float>(frame_.left), right = static_cast<float>(frame_.width);
        for (const float border : picture_.borders)
            fill(left, std::floor(border), right, std::floor(border) + 1, kAxisLineTone);
        for (const PictureTick& level : picture_.levels) {
            const float y = std::floor(level.at - 0.5F);
            fill(left - kLevelTickLength, y, left, y + 1, 1);
            fill(left, y, right, y + 1, kLevelLineTone);
            drawText(level.label, left - kLabelGap, level.labelAt, Anchor::end);
        }
        drawText(picture_.unit.label, kLabelGap, picture_.unit.at, Anchor::start);
    }

    void fill(float left, float top, float right, float bottom, float tone)
    {
        const auto x = static_cast<float>(x_), y = static_cast<float>(y_);
        raster_.fillAxis(x + left * scale_, y + top * scale_, x + right * scale_, y + bottom * scale_, tone);
    }

    void drawText(const std::string& text, float x, float baseline, Anchor anchor)
    {
        const float width = labelWidth(text, kLabelHeight);
        const float left = anchor == Anchor::start ? x : anchor == Anchor::end ? x - width : x - width / 2;
        drawLabel(raster_, text, static_cast<float>(x_) + std::round(left * scale_),
                  static_cast<float>(y_) + baseline * scale_, kLabelHeight * scale_);
    }

    Raster& raster_;
    const WaveformPicture& picture_;
    const PictureFrame& frame_;
    int factor_;
    float scale_;
    int x_, y_; // position of the picture in the raster
};

} // namespace

void drawPicture(Raster& raster, const WaveformPicture& picture, int x, int y)
{
    PictureDrawing(raster, picture, x, y).draw();
}

std::string pngOf(const WaveformPicture& picture, const PictureColors& colors)
{
    const PictureFrame& frame = picture.frame;
    Raster raster(frame.width * frame.scaleFactor, frame.height * frame.scaleFactor);
    drawPicture(raster, picture, 0, 0);
    PNGFile png(raster.width(), raster.height(), colors);
    png.add(raster);
    png.finish();
    return png.take();
}
