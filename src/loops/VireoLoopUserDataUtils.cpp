#include "loops/VireoLoopUserDataUtils.h"

#include "platform/core/Status.h"

#include <algorithm>
#include <limits>
#include <numeric>
#include <vector>

using platform::AudioFile;

std::uint32_t VireoLoopUserDataUtils::count(AudioFile& file, FourCC type)
{
    std::uint32_t count = 0;
    return file.countUserData(type, count) == kStatusOK ? count : 0;
}

std::optional<Bytes> VireoLoopUserDataUtils::read(AudioFile& file, FourCC type, std::uint32_t index,
                                                  std::uint32_t limit)
{
    std::uint32_t size = 0;
    if (file.userDataSize(type, index, size) != kStatusOK)
        return std::nullopt;
    size = std::min(size, limit);
    Bytes data(size);
    if (file.userData(type, index, size, data.data()) != kStatusOK)
        return std::nullopt;
    data.resize(size);
    return data;
}

bool VireoLoopUserDataUtils::write(AudioFile& file, FourCC type, std::uint32_t index, BytesView data)
{
    return data.size() <= std::numeric_limits<std::uint32_t>::max() &&
           file.setUserData(type, index, static_cast<std::uint32_t>(data.size()), data.data()) == kStatusOK;
}

bool VireoLoopUserDataUtils::removeAll(AudioFile& file, FourCC type)
{
    std::vector<std::uint32_t> indices(count(file, type));
    std::iota(indices.begin(), indices.end(), std::uint32_t{0});
    return indices.empty() || file.removeUserData(type, indices) == kStatusOK;
}

namespace {

bool hasUUID(AudioFile& file, std::uint32_t index, const tagging::UUIDBytes& uuid)
{
    const auto start = VireoLoopUserDataUtils::read(file, tagging::kCAFUUIDChunk, index, tagging::kUUIDSize);
    return start && start->size() == tagging::kUUIDSize &&
           UUIDIsEqual(reinterpret_cast<const std::uint8_t*>(start->data()), uuid);
}

} // namespace

std::optional<std::uint32_t> VireoLoopUUIDUserDataUtils::find(AudioFile& file, const tagging::UUIDBytes& uuid)
{
    const std::uint32_t count = VireoLoopUserDataUtils::count(file, tagging::kCAFUUIDChunk);
    for (std::uint32_t index = 0; index < count; ++index)
        if (hasUUID(file, index, uuid))
            return index;
    return std::nullopt;
}

std::optional<Bytes> VireoLoopUUIDUserDataUtils::read(AudioFile& file, const tagging::UUIDBytes& uuid)
{
    const auto index = find(file, uuid);
    auto item = index ? VireoLoopUserDataUtils::read(file, tagging::kCAFUUIDChunk, *index) : std::nullopt;
    if (!item || item->size() < tagging::kUUIDSize)
        return std::nullopt;
    item->erase(item->begin(), item->begin() + tagging::kUUIDSize);
    return item;
}

bool VireoLoopUUIDUserDataUtils::write(AudioFile& file, const tagging::UUIDBytes& uuid, BytesView data)
{
    const BytesView prefix = std::as_bytes(std::span(uuid));
    Bytes item(prefix.begin(), prefix.end());
    item.insert(item.end(), data.begin(), data.end());
    const auto first = find(file, uuid);
    const std::uint32_t index = first ? *first : VireoLoopUserDataUtils::count(file, tagging::kCAFUUIDChunk);
    return VireoLoopUserDataUtils::write(file, tagging::kCAFUUIDChunk, index, item);
}

bool VireoLoopUUIDUserDataUtils::removeAll(AudioFile& file, const tagging::UUIDBytes& uuid)
{
    const std::uint32_t count = VireoLoopUserDataUtils::count(file, tagging::kCAFUUIDChunk);
    std::vector<std::uint32_t> indices;
    for (std::uint32_t index = 0; index < count; ++index)
        if (hasUUID(file, index, uuid))
            indices.push_back(index);
    return indices.empty() || file.removeUserData(tagging::kCAFUUIDChunk, indices) == kStatusOK;
}
