// Edits of loop tags for the verbs: worked out by the library, written through SafeEdit, and reported.
#pragma once

#include "loops/tags/LoopTagsPlan.h"
#include "tool/shared/edits/SafeEdit.h"
#include "tool/shared/input/FileArguments.h"
#include "tool/shared/output/Output.h"

#include <functional>
#include <string>

/// A verb that edits. `action` is its name in JSON.
struct TagsEditor {
    const char* action;
    const char* done;   // "set"
    const char* dryRun; // "would set"
    /// As planLoopTagsCopy.
    std::function<std::optional<LoopTagsPlan>(const LoopTags& before, const platform::URLRef& target,
                                              platform::Error* error)>
        plan;
};

/// Edits file after file and reports each; false if one failed. Usage errors that depend on a file are found before the
/// first file is changed.
bool editTags(const FileArguments& files, const TagsEditor& editor, EditOptions edit, const OutputOptions& output);
