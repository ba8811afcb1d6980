// Changes the rows of an index.
#pragma once

#include "tool/shared/library/AddedFiles.h"
#include "tool/shared/library/Library.h"

#include <string>
#include <unordered_map>

/// Within a transaction of the caller's. Owns prepared statements; must not outlive the library.
class LibraryWriter {
public:
    explicit LibraryWriter(Library& library);

    /// Call at the beginning of each transaction: forgets which rows the folders have, as another program may have
    /// removed some.
    void begin();
    /// In the place of the transaction's own: the words of files that were added are written here.
    void commit(SQLTransaction& transaction);

    /// The row of a root, which is added if it is new. `path` ends with a slash.
    std::int64_t addRoot(const std::string& path);
    /// Forgets a root, not what is known below it.
    void removeRoot(const std::string& path);
    /// Notes that a root was gone through to its end.
    void completeRoot(std::int64_t root, std::int64_t seconds);
    /// The row of a folder, which is added if it is new. `words` is the part of its path that a search looks at.
    std::int64_t addFolder(const std::string& path, const std::string& words);

    /// The row of a folder; 0 for none.
    std::int64_t folderAt(const std::string& path);
    /// Notes whether a file system is mounted at a folder.
    void setMounted(std::int64_t folder, bool isMounted);
    /// Forgets the folders of whose files nothing is known, but not where file systems were mounted.
    void removeEmptyFolders();

    /// Adds an audio file, or puts it in the place of what was known of the file of that place; the row stays the
    /// same. Returns the row.
    std::int64_t put(const LibraryRecord& record, std::int64_t folder);
    /// Notes a file that is no audio, so that it is not read again; an audio file that was in its place is removed.
    void passOver(std::int64_t folder, const std::string& name, const SeenStamp& stamp);
    /// A file has moved: its row goes with it. Nothing else may be known of the new place.
    void move(std::int64_t folder, const std::string& name, std::int64_t newFolder, const std::string& newName,
              const SeenStamp& stamp);
    /// Forgets what was in a place; nothing if there was none. Whether it was audio.
    bool remove(std::int64_t folder, const std::string& name);
    /// A folder has moved with all that is in it.
    void moveFolder(std::int64_t folder, const std::string& path, const std::string& words);

private:
    /// The audio file of a place; 0 for none.
    std::int64_t fileAt(std::int64_t folder, const std::string& name);
    void see(std::int64_t folder, const std::string& name, const SeenStamp& stamp, std::int64_t file);
    void removeFile(std::int64_t file);
    void putParts(std::int64_t file, const LibraryRecord& record, bool isNew);

    Library& library_;
    AddedFiles added_;
    SQLStatement findFile_, addFile_, changeFile_, removeFile_, see_, unsee_;
    SQLStatement dropFindings_, addFinding_, putOverview_, dropOverview_, putDetails_;
    SQLStatement addFolder_, findFolder_, moveFile_;
    std::unordered_map<std::string, std::int64_t> folders_; // by path
};
