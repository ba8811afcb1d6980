// Safe edits of containers, checked before they take effect: everything that the edit is not about stays, to the
// byte.
#pragma once

#include "audiofile/ChunkInventory.h"
#include "audiofile/ContainerProblem.h"
#include "audiofile/EditScope.h"
#include "files/CSafeEdit.h"

#include <optional>

/// A CSafeEdit that knows chunks. Look at the file, and at what speaks against the edit (audiofile/ChunkSurvey.h), once
/// it has begun.
///
///     CContainerEdit edit;
///     if (edit.Begin(path))
///         return ...;
///     const auto change = [&](const std::string& copy) {
///         return AddChunkTo(CFileRef(copy.c_str(), false), {.id = fourCC("note"), .body = text}).Status();
///     };
///     if (FileProblem problem = edit.Apply(EditScope::chunk(fourCC("note")), change))
///         return ...;
class KT_EXPORT CContainerEdit : public CSafeEdit {
public:
    /// CSafeEdit::Apply, followed by a comparison of everything outside the scope: with the original, byte by byte;
    /// after an edit in place only by the ends of its bodies, since nothing else of it is left. A difference is a
    /// problem of the kind `refused`, and Difference() says which.
    FileProblem Apply(const EditScope& scope, const Change& change);

    /// What the comparison of the last Apply found.
    const ContainerProblem& Difference() const { return difference_; }

protected:
    std::int32_t LookBefore(int original) override;
    std::int32_t LookAfter(int original, int edited) override;
    void CutBack(int edited) override;

private:
    EditScope scope_;
    std::optional<ChunkInventory> before_; // of an edit in place
    ContainerProblem difference_;
};
