// CFileIO: moving a part of a file within it.
#include "files/CFileIO.h"

#include "platform/SystemCalls.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <memory>
#include <new>

namespace {

constexpr long kMovePiece = 1048576;

} // namespace

std::int32_t CFileIO::BlockMove(long long from, long long to)
{
    if (!IsOpenForWriting())
        return kStatusNotOpen;
    if (from == to)
        return kStatusOK;
    long long length = 0;
    std::int32_t status = FlushWCache();
    if (status == kStatusOK)
        status = GetEOF(&length);
    if (status != kStatusOK)
        return status;
    if (from < 0 || to < 0 || from > length)
        return kStatusParameterError;
    return to > from ? MoveUp(from, to - from, length) : MoveDown(from, from - to, length);
}

/// Moves backwards from the end, so that no byte is overwritten before it is read.
std::int32_t CFileIO::MoveUp(long long from, long long distance, long long length)
{
    long long newLength = 0;
    if (__builtin_add_overflow(length, distance, &newLength))
        return kStatusFileTooBig;
    const std::unique_ptr<char[]> buffer(new (std::nothrow) char[kMovePiece]);
    if (!buffer)
        return kStatusOutOfMemory;
    std::int32_t status = ReserveBehind(length, distance);
    if (status == kStatusOK)
        status = SetEOF(newLength);
    for (long long end = length; end > from && status == kStatusOK;) {
        const auto piece = static_cast<long>(std::min<long long>(kMovePiece, end - from));
        end -= piece;
        status = ReadPiece(buffer.get(), end, piece);
        if (status == kStatusOK)
            status = WriteThrough(buffer.get(), end + distance, piece);
    }
    return status;
}

std::int32_t CFileIO::MoveDown(long long from, long long distance, long long length)
{
    const std::unique_ptr<char[]> buffer(new (std::nothrow) char[kMovePiece]);
    if (!buffer)
        return kStatusOutOfMemory;
    std::int32_t status = kStatusOK;
    for (long long position = from; position < length && status == kStatusOK;) {
        const auto piece = static_cast<long>(std::min<long long>(kMovePiece, length - position));
        status = ReadPiece(buffer.get(), position, piece);
        if (status == kStatusOK)
            status = WriteThrough(buffer.get(), position - distance, piece);
        position += piece;
    }
    return status == kStatusOK ? SetEOF(length - distance) : status;
}

/// Reserves the space first: a disk that fills up in the middle of a move would leave the file torn.
std::int32_t CFileIO::ReserveBehind(long long end, long long size)
{
    if (IsMemoryFile() || platform::systemCalls().preallocate(descriptor_, end, size) == 0)
        return kStatusOK;
    // Not every file system can preallocate.
    return errno == ENOSPC || errno == EDQUOT ? PosixErrorToOSErr() : kStatusOK;
}

/// Reads past the read cache, because moved bytes are read only once.
std::int32_t CFileIO::ReadPiece(void* buffer, long long position, long count)
{
    if (IsMemoryFile())
        return Read(buffer, position, count, nullptr);
    long ignored = 0;
    return ReadDirect(buffer, position, count, count, &ignored);
}
