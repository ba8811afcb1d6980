// Timestamps of ITU-R BS.2076: hh:mm:ss.zzzzz, and hh:mm:ss.zzzzzSfffff with a fraction counted in samples.
#pragma once

#include "platform/core/Export.h"

#include <cstdint>
#include <limits>
#include <optional>
#include <string>
#include <string_view>

/// A time that is not given, or cannot be read.
inline constexpr std::int64_t kADMInvalidTime = std::numeric_limits<std::int64_t>::min() + 1;

/// Microseconds, or `kADMInvalidTime`: also where they do not fit 64 bits, and for "S0". The fraction is a count of
/// 1/fffff seconds, of 1/100000 without the "S", whatever its digits: "00:00:01.5" is 1.000050 s.
KT_EXPORT std::int64_t ADMTimestampStringToMicroSeconds(std::optional<std::string_view> text);
/// The same, but without an "S" the digits of the fraction are decimals: "00:00:01.5" is 1.5 s.
KT_EXPORT std::int64_t ADMTimestampStringToExactMicroSeconds(std::optional<std::string_view> text);

/// "hh:mm:ss.zzzzz". The rounding to 10 µs never carries: 999999 gives "00:00:00.10000".
KT_EXPORT std::string ADMTimeMicrosecToTimestampString(std::int64_t microseconds);
