// What kept a file from being copied, made or changed safely.
#pragma once

#include "platform/core/Export.h"

#include <cerrno>
#include <cstdint>
#include <string>
#include <utility>

/// With the facts that a sentence about it needs. Tests true when there is one.
struct [[nodiscard]] FileProblem {
    enum class Kind : std::uint8_t {
        none,
        system,       // a call of the system failed
        folder,       // the folder of the target cannot be opened
        creation,     // no file can be made in that folder
        noFreeName,   // every name that a temporary file may have there is taken
        givenAway,    // the name of a temporary file leads to something else now; nothing was done
        shortened,    // the original became shorter while it was copied
        owner,        // cannot be kept
        attribute,    // an extended one, `name`, cannot be kept
        hardLinks,    // the file has `count` names, and the others would keep the old content
        sameAsBackup, // `name` is the same file still, left so by an edit that was cut short, and would change with it
        backups,      // there are too many
        uncommittedBackup, // the backup cannot be committed to storage
        changed,           // another program changed the file meanwhile, or put another in its place; nothing was done
        refused,           // what was to be changed, or the look at what came of it, gave `status`
        uncommitted        // it is done, but a loss of power now may undo it: the folder cannot be committed to storage
    };

    Kind kind = Kind::none;
    int systemError = 0;     // errno, 0 when it was not the system
    std::int32_t status = 0; // of `refused`
    std::uint64_t count = 0;
    std::string name = {};

    /// Of a call that failed just now.
    static FileProblem ofSystem(Kind kind = Kind::system, std::string name = {})
    {
        return {kind, errno, 0, 0, std::move(name)};
    }

    explicit operator bool() const { return kind != Kind::none; }
    /// As a status code (platform/core/Status.h), never 0 when there is a problem.
    KT_EXPORT std::int32_t Status() const;
    /// In words, about the file: "became shorter while it was copied"; empty when there is none.
    KT_EXPORT std::string Description() const;
};
