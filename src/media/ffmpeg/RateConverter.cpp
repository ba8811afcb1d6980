#include "media/ffmpeg/RateConverter.h"

#include "media/containers/AudioHandle.h"
#include "platform/core/Status.h"

extern "C" {
#include <libavutil/channel_layout.h>
#include <libavutil/opt.h>
#include <libswresample/swresample.h>
}

#include <algorithm>
#include <bit>
#include <cmath>
#include <utility>

namespace platform::ffmpeg {

namespace {

// The filter is a sinc with 128 crossings at the lower rate, under a Kaiser window. Measured from 48 to 44.1 kHz: 19.5
// kHz passes within 0.0001 dB, 22.5 kHz is 119 dB down, and the noise of a sine is at -134 dB.
constexpr int kCrossings = 128;
constexpr double kKaiserBeta = 12;
constexpr double kCutoff = 0.95;

// Ratios with few phases have a filter per phase (media/decoding/PolyphaseResampler.h). For others each frame is
// interpolated linearly between two of this many filters, at its exact time.
constexpr std::uint32_t kPhases = 1024;
constexpr std::uint64_t kMaxCoefficients = 1 << 24; // of 32 bits each

/// Parameters from which the library builds its filter.
struct Filter {
    std::uint64_t taps;

    Filter(std::uint32_t fromRate, std::uint32_t toRate)
    {
        const double factor = std::min(toRate * kCutoff / fromRate, 1.0);
        taps = static_cast<std::uint64_t>(std::ceil(kCrossings / factor)) + 1; // an even number
    }
    bool isReasonable() const { return kPhases * taps <= kMaxCoefficients; }
};

struct SwrDeleter {
    void operator()(SwrContext* context) const { swr_free(&context); }
};
using SwrOwner = std::unique_ptr<SwrContext, SwrDeleter>;

std::int32_t statusOf(int error)
{
    return error >= 0 ? kStatusOK : error == AVERROR(ENOMEM) ? kStatusOutOfMemory : kStatusIOError;
}

class RateConverter final : public Resampler {
public:
    RateConverter(SwrOwner context, const Filter& filter)
        : context_(std::move(context)),
          reach_(static_cast<std::uint32_t>(filter.taps / 2 + 8)) // taps are rounded up to a multiple of eight
    {
    }
    std::uint32_t reach() const override { return reach_; }
    std::int32_t reset() override { return statusOf(swr_init(context_.get())); } // keeps the filter
    std::int32_t convert(const float* from, std::uint32_t taken, float* to, std::uint32_t& made) override
    {
        static constexpr float nothing = 0; // a null pointer would end the sound
        const auto* input = reinterpret_cast<const std::uint8_t*>(taken > 0 ? from : &nothing);
        auto* output = reinterpret_cast<std::uint8_t*>(to);
        const int done = swr_convert(context_.get(), &output, static_cast<int>(made), &input, static_cast<int>(taken));
        made = static_cast<std::uint32_t>(std::max(done, 0));
        return statusOf(done);
    }

private:
    SwrOwner context_;
    std::uint32_t reach_;
};

int setOptions(SwrContext* context)
{
    int error = 0;
    const auto set = [&](const char* name, std::int64_t value) {
        if (error >= 0)
            error = av_opt_set_int(context, name, value, 0);
    };
    set("filter_size", kCrossings);
    set("phase_shift", std::bit_width(kPhases - 1));
    set("exact_rational", 1);
    set("linear_interp", 1);
    set("filter_type", SWR_FILTER_TYPE_KAISER);
    if (error >= 0)
        error = av_opt_set_double(context, "kaiser_beta", kKaiserBeta, 0);
    return error >= 0 ? av_opt_set_double(context, "cutoff", kCutoff, 0) : error;
}

} // namespace

std::unique_ptr<Resampler> makeRateConverter(std::uint32_t channels, std::uint32_t fromRate, std::uint32_t toRate,
                                             std::int32_t& status)
{
    const auto isRate = [](std::uint32_t rate) { return rate >= 1 && rate <= Resampler::kMaxRate; };
    status = AudioHandle::kFormatNotSupported;
    if (channels < 1 || channels > Resampler::kMaxChannels || !isRate(fromRate) || !isRate(toRate) ||
        fromRate == toRate)
        return nullptr;
    const Filter filter(fromRate, toRate);
    if (!filter.isReasonable())
        return nullptr;
    AVChannelLayout layout = {};
    layout.nb_channels = static_cast<int>(channels);
    SwrContext* made = nullptr;
    int error = swr_alloc_set_opts2(&made, &layout, AV_SAMPLE_FMT_FLT, static_cast<int>(toRate), &layout,
                                    AV_SAMPLE_FMT_FLT, static_cast<int>(fromRate), 0, nullptr);
    SwrOwner context(made);
    if (error >= 0)
        error = setOptions(context.get());
    if (error >= 0)
        error = swr_init(context.get());
    status = statusOf(error);
    return error >= 0 ? std::make_unique<RateConverter>(std::move(context), filter) : nullptr;
}

} // namespace platform::ffmpeg
