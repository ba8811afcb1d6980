// Texts of files as one word on one line, from which a shell's `read -r` or `$(…)` brings them back: as they are, or as
// $'…', the notation that shells have for what cannot be written so.
#pragma once

#include <string>
#include <string_view>

/// `text` itself, or $'…' where that would lose something: a control character, what a terminal must not be sent, white
/// space at either end, a character of `separators`, and a text that begins with $' itself. Inside are \\, \', \n, \t,
/// \r and \xNN, for a byte.
std::string quotedText(std::string_view text, std::string_view separators = {});

/// Whether a text begins with $'.
bool isQuoted(std::string_view text);

/// What the $'…' at the beginning stands for, which goes from `text`. Throws UsageError for one that does not end, and
/// for an escape that is none of those above nor \".
std::string takeQuotedText(std::string_view& text);
