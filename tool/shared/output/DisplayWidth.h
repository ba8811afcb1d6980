// How wide text is on a terminal, and text made to fit: names cut in the middle, sentences broken between words.
#pragma once

#include <string>
#include <string_view>

/// The next character of UTF-8, by which `text` is shortened; U+FFFD for a byte that begins none, and for the beginning
/// of one that is not whole (The Unicode Standard, table 3-7, and section 3.9 on maximal subparts).
char32_t takeCharacter(std::string_view& text);

/// Whether a terminal shows something for the character, or combines it with the one before: no control, no separator
/// of lines, and known to Unicode.
bool isShowable(char32_t character);

/// Terminal columns that a text from `printable` takes: 2 for wide characters, 0 for combining ones.
int displayWidth(std::string_view text);

/// The text in no more than `width` columns: what does not fit gives way to "…" in the middle, nearer to the beginning,
/// since the end of a path says more. No character is parted from those that combine with it.
std::string shortened(std::string_view text, int width);

/// The text in lines of no more than `width` columns, the first of which begins at `column` and the others are indented
/// by `indent`; a word that is wider than a line is left whole. Without a line break at the end.
std::string wrapped(std::string_view text, int width, int column, int indent);
