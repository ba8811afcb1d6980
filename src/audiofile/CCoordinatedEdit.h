// // Safe edits of containers under coordinated access (platform/FileCoordination.h).
#pragma once

#include "audiofile/CContainerEdit.h"

#include <memory>
#include <optional>
#include <string>

namespace platform {
class CoordinatedAccess;
}

/// How an edit is made, and how long it waits.
struct CoordinatedEditOptions : SafeEditOptions {
    /// How many seconds to wait for others, each time that they are in the way; 0 or more. Null means no limit.
    std::optional<double> timeoutSeconds = std::nullopt;
    /// The caller has coordinated write access already, for which the edit would wait.
    bool hasAccess = false;
};

/// One edit of one file. From Begin to its destruction nobody else has coordinated access to the file, and it is
/// locked against other edits of this kind. One thread.
class KT_EXPORT CCoordinatedEdit {
public:
    CCoordinatedEdit();
    ~CCoordinatedEdit();
    CCoordinatedEdit(const CCoordinatedEdit&) = delete;
    CCoordinatedEdit& operator=(const CCoordinatedEdit&) = delete;

    /// Waits for write access, then does what CSafeEdit::Begin does. Call it once. A further problem is `refused`,
    /// with kStatusFileBusy when the time is up, or with the status of a system that refuses coordination. A limit
    /// needs a thread, which goes on waiting after the time is up, and gives back what it then gets.
    FileProblem Begin(const std::string& path, CoordinatedEditOptions options = {});

    /// Each as in CContainerEdit.
    FileProblem Apply(const EditScope& scope, const CSafeEdit::Change& change) { return edit_.Apply(scope, change); }
    const ContainerProblem& Difference() const { return edit_.Difference(); }
    const std::string& Target() const { return edit_.Target(); }
    const std::string& Backup() const { return edit_.Backup(); }

private:
    std::unique_ptr<platform::CoordinatedAccess> access_; // ends behind the edit
    CContainerEdit edit_;
};
