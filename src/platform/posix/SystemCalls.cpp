#include "platform/SystemCalls.h"

#include "platform/core/ASCIICase.h"
#include "platform/posix/ItemKind.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <string>
#include <string_view>

#include <fcntl.h>
#include <linux/fs.h>
#include <linux/openat2.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace platform {

namespace {

enum class Waiting : bool { no, yes };
enum class Links : bool { followed, refused };

/// Opens without blocking, so that a FIFO or device does not hold up the caller.
int openFlags(OpenFor access, Waiting waiting = Waiting::no)
{
    return (access == OpenFor::reading ? O_RDONLY : O_RDWR) | O_CLOEXEC | O_NOCTTY |
           (waiting == Waiting::no ? O_NONBLOCK : 0);
}

int openPath(const char* path, int flags, Links links)
{
    if (links == Links::followed)
        return ::open(path, flags);
    open_how how = {};
    how.flags = static_cast<unsigned>(flags);
    how.resolve = RESOLVE_NO_SYMLINKS;
    return static_cast<int>(syscall(SYS_openat2, AT_FDCWD, path, &how, sizeof how));
}

FileStatus fileStatus(const struct stat& from)
{
    FileStatus status;
    status.device = from.st_dev;
    status.inode = from.st_ino;
    status.size = from.st_size;
    status.kind = kindOfMode(from.st_mode);
    status.permissions = from.st_mode & 07777;
    status.changed = std::int64_t{from.st_ctim.tv_sec} * 1'000'000'000 + from.st_ctim.tv_nsec;
    status.links = from.st_nlink;
    return status;
}

bool descriptorStatus(int descriptor, FileStatus* status)
{
    struct stat found = {};
    if (fstat(descriptor, &found) != 0)
        return false;
    *status = fileStatus(found);
    return true;
}

bool pathStatus(const char* path, FileStatus* status)
{
    struct stat found = {};
    if (stat(path, &found) != 0)
        return false;
    *status = fileStatus(found);
    return true;
}

bool linkStatus(const char* path, FileStatus* status)
{
    struct stat found = {};
    if (lstat(path, &found) != 0)
        return false;
    *status = fileStatus(found);
    return true;
}

bool isRegular(const FileStatus& status)
{
    if (status.kind == FileKind::file)
        return true;
    errno = status.kind == FileKind::directory ? EISDIR : ENXIO;
    return false;
}

/// Passes on the descriptor of a regular file, with its status; closes any other.
int regularFileOnly(int descriptor, FileStatus* status)
{
    if (descriptor < 0)
        return -1;
    FileStatus found;
    if (descriptorStatus(descriptor, &found) && isRegular(found)) {
        if (status != nullptr)
            *status = found;
        return descriptor;
    }
    const int reason = errno;
    ::close(descriptor);
    errno = reason;
    return -1;
}

/// Waits for a regular file on which another process, such as a file server, holds a lease, as a plain open does: the
/// kernel asks the holder to return the lease, and revokes it after a time. A path-only descriptor holds the item
/// meanwhile, so that nothing can take its place.
int openLeasedFile(const char* path, OpenFor access, Links links)
{
    const int item = regularFileOnly(openPath(path, O_PATH | O_CLOEXEC, links), nullptr);
    if (item < 0)
        return -1;
    const std::string itself = "/proc/self/fd/" + std::to_string(item);
    int descriptor = ::open(itself.c_str(), openFlags(access, Waiting::yes));
    if (descriptor < 0 && errno == ENOENT) // /proc is not mounted
        descriptor = openPath(path, openFlags(access, Waiting::yes), links);
    const int reason = errno;
    ::close(item);
    errno = reason;
    return descriptor;
}

int openRegularFile(const char* path, OpenFor access, Links links, FileStatus* status)
{
    int descriptor = openPath(path, openFlags(access), links);
    if (descriptor < 0 && errno == EWOULDBLOCK)
        descriptor = openLeasedFile(path, access, links);
    return regularFileOnly(descriptor, status);
}

int openFile(const char* path, OpenFor access, FileStatus* status)
{
    FileStatus found;
    if (!pathStatus(path, &found) || !isRegular(found))
        return -1;
    return openRegularFile(path, access, Links::followed, status);
}

/// Whether the path has an extension of recordings and loops, which are read by the hundred thousand.
bool endsLikeRecording(std::string_view path)
{
    const std::string_view end = path.substr(path.size() - std::min<std::size_t>(path.size(), 5));
    for (const std::string_view extension : {".wav", ".aif", ".aiff", ".aifc", ".caf"})
        if (equalIgnoringASCIICase(end.substr(end.size() - std::min(end.size(), extension.size())), extension))
            return true;
    return false;
}

/// Whether merely opening the item could have an effect: open a device, or release a process that waits to write into a
/// FIFO and then take its reader away. Looking first costs a quarter of the time of opening for reading, so a FIFO is
/// trusted not to be named like a recording.
bool needsLookBeforeOpening(const char* path, OpenFor access)
{
    return access != OpenFor::reading || path[0] != '/' || std::strstr(path, "/dev/") != nullptr ||
           !endsLikeRecording(path);
}

/// "/proc/self/fd/N" leads to the open file rather than to a name, which another process could have changed; a caller
/// who uses that path means that file.
bool isOwnDescriptor(const char* path)
{
    constexpr std::string_view kFolder = "/proc/self/fd/";
    return std::string_view(path).starts_with(kFolder);
}

int openFileWithoutLinks(const char* path, OpenFor access, FileStatus* status)
{
    if (isOwnDescriptor(path))
        return openFile(path, access, status);
    if (needsLookBeforeOpening(path, access)) {
        FileStatus found;
        if (!pathStatus(path, &found) || !isRegular(found))
            return -1;
    }
    const int descriptor = openRegularFile(path, access, Links::refused, status);
    if (descriptor < 0 && errno == EPERM)
        errno = ENOSYS; // the answer of a container's system call filter
    return descriptor;
}

int createFile(const char* path, std::uint32_t permissions)
{
    return ::open(path, O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC | O_NOCTTY, static_cast<mode_t>(permissions));
}

int preallocate(int descriptor, std::int64_t offset, std::int64_t length)
{
    return ::fallocate(descriptor, FALLOC_FL_KEEP_SIZE, offset, length);
}

int adviseNoReuse(int descriptor)
{
    const int error = ::posix_fadvise(descriptor, 0, 0, POSIX_FADV_NOREUSE);
    if (error != 0)
        errno = error;
    return error == 0 ? 0 : -1;
}

int syncFolder(const char* path)
{
    const int descriptor = ::open(path, O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (descriptor < 0)
        // A folder that can be written but not read cannot be committed by itself.
        return errno == EACCES ? 0 : -1;
    const int result = ::fsync(descriptor) == 0 || errno == EINVAL ? 0 : -1;
    const int reason = errno;
    ::close(descriptor);
    errno = reason;
    return result;
}

int createFolder(const char* path, std::uint32_t permissions)
{
    return ::mkdir(path, static_cast<mode_t>(permissions));
}

int renameWithoutReplacing(const char* from, const char* to)
{
    if (::renameat2(AT_FDCWD, from, AT_FDCWD, to, RENAME_NOREPLACE) == 0)
        return 0;
    if (errno != EINVAL && errno != ENOSYS)
        return -1;
    // On a file system without that flag, another process can take the name between the check and the rename.
    struct stat found = {};
    if (::lstat(to, &found) == 0)
        errno = EEXIST;
    return errno == ENOENT ? ::rename(from, to) : -1;
}

int exchangeNames(const char* a, const char* b)
{
    return ::renameat2(AT_FDCWD, a, AT_FDCWD, b, RENAME_EXCHANGE);
}

int openFolder(const char* path)
{
    const int descriptor = ::open(path, O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    return descriptor >= 0 ? descriptor : ::open(path, O_PATH | O_DIRECTORY | O_CLOEXEC);
}

int createFileIn(int folder, const char* name, std::uint32_t permissions)
{
    return ::openat(folder, name, O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC | O_NOCTTY,
                    static_cast<mode_t>(permissions));
}

int openFileIn(int folder, const char* name)
{
    return ::openat(folder, name, O_RDWR | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC | O_NOCTTY);
}

bool statusIn(int folder, const char* name, FileStatus* status)
{
    struct stat found = {};
    if (::fstatat(folder, name, &found, AT_SYMLINK_NOFOLLOW) != 0)
        return false;
    *status = fileStatus(found);
    return true;
}

int removeFileIn(int folder, const char* name)
{
    return ::unlinkat(folder, name, 0);
}

int renameIn(int folder, const char* from, const char* to)
{
    return ::renameat(folder, from, folder, to);
}

int renameInWithoutReplacing(int folder, const char* from, const char* to)
{
    if (::renameat2(folder, from, folder, to, RENAME_NOREPLACE) == 0)
        return 0;
    // On a file system without that flag, the file gets a second name and loses the first.
    if (errno == EEXIST || ::linkat(folder, from, folder, to, 0) != 0)
        return -1;
    ::unlinkat(folder, from, 0);
    return 0;
}

int shareContent(int from, int to)
{
    return ::ioctl(to, FICLONE, from);
}

std::int64_t copyRange(int from, int to, std::int64_t offset, std::size_t count)
{
    off_t read = offset, written = offset;
    return ::copy_file_range(from, &read, to, &written, count, 0);
}

bool nextData(int descriptor, std::int64_t offset, std::int64_t* begin, std::int64_t* end)
{
    struct stat status = {};
    if (::fstat(descriptor, &status) != 0)
        return false;
    const off_t data = ::lseek(descriptor, offset, SEEK_DATA);
    if (data < 0 && errno == ENXIO)
        return false;
    *begin = data < 0 ? offset : data; // the file system does not report holes
    const off_t hole = data < 0 ? -1 : ::lseek(descriptor, data, SEEK_HOLE);
    *end = hole < 0 ? status.st_size : std::min(hole, status.st_size);
    return true;
}

int setOwner(int descriptor, std::uint32_t owner, std::uint32_t group)
{
    return ::fchown(descriptor, owner, group);
}

static_assert(sizeof(off_t) == 8, "file offsets are 64-bit");

} // namespace

SystemCalls& systemCalls()
{
    static SystemCalls calls = {
        .openFile = openFile,
        .openFileWithoutLinks = openFileWithoutLinks,
        .createFile = createFile,
        .close = ::close,
        .pread = ::pread,
        .pwrite = ::pwrite,
        .ftruncate = ::ftruncate,
        .fsync = ::fsync,
        .syncFolder = syncFolder,
        .preallocate = preallocate,
        .adviseNoReuse = adviseNoReuse,
        .status = descriptorStatus,
        .pathStatus = pathStatus,
        .linkStatus = linkStatus,
        .createFolder = createFolder,
        .renameWithoutReplacing = renameWithoutReplacing,
        .exchangeNames = exchangeNames,
        .removeFile = ::unlink,
        .removeFolder = ::rmdir,
        .linkFile = ::link,
        .openFolder = openFolder,
        .createFileIn = createFileIn,
        .openFileIn = openFileIn,
        .statusIn = statusIn,
        .removeFileIn = removeFileIn,
        .renameIn = renameIn,
        .renameInWithoutReplacing = renameInWithoutReplacing,
        .shareContent = shareContent,
        .copyRange = copyRange,
        .nextData = nextData,
        .setOwner = setOwner,
    };
    return calls;
}

} // namespace platform
