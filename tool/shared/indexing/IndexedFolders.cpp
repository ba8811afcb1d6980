#include "tool/shared/indexing/IndexedFolders.h"

#include "tool/shared/library/IndexedName.h"

#include <algorithm>
#include <filesystem>
#include <sys/stat.h>
#include <system_error>

namespace {

// Folders below one are those between its path and this: a slash is followed by a zero.
std::string endOfFolder(std::string path)
{
    path.back() = '0';
    return path;
}

SeenStamp stampInRow(const SQLStatement& row, int first)
{
    return {row.number(first), row.number(first + 1), row.number(first + 2), row.number(first + 3)};
}

constexpr const char* kOwnEndings[] = {"", "-wal", "-shm", "-journal"};

} // namespace

bool VanishedFile::isGone() const
{
    struct stat status = {};
    const std::string path = folder + nameOfIndexed(text);
    if (::lstat(path.c_str(), &status) != 0)
        return errno == ENOENT || errno == ENOTDIR;
    // A link that leads nowhere may lead to a volume that is not mounted.
    if (S_ISLNK(status.st_mode) && ::stat(path.c_str(), &status) != 0)
        return false;
    return !S_ISREG(status.st_mode);
}

std::uint64_t deviceOfNearest(std::string folder)
{
    struct stat status = {};
    while (::stat(folder.c_str(), &status) != 0) {
        if (folder.size() < 2)
            return 0;
        folder.erase(folder.rfind('/', folder.size() - 2) + 1);
    }
    return status.st_dev;
}

IndexedFolders::IndexedFolders(SQLDatabase& database)
    : database_(database),
      files_(database, "SELECT s.name, s.size, s.modified, s.changed, s.inode, s.file IS NOT NULL "
                       "FROM folders d JOIN seen s ON s.folder = d.id WHERE d.path = ? ORDER BY s.name"),
      file_(database, "SELECT s.name, s.size, s.modified, s.changed, s.inode, s.file IS NOT NULL "
                      "FROM folders d JOIN seen s ON s.folder = d.id WHERE d.path = ? AND s.name = ?"),
      folders_(database, "SELECT path FROM folders WHERE path >= ? AND path < ?"),
      mounts_(database, "SELECT path FROM folders WHERE mounted = 1 AND path >= ? AND path < ?"),
      anyBelow_(database, "SELECT 1 FROM folders d WHERE path >= ? AND path < ? "
                          "AND EXISTS (SELECT 1 FROM seen s WHERE s.folder = d.id) LIMIT 1"),
      inodes_(database, "SELECT d.path, s.name, s.size, s.modified, s.changed, s.inode "
                        "FROM seen s JOIN folders d ON d.id = s.folder "
                        "WHERE s.inode = ? AND s.file IS NOT NULL AND s.size = ? AND s.modified = ?"),
      root_(database, "SELECT 1 FROM roots WHERE path = ?")
{
    namespace fs = std::filesystem;
    std::error_code error;
    const fs::path path = fs::weakly_canonical(database.path(), error);
    for (const char* const ending : kOwnEndings) {
        own_.emplace_back(path.parent_path().string() + "/", indexedName(path.filename().string() + ending));
        if (const auto stamp = stampOfFile(path.string() + ending))
            ownInodes_.push_back(stamp->inode);
    }
}

std::vector<std::string> IndexedFolders::roots()
{
    std::vector<std::string> paths;
    for (SQLStatement row(database_, "SELECT path FROM roots ORDER BY path"); row.step();)
        paths.push_back(nameOfIndexed(row.bytes(0)));
    return paths;
}

bool IndexedFolders::isRoot(const std::string& path)
{
    const std::string text = indexedName(path);
    const bool isThere = root_.bind(1, std::string_view(text)).step();
    root_.reset();
    return isThere;
}

std::vector<KnownFile> IndexedFolders::filesOf(const std::string& folder)
{
    const std::string text = indexedName(folder);
    std::vector<KnownFile> files;
    files_.bind(1, std::string_view(text));
    while (files_.step())
        files.push_back({files_.text(0), stampInRow(files_, 1), files_.number(5) != 0});
    return files;
}

std::optional<KnownFile> IndexedFolders::fileAt(const std::string& folder, const std::string& name)
{
    const std::string text = indexedName(folder), nameText = indexedName(name);
    std::optional<KnownFile> file;
    if (file_.bind(1, std::string_view(text)).bind(2, std::string_view(nameText)).step())
        file = {file_.text(0), stampInRow(file_, 1), file_.number(5) != 0};
    file_.reset();
    return file;
}

std::vector<std::string> IndexedFolders::foldersBelow(const std::string& folder)
{
    const std::string text = indexedName(folder), end = endOfFolder(text);
    std::vector<std::string> paths;
    folders_.bind(1, std::string_view(text)).bind(2, std::string_view(end));
    while (folders_.step())
        paths.push_back(nameOfIndexed(folders_.bytes(0)));
    return paths;
}

std::vector<std::string> IndexedFolders::mountsBelow(const std::string& folder)
{
    const std::string text = indexedName(folder), end = endOfFolder(text);
    std::vector<std::string> paths;
    mounts_.bind(1, std::string_view(text)).bind(2, std::string_view(end));
    while (mounts_.step())
        paths.push_back(nameOfIndexed(mounts_.bytes(0)));
    return paths;
}

bool IndexedFolders::isMount(const std::string& folder)
{
    const std::vector<std::string> mounts = mountsBelow(folder);
    return std::ranges::find(mounts, folder) != mounts.end();
}

bool IndexedFolders::knowsBelow(const std::string& folder)
{
    const std::string text = indexedName(folder), end = endOfFolder(text);
    const bool knows = anyBelow_.bind(1, std::string_view(text)).bind(2, std::string_view(end)).step();
    anyBelow_.reset();
    return knows;
}

std::vector<VanishedFile> IndexedFolders::withInodeOf(const ListedFile& file)
{
    std::vector<VanishedFile> found;
    if (file.stamp.inode == 0)
        return found;
    inodes_.bind(1, file.stamp.inode).bind(2, file.stamp.size).bind(3, file.stamp.modified);
    while (inodes_.step())
        found.push_back({nameOfIndexed(inodes_.bytes(0)), inodes_.text(1), stampInRow(inodes_, 2)});
    return found;
}

bool IndexedFolders::isItself(const FolderListing& folder, const ListedFile& file) const
{
    if (std::ranges::find(ownInodes_, file.stamp.inode) == ownInodes_.end()) {
        if (file.text.size() < own_.front().second.size() || !file.text.starts_with(own_.front().second))
            return false;
        return std::ranges::any_of(
            own_, [&](const auto& own) { return own.first == folder.path && own.second == file.text; });
    }
    // Its inode may be that of another file on another device.
    struct stat status = {};
    return ::stat((folder.path + nameOfIndexed(file.text)).c_str(), &status) == 0 &&
           status.st_dev == deviceOfNearest(own_.front().first);
}
