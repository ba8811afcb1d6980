// The values of a query as people type them. Each function returns none for a text that is no such value.
#pragma once

#include "tool/shared/library/LibraryQuery.h"

#include <functional>
#include <string_view>

/// One number of a range.
using NumberReader = std::function<std::optional<double>(std::string_view text)>;

/// "120", "120.5".
std::optional<double> plainNumberFromText(std::string_view text);
/// "500ms", "2s", "2.5", "2min", "1:30", "1:02:03", "1h": in seconds.
std::optional<double> secondsFromText(std::string_view text);
/// "48k", "44.1kHz", "48000", "48000Hz": in Hz.
std::optional<double> rateFromText(std::string_view text);
/// "118..122", "..90", "140..", or one number.
std::optional<NumberRange> rangeFromText(std::string_view text, const NumberReader& read);
/// A range of tempos; one tempo stands for all that are rounded to it: 120 for 119.5 to 120.5.
std::optional<NumberRange> tempoFromText(std::string_view text);
/// "F# minor", "Gb min", "f#m", "F♯", "minor"; "8A" and "1m" too.
std::optional<KeyChoice> keyFromText(std::string_view text);
/// "today", "yesterday", "90min", "12h", "3d", "2w", "6 months", "1y", "2026-11-01", "2026-11-01T12:30", the latter two
/// in local time unless a "Z" follows: in nanoseconds since 1970.
std::optional<std::int64_t> sinceFromText(std::string_view text);
