// Texts in UTF-8, character by character, and characters that are not what they seem.
#pragma once

#include "platform/core/Export.h"

#include <string_view>

namespace platform {

/// Takes the next character of UTF-8 off `text`, which must not be empty. U+FFFD for a byte that begins no character,
/// and for the start of an incomplete one (The Unicode Standard, table 3-7, and section 3.9 on maximal subparts).
KT_EXPORT char32_t takeCharacter(std::string_view& text);

/// Marks of writing direction, zero-width characters, separators of lines and paragraphs, tags. Not combining
/// characters and controls.
KT_EXPORT bool isUnseen(char32_t character);

/// DEL and the C1 controls.
KT_EXPORT bool isLateControl(char32_t character);

} // namespace platform
