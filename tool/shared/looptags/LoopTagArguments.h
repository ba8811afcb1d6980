// KEY=VALUE on the command line, as `tags` prints keys and values and as people type them.
#pragma once

#include "loops/tags/LoopTagsPatch.h"

#include <span>
#include <string>
#include <vector>

/// Files and "KEY=VALUE" in any order, told apart: what has a "=" and no "/" ahead of it is an assignment. Throws
/// UsageError for an unknown key, two values for one tag and a value that can never be.
struct TagArguments {
    std::vector<std::string> files;
    std::vector<LoopTagAssignment> assignments;
};
TagArguments parseAssignments(std::span<const std::string> arguments);
/// The same for "tags remove": what is a key and holds no "/" is one; its fields are to be cleared.
TagArguments parseKeys(std::span<const std::string> arguments);
