#include "tool/shared/looptags/LoopTagsPatch.h"

#include "loops/VireoLoopFileInfoChunkDataTypes.h"
#include "media/containers/ContainerHeaders.h"
#include "platform/String.h"
#include "tool/shared/looptags/LoopTagsLayouts.h"

void assignTags(RawLoopTags& tags, std::span<const TagAssignment> assignments)
{
    if (tags.fileType == kAIFF)
        assignAIFFTags(tags, assignments);
    else
        assignCAFTags(tags, assignments);
}

std::optional<std::string> rawText(const RawLoopTags& tags, const TagField& field)
{
    return tags.fileType == kAIFF ? rawAIFFText(tags, field) : pairText(tags, field);
}

std::vector<std::string> rawDescriptors(const RawLoopTags& tags)
{
    if (tags.fileType == kAIFF)
        return rawAIFFDescriptors(tags);
    const auto text = pairText(tags, *fieldsForKey("descriptors").front());
    return text ? std::vector{*text} : std::vector<std::string>();
}

platform::Dictionary infoTextsOf(const RawLoopTags& tags)
{
    platform::Dictionary texts;
    for (const TagField& field : tagFields()) {
        auto text = field.isFileInfo ? rawText(tags, field) : std::nullopt;
        const auto id = VireoLoopFileInfoChunkDataTypes::fileInfoTypeForKey(field.isFileInfo ? field.key : "");
        if (text && tags.fileType == kAIFF && field.key == std::string_view(VireoLoopFileInfoChunkDataCommentsKey))
            text = VireoLoopFileInfoChunkDataTypes::commentStringFromAifCommentChunkData(tags.texts.at(id));
        if (text && !text->empty() && platform::String::fromUTF8(*text))
            texts[field.key] = std::move(*text);
    }
    return texts;
}
