// KEY=VALUE on the command line, as `tags` prints it and as people type it.
#pragma once

#include "loops/tags/LoopTagsPatch.h"

#include <span>
#include <string>
#include <vector>

/// Files and "KEY=VALUE" in any order: an argument with a "=" and no "/" before it is an assignment. Throws UsageError
/// for an unknown key, two values for one tag, and a value that is never valid.
struct TagArguments {
    std::vector<std::string> files;
    std::vector<LoopTagAssignment> assignments;
};
TagArguments parseAssignments(std::span<const std::string> arguments);
/// As above for "tags remove": an argument that is a key and contains no "/" names fields to clear.
TagArguments parseKeys(std::span<const std::string> arguments);
