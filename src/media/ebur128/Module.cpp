// The module's entry point: libebur128 behind the meter's interface.
#include "media/loudness/LoudnessMeter.h"
#include "platform/core/Export.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <ebur128.h>
#include <limits>
#include <memory>
#include <new>
#include <numeric>
#include <utility>
#include <vector>

namespace {

using platform::Loudness;
using platform::LoudnessMeter;

constexpr int kModes = EBUR128_MODE_I | EBUR128_MODE_TRUE_PEAK;
constexpr unsigned long kStepMilliseconds = 100;
constexpr std::size_t kMomentarySteps = 4, kShortTermSteps = 30;
constexpr double kNone = -std::numeric_limits<double>::infinity();
constexpr double kAbsoluteGate = -70;  // LUFS; quieter sound is ignored everywhere
constexpr double kRelativeGate = 0.01; // of the mean: -20 LU

// WAVE's channel mask.
constexpr std::uint32_t kFrontLeft = 1U << 0, kFrontRight = 1U << 1, kEffects = 1U << 3, kBackLeft = 1U << 4,
                        kBackRight = 1U << 5, kSideLeft = 1U << 9, kSideRight = 1U << 10;

/// Maps a speaker to its position in ITU-R BS.1770-4. Speakers outside 5.1 and 7.1 weigh like the front.
channel placeOf(std::uint32_t speaker, std::uint32_t speakers)
{
    const bool hasSides = (speakers & (kSideLeft | kSideRight)) != 0;
    switch (speaker) {
    case kFrontLeft:
        return EBUR128_LEFT;
    case kFrontRight:
        return EBUR128_RIGHT;
    case kEffects:
        return EBUR128_UNUSED;
    case kBackLeft: // the surrounds, if there are no others
        return hasSides ? EBUR128_Mp135 : EBUR128_LEFT_SURROUND;
    case kBackRight:
        return hasSides ? EBUR128_Mm135 : EBUR128_RIGHT_SURROUND;
    case kSideLeft:
        return EBUR128_Mp090;
    case kSideRight:
        return EBUR128_Mm090;
    default:
        return EBUR128_CENTER;
    }
}

constexpr double kOffset = 0.691; // between mean square and LUFS

double energyOf(double loudness)
{
    return std::pow(10.0, (loudness + kOffset) / 10);
}

double loudnessOf(double energy)
{
    return 10 * std::log10(energy) - kOffset;
}

struct Destroy {
    void operator()(ebur128_state* state) const { ebur128_destroy(&state); }
};
using State = std::unique_ptr<ebur128_state, Destroy>;

class Meter final : public LoudnessMeter {
public:
    Meter(State state, std::uint32_t speakers) noexcept : state_(std::move(state)), stepFrames_(state_->samplerate / 10)
    {
        std::uint32_t left = speakers;
        for (unsigned channel = 0; channel < state_->channels; ++channel, left &= left - 1)
            ebur128_set_channel(state_.get(), channel, placeOf(left & -left, speakers));
    }

    std::int32_t add(const float* samples, std::size_t frames) override
    {
        const std::size_t channels = state_->channels;
        if (!std::all_of(samples, samples + frames * channels, [](float sample) { return std::isfinite(sample); }))
            return kStatusParameterError;
        while (frames > 0) {
            const std::size_t count = std::min(frames, stepFrames_ - frames_ % stepFrames_);
            if (ebur128_add_frames_float(state_.get(), samples, count) != EBUR128_SUCCESS)
                return kStatusOutOfMemory;
            frames_ += count;
            frames -= count;
            samples += count * channels;
            if (frames_ % stepFrames_ == 0 && !endStep())
                return kStatusOutOfMemory;
        }
        return kStatusOK;
    }

    Loudness measured() const override
    {
        Loudness loudness;
        double value = 0;
        if (ebur128_loudness_global(state_.get(), &value) == EBUR128_SUCCESS && std::isfinite(value))
            loudness.integrated = value;
        loudness.range = range();
        double peak = 0;
        for (unsigned channel = 0; channel < state_->channels; ++channel)
            if (ebur128_true_peak(state_.get(), channel, &value) == EBUR128_SUCCESS)
                peak = std::max(peak, value);
        if (peak > 0)
            loudness.maxTruePeak = 20 * std::log10(peak);
        if (std::isfinite(maxMomentary_))
            loudness.maxMomentary = maxMomentary_;
        if (std::isfinite(maxShortTerm_))
            loudness.maxShortTerm = maxShortTerm_;
        return loudness;
    }

private:
    /// Every 100 ms, computes the means of the last 400 ms and 3 s from step energies, each of which is computed once.
    /// False if memory is short.
    bool endStep()
    {
        double step = kNone;
        ebur128_loudness_window(state_.get(), kStepMilliseconds, &step);
        energies_[steps_++ % energies_.size()] = energyOf(step);
        maxMomentary_ = std::max(maxMomentary_, loudnessOf(energyOfLast(kMomentarySteps)));
        const double shortTerm = energyOfLast(kShortTermSteps);
        maxShortTerm_ = std::max(maxShortTerm_, loudnessOf(shortTerm));
        try {
            if (shortTerm >= energyOf(kAbsoluteGate))
                shortTerms_.push_back(shortTerm);
        } catch (const std::bad_alloc&) {
            return false;
        }
        return true;
    }
    /// The mean of the last `count` steps; 0 if there are fewer.
    double energyOfLast(std::size_t count) const
    {
        double sum = 0;
        for (std::size_t i = 1; i <= count && count <= steps_; ++i)
            sum += energies_[(steps_ - i) % energies_.size()];
        return sum / static_cast<double>(count);
    }
    /// The range by EBU Tech 3342 over 3 s windows that begin every 100 ms. libebur128 uses windows that begin every
    /// second, the fewest allowed, which may be off by several LU for sound that changes quickly.
    std::optional<double> range() const
    {
        std::vector<double> windows = shortTerms_;
        const double mean = std::accumulate(windows.begin(), windows.end(), 0.0) / static_cast<double>(windows.size());
        std::erase_if(windows, [&](double energy) { return energy < mean * kRelativeGate; });
        if (windows.empty())
            return std::nullopt;
        std::sort(windows.begin(), windows.end());
        const auto percentile = [&](double part) {
            return windows[static_cast<std::size_t>(std::lround(part * static_cast<double>(windows.size() - 1)))];
        };
        return loudnessOf(percentile(0.95)) - loudnessOf(percentile(0.10));
    }

    State state_;
    std::size_t stepFrames_, frames_ = 0, steps_ = 0;
    std::array<double, kShortTermSteps> energies_{}; // of the last steps
    std::vector<double> shortTerms_;                 // of the windows above the gate
    double maxMomentary_ = kNone, maxShortTerm_ = kNone;
};

LoudnessMeter* make(std::uint32_t channels, std::uint32_t sampleRate, std::uint32_t speakers)
{
    State state(ebur128_init(channels, sampleRate, kModes));
    return state != nullptr ? new (std::nothrow) Meter(std::move(state), speakers) : nullptr;
}

} // namespace

extern "C" KT_EXPORT const platform::LoudnessModule ktfiles_loudnessModule;
const platform::LoudnessModule ktfiles_loudnessModule = {
    .version = platform::LoudnessModule::currentVersion,
    .make = make,
};
