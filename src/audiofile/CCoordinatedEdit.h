// Safe edits of containers that others who coordinate their access (platform/FileCoordination.h) keep away from.
#pragma once

#include "audiofile/CContainerEdit.h"

#include <memory>
#include <optional>
#include <string>

namespace platform {
class CoordinatedAccess;
}

struct CoordinatedEditOptions : SafeEditOptions {
    /// For how long others are waited for, each time that they are in the way: 0 or more seconds. Without it there is
    /// no limit.
    std::optional<double> timeoutSeconds = std::nullopt;
};

/// One edit of one file. From Begin to its destruction nobody else has coordinated access to the file, and it is locked
/// against other edits of this kind. One thread.
class KT_EXPORT CCoordinatedEdit {
public:
    CCoordinatedEdit();
    ~CCoordinatedEdit();
    CCoordinatedEdit(const CCoordinatedEdit&) = delete;
    CCoordinatedEdit& operator=(const CCoordinatedEdit&) = delete;

    /// Waits for write access, then as CSafeEdit::Begin. Once only. Further problems: `refused`, with kStatusFileBusy
    /// when the time is up, or with the status of a system that refuses coordination. Only with a limit is there a
    /// thread that waits, which then goes on until it has what it waits for, and gives that back.
    FileProblem Begin(const std::string& path, CoordinatedEditOptions options = {});

    /// As those of CContainerEdit.
    FileProblem Apply(const EditScope& scope, const CSafeEdit::Change& change) { return edit_.Apply(scope, change); }
    const ContainerProblem& Difference() const { return edit_.Difference(); }
    const std::string& Target() const { return edit_.Target(); }
    const std::string& Backup() const { return edit_.Backup(); }

private:
    std::unique_ptr<platform::CoordinatedAccess> access_; // ends behind the edit
    CContainerEdit edit_;
};
