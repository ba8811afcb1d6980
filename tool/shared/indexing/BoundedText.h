// Texts of strangers, as an index holds them.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

// Bounds of the columns that are searched for words, in bytes.

inline constexpr std::size_t kMostOfLine = 1024;    // of a title, a name
inline constexpr std::size_t kMostOfComment = 4096; // of a comment

/// The text as UTF-8 of at most `most` bytes: what is not UTF-8 becomes U+FFFD, characters that a text of one line has
/// not become spaces, spaces at its ends and what is behind the last character that fits are left out.
std::string boundedLine(std::string_view text, std::size_t most);
