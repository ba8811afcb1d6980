// What an index knows already, folder by folder, for comparing it with what is there.
#pragma once

#include "tool/shared/indexing/FolderListing.h"
#include "tool/shared/library/SQLDatabase.h"

#include <optional>
#include <string>
#include <utility>
#include <vector>

/// A file that was looked at before.
struct KnownFile {
    std::string text; // its name, as indexedName() gives it
    SeenStamp stamp;
    bool isAudio = false;
};

/// A place that the index knows, and where nothing may be any more.
struct VanishedFile {
    std::string folder;             // with a slash at the end
    std::string text;               // the name, as indexedName() gives it
    std::optional<SeenStamp> stamp; // as the index knows it; any if there is none

    /// Whether there is no such file.
    bool isGone() const;
};

/// The number of the device that holds the folder, or if that is gone, the nearest folder above.
std::uint64_t deviceOfNearest(std::string folder);

/// Owns prepared statements; must not outlive the database.
class IndexedFolders {
public:
    explicit IndexedFolders(SQLDatabase& database);

    std::vector<std::string> roots();
    bool isRoot(const std::string& path);
    /// In the order of their texts.
    std::vector<KnownFile> filesOf(const std::string& folder);
    std::optional<KnownFile> fileAt(const std::string& folder, const std::string& name);
    /// The folder itself, and those below it.
    std::vector<std::string> foldersBelow(const std::string& folder);
    /// Where file systems were mounted: the folder itself, and those below it.
    std::vector<std::string> mountsBelow(const std::string& folder);
    bool isMount(const std::string& folder);
    /// Whether anything is known of the folder and of those below it.
    bool knowsBelow(const std::string& folder);
    /// Audio that may be the same as this file: of equal inode, size and time.
    std::vector<VanishedFile> withInodeOf(const ListedFile& file);
    /// Whether the file is that of the database, or one beside it that SQLite made. Another descriptor of such a file
    /// must not be closed: with it go the locks of this process.
    bool isItself(const FolderListing& folder, const ListedFile& file) const;

private:
    SQLDatabase& database_;
    SQLStatement files_, file_, folders_, mounts_, anyBelow_, inodes_, root_;
    std::vector<std::pair<std::string, std::string>> own_; // folders and texts
    std::vector<std::int64_t> ownInodes_;
};
