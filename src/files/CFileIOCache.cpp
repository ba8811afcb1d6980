// The two caches of CFileIO: their sizes, their content, when they are emptied.
#include "files/CFileIO.h"

#include <algorithm>
#include <cstring>

/// Copies as much of the request as the cached range holds from its position, and returns the number of bytes.
long CFileIO::CopyFromCache(void* buffer, long long position, long count) const
{
    // Another owner of the block may have shrunk it.
    const long long held = std::min(cacheLength_, static_cast<long long>(cache_->size()));
    const long long skip = position - cacheOffset_;
    if (position < cacheOffset_ || skip >= held)
        return 0;
    const auto copied = static_cast<std::size_t>(std::min<long long>(count, held - skip));
    std::memcpy(buffer, cache_->data() + skip, copied);
    return static_cast<long>(copied);
}

/// Fills the cache from a position. False, with the cache empty, if fewer than `needed` bytes arrive; a block that
/// reaches beyond the end of the file holds what there is. False, with the cache unchanged, if the block cannot hold
/// `needed` bytes.
bool CFileIO::Refill(long long position, long needed)
{
    const auto size = static_cast<long>(cache_->size());
    if (needed > size)
        return false;
    cacheLength_ = 0;
    long filled = 0;
    if (ReadDirect(cache_->data(), position, size, needed, &filled) != kStatusOK)
        return false;
    cacheOffset_ = position;
    cacheLength_ = filled;
    return true;
}

std::int32_t CFileIO::SetCache(long size)
{
    if (size < 0)
        return kStatusParameterError;
    return SetCache(std::make_shared<KTMem>(static_cast<std::size_t>(size)));
}

std::int32_t CFileIO::SetCache(const std::shared_ptr<KTMem>& block)
{
    cache_ = block;
    cacheOffset_ = 0;
    cacheLength_ = IsMemoryFile() && block ? static_cast<long long>(block->size()) : 0;
    return kStatusOK;
}

void CFileIO::ResetCache()
{
    SetCache(std::shared_ptr<KTMem>());
}

std::int32_t CFileIO::SetWCache(int size)
{
    if (size < 0)
        return kStatusParameterError;
    const std::int32_t status = FlushWCache();
    if (status != kStatusOK)
        return status;
    AdoptWriteCache(size > 0 ? std::unique_ptr<char[]>(new char[static_cast<std::size_t>(size)]) : nullptr, size);
    return kStatusOK;
}

std::int32_t CFileIO::SetWCache(char* buffer, long size)
{
    if (size < 0)
        return kStatusParameterError;
    const std::int32_t status = FlushWCache();
    if (status != kStatusOK)
        return status;
    AdoptWriteCache(std::unique_ptr<char[]>(buffer), buffer != nullptr ? size : 0);
    return kStatusOK;
}

void CFileIO::AdoptWriteCache(std::unique_ptr<char[]> buffer, long long size)
{
    writeCache_ = std::move(buffer);
    writeCacheFill_ = writeCache_.get();
    writeCacheCapacity_ = size;
}

void CFileIO::DeAllocWCache()
{
    AdoptWriteCache(nullptr, 0);
}

std::int32_t CFileIO::FlushWCache()
{
    const auto pending = static_cast<long>(Pending());
    if (pending == 0)
        return kStatusOK;
    const std::int32_t status = WriteThrough(writeCache_.get(), mark_, pending);
    if (status != kStatusOK)
        return status;
    mark_ += pending;
    writeCacheFill_ = writeCache_.get();
    return kStatusOK;
}
