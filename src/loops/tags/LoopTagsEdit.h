// Loop tags of a file set, removed and copied in one call: by a safe edit (audiofile/CCoordinatedEdit.h), outside of
// which the file stays as it is, to the byte. Nothing is written where nothing changes.
#pragma once

#include "audiofile/CCoordinatedEdit.h"
#include "loops/tags/LoopTagsSetting.h"

#include <optional>
#include <span>
#include <string>
#include <vector>

/// What came of an edit.
struct EditedLoopTags {
    std::vector<LoopTagChange> changes; // none: the file is untouched
    std::vector<std::string> notKept;   // what the container has no room for, in words
    std::string backup;                 // its path, where one was asked for
};

/// As planLoopTagAssignments, and then done. None on failure, with the file as it was; of an edit in place as
/// CSafeEdit::Apply says.
KT_EXPORT std::optional<EditedLoopTags> setLoopTags(const std::string& path,
                                                    std::span<const LoopTagAssignment> assignments,
                                                    const CoordinatedEditOptions& options = {},
                                                    platform::Error* error = nullptr);
/// The same of planLoopTagsRemoval.
KT_EXPORT std::optional<EditedLoopTags>
removeLoopTags(const std::string& path, const CoordinatedEditOptions& options = {}, platform::Error* error = nullptr);
/// All that makes a loop, of the file `from`; fails where that has nothing. The same of planLoopTagsCopy.
KT_EXPORT std::optional<EditedLoopTags> copyLoopTags(const std::string& from, const std::string& path,
                                                     const CoordinatedEditOptions& options = {},
                                                     platform::Error* error = nullptr);
