// SHA-256, and the digest of a path by which processes agree on a file.
#pragma once

#include "platform/String.h"
#include "platform/core/Bytes.h"

#include <array>

namespace platform {

/// The 32 bytes of a digest.
using SHA256Digest = std::array<std::byte, 32>;

/// The SHA-256 of `bytes` (FIPS 180-4).
KT_EXPORT SHA256Digest sha256(BytesView bytes);

/// The digest of the path's file-system representation, taken as it is (`fileSystemRepresentationSHA256`). Null for a
/// null string, and for one with a NUL, which no path has.
KT_EXPORT std::optional<SHA256Digest> fileSystemRepresentationSHA256(const String& path);

} // namespace platform
