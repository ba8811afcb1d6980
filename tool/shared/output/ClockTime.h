// Times as people write them: "1:02:03.456".
#pragma once

#include "platform/core/Value.h"

#include <cstdint>
#include <optional>
#include <string>

enum class ShowHours { whenAny, always };

/// Minutes and seconds with `decimals` digits after the point, and hours.
std::string clockText(double seconds, int decimals, ShowHours showHours = ShowHours::whenAny);

/// A duration to the millisecond, with hours if there are any.
std::string durationText(double seconds);

/// Seconds from "12.5", "1:02.5" or "1:02:03.5"; none if the text is no time.
std::optional<double> timeFromText(const std::string& text);

/// A position or length in a sound, in frames or seconds.
struct SoundLength {
    std::uint64_t frames = 0;
    std::optional<double> seconds;

    /// In frames; at most 9e18.
    std::uint64_t at(double sampleRate) const;
};
/// A number of frames such as "48000", or a time in a form that identifies it: "1.5s", "1:02.5", "1:02:03.5". None for
/// any other text.
std::optional<SoundLength> soundLengthFromText(const std::string& text);

/// "2026-11-21T09:30:00Z"; empty if there is no date or the calendar does not reach it.
std::string dateText(const std::optional<platform::Date>& date);
/// As above in local time, for people: "2026-11-21 10:30".
std::string localDateText(const std::optional<platform::Date>& date);
