// Characters by which a text is shown as another one, or a terminal takes part of it for a command. Names and tags come
// from strangers.
#pragma once

#include <string>
#include <string_view>

/// Marks of writing direction, characters without width, separators of lines and paragraphs, tags. Combining characters
/// are none, nor are controls.
bool isUnseen(char32_t character);

/// DEL and the C1 controls.
bool isLateControl(char32_t character);

/// Whether the text holds such a character or a C1 control. Bytes that are not UTF-8 are passed over.
bool isMisleading(std::string_view text);

/// As `printable`, for standard error: whether that is a terminal, not standard output, decides what is escaped.
std::string printableOnError(std::string_view text);
