// What becomes of a place in the sound when part of it is decoded, or at another rate.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <optional>

struct SoundChange {
    double sourceRate = 0, rate = 0; // frames per second, there and here
    std::uint64_t start = 0;         // the first frame, at the new rate
    std::uint64_t frames = 0;        // at the new rate
    bool isWhole = true;             // nothing was cut off

    bool keepsRate() const { return rate == sourceRate || !(sourceRate > 0); }
    /// Every frame is where it was.
    bool keepsPlaces() const { return isWhole && start == 0 && keepsRate(); }
    /// A number of frames, or a place whatever is cut off, at the new rate.
    std::uint64_t scaled(std::uint64_t count) const
    {
        constexpr long double most = 1.8e19L;
        const long double ratio = static_cast<long double>(rate) / static_cast<long double>(sourceRate);
        return keepsRate()
                   ? count
                   : static_cast<std::uint64_t>(std::min(std::round(static_cast<long double>(count) * ratio), most));
    }
    /// Where a frame of the source has gone; none for one that was cut off. Behind the last frame is a place, too.
    std::optional<std::uint64_t> placeOf(std::uint64_t frame) const
    {
        const std::uint64_t place = scaled(frame);
        return place >= start && place - start <= frames ? std::optional(place - start) : std::nullopt;
    }
};
