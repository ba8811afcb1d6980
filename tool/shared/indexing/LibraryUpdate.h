// Brings an index up to date with the folders that it is made of.
#pragma once

#include "tool/shared/indexing/FolderListing.h"
#include "tool/shared/indexing/LibraryFileReader.h"
#include "tool/shared/library/Library.h"

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

class FilesProgress;

/// A part of the files, chosen by a hash of the path below the root: the same on every machine.
struct LibraryShard {
    unsigned number = 1; // from 1
    unsigned count = 1;

    bool holds(const std::string& pathBelowRoot) const;
};

/// A folder of an index in which something has changed.
struct ChangedFolder {
    std::string path;           // with a slash at the end
    std::string words;          // as in FolderListing
    std::size_t rootLength = 0; // as there
    bool isWhole = false;       // with all that is below it; the folder itself may be gone

    auto operator<=>(const ChangedFolder&) const = default;
};

struct LibraryUpdate {
    std::vector<std::string> folders;        // or files; with none all folders that were indexed before
    std::vector<ChangedFolder> changed = {}; // if there are any, only these
    LibraryReading reading;
    unsigned threads = 0; // that read; 0 for as many as it takes
    LibraryShard shard;
    bool prunes = false; // forget also what is below folders that are not there
    std::function<void(const std::string& path, const std::string& problem)> tell = {};
    std::function<bool()> isEnded = {}; // asked now and then; what was read until then is kept
    /// Called for each folder before its entries are read, by several threads; empty for none.
    std::function<void(const FolderListing&)> opened = {};
    FilesProgress* progress = nullptr;
};

/// Numbers of files.
struct LibraryChanges {
    std::int64_t added = 0;
    std::int64_t changed = 0;
    std::int64_t moved = 0;
    std::int64_t removed = 0;
    std::int64_t same = 0;       // audio that was not read again
    std::int64_t passedOver = 0; // that are no audio
    std::int64_t unreadable = 0; // among those added and changed
    std::int64_t loops = 0;      // as well
    std::int64_t problems = 0;   // folders and files that could not be looked at
    bool wasEnded = false;

    bool areNone() const { return added + changed + moved + removed == 0; }
};

/// The index must be open for writing. Throws Failure for what concerns the index itself; what was written until then
/// stays. Several processes may do this at once.
LibraryChanges updateLibrary(Library& library, const LibraryUpdate& update);
