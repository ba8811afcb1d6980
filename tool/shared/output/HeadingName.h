// File names in headings.
#pragma once

#include <string>

/// `path`, printable; on a terminal shortened so that `rest`, which follows on the line, fits.
std::string headingName(const std::string& path, const std::string& rest);
