// How much memory there is.
#pragma once

#include "platform/core/Export.h"

#include <cstdint>

namespace platform {

/// How many bytes the process can take before the system has to write other memory to disk; the largest number where
/// the system does not tell.
KT_EXPORT std::uint64_t availableMemory();

} // namespace platform
