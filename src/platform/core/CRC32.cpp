#include "platform/core/CRC32.h"

#include <zlib.h>

std::uint32_t ECCRC32(std::uint32_t previous, const void* bytes, std::size_t count)
{
    // A null buffer would make zlib return the start value instead of `previous`, and an empty view may have one.
    if (count == 0)
        return previous;
    return static_cast<std::uint32_t>(crc32_z(previous, static_cast<const unsigned char*>(bytes), count));
}
