#include "media/decoding/PolyphaseResampler.h"

#include "media/decoding/PolyphaseSums.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <cmath>
#include <memory>
#include <numbers>
#include <numeric>

namespace platform {

namespace {

// The filter is a sinc with 128 crossings at the lower rate, under a Kaiser window. From 48 to 44.1 kHz it attenuates
// 22.5 kHz by 119 dB.
constexpr double kCrossings = 128;
constexpr double kKaiserBeta = 12;
constexpr double kCutoff = 0.95;

constexpr std::uint64_t kMostPhases = 1024; // however long the filters are; or
constexpr std::uint64_t kManyCoefficients = 1 << 20;
constexpr std::uint64_t kMostCoefficients = 1 << 24;

/// The modified Bessel function of the first kind and order 0, by its series.
double bessel0(double x)
{
    double sum = 1, term = 1;
    for (int k = 1; term > sum * 1e-17; ++k) {
        term *= (x / 2 / k) * (x / 2 / k);
        sum += term;
    }
    return sum;
}

} // namespace

std::unique_ptr<PolyphaseResampler> PolyphaseResampler::make(std::uint32_t channels, std::uint32_t fromRate,
                                                             std::uint32_t toRate)
{
    const auto isRate = [](std::uint32_t rate) { return rate >= 1 && rate <= kMaxRate; };
    if (channels < 1 || channels > kMaxChannels || !isRate(fromRate) || !isRate(toRate) || fromRate == toRate)
        return nullptr;
    const std::uint32_t divisor = std::gcd(fromRate, toRate);
    const std::uint64_t phases = toRate / divisor;
    const double factor = std::min(toRate * kCutoff / fromRate, 1.0);
    const auto least = static_cast<std::uint64_t>(std::ceil(kCrossings / factor));
    const std::uint64_t taps =
        (least + PolyphaseRun::kSideBySide - 1) / PolyphaseRun::kSideBySide * PolyphaseRun::kSideBySide;
    const bool isExact = phases <= kMostPhases || phases * taps <= kManyCoefficients;
    if (!isExact || phases * taps > kMostCoefficients)
        return nullptr;
    return std::unique_ptr<PolyphaseResampler>(
        new PolyphaseResampler(channels, taps, phases, fromRate / divisor, factor));
}

PolyphaseResampler::PolyphaseResampler(std::uint32_t channels, std::size_t taps, std::size_t phases, std::size_t step,
                                       double factor)
    : channels_(channels),
      taps_(taps),
      phases_(phases),
      step_(step),
      coefficients_(phases * taps + PolyphaseRun::kSideBySide)
{
    void* start = coefficients_.data();
    std::size_t room = coefficients_.size() * sizeof(float);
    filters_ = static_cast<float*>(
        std::align(PolyphaseRun::kSideBySide * sizeof(float), phases * taps * sizeof(float), start, room));
    buildFilters(factor);
    reset();
}

/// Every filter passes a constant level unchanged.
void PolyphaseResampler::buildFilters(double factor)
{
    const double half = static_cast<double>(taps_) / 2;
    std::vector<double> filter(taps_);
    for (std::size_t phase = 0; phase < phases_; ++phase) {
        const double center = half - 1 + static_cast<double>(phase) / static_cast<double>(phases_);
        double sum = 0;
        for (std::size_t tap = 0; tap < taps_; ++tap) {
            const double distance = static_cast<double>(tap) - center;
            const double angle = std::numbers::pi * distance * factor;
            const double place = std::min(std::abs(distance) / half, 1.0);
            filter[tap] =
                (angle == 0 ? 1 : std::sin(angle) / angle) * bessel0(kKaiserBeta * std::sqrt(1 - place * place));
            sum += filter[tap];
        }
        std::transform(filter.begin(), filter.end(), filters_ + phase * taps_,
                       [sum](double value) { return static_cast<float>(value / sum); });
    }
}

std::int32_t PolyphaseResampler::reset()
{
    filled_ = position_ = phase_ = 0;
    const std::size_t ahead = taps_ / 2 - 1;
    makeRoom(ahead);
    for (std::size_t channel = 0; channel < channels_; ++channel)
        std::fill_n(samples_.begin() + static_cast<std::ptrdiff_t>(channel * capacity_), ahead, 0.0F);
    filled_ = ahead;
    return kStatusOK;
}

/// Discards frames that are no longer needed only when the room is used up.
void PolyphaseResampler::makeRoom(std::size_t frames)
{
    if (filled_ + frames <= capacity_)
        return;
    const std::size_t kept = filled_ - std::min(position_, filled_);
    const std::size_t capacity = kept + frames <= capacity_ ? capacity_ : kept + frames + 2 * taps_;
    std::vector<float> larger(capacity > capacity_ ? capacity * channels_ : 0);
    std::vector<float>& target = larger.empty() ? samples_ : larger;
    for (std::size_t channel = 0; channel < channels_ && kept > 0; ++channel) {
        const float* const from = samples_.data() + channel * capacity_ + position_;
        std::copy_n(from, kept, target.data() + channel * capacity); // to the block's start, or the new block
    }
    if (!larger.empty())
        samples_.swap(larger);
    capacity_ = capacity;
    position_ -= filled_ - kept;
    filled_ = kept;
}

void PolyphaseResampler::take(const float* from, std::size_t frames)
{
    makeRoom(frames);
    for (std::size_t channel = 0; channel < channels_; ++channel) {
        float* const to = samples_.data() + channel * capacity_ + filled_;
        for (std::size_t frame = 0; frame < frames; ++frame)
            to[frame] = from[frame * channels_ + channel];
    }
    filled_ += frames;
}

std::int32_t PolyphaseResampler::convert(const float* from, std::uint32_t taken, float* to, std::uint32_t& made)
{
    if (taken > 0)
        take(from, taken);
    // The filter of the last frame that can be made ends with the last frame that is there.
    const std::size_t room = filled_ >= position_ + taps_ ? filled_ - position_ - taps_ + 1 : 0;
    const std::size_t possible = room > 0 ? (room * phases_ - phase_ - 1) / step_ + 1 : 0;
    const std::size_t frames = std::min<std::size_t>(made, possible);
    made = static_cast<std::uint32_t>(frames);
    if (frames == 0)
        return kStatusOK;
    runPolyphase({.filters = filters_,
                  .taps = taps_,
                  .phases = phases_,
                  .step = step_,
                  .phase = phase_,
                  .samples = samples_.data() + position_,
                  .stride = capacity_,
                  .channels = channels_,
                  .to = to,
                  .frames = frames});
    const std::size_t on = phase_ + frames * step_;
    position_ += on / phases_;
    phase_ = on % phases_;
    return kStatusOK;
}

} // namespace platform
