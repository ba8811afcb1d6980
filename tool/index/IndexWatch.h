// ktfiles index --watch: follows changes of the folders, until a signal ends it.
#pragma once

#include "tool/shared/indexing/LibraryUpdate.h"

#include <functional>

/// Brings the index up to date, and keeps it so. `told` gets the changes of the first update and of each later one that
/// found some. Returns whether no problem was met. Throws Failure.
bool watchIndex(Library& library, LibraryUpdate update, const std::function<void(const LibraryChanges&)>& told);
