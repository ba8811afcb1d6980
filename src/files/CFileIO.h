// CFileIO reads and writes the bytes of one file, or of one memory block, through caches that the caller sizes.
#pragma once

#include "files/CFileRef.h"
#include "platform/core/KTMem.h"
#include "platform/core/Status.h"

#include <cstdint>
#include <memory>

/// Open modes, a bit set. Other bits are stored and ignored.
enum : unsigned int {
    kFileIOReadWrite = 0x0001,   // a missing file is created
    kFileIOInteraction = 0x0004, // the user may be asked while an alias is resolved
    kFileIOMemory = 0x8000,      // a memory file: the cache block is its content
};

/// The state of a file. While it stays equal the bytes are the same, unless they changed again within one tick of the
/// system's clock.
struct FileStamp {
    long long length = 0;  // in bytes
    long long changed = 0; // when content or attributes last changed, in nanoseconds since 1970

    bool operator==(const FileStamp&) const = default;
};

/// One open file. The base names it, links resolved. Operations return status codes (platform/core/Status.h), system
/// errors as PosixErrorToOSErr maps them. Owns its descriptor and its write cache, shares its read cache; one thread
/// at a time.
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

    /// Resets to the state of a new object: closed, caches dropped, nothing flushed.
    virtual void Init();
    /// Opens what `ref` names, an alias file or symbolic link resolved. kStatusFileNotFound for a missing file
    /// without kFileIOReadWrite (with it, the file is created with permissions 0644), kStatusParameterError for a
    /// folder, kStatusNotAFile for a FIFO, socket or device. A memory file ignores `ref`; the cache block is its
    /// content. A failed open leaves the object closed.
    virtual std::int32_t Open(const CFileRef& ref, unsigned int mode);
    /// Open without kFileIOReadWrite.
    std::int32_t OpenRead(const CFileRef& ref, unsigned int mode) { return Open(ref, mode & ~kFileIOReadWrite); }
    /// Open with kFileIOReadWrite.
    std::int32_t OpenReadWrite(const CFileRef& ref, unsigned int mode) { return Open(ref, mode | kFileIOReadWrite); }
    /// Flushes and frees the write cache, closes, resets the base, and keeps the cache block. The object is closed
    /// whatever the result: the status of a failed flush, else of closing.
    virtual std::int32_t Close();

    /// Reads at a position, through the read cache. `actual` (may be null) gets the number of bytes, also on failure.
    /// kStatusEndOfFile when the file ends before `count` bytes.
    std::int32_t Read(void* buffer, long long position, long count, long* actual);
    /// Reads at the mark, which advances on success.
    std::int32_t Read(void* buffer, long count);
    /// Reads at the mark, which advances by what was delivered; `*count` becomes that number.
    std::int32_t Read(void* buffer, long* count);
    /// Reads as many bytes as the file is long, from the mark, into a new block that the caller frees with `free`.
    std::int32_t Read(void** data, long* size);
    /// Moves the mark back. kStatusBeforeStart, and the mark at 0, when that goes below 0.
    std::int32_t UnRead(long count);

    /// Writes at a position: flushes the write cache first, empties the read cache. kStatusDiskFull when the system
    /// takes no more bytes.
    std::int32_t Write(const void* buffer, long long position, long count);
    /// Writes at the mark, which advances: into the write cache when it has room, else straight to the file.
    std::int32_t Write(const void* buffer, long count);
    /// Writes the pending bytes at the mark, which advances; on failure they stay pending.
    std::int32_t FlushWCache();
    /// Commits the file to storage, without the bytes in the write cache.
    std::int32_t Flush();

    /// The length in bytes, read from the system each time; 0 on error. Bytes in the write cache do not count.
    long long GetEOF() const;
    /// The same, with the status of reading it.
    std::int32_t GetEOF(long long* length) const;
    /// The length in bytes when the file was opened, at no cost; others may have changed it since.
    long long LengthAtOpen() const { return stampAtOpen_.length; }
    /// The state of the file when it was opened.
    const FileStamp& StampAtOpen() const { return stampAtOpen_; }
    /// The state now, by one call of the system; for a memory file only the length means anything.
    std::int32_t GetStamp(FileStamp& stamp) const;
    /// Cuts the file or extends it with zeros; a mark beyond `length` moves to it.
    std::int32_t SetEOF(long long length);
    /// SetEOF; with `preallocate` first asks for `length` bytes of space past the end of the file, which may fail
    /// without an error. Space beyond `length` is given back.
    std::int32_t Allocate(long long length, bool preallocate);
    /// Moves everything from `from` (at most the length) to the end of the file so that it begins at `to`; the length
    /// changes by the distance. kStatusNotOpen without write access.
    std::int32_t BlockMove(long long from, long long to);
    /// The CRC-32 from the mark on, over as many bytes as the file is long; 0xFFFFFFFF when fewer are there.
    std::uint32_t CRC();

    /// The offset of the next read or write without a position.
    long long GetMark() const { return mark_; }
    /// Moves the mark; any value is taken.
    void SetMark(long long mark) { mark_ = mark; }

    /// Makes an empty read cache of `size` bytes; in memory mode, a content of `size` zeros.
    std::int32_t SetCache(long size);
    /// Takes the caller's block, still shared, as read cache; in memory mode as content.
    std::int32_t SetCache(const std::shared_ptr<KTMem>& block);
    /// Empties the read cache.
    void ResetCache();
    /// Flushes, then makes a write cache of `size` bytes, none for 0. When flushing fails its status is returned and
    /// nothing changes.
    std::int32_t SetWCache(int size);
    /// The same with an array from `new char[]`, which the file owns from then on unless an error is returned.
    std::int32_t SetWCache(char* buffer, long size);
    /// Frees the write cache. Pending bytes are lost.
    void DeAllocWCache();

    /// Whether there is an open file, or a content in memory mode.
    bool IsOpen() const { return descriptor_ >= 0 || (IsMemoryFile() && cache_ != nullptr); }
    /// Whether the file was opened with kFileIOMemory.
    bool IsMemoryFile() const { return (mode_ & kFileIOMemory) != 0; }
    /// Whether it was opened with kFileIOReadWrite.
    bool IsOpenForWriting() const { return IsOpen() && (mode_ & kFileIOReadWrite) != 0; }
    /// The open modes, as given.
    unsigned int Mode() const { return mode_; }
    /// The block of the read cache, or the content in memory mode; null for none.
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
