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

/// The state of a file: as long as it stays equal the bytes are the same, unless they changed again within one tick of
/// the system's clock.
struct FileStamp {
    long long length = 0;
    long long changed = 0; // when content or attributes changed last, in nanoseconds since 1970

    bool operator==(const FileStamp&) const = default;
};

/// The base names the open file, its links resolved. Operations return status codes (platform/core/Status.h); a system
/// error comes back as PosixErrorToOSErr maps it. Owns its descriptor and its write cache, shares its read cache; one
/// thread at a time.
///
/// Bytes in the write cache belong at the mark and are not in the file: call FlushWCache before moving the mark or
/// reading what was written.
class KT_EXPORT CFileIO : public CFileRef {
public:
    CFileIO() = default;
    /// As Open; an error leaves the object closed (`IsValid()` is false).
    CFileIO(const CFileRef& ref, unsigned int mode);
    CFileIO(const CFileIO&) = delete;
    CFileIO& operator=(const CFileIO&) = delete;
    virtual ~CFileIO();

    // What replaces the file is virtual: derived classes know things of the one that is open.

    /// The state of a new object: closed, caches dropped, nothing flushed.
    virtual void Init();
    /// Opens what `ref` names, an alias file or symbolic link resolved. kStatusFileNotFound for a missing file without
    /// kFileIOReadWrite (with it, the file is created with permissions 0644), kStatusParameterError for a folder,
    /// kStatusNotAFile for a FIFO, socket or device. A memory file ignores `ref` and takes the cache block for its
    /// content. A failed open leaves the object closed.
    virtual std::int32_t Open(const CFileRef& ref, unsigned int mode);
    std::int32_t OpenRead(const CFileRef& ref, unsigned int mode) { return Open(ref, mode & ~kFileIOReadWrite); }
    std::int32_t OpenReadWrite(const CFileRef& ref, unsigned int mode) { return Open(ref, mode | kFileIOReadWrite); }
    /// Flushes and frees the write cache, closes, resets the base. The cache block is kept. The object is closed
    /// whatever is returned: the failure to flush, else that to close.
    virtual std::int32_t Close();

    /// At a position, through the read cache; `actual` (may be null) receives the bytes delivered, also on failure.
    /// kStatusEndOfFile when the file ends before `count` bytes.
    std::int32_t Read(void* buffer, long long position, long count, long* actual);
    /// At the mark, which advances on success.
    std::int32_t Read(void* buffer, long count);
    /// At the mark, which advances by what was delivered; `*count` becomes that number.
    std::int32_t Read(void* buffer, long* count);
    /// As many bytes as the file is long, from the mark, into a new block that the caller gives to `free`.
    std::int32_t Read(void** data, long* size);
    /// Moves the mark back; kStatusBeforeStart, and the mark at 0, when that would go below 0.
    std::int32_t UnRead(long count);

    /// At a position: flushes the write cache first, empties the read cache. kStatusDiskFull when nothing more could be
    /// written.
    std::int32_t Write(const void* buffer, long long position, long count);
    /// At the mark: into the write cache when it has room, else straight to the file, and the mark advances.
    std::int32_t Write(const void* buffer, long count);
    /// Writes the pending bytes at the mark, which advances; they stay pending when that fails.
    std::int32_t FlushWCache();
    /// Commits the file to storage; what lies in the write cache is not part of that.
    std::int32_t Flush();

    /// The length in bytes, asked of the system each time; 0 on error. Bytes in the write cache do not count.
    long long GetEOF() const;
    std::int32_t GetEOF(long long* length) const;
    /// The length that Open met, which costs nothing; a file that others write may have another by now.
    long long LengthAtOpen() const { return stampAtOpen_.length; }
    const FileStamp& StampAtOpen() const { return stampAtOpen_; }
    /// The state now, by one call of the system; of a memory file its length.
    std::int32_t GetStamp(FileStamp& stamp) const;
    /// Cuts the file or extends it with zeros; a mark beyond `length` moves there.
    std::int32_t SetEOF(long long length);
    /// SetEOF, with `preallocate` after asking for `length` bytes of space behind the end of the file, which may fail.
    /// What is left of that beyond `length` is given back.
    std::int32_t Allocate(long long length, bool preallocate);
    /// Moves everything from `from` (at most the length) to the end of the file so that it begins at `to`; the length
    /// changes by the distance. kStatusNotOpen without write access.
    std::int32_t BlockMove(long long from, long long to);
    /// The CRC-32 from the mark on, over as many bytes as the file is long; 0xFFFFFFFF when they are not there.
    std::uint32_t CRC();

    long long GetMark() const { return mark_; }
    void SetMark(long long mark) { mark_ = mark; }

    /// The read cache, empty and of `size` bytes; in memory mode the content: `size` zeros.
    std::int32_t SetCache(long size);
    /// The same with the caller's block, which stays shared; in memory mode it is the content.
    std::int32_t SetCache(const std::shared_ptr<KTMem>& block);
    void ResetCache();
    /// Flushes first; when that fails its status is returned and nothing changes. 0 for no write cache.
    std::int32_t SetWCache(int size);
    /// The same with an array from `new char[]`, owned from then on, unless an error is returned.
    std::int32_t SetWCache(char* buffer, long size);
    /// Pending bytes are lost.
    void DeAllocWCache();

    bool IsOpen() const { return descriptor_ >= 0 || (IsMemoryFile() && cache_ != nullptr); }
    bool IsMemoryFile() const { return (mode_ & kFileIOMemory) != 0; }
    bool IsOpenForWriting() const { return IsOpen() && (mode_ & kFileIOReadWrite) != 0; }
    unsigned int Mode() const { return mode_; }
    const std::shared_ptr<KTMem>& CacheBlock() const { return cache_; }

private:
    std::int32_t OpenFile(const CFileRef& ref, unsigned int mode);
    std::int32_t OpenStepByStep(const CFileRef& ref, unsigned int mode);
    void Adopt(int descriptor, const FileStamp& stamp, unsigned int mode);
    void HintAtNoReuse(long long length);
    std::int32_t CloseDescriptor();
    void ForgetPosition();

    long CopyFromCache(void* buffer, long long position, long count) const;
    bool Refill(long long position, long needed);
    std::int32_t ReadDirect(void* buffer, long long position, long count, long enough, long* actual) const;
    std::int32_t WriteThrough(const void* buffer, long long position, long count);
    std::int32_t WriteToMemory(const void* buffer, long long position, long count);
    std::int32_t ResizeMemory(long long length);
    std::int32_t MoveUp(long long from, long long distance, long long length);
    std::int32_t MoveDown(long long from, long long distance, long long length);
    std::int32_t ReserveBehind(long long end, long long size);
    std::int32_t ReadPiece(void* buffer, long long position, long count);
    void AdoptWriteCache(std::unique_ptr<char[]> buffer, long long size);
    long long Pending() const { return writeCacheFill_ - writeCache_.get(); }

    static constexpr long long kWorthAHint = 1 << 20; // what is smaller crowds nothing out of the system's cache

    std::int32_t descriptor_ = -1;
    long long cacheOffset_ = 0;
    long long cacheLength_ = 0; // valid bytes; of a memory file, its length
    std::shared_ptr<KTMem> cache_;
    long long mark_ = 0; // of bytes in the write cache, the offset at which they belong
    std::unique_ptr<char[]> writeCache_;
    char* writeCacheFill_ = nullptr;
    long long writeCacheCapacity_ = 0;
    unsigned int mode_ = 0;
    FileStamp stampAtOpen_;
    bool isHinted_ = false; // of the open file
};
