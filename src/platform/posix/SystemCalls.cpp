#include "platform/SystemCalls.h"

#include <cerrno>
#include <cstdio>
#include <cstring>

#include <fcntl.h>
#include <linux/openat2.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace platform {

namespace {

// O_NONBLOCK means nothing to a regular file; it keeps the open of anything else from waiting.
int openFlags(OpenFor access)
{
    return (access == OpenFor::reading ? O_RDONLY : O_RDWR) | O_CLOEXEC | O_NOCTTY | O_NONBLOCK;
}

FileStatus fileStatus(const struct stat& from)
{
    FileStatus status;
    status.device = from.st_dev;
    status.inode = from.st_ino;
    status.size = from.st_size;
    status.kind = S_ISREG(from.st_mode)   ? FileKind::file
                  : S_ISDIR(from.st_mode) ? FileKind::directory
                  : S_ISLNK(from.st_mode) ? FileKind::symbolicLink
                                          : FileKind::other;
    status.permissions = from.st_mode & 07777;
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

/// Passes on the descriptor of a regular file with its status; closes any other.
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

int openFile(const char* path, OpenFor access, FileStatus* status)
{
    FileStatus found;
    if (!pathStatus(path, &found) || !isRegular(found))
        return -1;
    return regularFileOnly(::open(path, openFlags(access)), status);
}

/// Whether merely opening what lies at the path could do something: writing to a FIFO or device, or reading where
/// devices live. A status of its own would cost an open for reading a quarter of its time.
bool needsLookBeforeOpening(const char* path, OpenFor access)
{
    return access != OpenFor::reading || path[0] != '/' || std::strstr(path, "/dev/") != nullptr;
}

int openFileWithoutLinks(const char* path, OpenFor access, FileStatus* status)
{
    if (needsLookBeforeOpening(path, access)) {
        FileStatus found;
        if (!pathStatus(path, &found) || !isRegular(found))
            return -1;
    }
    open_how how = {};
    how.flags = static_cast<unsigned>(openFlags(access));
    how.resolve = RESOLVE_NO_SYMLINKS;
    const int descriptor = static_cast<int>(syscall(SYS_openat2, AT_FDCWD, path, &how, sizeof how));
    if (descriptor < 0 && errno == EPERM)
        errno = ENOSYS; // what a container's filter of system calls answers
    return regularFileOnly(descriptor, status);
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
        return errno == EACCES ? 0 : -1; // a folder that may be written but not read cannot be committed by itself
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
    // A file system without that flag: a look ahead leaves a moment in which another process can take the name.
    struct stat found = {};
    if (::lstat(to, &found) == 0)
        errno = EEXIST;
    return errno == ENOENT ? ::rename(from, to) : -1;
}

int exchangeNames(const char* a, const char* b)
{
    return ::renameat2(AT_FDCWD, a, AT_FDCWD, b, RENAME_EXCHANGE);
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
    };
    return calls;
}

} // namespace platform
