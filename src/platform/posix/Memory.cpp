#include "platform/Memory.h"

#include <fstream>
#include <limits>
#include <string>

namespace platform {

std::uint64_t availableMemory()
{
    constexpr std::uint64_t kibibyte = 1024;
    std::ifstream table("/proc/meminfo");
    std::uint64_t value = 0;
    for (std::string name, unit; table >> name >> value && std::getline(table, unit);)
        if (name == "MemAvailable:")
            return value * kibibyte;
    return std::numeric_limits<std::uint64_t>::max();
}

} // namespace platform
