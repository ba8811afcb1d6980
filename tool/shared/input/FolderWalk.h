// Walks the files below folders in a stable order.
#pragma once

#include "tool/shared/input/FoundFile.h"

#include <functional>
#include <set>
#include <string>
#include <utility>
#include <vector>

/// Whether the path leads to a folder; false for "-", standard input.
bool isFolder(const std::string& path);

/// Visits each folder once, in byte order of the names, and keeps only the names in the folders that it is in. Skips
/// names that begin with a dot. Links to files count as files; a link to a folder is followed only if it leads out of
/// the folders named, so that nothing is met twice and no circle is walked.
class FolderWalk {
public:
    /// False ends the walk.
    using Visit = std::function<bool(FoundFile file)>;

    /// The roots may be files, which are always visited.
    FolderWalk(std::vector<std::string> roots, Visit visit);
    /// False if the walk was ended.
    bool run();

private:
    struct Entry {
        std::string name;
        unsigned char type; // DT_DIR and so on
    };

    bool walk(const std::string& folder);
    bool visitEntry(std::string path, const Entry& entry);
    bool visit(std::string path, std::string problem = {}) const;
    bool isNew(const std::string& folder);
    bool leadsInside(const std::string& link) const;
    static std::vector<Entry> entriesOf(const std::string& folder, int& error);

    std::vector<std::string> roots_;
    std::vector<std::string> resolvedRoots_;
    Visit visit_;
    std::size_t rootLength_ = 0;                             // of the folder being walked
    std::set<std::pair<std::uint64_t, std::uint64_t>> seen_; // device and inode of each folder
};
