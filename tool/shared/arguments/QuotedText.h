// Writes texts of files as one word on one line, so that a shell's `read -r` or `$(…)` restores them: as they are, or
// as $'…', the shell notation for characters that cannot be written plainly.
#pragma once

#include <string>
#include <string_view>

/// `text` itself, or $'…' if it contains a control character, a character that must not be sent to a terminal, white
/// space at either end or one of `separators`, or begins with $' itself. The escapes are \\, \', \n, \t, \r, and \xNN
/// for a byte.
std::string quotedText(std::string_view text, std::string_view separators = {});

/// Whether a text begins with $'.
bool isQuoted(std::string_view text);

/// Removes the $'…' that `text` begins with and returns its meaning. Throws UsageError if it does not end, or has an
/// escape other than those above and \".
std::string takeQuotedText(std::string_view& text);
