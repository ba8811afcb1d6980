// Edits of loop tags: what would change is worked out first, in memory, and what the container cannot keep is refused;
// then it is written by way of SafeEdit, and read again.
#pragma once

#include "tool/shared/edits/SafeEdit.h"
#include "tool/shared/input/FileArguments.h"
#include "tool/shared/looptags/LoopTags.h"
#include "tool/shared/looptags/RawLoopTags.h"
#include "tool/shared/output/Output.h"

#include <functional>
#include <string>
#include <vector>

/// One tag, or one chunk that is carried without being interpreted, before and after an edit; null: absent. Chunks are
/// given by their sizes, transients by their number.
struct TagChange {
    std::string key;
    platform::Value from;
    platform::Value to;
};

/// An edit of one file, worked out.
struct TagsPlan {
    LoopTags after;    // as it will be read from the file
    RawLoopTags bytes; // the same, of those that are interpreted
    std::vector<TagChange> changes;
    std::vector<std::string> notKept; // what the container has no room for, in words
    /// Does it; false when something could not be written.
    std::function<bool(VireoLoopChunksManager&)> write;
};

/// What differs, transients and carried chunks compared by number and size.
std::vector<TagChange> differences(const LoopTags& before, const LoopTags& after);

/// Makes the planned edit of the file itself, and reads it again. Throws Failure, also when the tags are then not found
/// as they should be.
void writeTags(const std::string& path, const TagsPlan& plan);

/// A verb that edits. `action` is its name for JSON.
struct TagsEditor {
    const char* action;
    const char* done;   // "set"
    const char* dryRun; // "would set"
    /// Throws Failure for a file that cannot be edited so, UsageError for a mistake on the command line.
    std::function<TagsPlan(const LoopTags& before, const std::string& target)> plan;
};

/// Edits one file after the other and reports each; false when one failed. Mistakes on the command line that show only
/// in the light of a file are found before the first file is touched.
bool editTags(const FileArguments& files, const TagsEditor& editor, EditOptions edit, const OutputOptions& output);
