// Sample rate conversion for ratios with few phases, with one filter per phase, so that every frame is exact.
#pragma once

#include "media/decoding/Resampler.h"

#include <cstddef>
#include <memory>
#include <vector>

namespace platform {

class PolyphaseResampler final : public Resampler {
public:
    /// Null if too many filters would be needed; RateConverter then interpolates between two filters.
    static std::unique_ptr<PolyphaseResampler> make(std::uint32_t channels, std::uint32_t fromRate,
                                                    std::uint32_t toRate);

    std::uint32_t reach() const override { return static_cast<std::uint32_t>(taps_ / 2); }
    std::int32_t reset() override;
    std::int32_t convert(const float* from, std::uint32_t taken, float* to, std::uint32_t& made) override;

private:
    PolyphaseResampler(std::uint32_t channels, std::size_t taps, std::size_t phases, std::size_t step, double factor);
    void buildFilters(double factor);
    void take(const float* from, std::size_t frames);
    void makeRoom(std::size_t frames);

    std::size_t channels_, taps_, phases_;
    std::size_t step_; // from one output frame to the next, in phases
    std::vector<float> coefficients_;
    float* filters_ = nullptr;   // the first 64-byte boundary in `coefficients_`
    std::vector<float> samples_; // channel after channel, `capacity_` apart
    std::size_t capacity_ = 0;
    std::size_t filled_ = 0;   // frames present
    std::size_t position_ = 0; // of the frame under the first coefficient for the next output frame
    std::size_t phase_ = 0;
};

} // namespace platform
