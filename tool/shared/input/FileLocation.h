// The library's location for a file name on the command line.
#pragma once

#include "platform/URL.h"

#include <string>

/// Absolute, whether the file exists or not; `name` need not be UTF-8. Throws Failure.
platform::URLRef fileLocation(const std::string& name);
