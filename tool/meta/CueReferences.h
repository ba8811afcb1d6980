// Chunks of WAVE that refer to points of "cue " by id: "adtl", "plst" and the loops of "smpl".
#pragma once

#include "tool/meta/MetaEdit.h"

/// Whether "adtl" describes the point.
bool isSpokenOf(MetaEdit& edit, std::uint32_t cueId);
/// The first id from `least` on that no point has and no other chunk refers to, so that a new point inherits nothing.
std::uint32_t freeCueId(MetaEdit& edit, std::uint32_t least);
/// Everything that refers to `from` will refer to `to`, except loops whose point is set by a step.
void renameCue(MetaEdit& edit, std::uint32_t from, std::uint32_t to);
/// Removes names, remarks and ranges of the points, and their entries in "plst". Keeps a loop, which has its own
/// positions, and a file in the list, whose removal nobody would notice.
void eraseAbout(MetaEdit& edit, const std::function<bool(std::uint32_t cueId)>& isGone);
