// Texts of files whose standard names no encoding, or one that few writers keep to.
#pragma once

#include "platform/core/Export.h"

#include <string>
#include <string_view>

namespace platform {

/// The encoding of texts that are not UTF-8: in AIFF the one of the machines that the format comes from; in other kinds
/// of file, Latin-1.
enum class FallbackEncoding { latin1, macintosh };

/// A text and the encoding that it was in.
struct FileText {
    std::string utf8; // the text, valid UTF-8
    /// the IANA name of the file's encoding: "ISO-8859-1", "macintosh"; null for UTF-8
    const char* encoding = nullptr; ///< the IANA name of that which it was in: "ISO-8859-1", "macintosh"; null: UTF-8
};

/// Takes the bytes for UTF-8 when they are valid, else for `fallback`, in which every byte is a character.
KT_EXPORT FileText decodeFileText(std::string_view bytes, FallbackEncoding fallback);

} // namespace platform
