#include "tool/shared/indexing/SparseFile.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace {

/// Whether much of the file is not on the disk.
bool hasHoles(const std::string& path, std::int64_t size)
{
    constexpr std::int64_t kBlock = 512, kWorthIt = 1 << 26; // what is smaller is read quickly
    struct stat status = {};
    return size > kWorthIt && ::stat(path.c_str(), &status) == 0 && status.st_blocks < status.st_size / kBlock / 2;
}

} // namespace

SparseFile::SparseFile(const std::string& path, std::int64_t size)
    : file_(hasHoles(path, size) ? ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY) : -1)
{
}

std::int64_t SparseFile::endOfHole(std::int64_t offset)
{
    if (!file_)
        return offset;
    const off_t data = ::lseek(file_.get(), offset, SEEK_DATA);
    return data < 0 ? ::lseek(file_.get(), 0, SEEK_END) : data; // an error: no data behind
}
