#include "platform/posix/ItemSearch.h"

#include <algorithm>
#include <climits>
#include <deque>
#include <memory>

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace platform {

namespace {

struct CloseFolder {
    void operator()(DIR* folder) const { ::closedir(folder); }
};
using OpenFolder = std::unique_ptr<DIR, CloseFolder>;

OpenFolder openFolder(const std::string& path, int linkFlag)
{
    const int descriptor = ::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC | linkFlag);
    if (descriptor < 0)
        return nullptr;
    OpenFolder folder(::fdopendir(descriptor));
    if (!folder)
        ::close(descriptor);
    return folder;
}

bool isDotOrDotDot(const char* name)
{
    return name[0] == '.' && (name[1] == '\0' || (name[1] == '.' && name[2] == '\0'));
}

std::string joined(const std::string& folder, const char* name)
{
    return folder.ends_with('/') ? folder + name : folder + '/' + name;
}

/// A folder to search. `device` is that of the folder where the walk began; that folder itself has none yet.
struct WaitingFolder {
    std::string path;
    std::optional<dev_t> device;
};

class Walk {
public:
    Walk(const ItemIdentity& wanted, const std::vector<std::string>& folders, SearchDepth depth, std::size_t limit)
        : wanted_(wanted),
          folders_(folders),
          depth_(depth),
          entriesLeft_(limit)
    {
        for (const std::string& folder : folders)
            waiting_.push_back({folder, std::nullopt});
    }

    std::optional<std::string> run()
    {
        while (!waiting_.empty() && entriesLeft_ > 0) {
            const WaitingFolder next = std::move(waiting_.front());
            waiting_.pop_front();
            if (auto found = lookThrough(next))
                return found;
        }
        return std::nullopt;
    }

private:
    std::optional<std::string> lookThrough(const WaitingFolder& waiting)
    {
        const bool isBeginning = !waiting.device.has_value();
        const OpenFolder folder = openFolder(waiting.path, isBeginning ? 0 : O_NOFOLLOW);
        struct stat status = {};
        if (!folder || fstat(dirfd(folder.get()), &status) != 0 || (!isBeginning && status.st_dev != *waiting.device))
            return std::nullopt;

        while (const dirent* entry = ::readdir(folder.get())) {
            if (isDotOrDotDot(entry->d_name))
                continue;
            if (entriesLeft_-- == 0) {
                entriesLeft_ = 0;
                return std::nullopt;
            }
            if (entry->d_ino == wanted_.inode) {
                const std::string path = joined(waiting.path, entry->d_name);
                const std::optional<ItemIdentity> identity = itemIdentity(path.c_str());
                if (identity && provenSame(*identity, wanted_))
                    return path;
            }
            if (depth_ == SearchDepth::withSubfolders && (entry->d_type == DT_DIR || entry->d_type == DT_UNKNOWN))
                addSubfolder(waiting.path, *entry, dirfd(folder.get()), status.st_dev);
        }
        return std::nullopt;
    }

    /// The device is checked before the folder is opened, because opening triggers an automounter.
    void addSubfolder(const std::string& parent, const dirent& entry, int parentDescriptor, dev_t device)
    {
        std::string path = joined(parent, entry.d_name);
        struct stat status = {};
        if (path.size() < PATH_MAX && std::find(folders_.begin(), folders_.end(), path) == folders_.end() &&
            fstatat(parentDescriptor, entry.d_name, &status, AT_SYMLINK_NOFOLLOW | AT_NO_AUTOMOUNT) == 0 &&
            S_ISDIR(status.st_mode) && status.st_dev == device)
            waiting_.push_back({std::move(path), device});
    }

    const ItemIdentity& wanted_;
    const std::vector<std::string>& folders_;
    SearchDepth depth_;
    std::size_t entriesLeft_;
    std::deque<WaitingFolder> waiting_;
};

} // namespace

std::optional<std::string> findItem(const ItemIdentity& wanted, const std::vector<std::string>& folders,
                                    SearchDepth depth, std::size_t entryLimit)
{
    return Walk(wanted, folders, depth, entryLimit).run();
}

} // namespace platform
