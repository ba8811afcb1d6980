// What other chunks of WAVE say of the points of "cue ", which they name by their ids: "adtl", "plst" and the loops of
// "smpl".
#pragma once

#include "tool/meta/MetaEdit.h"

/// Whether "adtl" has something to say of the point.
bool isSpokenOf(MetaEdit& edit, std::uint32_t cueId);
/// The first id from `least` on that no point has and no other chunk names, so that nothing stray is said of what gets
/// it.
std::uint32_t freeCueId(MetaEdit& edit, std::uint32_t least);
/// What is said of `from` is said of `to`. Loops whose point a step names keep that.
void renameCue(MetaEdit& edit, std::uint32_t from, std::uint32_t to);
/// Names, remarks and ranges go, and what is played from the points. A loop stays, since its places are its own; and so
/// does a file within the list, of which nobody sees that it goes.
void eraseAbout(MetaEdit& edit, const std::function<bool(std::uint32_t cueId)>& isGone);
