// File names as texts of an index. Names are bytes, and the texts of a database must be UTF-8 to be read everywhere.
#pragma once

#include <string>
#include <string_view>

/// A name as an index keeps it: UTF-8 stays as it is; each other byte B becomes the character U+10FF00 + B, of a
/// private use area, and so does each byte of such a character that a name really has, so that no two names become one.
std::string indexedName(std::string_view name);
/// The name that became such a text.
std::string nameOfIndexed(std::string_view text);
