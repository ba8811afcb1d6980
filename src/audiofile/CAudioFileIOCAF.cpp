// CAudioFileIO: the "uuid" user-data items in which a CAF file carries the suite's chunks.
#include "audiofile/CAudioFileIO.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <memory>
#include <new>

namespace {

constexpr std::size_t kUUIDSize = 16;
using UUIDBytes = std::array<unsigned char, kUUIDSize>;

/// Calls `visit(UUIDBytes& uuid, void* data, unsigned int size, std::uint32_t index)` for each item until it returns
/// false. Skips items that cannot be read or are shorter than a UUID.
template <class Visit>
void forEachItem(platform::AudioFile& file, Visit&& visit)
{
    std::uint32_t count = 0;
    if (file.countUserData(kUuid, count) != kStatusOK)
        return;
    for (std::uint32_t index = 0; index < count; ++index) {
        std::uint32_t size = 0;
        if (file.userDataSize(kUuid, index, size) != kStatusOK || size < kUUIDSize)
            continue;
        const std::unique_ptr<unsigned char[]> item(new (std::nothrow) unsigned char[size]);
        if (!item || file.userData(kUuid, index, size, item.get()) != kStatusOK || size < kUUIDSize)
            continue;
        UUIDBytes uuid;
        std::copy_n(item.get(), uuid.size(), uuid.begin());
        if (!visit(uuid, item.get(), size, index))
            return;
    }
}

bool matches(const unsigned char* uuid, const unsigned char* other)
{
    return uuid != nullptr && std::memcmp(uuid, other, kUUIDSize) == 0;
}

} // namespace

std::int32_t CAudioFileIO::PerformAudioFileOperations(const CFileRef& ref,
                                                      const std::function<void(platform::AudioFile&)>& block)
{
    if (!ref.URL())
        return kStatusBadReference;
    std::int32_t status = kStatusOK;
    const auto file = platform::AudioFile::open(*ref.URL(), platform::AudioFile::Permission::readWrite, 0, &status);
    if (file && block)
        block(*file);
    return status;
}

void CAudioFileIO::ForAllUUIDChunksPerformBlock(platform::AudioFile& file, const UUIDChunkBlock& block)
{
    forEachItem(file, [&](UUIDBytes& uuid, void* data, unsigned int size, std::uint32_t) {
        bool stop = !block;
        if (block)
            block(uuid.data(), data, size, 0, &stop); // Kept: the index is always 0
        return !stop;
    });
}

std::int32_t CAudioFileIO::FindCAFChunkInUUIDChunk(platform::AudioFile& file, const unsigned char* uuid,
                                                   unsigned int* size, void* /*reserved*/)
{
    std::int32_t result = -1;
    if (size != nullptr)
        *size = 0;
    ForAllUUIDChunksPerformBlock(
        file, [&](const unsigned char* itemUUID, void*, unsigned int itemSize, int index, bool* stop) {
            if (!matches(uuid, itemUUID))
                return;
            if (size != nullptr)
                *size = itemSize;
            result = index;
            *stop = true;
        });
    return result;
}

std::int32_t CAudioFileIO::RemoveCAFChunkFromUUIDChunk(platform::AudioFile& file, const unsigned char* uuid)
{
    // Kept: the item that moves into the place of a removed one is not examined, so of two adjacent duplicates the
    // second survives.
    forEachItem(file, [&](UUIDBytes& itemUUID, void*, unsigned int, std::uint32_t index) {
        return !matches(uuid, itemUUID.data()) || file.removeUserData(kUuid, index) == kStatusOK;
    });
    return kStatusOK;
}

std::int32_t CAudioFileIO::AddCAFChunkToUUIDChunk(platform::AudioFile& file, const unsigned char* uuid,
                                                  unsigned int size, const void* data)
{
    RemoveCAFChunkFromUUIDChunk(file, uuid);
    std::uint32_t count = 0;
    const std::int32_t status = file.countUserData(kUuid, count);
    return status != kStatusOK ? status : file.setUserData(kUuid, count, size, data);
}
