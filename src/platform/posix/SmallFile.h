// Whole small files: desktop entries, alias files.
#pragma once

#include "platform/core/Bytes.h"

#include <cstddef>
#include <optional>

namespace platform {

/// The content of a regular file of at most `limit` bytes; null for anything else, which is never waited for.
std::optional<Bytes> readSmallFile(const char* path, std::size_t limit);

} // namespace platform
