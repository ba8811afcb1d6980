// Decoding of texts that are not Unicode: numbered legacy encodings.
#pragma once

#include "platform/String.h"

#include <cstdint>
#include <string_view>

namespace platform {

/// Encoding numbers. 0 is the legacy 8-bit Western encoding, in which every byte is a character (0x8A is "ä"); 256 is
/// 16-bit Unicode, whose byte order a mark decides, else big-endian.
using TextEncoding = std::uint32_t;
/// The numbers that the library itself uses.
inline constexpr TextEncoding kTextEncodingWestern = 0;
/// 16-bit Unicode.
inline constexpr TextEncoding kTextEncodingUnicode16 = 256;
/// UTF-8.
inline constexpr TextEncoding kTextEncodingUTF8 = 0x08000100;

/// The encoding of C strings on this system: UTF-8.
KT_EXPORT TextEncoding systemTextEncoding();

/// The text of `bytes` in `encoding`; null for an unknown encoding, or bytes that it does not know.
KT_EXPORT String decodeText(std::string_view bytes, TextEncoding encoding);

/// The text of a C string in `encoding`; null also for a null pointer. A C string in 16-bit Unicode ends at the first
/// 16-bit zero: where only a zero byte is certain, give its bytes to decodeText.
KT_EXPORT String decodeCString(const char* text, TextEncoding encoding);

} // namespace platform
