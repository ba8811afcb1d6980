// The library's loop tags for files named on the command line; its errors become Failures.
#pragma once

#include "loops/tags/LoopTagsPlan.h"
#include "tool/shared/output/Failure.h"

#include <string>

/// Throws the Failure of an error about the file; OtherKind if the file is of another kind.
[[noreturn]] void failForTags(const std::string& path, const platform::Error& error);

/// As readLoopTags and readOwnLoopTags; throw Failure.
LoopTags loopTagsOf(const std::string& path);
LoopTags ownLoopTagsOf(const std::string& path);

/// As carryOutLoopTagsPlan; throws Failure.
void writeTags(const std::string& path, const LoopTagsPlan& plan);
