// The library's loop tags of files that are named on the command line, with its errors as Failures.
#pragma once

#include "loops/tags/LoopTagsPlan.h"
#include "tool/shared/output/Failure.h"

#include <string>

/// Throws the Failure of an error about the file; for one of another kind OtherKind.
[[noreturn]] void failForTags(const std::string& path, const platform::Error& error);

/// As readLoopTags and readOwnLoopTags; throw Failure.
LoopTags loopTagsOf(const std::string& path);
LoopTags ownLoopTagsOf(const std::string& path);

/// As carryOutLoopTagsPlan; throws Failure.
void writeTags(const std::string& path, const LoopTagsPlan& plan);
