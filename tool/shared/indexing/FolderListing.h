// The files of one folder with what tells whether they have changed, read without opening any of them.
#pragma once

#include "tool/shared/library/LibraryRecord.h"

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

struct ListedFile {
    std::string text; // its name, as indexedName() gives it
    SeenStamp stamp;
};

/// A folder inside another one, or what a link leads to.
struct ListedFolder {
    std::string name;
    bool isLink = false;
};

struct FolderListing {
    std::string path;           // absolute, links resolved, with a slash at the end
    std::string words;          // the part that a search for words looks at: from the name of the root on
    std::size_t rootLength = 0; // of the root's name and slash in `words`

    std::vector<ListedFile> files; // by their texts
    std::vector<ListedFolder> folders;
    std::vector<std::string> uncertain; // texts of names whose files could not be looked at, in order
    std::vector<std::string> missing;   // names of files that were named by themselves and are not there
    std::uint64_t device = 0, inode = 0;
    bool isRoot = false;
    bool isMount = false; // a file system begins here
    bool isWhole = true;  // otherwise files that are not listed may be there
    bool isGone = false;  // there is no such folder
    int error = 0;        // of the system, for a folder that could not be read to its end; then it is not whole

    /// The path of a file or of the folder itself below its root.
    std::string below(const std::string& name = {}) const { return words.substr(rootLength) + name; }
};

/// Lists the folder at `listing.path`: regular files, and links to such; names that begin with a dot are left out.
/// Lists nothing if `isWanted`, which finds device and inode filled in, says so.
void listFolder(FolderListing& listing, const std::function<bool(const FolderListing&)>& isWanted);
/// Whether a file system begins at the folder.
bool isMountPoint(const std::string& folder);
/// The stamp of a regular file, or of the one that a link leads to; none if there is none, with `errno` set.
std::optional<SeenStamp> stampOfFile(const std::string& path);
/// Adds a file that was named by itself to those of its folder, which is not whole. False if it is not there.
bool listFile(FolderListing& listing, const std::string& name);
