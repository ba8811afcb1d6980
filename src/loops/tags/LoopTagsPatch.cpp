#include "loops/tags/LoopTagsPatch.h"

#include "loops/VireoLoopFileInfoChunkDataTypes.h"
#include "loops/tags/bytes/LoopTagsLayouts.h"
#include "media/containers/ContainerHeaders.h"
#include "platform/String.h"

bool assignLoopTags(RawLoopTags& tags, std::span<const LoopTagAssignment> assignments, platform::Error* error)
{
    if (tags.fileType == kAIFF)
        return assignAIFFLoopTags(tags, assignments, error);
    assignCAFLoopTags(tags, assignments);
    return true;
}

std::optional<std::string> rawLoopText(const RawLoopTags& tags, const LoopTagField& field)
{
    return tags.fileType == kAIFF ? rawAIFFLoopText(tags, field) : loopPairText(tags, field);
}

std::vector<std::string> rawLoopDescriptors(const RawLoopTags& tags)
{
    if (tags.fileType == kAIFF)
        return rawAIFFLoopDescriptors(tags);
    const auto text = loopPairText(tags, *loopTagFieldsForKey("descriptors").front());
    return text ? std::vector{*text} : std::vector<std::string>();
}

platform::Dictionary loopTextsOf(const RawLoopTags& tags)
{
    platform::Dictionary texts;
    for (const LoopTagField& field : loopTagFields()) {
        auto text = field.isFileInfo ? rawLoopText(tags, field) : std::nullopt;
        const auto id = VireoLoopFileInfoChunkDataTypes::fileInfoTypeForKey(field.isFileInfo ? field.key : "");
        if (text && tags.fileType == kAIFF && field.key == std::string_view(VireoLoopFileInfoChunkDataCommentsKey))
            text = VireoLoopFileInfoChunkDataTypes::commentStringFromAifCommentChunkData(tags.texts.at(id));
        if (text && !text->empty() && platform::String::fromUTF8(*text))
            texts[field.key] = std::move(*text);
    }
    return texts;
}
