// Standard input where a file's name stands: "-". A file that is called so is "./-".
#pragma once

#include <cstdint>
#include <string>

inline constexpr const char* kStandardInput = "-";

/// How much of a pipe is kept.
inline constexpr std::int64_t kMostOfStandardInput = std::int64_t{2} << 30;

/// Where the system has what `name` names: standard input if that is "-", else `name` itself. A file on standard input
/// is taken where it lies, if nothing of it was read. Anything else is read to its end into memory, once. Throws
/// Failure, also for more than kMostOfStandardInput.
std::string systemPath(const std::string& name);

/// Whether `name` is standard input and no file.
bool isPiped(const std::string& name);
