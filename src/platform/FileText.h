// Texts of files whose standard names no encoding, or one that few writers keep.
#pragma once

#include "platform/core/Export.h"

#include <string>
#include <string_view>

namespace platform {

/// What texts of a kind of file are in where they are not UTF-8: of AIFF the encoding of the machines that it comes
/// from, of others Latin-1.
enum class FallbackEncoding { latin1, macintosh };

struct FileText {
    std::string utf8;
    const char* encoding = nullptr; ///< the IANA name of that which it was in: "ISO-8859-1", "macintosh"; null: UTF-8
};

/// UTF-8 where its bytes are that, else what its kind of file falls back to, in which each byte is a character.
KT_EXPORT FileText decodeFileText(std::string_view bytes, FallbackEncoding fallback);

} // namespace platform
