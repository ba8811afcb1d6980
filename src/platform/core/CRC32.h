// The running CRC-32 of the suite.
#pragma once

#include "platform/core/Export.h"

#include <cstddef>
#include <cstdint>

/// The CRC-32 of ISO 3309 and ITU-T V.42 (polynomial 0xEDB88320, reflected) over `count` bytes, continued from
/// `previous`, which is 0 for the first piece: "123456789" gives 0xCBF43926.
KT_EXPORT std::uint32_t ECCRC32(std::uint32_t previous, const void* bytes, std::size_t count);
