// Tells in which folders of an index something changes, as the system announces it.
#pragma once

#include "platform/OwnedDescriptor.h"
#include "tool/shared/indexing/LibraryUpdate.h"

#include <chrono>
#include <mutex>
#include <set>
#include <string>
#include <unordered_map>
#include <vector>

/// Folders may be added by several threads; one waits.
class FolderWatch {
public:
    /// What beside the database has its name belongs to it, and is no change. Throws Failure.
    explicit FolderWatch(const std::string& database);

    /// Watches a folder whose entries are about to be read.
    void add(const FolderListing& folder);
    /// Whether changes may go unnoticed: in folders of other machines, and in those that the system's limit left out.
    bool missesSome() const { return missesSome_; }
    /// Whether the limit did; said once.
    bool takeLimitReached();

    struct Changes {
        std::vector<ChangedFolder> folders;
        bool areUnknown = false; // too many, or of a root itself: everything must be looked at
    };
    /// Waits for changes, and until nothing more happens for a moment. None after `longest`, and when a signal arrives.
    Changes wait(std::chrono::milliseconds longest);

private:
    struct Watched {
        std::string path, words;
        std::size_t rootLength = 0;
    };

    bool readEvents(std::chrono::milliseconds longest);
    void note(int watch, std::uint32_t mask, const std::string& name);
    void noteFolder(const Watched& parent, const std::string& name, std::uint32_t mask);
    void forgetBelow(const std::string& path);
    bool isDatabase(const Watched& folder, const std::string& name) const;

    platform::OwnedDescriptor queue_;
    std::string databaseFolder_, databaseName_;
    std::mutex mutex_;
    std::unordered_map<int, Watched> watched_;
    std::set<ChangedFolder> changed_;
    bool areUnknown_ = false;
    bool missesSome_ = false;
    bool isLimitReached_ = false;
};
