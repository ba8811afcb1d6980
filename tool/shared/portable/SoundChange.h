// Maps positions in a sound when a part of it is decoded, or its rate changes.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <optional>

struct SoundChange {
    double sourceRate = 0, rate = 0; // frames per second, before and after
    std::uint64_t start = 0;         // first frame, at the new rate
    std::uint64_t frames = 0;        // at the new rate
    bool isWhole = true;             // nothing was cut off

    bool keepsRate() const { return rate == sourceRate || !(sourceRate > 0); }
    /// Whether every frame keeps its position.
    bool keepsPlaces() const { return isWhole && start == 0 && keepsRate(); }
    /// A number of frames, or a position regardless of cuts, at the new rate.
    std::uint64_t scaled(std::uint64_t count) const
    {
        constexpr long double most = 1.8e19L;
        const long double ratio = static_cast<long double>(rate) / static_cast<long double>(sourceRate);
        return keepsRate()
                   ? count
                   : static_cast<std::uint64_t>(std::min(std::round(static_cast<long double>(count) * ratio), most));
    }
    /// The new position of a source frame; none if it was cut off. The end of the sound is a position, too.
    std::optional<std::uint64_t> placeOf(std::uint64_t frame) const
    {
        const std::uint64_t place = scaled(frame);
        return place >= start && place - start <= frames ? std::optional(place - start) : std::nullopt;
    }
};
