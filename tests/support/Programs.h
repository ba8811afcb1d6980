// Other programs as independent writers and readers of files.
#pragma once

#include "support/TemporaryFolder.h"

#include <cstdlib>
#include <string>

/// Runs shell commands in the folder, silently; false if one fails.
inline bool runs(const TemporaryFolder& folder, const std::string& command)
{
    const std::string line = "cd '" + folder.path().string() + "' && { " + command + "; } >/dev/null 2>&1 </dev/null";
    return std::system(line.c_str()) == 0;
}
