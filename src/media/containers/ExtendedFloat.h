// 80-bit extended floating point, big-endian, as in "COMM" (IEEE 754, x87 form).
#pragma once

#include <cstddef>

namespace platform {

inline constexpr std::size_t kExtendedSize = 10; // bytes

/// Zero for what is no finite number, and for negative ones: no rate is.
double loadExtended(const std::byte* bytes);
/// Zero for negative numbers.
void storeExtended(std::byte* bytes, double value);

} // namespace platform
