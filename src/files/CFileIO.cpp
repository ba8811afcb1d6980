// How CFileIO reads, writes and changes its length.
#include "files/CFileIO.h"

#include "platform/Log.h"
#include "platform/SystemCalls.h"
#include "platform/core/CRC32.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <system_error>

namespace {

constexpr long kLargestPiece = std::numeric_limits<std::int32_t>::max(); // bytes per system call

} // namespace

std::int32_t CFileIO::Read(void* buffer, long long position, long count, long* actual)
{
    long ignored = 0;
    long& delivered = actual != nullptr ? *actual : ignored;
    delivered = 0;
    if (count == 0)
        return kStatusOK;
    if (buffer == nullptr || count < 0)
        return kStatusParameterError;
    if (!cache_ || position < 0)
        return ReadDirect(buffer, position, count, count, &delivered);

    delivered = CopyFromCache(buffer, position, count);
    if (delivered == count)
        return kStatusOK;
    if (IsMemoryFile())
        return kStatusEndOfFile;

    std::byte* to = static_cast<std::byte*>(buffer) + delivered;
    const long rest = count - delivered;
    position += delivered;
    if (Refill(position, rest)) {
        delivered += CopyFromCache(to, position, rest);
        return kStatusOK;
    }
    long direct = 0;
    const std::int32_t status = ReadDirect(to, position, rest, rest, &direct);
    delivered += direct;
    return status;
}

/// Reads until `enough` of `count` bytes have arrived. Reading on to a known end of the file would cost a call that
/// returns nothing.
std::int32_t CFileIO::ReadDirect(void* buffer, long long position, long count, long enough, long* actual) const
{
    *actual = 0;
    while (*actual < enough) {
        const long piece = std::min(count - *actual, kLargestPiece);
        const std::int64_t got = platform::systemCalls().pread(descriptor_, static_cast<std::byte*>(buffer) + *actual,
                                                               static_cast<std::size_t>(piece), position + *actual);
        if (got < 0) {
            const int error = errno;
            if (error == EINTR)
                continue;
            platform::logLine("Encountered read failure " + std::to_string(error) + " " +
                              std::generic_category().message(error));
            return PosixErrorToOSErr(error);
        }
        if (got == 0)
            return kStatusEndOfFile;
        *actual += static_cast<long>(got);
    }
    return kStatusOK;
}

std::int32_t CFileIO::Read(void* buffer, long count)
{
    const std::int32_t status = Read(buffer, mark_, count, nullptr);
    if (status == kStatusOK)
        mark_ += count;
    return status;
}

std::int32_t CFileIO::Read(void* buffer, long* count)
{
    if (count == nullptr)
        return kStatusParameterError;
    const std::int32_t status = Read(buffer, mark_, *count, count);
    mark_ += *count;
    return status;
}

std::int32_t CFileIO::Read(void** data, long* size)
{
    if (data == nullptr || size == nullptr)
        return kStatusParameterError;
    *data = nullptr;
    *size = 0;
    long long length = 0;
    std::int32_t status = GetEOF(&length);
    if (status != kStatusOK || length == 0)
        return status;
    void* block = std::malloc(static_cast<std::size_t>(length));
    if (block == nullptr)
        return kStatusOutOfMemory;
    status = Read(block, static_cast<long>(length));
    if (status != kStatusOK) {
        std::free(block);
        return status;
    }
    *data = block;
    *size = static_cast<long>(length);
    return kStatusOK;
}

std::int32_t CFileIO::UnRead(long count)
{
    long long mark = 0;
    if (__builtin_sub_overflow(mark_, count, &mark))
        return kStatusParameterError;
    mark_ = std::max(mark, 0LL);
    return mark < 0 ? kStatusBeforeStart : kStatusOK;
}

std::int32_t CFileIO::Write(const void* buffer, long long position, long count)
{
    if (count < 0 || (buffer == nullptr && count > 0))
        return kStatusParameterError;
    const std::int32_t status = FlushWCache();
    return status != kStatusOK ? status : WriteThrough(buffer, position, count);
}

std::int32_t CFileIO::Write(const void* buffer, long count)
{
    if (count < 0 || (buffer == nullptr && count > 0))
        return kStatusParameterError;
    if (count <= writeCacheCapacity_ - Pending()) {
        std::copy_n(static_cast<const char*>(buffer), count, writeCacheFill_);
        writeCacheFill_ += count;
        return kStatusOK;
    }
    std::int32_t status = FlushWCache();
    if (status == kStatusOK)
        status = WriteThrough(buffer, mark_, count);
    if (status == kStatusOK)
        mark_ += count;
    return status;
}

/// Writes to the file or memory block itself, past the write cache.
std::int32_t CFileIO::WriteThrough(const void* buffer, long long position, long count)
{
    if (IsMemoryFile())
        return WriteToMemory(buffer, position, count);
    cacheLength_ = 0;
    HintAtNoReuse(std::min(position, kWorthAHint) + count);
    for (long written = 0; written < count;) {
        const long piece = std::min(count - written, kLargestPiece);
        const std::int64_t put =
            platform::systemCalls().pwrite(descriptor_, static_cast<const std::byte*>(buffer) + written,
                                           static_cast<std::size_t>(piece), position + written);
        if (put == 0)
            return kStatusDiskFull;
        if (put < 0 && errno != EINTR)
            return PosixErrorToOSErr();
        written += static_cast<long>(std::max<std::int64_t>(put, 0));
    }
    return kStatusOK;
}

/// Tells the system once that the bytes of a file this long will not be needed again soon.
void CFileIO::HintAtNoReuse(long long length)
{
    if (isHinted_ || length < kWorthAHint)
        return;
    isHinted_ = true;
    platform::systemCalls().adviseNoReuse(descriptor_);
}

/// Kept: a memory file grows through SetEOF, which moves a mark beyond the new end there; even an empty write beyond
/// the end makes the file that long.
std::int32_t CFileIO::WriteToMemory(const void* buffer, long long position, long count)
{
    if (position < 0)
        return kStatusParameterError;
    long long end = 0;
    if (__builtin_add_overflow(position, count, &end))
        return kStatusFileTooBig;
    if (!cache_ || end > static_cast<long long>(cache_->size())) {
        const std::int32_t status = SetEOF(end);
        if (status != kStatusOK)
            return status;
    }
    if (count > 0)
        std::memcpy(cache_->data() + position, buffer, static_cast<std::size_t>(count));
    return kStatusOK;
}

std::int32_t CFileIO::Flush()
{
    if (descriptor_ >= 0 && platform::systemCalls().fsync(descriptor_) != 0)
        return PosixErrorToOSErr();
    return kStatusOK;
}

long long CFileIO::GetEOF() const
{
    long long length = 0;
    GetEOF(&length);
    return length;
}

std::int32_t CFileIO::GetEOF(long long* length) const
{
    if (length == nullptr)
        return kStatusParameterError;
    *length = 0;
    if (IsMemoryFile()) {
        *length = cache_ ? static_cast<long long>(cache_->size()) : 0;
        return kStatusOK;
    }
    platform::FileStatus status;
    if (!platform::systemCalls().status(descriptor_, &status))
        return PosixErrorToOSErr();
    *length = status.size;
    return kStatusOK;
}

std::int32_t CFileIO::GetStamp(FileStamp& stamp) const
{
    stamp = {};
    if (IsMemoryFile())
        return GetEOF(&stamp.length);
    platform::FileStatus status;
    if (!platform::systemCalls().status(descriptor_, &status))
        return PosixErrorToOSErr();
    stamp = {status.size, status.changed};
    return kStatusOK;
}

std::int32_t CFileIO::SetEOF(long long length)
{
    if (IsMemoryFile()) {
        const std::int32_t status = ResizeMemory(length);
        if (status != kStatusOK)
            return status;
    } else {
        cacheLength_ = 0; // the cache may hold bytes that are cut off
        HintAtNoReuse(length);
        while (platform::systemCalls().ftruncate(descriptor_, length) != 0) {
            if (errno != EINTR)
                return PosixErrorToOSErr();
        }
    }
    mark_ = std::min(mark_, length);
    return kStatusOK;
}

std::int32_t CFileIO::ResizeMemory(long long length)
{
    if (length < 0)
        return kStatusParameterError;
    if (!cache_)
        cache_ = std::make_shared<KTMem>();
    if (!cache_->reallocate(static_cast<std::size_t>(length)))
        return kStatusOutOfMemory;
    cacheLength_ = length;
    return kStatusOK;
}

std::int32_t CFileIO::Allocate(long long length, bool preallocate)
{
    long long end = 0;
    const bool isReserved = preallocate && !IsMemoryFile() && GetEOF(&end) == kStatusOK &&
                            platform::systemCalls().preallocate(descriptor_, end, length) == 0;
    const std::int32_t status = SetEOF(length);
    // Preallocating reserves `length` bytes beyond the former end; setting the length once more gives back what lies
    // beyond it.
    return status == kStatusOK && isReserved && end > 0 ? SetEOF(length) : status;
}

std::uint32_t CFileIO::CRC()
{
    constexpr long pieceSize = 10240;
    constexpr std::uint32_t noCRC = 0xFFFFFFFF;
    std::array<char, pieceSize> buffer;
    std::uint32_t crc = 0;
    for (long long left = GetEOF(); left > 0;) {
        const auto piece = static_cast<long>(std::min<long long>(pieceSize, left));
        // Kept: reads from the mark, not from the start; the caller sets the mark.
        if (Read(buffer.data(), piece) != kStatusOK)
            return noCRC;
        crc = ECCRC32(crc, buffer.data(), static_cast<std::size_t>(piece));
        left -= piece;
    }
    return crc;
}
