// 80-bit extended floating point, big-endian, as in "COMM" (IEEE 754, x87 form).
#pragma once

#include <cstddef>

namespace platform {

inline constexpr std::size_t kExtendedSize = 10; // bytes

/// Zero for numbers that are not finite and for negative ones, which are no rates.
double loadExtended(const std::byte* bytes);
/// Stores zero for negative numbers.
void storeExtended(std::byte* bytes, double value);

} // namespace platform
