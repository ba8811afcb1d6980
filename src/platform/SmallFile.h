// Whole small files: property lists, desktop entries, alias files.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"

#include <cstddef>
#include <optional>

namespace platform {

/// The content of a regular file of at most `limit` bytes; null for anything else. Never waits, not even for a FIFO.
KT_EXPORT std::optional<Bytes> readSmallFile(const char* path, std::size_t limit);

/// Writes the content into the file itself, creating it when it is missing, so that an existing file keeps its links
/// and permissions. Reserves the space first: a full disk fails before a byte changes. Any other failure leaves the
/// file half written. False, with errno, on failure.
KT_EXPORT bool writeSmallFile(const char* path, BytesView content);

/// Writes `content` from the start of an open file and truncates the file behind it. False, with errno, on failure.
bool writeContent(int descriptor, BytesView content);

} // namespace platform
