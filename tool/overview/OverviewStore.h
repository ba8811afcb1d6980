// The edit of `ktfiles overview --store`.
#pragma once

#include "tool/overview/FileOverview.h"
#include "tool/shared/edits/SafeEdit.h"

#include <string>

/// What storing came to.
struct StoreResult {
    bool stored = false;  // the file holds its overview, or with --dry-run would
    bool changed = false; // it did not before
    std::string backup;
};

/// Throws Failure for a file that is no container, which overviews are not stored in.
void requireRoomForOverview(const std::string& path);

/// Stores the overview in the file, in the place of the one that it has. The edit must have begun before the overview
/// was computed. Of silence a CAF file keeps none. Throws Failure.
StoreResult storeOverview(SafeEdit& edit, FileOverview& overview, const EditOptions& options);
