// How the texts of ADM documents are read as numbers, and how debug texts show them: the same in every locale.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace adm {

/// The text after its leading blanks.
std::string_view withoutLeadingBlanks(std::string_view text);

/// A decimal integer; blanks ahead of it and text after it are ignored. 0 when there is none, the nearest 64-bit
/// number when it does not fit.
std::int64_t integerOf(std::string_view text);
/// The same in 32 bits.
std::int32_t integer32Of(std::string_view text);
/// A decimal number, read the same way; infinite when it does not fit.
float floatOf(std::string_view text);
/// Whether the text begins with y, t or a digit other than 0.
bool booleanOf(std::string_view text);
/// 1 for "dB", else 0: the values of `gainUnit`.
int gainUnitOf(std::string_view text);

/// "%04X", as labels are written.
std::string hexText(std::uint32_t value);
/// "%f".
std::string fixedText(float value);
/// The shortest text that reads as the same number.
std::string shortText(float value);
/// "YES" or "NO".
std::string booleanText(bool value);
/// The text, or "(null)".
std::string orNull(const std::optional<std::string>& text);
/// "0x…", the address of an object.
std::string addressText(const void* object);

} // namespace adm
