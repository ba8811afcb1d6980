// Sample rate conversion between rates whose ratio has few phases: by a filter for each of them, so that every frame is
// exact.
#pragma once

#include "media/decoding/Resampler.h"

#include <cstddef>
#include <memory>
#include <vector>

namespace platform {

class PolyphaseResampler final : public Resampler {
public:
    /// Null where there would be too many filters: then frames between two of them serve, which others make.
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
    std::vector<float> filters_;
    std::vector<float> samples_; // of each channel by itself, `capacity_` apart
    std::size_t capacity_ = 0;
    std::size_t filled_ = 0;   // frames there
    std::size_t position_ = 0; // the one under the first coefficient of the next output frame
    std::size_t phase_ = 0;
};

} // namespace platform
