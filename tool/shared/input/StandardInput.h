// Standard input under the file name "-". A file with that name is "./-".
#pragma once

#include <cstdint>
#include <string>

inline constexpr const char* kStandardInput = "-";

/// How much of a pipe is kept.
inline constexpr std::int64_t kMostOfStandardInput = std::int64_t{2} << 30;

/// The system's path for `name`: standard input if it is "-", else `name` itself. A file on standard input is used
/// directly if nothing was read from it yet. Anything else is read into memory once, to its end. Throws Failure, also
/// beyond kMostOfStandardInput.
std::string systemPath(const std::string& name);

/// Whether `name` is standard input and no file.
bool isPiped(const std::string& name);
