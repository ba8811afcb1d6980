// The folder in which a backup is made, until it is whole and takes its name.
#pragma once

#include "platform/OwnedDescriptor.h"

#include <filesystem>

/// Hidden, so that a backup of which half is there is none; with a name of its own and locked, so that it is told from
/// one that a killed process left. Throws Failure.
class UnfinishedBackup {
public:
    /// In the folder of backups, which is made where it is missing; what killed processes left there goes.
    explicit UnfinishedBackup(const std::filesystem::path& backups);
    /// Removes it unless it has its name.
    ~UnfinishedBackup();
    UnfinishedBackup(const UnfinishedBackup&) = delete;
    UnfinishedBackup& operator=(const UnfinishedBackup&) = delete;

    const std::filesystem::path& path() const { return path_; }
    /// Over an empty folder at most; false when something else has the name.
    bool publish(const std::filesystem::path& name);

private:
    std::filesystem::path path_; // empty once it is published
    platform::OwnedDescriptor lock_;
};
