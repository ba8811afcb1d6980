// Edits of loop tags by the verbs: worked out by the library, written by way of SafeEdit, and reported.
#pragma once

#include "loops/tags/LoopTagsPlan.h"
#include "tool/shared/edits/SafeEdit.h"
#include "tool/shared/input/FileArguments.h"
#include "tool/shared/output/Output.h"

#include <functional>
#include <string>

/// A verb that edits. `action` is its name for JSON.
struct TagsEditor {
    const char* action;
    const char* done;   // "set"
    const char* dryRun; // "would set"
    /// As planLoopTagsCopy.
    std::function<std::optional<LoopTagsPlan>(const LoopTags& before, const platform::URLRef& target,
                                              platform::Error* error)>
        plan;
};

/// Edits one file after the other and reports each; false when one failed. Mistakes on the command line that show only
/// in the light of a file are found before the first file is touched.
bool editTags(const FileArguments& files, const TagsEditor& editor, EditOptions edit, const OutputOptions& output);
