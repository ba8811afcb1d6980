// Points in time as people write them: "1:02:03.456".
#pragma once

#include "platform/core/Value.h"

#include <cstdint>
#include <optional>
#include <string>

enum class ShowHours { whenAny, always };

/// Minutes and seconds with `decimals` digits behind the point, and hours.
std::string clockText(double seconds, int decimals, ShowHours showHours = ShowHours::whenAny);

/// A duration to the millisecond; hours where there are any.
std::string durationText(double seconds);

/// Seconds from "12.5", "1:02.5" or "1:02:03.5"; none for what is no time.
std::optional<double> timeFromText(const std::string& text);

/// A place in a sound or a length of it, in frames or in seconds.
struct SoundLength {
    std::uint64_t frames = 0;
    std::optional<double> seconds;

    /// In frames; 9e18 stands for more.
    std::uint64_t at(double sampleRate) const;
};
/// A number of frames such as "48000", or a time, which shows that it is one: "1.5s", "1:02.5", "1:02:03.5". None for
/// another text.
std::optional<SoundLength> soundLengthFromText(const std::string& text);

/// "2026-11-21T09:30:00Z"; empty for none, and for a date that the calendar does not reach.
std::string dateText(const std::optional<platform::Date>& date);
/// The same in local time, for people: "2026-11-21 10:30".
std::string localDateText(const std::optional<platform::Date>& date);
