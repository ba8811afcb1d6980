#include "platform/Folders.h"

#include "platform/FileDates.h"
#include "platform/SystemCalls.h"

#include <algorithm>
#include <cerrno>
#include <memory>
#include <string_view>

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>

namespace platform {

namespace {

constexpr std::uint32_t kFolderPermissions = 0777; // less the process's mask
constexpr std::int64_t kUnixTimeOf2001 = 978307200;

struct CloseDirectory {
    void operator()(DIR* folder) const { ::closedir(folder); }
};

bool isFolder(const std::string& path)
{
    FileStatus status;
    if (!systemCalls().pathStatus(path.c_str(), &status))
        return false;
    if (status.kind != FileKind::directory)
        errno = ENOTDIR;
    return status.kind == FileKind::directory;
}

/// One item to remove. A folder is removed at its second visit, after its content.
struct Removal {
    std::string path;
    bool isEmptied = false;
};

} // namespace

std::optional<std::vector<std::string>> namesInFolder(const std::string& path)
{
    const std::unique_ptr<DIR, CloseDirectory> folder(::opendir(path.c_str()));
    if (!folder)
        return std::nullopt;
    std::vector<std::string> names;
    for (;;) {
        errno = 0;
        const dirent* entry = ::readdir(folder.get());
        if (entry == nullptr)
            break;
        const std::string_view name = entry->d_name;
        if (name != "." && name != "..")
            names.emplace_back(name);
    }
    if (errno != 0)
        return std::nullopt;
    std::sort(names.begin(), names.end());
    return names;
}

bool createFolders(const std::string& path)
{
    if (isFolder(path))
        return true;
    if (errno != ENOENT)
        return false;
    const SystemCalls& calls = systemCalls();
    // Works from the top down, each component once, because an existing folder answers for those above it.
    std::size_t end = 0;
    do {
        end = path.find('/', end + 1);
        const std::string folder = path.substr(0, end);
        if (calls.createFolder(folder.c_str(), kFolderPermissions) != 0) {
            const int reason = errno; // a read-only place gives this error even for existing folders
            if (!isFolder(folder)) {
                errno = reason == EEXIST ? ENOTDIR : reason;
                return false;
            }
        }
    } while (end != path.npos);
    return true;
}

bool removeTree(const std::string& path)
{
    const SystemCalls& calls = systemCalls();
    FileStatus top;
    if (!calls.linkStatus(path.c_str(), &top))
        return false;
    std::vector<Removal> waiting{{path}};
    while (!waiting.empty()) {
        const Removal item = waiting.back();
        FileStatus status;
        if (!calls.linkStatus(item.path.c_str(), &status))
            return false;
        if (item.isEmptied || status.kind != FileKind::directory) {
            const auto remove = item.isEmptied ? calls.removeFolder : calls.removeFile;
            if (remove(item.path.c_str()) != 0)
                return false;
            waiting.pop_back();
            continue;
        }
        if (status.device != top.device) {
            errno = EXDEV;
            return false;
        }
        if (const std::uint32_t all = status.permissions | S_IRWXU; all != status.permissions) // a read-only folder
            ::fchmodat(AT_FDCWD, item.path.c_str(), all, AT_SYMLINK_NOFOLLOW);
        const auto names = namesInFolder(item.path);
        if (!names)
            return false;
        waiting.back().isEmptied = true;
        for (const std::string& name : *names)
            waiting.push_back({item.path + '/' + name});
    }
    return true;
}

std::optional<Date> modificationDate(const std::string& path)
{
    const auto time = fileDate(path.c_str(), FileDate::modification);
    if (!time)
        return std::nullopt;
    return Date{static_cast<double>(time->seconds - kUnixTimeOf2001) + time->nanoseconds * 1e-9};
}

} // namespace platform
