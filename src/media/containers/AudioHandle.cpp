#include "media/containers/AudioHandle.h"

#include "platform/core/Status.h"

#include <cstring>

namespace platform {

std::int32_t AudioHandle::give(const void* value, std::uint32_t valueSize, std::uint32_t& size, void* data)
{
    if (data == nullptr)
        return kStatusParameterError;
    if (size < valueSize)
        return kBadPropertySize;
    std::memcpy(data, value, valueSize);
    size = valueSize;
    return kStatusOK;
}

} // namespace platform
