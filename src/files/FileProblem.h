// What kept a file from being copied, made or changed safely.
#pragma once

#include "platform/core/Export.h"

#include <cerrno>
#include <cstdint>
#include <string>
#include <utility>

/// A problem, with the facts that a sentence about it needs.
struct [[nodiscard]] FileProblem {
    /// What went wrong.
    enum class Kind : std::uint8_t {
        none,
        system,            // a call of the system failed
        folder,            // the folder of the target cannot be opened
        creation,          // no file can be made in that folder
        noFreeName,        // every name that a temporary file may have there is taken
        givenAway,         // the name of a temporary file leads to something else now; nothing was done
        shortened,         // the original became shorter while it was copied
        owner,             // cannot be kept
        attribute,         // an extended attribute, `name`, cannot be kept
        hardLinks,         // the file has `count` names, and the others would keep the old content
        sameAsBackup,      // `name`, left by an edit that was cut short, is the same file and would change with it
        backups,           // too many exist
        uncommittedBackup, // the backup cannot be committed to storage
        changed,           // another program changed or replaced the file meanwhile; nothing was done
        refused,           // the change, or the judgement of its outcome, gave `status`
        uncommitted        // done, but a loss of power may undo it: the folder cannot be committed to storage
    };

    Kind kind = Kind::none;  // none: all is well
    int systemError = 0;     // errno; 0 when the system did not fail
    std::int32_t status = 0; // of `refused`, else 0
    std::uint64_t count = 0; // of `hardLinks`, else 0
    std::string name = {};   // of `attribute` and `sameAsBackup`, else empty

    /// A problem of the call that just failed: takes errno.
    static FileProblem ofSystem(Kind kind = Kind::system, std::string name = {})
    {
        return {kind, errno, 0, 0, std::move(name)};
    }

    /// Whether there is a problem.
    explicit operator bool() const { return kind != Kind::none; }
    /// As a status code (platform/core/Status.h), never 0 when there is a problem.
    KT_EXPORT std::int32_t Status() const;
    /// In words, about the file: "became shorter while it was copied"; empty when there is none.
    KT_EXPORT std::string Description() const;
};
