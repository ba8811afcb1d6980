// The width of text on a terminal, and text made to fit: names cut in the middle, sentences broken between words.
#pragma once

#include "platform/core/UTF8.h"

#include <string>
#include <string_view>

using platform::takeCharacter;

/// Whether a terminal shows the character or combines it with the one before: not for controls, line separators and
/// characters unknown to Unicode.
bool isShowable(char32_t character);

/// Terminal columns of a text from `printable`: 2 for wide characters, 0 for combining ones.
int displayWidth(std::string_view text);

/// The text in at most `width` columns: "…" replaces what does not fit, nearer to the beginning than to the end, since
/// the end of a path says more. Characters stay together with those that combine with them.
std::string shortened(std::string_view text, int width);

/// The text in lines of at most `width` columns. The first begins at `column`, the others are indented by `indent`; a
/// word wider than a line stays whole. Without a line break at the end.
std::string wrapped(std::string_view text, int width, int column, int indent);
