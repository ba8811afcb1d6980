// How file names are told that are not UTF-8, as old sample libraries have them, so that they can be given back.
#pragma once

#include <string>

/// `name` as messages and output say it. UTF-8 stays as it is. In any other name each byte that is no part of UTF-8 is
/// `\xE4`, and a backslash `\x5C`; where another file is called that to the letter, every byte of the last component is
/// escaped.
std::string shownName(const std::string& name);

/// The name that an argument means: itself where such a file is there; else the one that it is with its escapes read,
/// if that is there; else itself.
std::string nameMeantBy(const std::string& argument);
