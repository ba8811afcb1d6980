#include "media/containers/ExtendedFloat.h"

#include "platform/core/Packed.h"

#include <cmath>
#include <cstdint>

namespace platform {

double loadExtended(const std::byte* bytes)
{
    const auto head = loadBE<std::uint16_t>(bytes);
    const auto mantissa = loadBE<std::uint64_t>(bytes + 2);
    const int exponent = (head & 0x7FFF) - 16383;
    if (mantissa == 0 || exponent > 1023 || exponent < -1022 || (head & 0x8000))
        return 0;
    return std::ldexp(static_cast<double>(mantissa), exponent - 63);
}

void storeExtended(std::byte* bytes, double value)
{
    int exponent = 0;
    const double fraction = std::frexp(value, &exponent); // [0.5, 1)
    storeBE(bytes, static_cast<std::uint16_t>(value > 0 ? exponent - 1 + 16383 : 0));
    storeBE(bytes + 2, value > 0 ? static_cast<std::uint64_t>(std::ldexp(fraction, 64)) : std::uint64_t{0});
}

} // namespace platform
