#include "tool/shared/edits/FileCopy.h"

#include "tool/shared/access/Descriptor.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Progress.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <linux/fs.h>
#include <memory>
#include <string>
#include <sys/ioctl.h>
#include <sys/xattr.h>
#include <unistd.h>
#include <vector>

namespace {

constexpr std::size_t kPiece = std::size_t{8} << 20;

[[noreturn]] void failWithErrno()
{
    throw Failure(systemErrorText(errno));
}

// Through memory, where the kernel cannot copy between the two files itself. Bytes copied, 0 at the end of `from`.
ssize_t copyPieceByHand(int from, off_t offset, int to, std::size_t count)
{
    static const auto buffer = std::make_unique<char[]>(kPiece);
    const ssize_t got = ::pread(from, buffer.get(), std::min(count, kPiece), offset);
    ssize_t put = 0;
    while (put < got) {
        const ssize_t now = ::pwrite(to, buffer.get() + put, static_cast<std::size_t>(got - put), offset + put);
        if (now < 0 && errno != EINTR)
            return -1;
        put += std::max<ssize_t>(now, 0);
    }
    return got;
}

void copyExtent(int from, off_t begin, off_t end, int to, Progress& progress)
{
    bool inKernel = true;
    while (begin < end) {
        const std::size_t count = std::min(static_cast<std::size_t>(end - begin), kPiece);
        off_t read = begin, written = begin;
        const ssize_t copied =
            inKernel ? ::copy_file_range(from, &read, to, &written, count, 0) : copyPieceByHand(from, begin, to, count);
        if (copied > 0) {
            begin += copied;
            progress.advance(copied);
        } else if (copied < 0 && (errno == ENOSPC || errno == EFBIG || errno == EDQUOT)) {
            failWithErrno();
        } else if (inKernel) {
            inKernel = false;
        } else if (copied == 0) {
            throw Failure("became shorter while it was copied");
        } else if (errno != EINTR) {
            failWithErrno();
        }
    }
}

// The attributes that the system keeps for itself are there already, or are not ours to set.
bool isOurs(const char* name)
{
    return std::strncmp(name, "user.", 5) == 0 || std::strncmp(name, "system.posix_acl_", 17) == 0;
}

void copyExtendedAttributes(int from, int to)
{
    std::vector<char> names(XATTR_LIST_MAX), value(XATTR_SIZE_MAX);
    const ssize_t length = ::flistxattr(from, names.data(), names.size());
    if (length < 0 && errno != ENOTSUP)
        failWithErrno();
    for (const char* name = names.data(); name < names.data() + length; name += std::strlen(name) + 1) {
        const ssize_t size = ::fgetxattr(from, name, value.data(), value.size());
        const bool kept = size >= 0 && ::fsetxattr(to, name, value.data(), static_cast<std::size_t>(size), 0) == 0;
        if (!kept && isOurs(name))
            throw Failure(std::string("its extended attribute ") + name + " cannot be kept: " + systemErrorText(errno) +
                          "; --in-place edits the file itself");
    }
}

} // namespace

void copyContent(int from, int to, Progress& progress)
{
    if (::ioctl(to, FICLONE, from) == 0)
        return;
    struct stat status = {};
    if (::fstat(from, &status) != 0 || ::ftruncate(to, status.st_size) != 0)
        failWithErrno();
    off_t position = 0;
    while (position < status.st_size) {
        const off_t data = ::lseek(from, position, SEEK_DATA);
        if (data < 0 && errno == ENXIO) // only a hole is left
            return;
        const off_t begin = data < 0 ? position : data; // a file system without holes
        const off_t hole = data < 0 ? -1 : ::lseek(from, begin, SEEK_HOLE);
        const off_t end = hole < 0 ? status.st_size : std::min(hole, status.st_size);
        progress.advance(begin - position);
        copyExtent(from, begin, end, to, progress);
        position = end;
    }
}

void copyAttributes(int from, const struct stat& status, int to, Times times)
{
    struct stat own = {};
    if (::fstat(to, &own) != 0)
        failWithErrno();
    const bool foreign = own.st_uid != status.st_uid || own.st_gid != status.st_gid;
    if (foreign && ::fchown(to, status.st_uid, status.st_gid) != 0)
        throw Failure("its owner cannot be kept: " + systemErrorText(errno) + "; --in-place edits the file itself");
    if (::fchmod(to, status.st_mode & 07777) != 0) // behind the owner, whose change takes set-id bits away
        failWithErrno();
    copyExtendedAttributes(from, to);
    const timespec stamps[2] = {status.st_atim, times == Times::kept ? status.st_mtim : timespec{0, UTIME_NOW}};
    if (::futimens(to, stamps) != 0)
        failWithErrno();
}

void synchronize(int descriptor)
{
    if (::fsync(descriptor) != 0)
        failWithErrno();
}

void synchronizeFolderOf(const char* path)
{
    std::filesystem::path folder = std::filesystem::path(path).parent_path();
    if (folder.empty())
        folder = ".";
    const Descriptor opened(::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    // A folder that may be written but not read, and file systems that cannot commit folders, keep their own promises.
    if (opened && ::fsync(opened.get()) != 0 && errno != EINVAL)
        failWithErrno();
}
