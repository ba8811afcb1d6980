// What an update writes, in short transactions, so that other programs have their turn and a kill costs little.
#pragma once

#include "tool/shared/indexing/IndexedFolders.h"
#include "tool/shared/indexing/LibraryUpdate.h"
#include "tool/shared/indexing/UpdateInbox.h"
#include "tool/shared/library/LibraryWriter.h"

#include <chrono>
#include <string>
#include <vector>

/// Counts what was written.
class UpdateBatch {
public:
    UpdateBatch(Library& library, LibraryChanges& changes);

    void addRoots(const std::vector<std::string>& paths);
    /// A file was read.
    void put(FileReading reading);
    /// A file has moved, if nobody else has seen to it when this is written.
    void move(VanishedFile from, ReadingJob to);
    /// A file system is mounted at a folder, or, without words, is none any more.
    void noteMount(const std::string& path, const std::string& words);
    /// When there is something to be written for long enough, or enough of it.
    std::chrono::steady_clock::time_point due() const { return due_; }
    /// Writes it; returns files that have not moved, and must be read.
    std::vector<ReadingJob> write();
    /// Removes those that are still gone and known as they were.
    void remove(std::vector<VanishedFile> files);
    /// Roots that were gone through to their ends, and roots to be forgotten.
    void finish(const std::vector<std::string>& complete, const std::vector<std::string>& gone);

private:
    struct Move {
        VanishedFile from;
        ReadingJob to;
    };

    void noteWork();
    void write(const FileReading& reading);
    bool write(const Move& move);
    bool isAsKnown(std::int64_t folder, const VanishedFile& file);
    std::int64_t folderOf(const FolderListing& folder) { return writer_.addFolder(folder.path, folder.words); }

    Library& library_;
    LibraryChanges& changes_;
    LibraryWriter writer_;
    SQLStatement seen_;
    std::vector<FileReading> readings_;
    std::vector<Move> moves_;
    std::vector<std::pair<std::string, std::string>> mounts_; // paths and words
    std::chrono::steady_clock::time_point due_ = std::chrono::steady_clock::time_point::max();
};
