// The location of a file by its name on the command line, as the library takes it.
#pragma once

#include "platform/URL.h"

#include <string>

/// Absolute, whether the file exists or not; `name` need not be UTF-8. Throws Failure.
platform::URLRef fileLocation(const std::string& name);
