// Loop tags set and removed by name, in AIFF and CAF files.
#pragma once

#include "loops/tags/LoopTagsPatch.h"
#include "loops/tags/LoopTagsPlan.h"

#include <optional>
#include <span>
#include <string_view>

/// The assignment of a value to the tag of that name in loopTagFields; null clears it. A number is one from `least` to
/// `most`, or a text that stands for it: a key such as "F#" or "Bb", a mode such as "minor". A text is UTF-8, a list an
/// array of such texts, in any order and perhaps repeated. Transients are an array of frames, in any order, each of
/// them a number or an array of the frame and its type. None for a name that is unknown, and for a value that the tag
/// can never have.
KT_EXPORT std::optional<LoopTagAssignment> loopTagAssignment(std::string_view name, platform::Value value,
                                                             platform::Error* error = nullptr);

/// What the assignments change in the file, whose tags are `before` (readOwnLoopTags): tags that are not named stay, to
/// the byte. Beats make a loop of a file that does not say what it is. None for a file that is neither AIFF nor CAF;
/// where the container cannot keep a value, or another tag would be lost; and for values that loopTagAssignment would
/// refuse.
KT_EXPORT std::optional<LoopTagsPlan> planLoopTagAssignments(const LoopTags& before, const platform::URLRef& file,
                                                             std::span<const LoopTagAssignment> assignments,
                                                             platform::Error* error = nullptr);
/// The same of removing everything that makes a loop, of AIFF and CAF files.
KT_EXPORT std::optional<LoopTagsPlan> planLoopTagsRemoval(const LoopTags& before, const platform::URLRef& file,
                                                          platform::Error* error = nullptr);
