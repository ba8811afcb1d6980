// Writes file names that are not UTF-8, as in old sample libraries, so that they can be typed again.
#pragma once

#include <string>

/// `name` for messages and output. UTF-8 stays as it is. In any other name, each byte that is no part of UTF-8 becomes
/// `\xE4` and a backslash `\x5C`; if another file has exactly the resulting name, every byte of the last component is
/// escaped.
std::string shownName(const std::string& name);

/// The name that an argument means: itself if that file exists; else the name with its escapes resolved if that exists;
/// else itself.
std::string nameMeantBy(const std::string& argument);
