// What an update begins with, of the names that the user gave.
#pragma once

#include "tool/shared/indexing/LibraryWalk.h"

#include <string>
#include <vector>

struct UpdateStarts {
    std::vector<WalkStart> walks;
    std::vector<std::string> roots;  // that are there, with a slash at the end
    std::vector<std::string> absent; // that are not, with a slash at the end, as far as links can be resolved
};

/// Roots inside others are walked with these.
UpdateStarts updateStarts(const std::vector<std::string>& names);
/// The last name of a folder's path, with its slash.
std::string lastName(const std::string& folder);
