#include "platform/core/CRC32.h"

#include <zlib.h>

std::uint32_t ECCRC32(std::uint32_t previous, const void* bytes, std::size_t count)
{
    // For a null buffer, which an empty view may have, zlib returns its initial value instead of `previous`.
    if (count == 0)
        return previous;
    return static_cast<std::uint32_t>(crc32_z(previous, static_cast<const unsigned char*>(bytes), count));
}
