// What loop tags say, in the columns of an index.
#pragma once

#include "loops/tags/LoopTags.h"

struct LibraryRecord;

/// Fills what the tags say of kind, tempo, key, beats, signature, categories and texts, and `tags`, the JSON object of
/// all.
void addLoopTags(LibraryRecord& record, LoopTags tags);
