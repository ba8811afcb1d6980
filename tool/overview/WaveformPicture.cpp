#include "tool/overview/WaveformPicture.h"

#include "tool/overview/LabelFont.h"
#include "tool/overview/LevelScale.h"
#include "tool/overview/TimeAxis.h"

#include <algorithm>
#include <cmath>

namespace {

constexpr int kTimeStripHeight = 27;
constexpr int kLowestWithTimeStrip = 72; // a lower picture is all wave
constexpr int kLeastLane = 8;
constexpr int kScaleWidth = 44;
constexpr int kNarrowestWithLabels = 120, kNarrowestWithScale = 40; // width beside the labels
constexpr float kUnitEnd = 30;                                      // in the corner below the scale
constexpr float kHairline = 1;
constexpr float kLeastBetweenLabels = 14; // between baselines
constexpr float kEdge = 2;                // between a label and the picture's edge
constexpr float kGapBetweenTimes = 6;
constexpr float kMarkHeight = 3;
constexpr float kLeastBetweenDots = 8;

PictureExtent extentOf(const LevelScale& scale, float low, float high)
{
    PictureExtent extent{scale.y(high), scale.y(low)};
    if (extent.bottom - extent.top < kHairline) {
        const float middle = (extent.top + extent.bottom) / 2;
        extent = {middle - kHairline / 2, middle + kHairline / 2};
    }
    // Anything beyond the lane leaves a trace at its edge.
    return {std::clamp(extent.top, scale.top(), scale.bottom() - kHairline),
            std::clamp(extent.bottom, scale.top() + kHairline, scale.bottom())};
}

// Closes gaps between columns by extending both halfway, because a wave has no gaps.
void join(std::vector<PictureExtent>& extents)
{
    for (std::size_t i = 1; i < extents.size(); ++i) {
        PictureExtent &before = extents[i - 1], &after = extents[i];
        if (before.bottom < after.top)
            before.bottom = after.top = (before.bottom + after.top) / 2;
        else if (after.bottom < before.top)
            after.bottom = before.top = (after.bottom + before.top) / 2;
    }
}

// Draws one lane.
class LaneDrawing {
public:
    LaneDrawing(WaveformPicture& picture, const DrawnSound& sound, const LevelScale& scale)
        : picture_(picture),
          sound_(sound),
          scale_(scale)
    {
        lane_.top = scale.top();
        lane_.bottom = scale.bottom();
    }

    PictureLane draw(const DrawnLane& drawn)
    {
        if (drawn.samples.empty())
            drawColumns(drawn.columns);
        else
            drawLine(drawn.samples);
        return std::move(lane_);
    }

private:
    void drawColumns(const std::vector<WaveformColumn>& columns)
    {
        const float width = 1.0F / static_cast<float>(picture_.frame.scaleFactor);
        for (std::size_t i = 0; i < columns.size(); ++i) {
            const WaveformColumn& column = columns[i];
            lane_.peaks.push_back(extentOf(scale_, column.low, column.high));
            lane_.body.push_back(extentOf(scale_, column.meanLow, column.meanHigh));
            const float x = static_cast<float>(picture_.frame.left) + static_cast<float>(i) * width;
            mark(x, x + width, column.high);
            mark(x, x + width, column.low);
        }
        join(lane_.peaks);
        join(lane_.body);
    }

    void drawLine(const std::vector<float>& samples)
    {
        const double pixelsPerFrame = picture_.frame.plotWidth / (sound_.to - sound_.from);
        lane_.hasDots = pixelsPerFrame >= kLeastBetweenDots;
        const double first = std::floor(sound_.from);
        for (std::size_t i = 0; i < samples.size(); ++i) {
            const auto x = static_cast<float>(picture_.frame.left +
                                              (first + static_cast<double>(i) - sound_.from) * pixelsPerFrame);
            lane_.line.push_back({x, scale_.y(samples[i])});
            mark(x - kMarkHeight / 2, x + kMarkHeight / 2, samples[i]);
        }
    }

    void mark(float left, float right, float sample)
    {
        const bool isClipping = std::abs(sample) >= sound_.clipping;
        const float y = scale_.y(sample);
        const bool isCut = y < scale_.top() || y > scale_.bottom();
        if (!isClipping && !isCut)
            return;
        left = std::max(left, static_cast<float>(picture_.frame.left));
        right = std::min(right, static_cast<float>(picture_.frame.width));
        const float tip = std::clamp(y, scale_.top(), scale_.bottom());
        const bool isUpper = sample > 0;
        if (left < right)
            picture_.marks.push_back({left, isUpper ? tip : std::max(tip - kMarkHeight, scale_.top()), right,
                                      isUpper ? std::min(tip + kMarkHeight, scale_.bottom()) : tip, isClipping});
    }

    WaveformPicture& picture_;
    const DrawnSound& sound_;
    const LevelScale& scale_;
    PictureLane lane_;
};

double peakOf(const DrawnSound& sound)
{
    float peak = 0;
    for (const DrawnLane& lane : sound.lanes) {
        for (const WaveformColumn& column : lane.columns)
            peak = std::max({peak, column.high, -column.low});
        for (const float sample : lane.samples)
            peak = std::max(peak, std::abs(sample));
    }
    return peak;
}

double gainFor(const DrawnSound& sound, const PictureSettings& settings)
{
    constexpr double kMost = 120; // decibels: below 20 bits
    const double peak = peakOf(sound);
    if (settings.gain || peak == 0)
        return settings.gain.value_or(0);
    return std::clamp(-20 * std::log10(peak), -kMost, kMost);
}

void markTimes(WaveformPicture& picture, double start, double end)
{
    const PictureFrame& frame = picture.frame;
    const float left = picture.unit.label.empty() ? kEdge : kUnitEnd, right = static_cast<float>(frame.width) - kEdge;
    float taken = left - kGapBetweenTimes;
    for (TimeTick& tick : timeTicks(start, end, frame.plotWidth)) {
        const double x = frame.left + (tick.seconds - start) / (end - start) * frame.plotWidth;
        // The very last tick is moved onto the last column.
        PictureTick placed{static_cast<float>(std::clamp(x, 0.0, frame.width - 1.0)), {}, 0, Anchor::middle};
        if (!tick.label.empty()) {
            const float width = broadestWidth(tick.label, kLabelHeight), centre = std::floor(placed.at) + 0.5F;
            const float begin = std::clamp(centre - width / 2, std::min(left, right - width), right - width);
            if (begin >= left && begin >= taken + kGapBetweenTimes) {
                placed.label = std::move(tick.label);
                placed.anchor = begin > centre - width / 2   ? Anchor::start
                                : begin < centre - width / 2 ? Anchor::end
                                                             : Anchor::middle;
                placed.labelAt = placed.anchor == Anchor::start ? begin
                                 : placed.anchor == Anchor::end ? begin + width
                                                                : centre;
                taken = begin + width;
            }
        }
        picture.times.push_back(std::move(placed));
    }
}

// Places labels from the top down and drops those without room.
class LabelColumn {
public:
    explicit LabelColumn(std::vector<PictureTick>& ticks, float height) : ticks_(ticks), height_(height) {}

    void add(float y, const std::string& label)
    {
        const float baseline = std::round(std::clamp(y + kLabelHeight / 2, kLabelHeight + 1, height_ - 1));
        const bool hasRoom = baseline - taken_ >= kLeastBetweenLabels && height_ > kLabelHeight + 2;
        ticks_.push_back({y, hasRoom ? label : std::string(), baseline, Anchor::end});
        taken_ = hasRoom ? baseline : taken_;
    }

private:
    std::vector<PictureTick>& ticks_;
    float height_;
    float taken_ = -kLeastBetweenLabels;
};

void nameLanes(WaveformPicture& picture, const DrawnSound& sound)
{
    if (picture.frame.labelsEnd == 0)
        return;
    LabelColumn names(picture.names, static_cast<float>(picture.frame.plotHeight));
    for (std::size_t i = 0; i < sound.lanes.size(); ++i) {
        const PictureLane& lane = picture.lanes[i];
        const SoundLane& named = sound.lanes[i].lane;
        const float centre = (lane.top + lane.bottom) / 2, quarter = (lane.bottom - lane.top) / 4;
        names.add(named.lowerLabel.empty() ? centre : centre - quarter, named.label);
        if (!named.lowerLabel.empty())
            names.add(centre + quarter, named.lowerLabel);
    }
}

} // namespace

PictureFrame::PictureFrame(const PictureSettings& settings, const std::vector<SoundLane>& lanes)
    : width(settings.width),
      height(settings.height),
      scaleFactor(settings.scaleFactor)
{
    float widest = 0;
    for (const SoundLane& lane : lanes)
        for (const std::string& label : {lane.label, lane.lowerLabel})
            if (!label.empty())
                widest = std::max(widest, broadestWidth(label, kLabelHeight));
    plotHeight = height - (height < kLowestWithTimeStrip ? 0 : kTimeStripHeight);
    hasScale = settings.scale && width >= kScaleWidth + kNarrowestWithScale;
    const int names = static_cast<int>(std::ceil(kLabelGap + widest)), scaleWidth = hasScale ? kScaleWidth : 0;
    if (widest > 0 && width - names - scaleWidth >= kNarrowestWithLabels &&
        plotHeight >= static_cast<int>(kLeastBetweenLabels)) {
        labelsEnd = names;
        left = names + (hasScale ? 0 : static_cast<int>(kLabelGap));
    }
    left += scaleWidth;
    plotWidth = width - left;
}

int leastHeightFor(std::size_t lanes)
{
    const int plot = static_cast<int>(std::min<std::size_t>(lanes, 1U << 20)) * kLeastLane;
    return plot < kLowestWithTimeStrip ? plot : plot + kTimeStripHeight;
}

DrawnSound drawnPoints(const Waveform& waveform, double from, double to, const SoundLane& lane,
                       const PictureFrame& frame)
{
    constexpr float kFullScale = 127;
    DrawnSound drawn;
    drawn.from = from;
    drawn.to = to;
    drawn.sampleRate = waveform.sampleRate;
    drawn.lanes.push_back({lane, foldedColumns(waveform, from, to, frame.columns()), {}});
    for (WaveformColumn& column : drawn.lanes.front().columns)
        for (float* const value : {&column.low, &column.high, &column.meanLow, &column.meanHigh})
            *value /= kFullScale;
    return drawn;
}

WaveformPicture pictureOf(const PictureFrame& frame, const DrawnSound& sound, const PictureSettings& settings)
{
    WaveformPicture picture{
        .frame = frame, .lanes = {}, .marks = {}, .borders = {}, .times = {}, .levels = {}, .names = {}, .unit = {}};
    const double gain = gainFor(sound, settings);
    const float height = static_cast<float>(frame.plotHeight), count = static_cast<float>(sound.lanes.size());
    LabelColumn levels(picture.levels, height);
    for (std::size_t i = 0; i < sound.lanes.size(); ++i) {
        const float top = height * static_cast<float>(i) / count, bottom = height * static_cast<float>(i + 1) / count;
        const LevelScale scale(top, bottom, gain);
        picture.lanes.push_back(LaneDrawing(picture, sound, scale).draw(sound.lanes[i]));
        if (i > 0)
            picture.borders.push_back(top);
        if (frame.hasScale)
            for (const Level& level : scale.levels())
                levels.add(level.y, level.label);
    }
    if (frame.hasScale && frame.hasTimeAxis())
        picture.unit = {static_cast<float>(frame.plotHeight) + kLabelBaseline, "dB"};
    nameLanes(picture, sound);
    if (frame.hasTimeAxis())
        markTimes(picture, sound.from / sound.sampleRate, sound.to / sound.sampleRate);
    return picture;
}
