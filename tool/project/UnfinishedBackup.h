// The folder in which a backup is made, until it is complete and gets its name.
#pragma once

#include "platform/OwnedDescriptor.h"

#include <filesystem>

/// Hidden, so that half a backup does not pass for one; uniquely named and locked, so that it is distinguished from one
/// that a killed process left. Throws Failure.
class UnfinishedBackup {
public:
    /// Creates the folder of backups if necessary, and removes what killed processes left in it.
    explicit UnfinishedBackup(const std::filesystem::path& backups);
    /// Removes the folder unless it has got its name.
    ~UnfinishedBackup();
    UnfinishedBackup(const UnfinishedBackup&) = delete;
    UnfinishedBackup& operator=(const UnfinishedBackup&) = delete;

    const std::filesystem::path& path() const { return path_; }
    /// Replaces at most an empty folder; false if anything else has the name.
    bool publish(const std::filesystem::path& name);

private:
    std::filesystem::path path_; // empty once published
    platform::OwnedDescriptor lock_;
};
