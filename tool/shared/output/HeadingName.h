// The names of files above what is told of them.
#pragma once

#include <string>

/// `path`, printable; on a terminal it is shortened so that `rest`, which follows on the line, fits.
std::string headingName(const std::string& path, const std::string& rest);
