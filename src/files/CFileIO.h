// CFileIO reads and writes the bytes of one file, or of one memory block, through caches that the caller sizes.
#pragma once

#include "files/CFileRef.h"
#include "platform/core/KTMem.h"
#include "platform/core/Status.h"

#include <cstdint>
#include <memory>

/// Open modes, a bit set; other bits are stored and ignored.
enum : unsigned int {
    kFileIOReadWrite = 0x0001,   // a missing file is created
    kFileIOInteraction = 0x0004, // the user may be asked while an alias is resolved
    kFileIOMemory = 0x8000,      // a memory file: the cache block is its content
};

/// The base names the open file, its links resolved. Operations return status codes (platform/core/Status.h). Owns its
/// descriptor and its write cache, shares its read cache; one thread at a time.
class KT_EXPORT CFileIO : public CFileRef {
public:
    CFileIO() = default;
    /// As Open; an error leaves the object closed (`IsValid()` is false).
    CFileIO(const CFileRef& ref, unsigned int mode);
    CFileIO(const CFileIO&) = delete;
    CFileIO& operator=(const CFileIO&) = delete;
    virtual ~CFileIO();

    /// The state of a new object: caches dropped, nothing flushed.
    void Init();
    std::int32_t Open(const CFileRef& ref, unsigned int mode);
    std::int32_t OpenRead(const CFileRef& ref, unsigned int mode) { return Open(ref, mode & ~kFileIOReadWrite); }
    std::int32_t OpenReadWrite(const CFileRef& ref, unsigned int mode) { return Open(ref, mode | kFileIOReadWrite); }
    /// Flushes and frees the write cache, closes, resets the base. The cache block is kept.
    std::int32_t Close();

    /// At a position, through the read cache; `actual` (may be null) receives the bytes delivered, also on failure.
    std::int32_t Read(void* buffer, long long position, long count, long* actual);
    /// At the mark, which advances on success.
    std::int32_t Read(void* buffer, long count);
    /// At the mark, which advances by what was delivered; `*count` becomes that number.
    std::int32_t Read(void* buffer, long* count);
    /// As many bytes as the file is long, from the mark, into a new block that the caller gives to `free`.
    std::int32_t Read(void** data, long* size);
    /// Moves the mark back; kStatusBeforeStart, and the mark at 0, when that would go below 0.
    std::int32_t UnRead(long count);

    /// At a position: flushes the write cache, empties the read cache, leaves the mark.
    std::int32_t Write(const void* buffer, long long position, long count);
    /// At the mark, through the write cache.
    std::int32_t Write(const void* buffer, long count);
    std::int32_t FlushWCache();
    /// Commits the file to storage; what lies in the write cache is not part of that.
    std::int32_t Flush();

    long long GetEOF() const;
    std::int32_t GetEOF(long long* length) const;
    std::int32_t SetEOF(long long length);
    std::int32_t Allocate(long long length, bool preallocate);
    /// Moves everything from `from` to the end of the file so that it begins at `to`.
    std::int32_t BlockMove(long long from, long long to);
    /// The CRC-32 from the mark on, over as many bytes as the file is long; 0xFFFFFFFF when they are not there.
    std::uint32_t CRC();

    long long GetMark() const { return mMark; }
    void SetMark(long long mark) { mMark = mark; }

    std::int32_t SetCache(long size);
    std::int32_t SetCache(const std::shared_ptr<KTMem>& block);
    void ResetCache();
    std::int32_t SetWCache(int size);
    std::int32_t SetWCache(char* buffer, long size);
    /// Pending bytes are lost.
    void DeAllocWCache();

    bool IsOpen() const { return mDescriptor >= 0 || (IsMemoryFile() && mCache != nullptr); }
    bool IsMemoryFile() const { return (mMode & kFileIOMemory) != 0; }
    bool IsOpenForWriting() const { return IsOpen() && (mMode & kFileIOReadWrite) != 0; }
    unsigned int Mode() const { return mMode; }
    const std::shared_ptr<KTMem>& CacheBlock() const { return mCache; }

private:
    std::int32_t OpenPath(unsigned int mode);
    std::int32_t ReadDirect(void* buffer, long long position, long count, long* actual);
    std::int32_t WriteDirect(const void* buffer, long long position, long count, long long* written);

    std::int32_t mDescriptor = -1;
    long long mCacheOffset = 0;
    long long mCacheLength = 0; // valid bytes; of a memory file, its length
    std::shared_ptr<KTMem> mCache;
    long long mMark = 0; // of bytes in the write cache, the offset at which they belong
    std::unique_ptr<char[]> mWriteCache;
    char* mWriteCacheFill = nullptr;
    long long mWriteCacheCapacity = 0;
    unsigned int mMode = 0;
};
