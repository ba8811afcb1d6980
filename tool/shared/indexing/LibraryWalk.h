// Goes through the folders that an index is made of, several at a time.
#pragma once

#include "tool/shared/indexing/UpdateInbox.h"

#include <condition_variable>
#include <functional>
#include <mutex>
#include <set>
#include <string>
#include <thread>
#include <utility>
#include <vector>

/// Where a walk begins: a root, or files of one folder that were named by themselves, or a folder that has changed.
struct WalkStart {
    std::string path; // of the folder: absolute, links resolved, with a slash at the end
    std::string words;
    std::vector<std::string> files = {}; // none for a folder
    std::size_t rootLength = 0;          // as in FolderListing, of a folder below a root; 0 for a root
    bool isAlone = false;                // the folders in it are not gone through
};

/// Leaves a listing of each folder in the inbox, in no order. A folder is visited once. A link to a folder is followed
/// if it leads out of all roots, and the folder has the path that it leads to.
class LibraryWalk {
public:
    ///
    /// `opened` is called by the threads of the walk for each folder before its entries are read; empty for none.
    LibraryWalk(UpdateInbox& inbox, std::vector<WalkStart> starts, unsigned threads,
                std::function<void(const FolderListing&)> opened = {});
    /// Ends the walk.
    ~LibraryWalk();

private:
    struct Task {
        FolderListing listing;
        std::vector<std::string> files;
        bool isAlone = false;
    };

    void work();
    void visitAll();
    bool visit(Task& task);
    void addFolders(const FolderListing& listing);
    bool isNew(const FolderListing& listing);
    bool leadsInside(const std::string& path) const;

    UpdateInbox& inbox_;
    std::function<void(const FolderListing&)> opened_;
    std::vector<std::string> roots_;

    std::mutex mutex_;
    std::condition_variable ready_;
    std::vector<Task> tasks_;                                   // the last is next, so that few wait
    std::set<std::pair<std::uint64_t, std::uint64_t>> visited_; // devices and inodes
    std::size_t atWork_ = 0;
    bool isStopped_ = false;
    std::vector<std::jthread> threads_; // last: they end before what they use
};
