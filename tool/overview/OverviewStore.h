// The edit of `ktfiles overview --store`.
#pragma once

#include "tool/overview/FileOverview.h"
#include "tool/shared/edits/SafeEdit.h"

#include <string>

/// The result of storing.
struct StoreResult {
    bool stored = false;  // the file holds its overview, or with --dry-run would
    bool changed = false; // it did not before
    std::string backup;
};

/// Throws Failure if the file is no container, because overviews are stored only there.
void requireRoomForOverview(const std::string& path);

/// Stores the overview in place of the file's former one. The edit must have begun before the overview was computed. A
/// CAF file stores none of silence. Throws Failure.
StoreResult storeOverview(SafeEdit& edit, FileOverview& overview, const EditOptions& options);
