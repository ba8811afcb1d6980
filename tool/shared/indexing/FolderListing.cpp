#include "tool/shared/indexing/FolderListing.h"

#include "platform/OwnedDescriptor.h"
#include "tool/shared/library/IndexedName.h"

#include <algorithm>
#include <cerrno>
#include <cstddef>
#include <cstring>
#include <dirent.h>
#include <fcntl.h>
#include <memory>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace {

// Larger than the buffer of readdir(), so that a folder of a thousand files takes two calls.
constexpr std::size_t kEntryBytes = 1 << 18;

std::int64_t nanosecondsOf(const timespec& time)
{
    return std::int64_t{time.tv_sec} * 1'000'000'000 + time.tv_nsec;
}

SeenStamp stampOf(const struct stat& status)
{
    return {status.st_size, nanosecondsOf(status.st_mtim), nanosecondsOf(status.st_ctim),
            static_cast<std::int64_t>(status.st_ino)};
}

bool isPlain(const char* name)
{
    for (; *name != '\0'; ++name)
        if (static_cast<unsigned char>(*name) >= 0x80)
            return false;
    return true;
}

std::string textOfName(const char* name)
{
    return isPlain(name) ? std::string(name) : indexedName(name);
}

void addEntry(FolderListing& listing, int folder, const char* name, unsigned char type)
{
    if (type == DT_DIR) {
        listing.folders.push_back({name, false});
        return;
    }
    if (type != DT_REG && type != DT_LNK && type != DT_UNKNOWN)
        return;
    struct stat status = {};
    if (type == DT_UNKNOWN && ::fstatat(folder, name, &status, AT_SYMLINK_NOFOLLOW) == 0)
        type = S_ISLNK(status.st_mode) ? DT_LNK : S_ISREG(status.st_mode) ? DT_REG : DT_DIR;
    if (::fstatat(folder, name, &status, 0) != 0) {
        // What has just vanished is gone; a link that leads nowhere may lead to a volume that is not mounted.
        if (errno != ENOENT || type != DT_REG)
            listing.uncertain.push_back(textOfName(name));
    } else if (S_ISDIR(status.st_mode)) {
        listing.folders.push_back({name, type != DT_DIR});
    } else if (S_ISREG(status.st_mode)) {
        listing.files.push_back({textOfName(name), stampOf(status)});
    }
}

// The fixed part of what the system call writes; the name follows, with a zero.
struct EntryHead {
    std::uint64_t inode;
    std::int64_t next;
    std::uint16_t length;
    unsigned char type;
};
constexpr std::size_t kNameOffset = offsetof(EntryHead, type) + 1;

// 0, or what went wrong.
int addEntries(FolderListing& listing, int folder)
{
    thread_local const std::unique_ptr<char[]> buffer(new char[kEntryBytes]);
    for (;;) {
        const long got = ::syscall(SYS_getdents64, folder, buffer.get(), kEntryBytes);
        if (got < 0)
            return errno;
        if (got == 0)
            return 0;
        for (long at = 0; at < got;) {
            EntryHead head;
            std::memcpy(&head, buffer.get() + at, kNameOffset);
            const char* const name = buffer.get() + at + kNameOffset;
            if (name[0] != '.')
                addEntry(listing, folder, name, head.type);
            at += head.length;
        }
    }
}

} // namespace

void listFolder(FolderListing& listing, const std::function<bool(const FolderListing&)>& isWanted)
{
    const platform::OwnedDescriptor folder(
        ::open(listing.path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC | O_NONBLOCK));
    struct stat status = {};
    if (!folder || ::fstat(folder.get(), &status) != 0) {
        listing.error = errno;
        listing.isWhole = false;
        listing.isGone = errno == ENOENT || errno == ENOTDIR;
        return;
    }
    struct stat above = {};
    listing.device = status.st_dev;
    listing.inode = status.st_ino;
    listing.isMount = ::fstatat(folder.get(), "..", &above, 0) == 0 && above.st_dev != status.st_dev;
    if (!isWanted(listing)) {
        listing.isWhole = false;
        return;
    }
    listing.error = addEntries(listing, folder.get());
    listing.isWhole = listing.error == 0;
    std::ranges::sort(listing.files, {}, &ListedFile::text);
    std::ranges::sort(listing.uncertain);
}

bool isMountPoint(const std::string& folder)
{
    struct stat status = {}, above = {};
    return ::stat(folder.c_str(), &status) == 0 && ::stat((folder + "..").c_str(), &above) == 0 &&
           status.st_dev != above.st_dev;
}

std::optional<SeenStamp> stampOfFile(const std::string& path)
{
    struct stat status = {};
    if (::stat(path.c_str(), &status) != 0)
        return std::nullopt;
    errno = ENOENT;
    return S_ISREG(status.st_mode) ? std::optional(stampOf(status)) : std::nullopt;
}

bool listFile(FolderListing& listing, const std::string& name)
{
    listing.isWhole = false;
    const std::optional<SeenStamp> stamp = stampOfFile(listing.path + name);
    if (stamp)
        listing.files.push_back({indexedName(name), *stamp});
    return stamp.has_value();
}
