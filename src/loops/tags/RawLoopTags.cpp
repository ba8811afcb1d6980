#include "loops/tags/RawLoopTags.h"

#include "loops/VireoLoopCombinedTagsChunkData.h"
#include "loops/VireoLoopUserDataUtils.h"
#include "loops/tags/LoopTagsError.h"
#include "media/containers/ContainerHeaders.h"

#include <algorithm>

using platform::AudioFile;

namespace {

constexpr FourCC kInfoChunk = fourCC("info");

// The item at an index, if it exists. False if it cannot be read, which differs from a missing item.
bool readItem(AudioFile& file, FourCC type, std::uint32_t index, std::optional<Bytes>& item, platform::Error* error)
{
    std::uint32_t size = 0;
    const std::int32_t status = file.userDataSize(type, index, size);
    if (status == kStatusParameterError)
        return true;
    if (!succeeded(status, error))
        return false;
    Bytes bytes(size);
    if (!succeeded(file.userData(type, index, size, bytes.data()), error))
        return false;
    bytes.resize(size);
    item = std::move(bytes);
    return true;
}

// As above for a CAF file's "uuid" items, without the UUID.
bool readItemWithUUID(AudioFile& file, const tagging::UUIDBytes& uuid, std::optional<Bytes>& item,
                      platform::Error* error)
{
    std::uint32_t count = 0;
    if (!succeeded(file.countUserData(tagging::kCAFUUIDChunk, count), error))
        return false;
    for (std::uint32_t index = 0; index < count; ++index) {
        tagging::UUIDBytes found{};
        std::uint32_t size = sizeof found;
        if (!succeeded(file.userData(tagging::kCAFUUIDChunk, index, size, found), error))
            return false;
        if (size < sizeof found || !std::ranges::equal(found, uuid))
            continue;
        if (!readItem(file, tagging::kCAFUUIDChunk, index, item, error))
            return false;
        if (!item)
            item.emplace();
        item->erase(item->begin(), item->begin() + std::min<std::ptrdiff_t>(sizeof uuid, std::ssize(*item)));
        return true;
    }
    return true;
}

bool readLoopChunk(AudioFile& file, FourCC id, std::optional<Bytes>& chunk, platform::Error* error)
{
    return file.fileType() == kAIFF ? readItem(file, id, 0, chunk, error)
                                    : readItemWithUUID(file, *chunkIDToCafChunkUUID(id), chunk, error);
}

bool writeItem(AudioFile& file, FourCC id, const std::optional<Bytes>& before, const std::optional<Bytes>& after)
{
    if (before == after)
        return true;
    const bool byUUID = file.fileType() == kCaff && id != kInfoChunk;
    if (byUUID) {
        const tagging::UUIDBytes& uuid = *chunkIDToCafChunkUUID(id);
        return after ? VireoLoopUUIDUserDataUtils::write(file, uuid, *after)
                     : VireoLoopUUIDUserDataUtils::removeAll(file, uuid);
    }
    return after ? VireoLoopUserDataUtils::write(file, id, 0, *after) : VireoLoopUserDataUtils::removeAll(file, id);
}

std::optional<Bytes> under(const std::map<FourCC, Bytes>& texts, FourCC id)
{
    const auto found = texts.find(id);
    return found == texts.end() ? std::nullopt : std::optional(found->second);
}

std::vector<FourCC> textIDs(FourCC fileType)
{
    if (fileType == kWAVE)
        return {fourCC("acid"), fourCC("smpl")};
    if (fileType == kAIFF)
        return {fourCC("NAME"), fourCC("AUTH"), fourCC("(c) "), fourCC("COMT")};
    return {kInfoChunk};
}

} // namespace

std::optional<RawLoopTags> readRawLoopTags(VireoLoopChunksManager& manager, platform::Error* error)
{
    AudioFile& file = *manager.audioFile();
    RawLoopTags tags;
    tags.fileType = file.fileType();
    if (tags.fileType != kWAVE && (!readLoopChunk(file, tagging::kBasicTagging, tags.basic, error) ||
                                   !readLoopChunk(file, tagging::kTransients, tags.transients, error)))
        return std::nullopt;
    if (tags.fileType == kAIFF && !readLoopChunk(file, tagging::kCategories, tags.categories, error))
        return std::nullopt;
    for (const FourCC id : textIDs(tags.fileType)) {
        std::optional<Bytes> text;
        if (!readItem(file, id, 0, text, error))
            return std::nullopt;
        if (text)
            tags.texts[id] = std::move(*text);
    }
    return tags;
}

bool writeRawLoopTags(VireoLoopChunksManager& manager, const RawLoopTags& before, const RawLoopTags& after)
{
    AudioFile& file = *manager.audioFile();
    bool good = writeItem(file, tagging::kBasicTagging, before.basic, after.basic) &&
                writeItem(file, tagging::kCategories, before.categories, after.categories) &&
                writeItem(file, tagging::kTransients, before.transients, after.transients);
    for (const FourCC id : textIDs(after.fileType))
        good = good && writeItem(file, id, under(before.texts, id), under(after.texts, id));
    return good;
}

platform::Dictionary combinedLoopTagsOf(const RawLoopTags& tags)
{
    VireoLoopCombinedTagsChunkData data;
    if (tags.fileType == kAIFF && (tags.basic || tags.categories)) {
        const auto archive = VireoLoopCombinedTagsChunkDataTypes::combinedAifChunkDataFrom(
            tags.basic.value_or(Bytes()), tags.categories.value_or(Bytes()));
        data.setChunkData(archive.value_or(Bytes()), kAIFF);
    } else if (tags.basic) {
        data.setChunkData(*tags.basic, tags.fileType);
    }
    return data.dataDictionary();
}
