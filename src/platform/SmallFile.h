// Whole small files: property lists, desktop entries, alias files.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"

#include <cstddef>
#include <optional>

namespace platform {

/// The content of a regular file of at most `limit` bytes; null for anything else, which is never waited for.
KT_EXPORT std::optional<Bytes> readSmallFile(const char* path, std::size_t limit);

/// Writes the content into the file itself, which is created when nothing is there: one that is keeps its links and its
/// rights. Space is reserved first, so that a full disk is met before a byte is changed; any other failure leaves the
/// file half written. False, with errno, on failure.
KT_EXPORT bool writeSmallFile(const char* path, BytesView content);

/// Writes `content` from the start of an open file and cuts the file off behind it; false with errno.
bool writeContent(int descriptor, BytesView content);

} // namespace platform
