#include "tool/shared/looptags/RawLoopTags.h"

#include "loops/VireoLoopCombinedTagsChunkData.h"
#include "loops/VireoLoopUserDataUtils.h"
#include "media/containers/ContainerHeaders.h"
#include "platform/core/Status.h"
#include "tool/shared/output/Failure.h"

#include <algorithm>

using platform::AudioFile;

namespace {

constexpr FourCC kInfoChunk = fourCC("info");

// The item at an index; none when there is none. What cannot be read is no item that is not there.
std::optional<Bytes> item(AudioFile& file, FourCC type, std::uint32_t index)
{
    std::uint32_t size = 0;
    const std::int32_t status = file.userDataSize(type, index, size);
    if (status == kStatusParameterError)
        return std::nullopt;
    requireOK(status);
    Bytes bytes(size);
    requireOK(file.userData(type, index, size, bytes.data()));
    bytes.resize(size);
    return bytes;
}

// The same of a CAF file's "uuid" items, without the UUID.
std::optional<Bytes> itemWithUUID(AudioFile& file, const tagging::UUIDBytes& uuid)
{
    std::uint32_t count = 0;
    requireOK(file.countUserData(tagging::kCAFUUIDChunk, count));
    for (std::uint32_t index = 0; index < count; ++index) {
        tagging::UUIDBytes found{};
        std::uint32_t size = sizeof found;
        requireOK(file.userData(tagging::kCAFUUIDChunk, index, size, found));
        if (size < sizeof found || !std::ranges::equal(found, uuid))
            continue;
        Bytes bytes = item(file, tagging::kCAFUUIDChunk, index).value_or(Bytes());
        bytes.erase(bytes.begin(), bytes.begin() + std::min<std::ptrdiff_t>(sizeof uuid, std::ssize(bytes)));
        return bytes;
    }
    return std::nullopt;
}

std::optional<Bytes> loopChunk(AudioFile& file, FourCC id)
{
    return file.fileType() == kAIFF ? item(file, id, 0) : itemWithUUID(file, *chunkIDToCafChunkUUID(id));
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

RawLoopTags readRawLoopTags(VireoLoopChunksManager& manager)
{
    AudioFile& file = *manager.audioFile();
    RawLoopTags tags;
    tags.fileType = file.fileType();
    if (tags.fileType != kWAVE) {
        tags.basic = loopChunk(file, tagging::kBasicTagging);
        tags.transients = loopChunk(file, tagging::kTransients);
    }
    if (tags.fileType == kAIFF)
        tags.categories = loopChunk(file, tagging::kCategories);
    for (const FourCC id : textIDs(tags.fileType))
        if (auto text = item(file, id, 0))
            tags.texts[id] = std::move(*text);
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

platform::Dictionary combinedTagsOf(const RawLoopTags& tags)
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
