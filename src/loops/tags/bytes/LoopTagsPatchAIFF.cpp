// The AIFF side of LoopTagsPatch.
#include "loops/VireoLoopCombinedTagsChunkDataTypes.h"
#include "loops/VireoLoopFileInfoChunkDataTypes.h"
#include "loops/tagging/Chunks.h"
#include "loops/tags/LoopTagsError.h"
#include "loops/tags/bytes/LoopTagsLayouts.h"

#include <cstring>
#include <set>

using platform::Value;
using tagging::BasicTaggingChunk;
using tagging::CategoryChunk;
using tagging::kCategoryTextSize;

using namespace loopkeys;

namespace {

bool isZeroFrom(BytesView bytes, std::size_t start)
{
    return std::ranges::all_of(bytes.subspan(std::min(start, bytes.size())),
                               [](std::byte b) { return b == std::byte{}; });
}

// A new chunk, of version 1.
Bytes newChunk(std::size_t size)
{
    Bytes bytes(size);
    storeBE(bytes.data(), std::uint32_t{1});
    return bytes;
}

// AIFF "basc".

std::size_t offsetInBasic(std::string_view key)
{
    if (key == kRootNote)
        return offsetof(BasicTaggingChunk, midiRootNote);
    if (key == kKeyType)
        return offsetof(BasicTaggingChunk, keyType);
    if (key == kTop)
        return offsetof(BasicTaggingChunk, signatureTop);
    if (key == kBottom)
        return offsetof(BasicTaggingChunk, signatureBottom);
    return offsetof(BasicTaggingChunk, fileType);
}

// "its chunk "basc" is cut short (80 of 82 bytes); tags remove takes it off".
bool failForCut(platform::Error* error, const char* id, std::size_t size, std::size_t whole)
{
    return failWith(error, LoopTagsError::damagedChunk,
                    "its chunk \"" + std::string(id) + "\" is cut short (" + std::to_string(size) + " of " +
                        std::to_string(whole) + " bytes); tags remove takes it off");
}

bool assignBasic(std::optional<Bytes>& chunk, std::string_view key, std::int64_t number, platform::Error* error)
{
    if (!chunk && number == 0)
        return true;
    Bytes bytes = chunk ? *chunk : newChunk(sizeof(BasicTaggingChunk));
    if (bytes.size() < sizeof(BasicTaggingChunk))
        return failForCut(error, "basc", bytes.size(), sizeof(BasicTaggingChunk));
    if (key == kBeatCount)
        storeBE(bytes.data() + offsetof(BasicTaggingChunk, beatCount), static_cast<std::int32_t>(number));
    else
        storeBE(bytes.data() + offsetInBasic(key), static_cast<std::int16_t>(number));
    if (bytes == chunk)
        return true;
    chunk = std::move(bytes);
    if (isZeroFrom(*chunk, offsetof(BasicTaggingChunk, beatCount)))
        chunk.reset();
    return true;
}

// AIFF "cate".

struct CategoryLayout {
    std::size_t countOffset;
    std::size_t descriptorsOffset;
};

std::optional<CategoryLayout> layoutOf(BytesView chunk)
{
    if (chunk.size() < sizeof(CategoryChunk))
        return std::nullopt;
    switch (loadBE<std::uint32_t>(chunk.data())) {
    case 1:
        return CategoryLayout{offsetof(CategoryChunk, descriptorCount), sizeof(CategoryChunk)};
    case 2:
        return CategoryLayout{tagging::kCategoryV2CountOffset, tagging::kCategoryV2DescriptorsOffset};
    default:
        return std::nullopt;
    }
}

std::size_t offsetInCategories(std::string_view key)
{
    return key == VireoLoopCombinedTagsChunkDataInstrumentTypeKey      ? offsetof(CategoryChunk, instrumentType)
           : key == VireoLoopCombinedTagsChunkDataInstrumentSubTypeKey ? offsetof(CategoryChunk, instrumentSubType)
                                                                       : offsetof(CategoryChunk, genre);
}

std::string_view fieldText(BytesView field)
{
    const std::string_view text = textOf(field);
    return text.substr(0, text.find('\0'));
}

void storeField(std::byte* field, std::string_view text)
{
    std::memset(field, 0, kCategoryTextSize);
    std::memcpy(field, text.data(), std::min(text.size(), kCategoryTextSize - 1));
}

// The descriptors' fields, and where the bytes after them begin.
struct DescriptorFields {
    std::vector<std::string> texts;
    std::size_t end;
};

DescriptorFields descriptorFields(BytesView chunk, const CategoryLayout& layout)
{
    if (chunk.size() < layout.descriptorsOffset)
        return {{}, chunk.size()};
    const std::size_t claimed = loadBE<std::uint16_t>(chunk.data() + layout.countOffset);
    const std::size_t room = (chunk.size() - layout.descriptorsOffset) / kCategoryTextSize;
    DescriptorFields fields{{}, layout.descriptorsOffset + claimed * kCategoryTextSize};
    for (std::size_t i = 0; i < std::min(claimed, room); ++i)
        fields.texts.emplace_back(
            fieldText(chunk.subspan(layout.descriptorsOffset + i * kCategoryTextSize, kCategoryTextSize)));
    fields.end = std::min(fields.end, chunk.size());
    return fields;
}

void assignDescriptors(Bytes& chunk, const CategoryLayout& layout, const std::vector<std::string>& texts)
{
    const DescriptorFields old = descriptorFields(chunk, layout);
    if (std::set<std::string>(old.texts.begin(), old.texts.end()) == std::set<std::string>(texts.begin(), texts.end()))
        return;
    const std::size_t count = std::min<std::size_t>(texts.size(), UINT16_MAX);
    Bytes bytes(chunk.begin(), chunk.begin() + std::min(std::ssize(chunk), std::ptrdiff_t(layout.descriptorsOffset)));
    bytes.resize(layout.descriptorsOffset + count * kCategoryTextSize);
    storeBE(bytes.data() + layout.countOffset, static_cast<std::uint16_t>(count));
    for (std::size_t i = 0; i < count; ++i)
        storeField(bytes.data() + layout.descriptorsOffset + i * kCategoryTextSize, texts[i]);
    bytes.insert(bytes.end(), chunk.begin() + static_cast<std::ptrdiff_t>(old.end), chunk.end());
    chunk = std::move(bytes);
}

bool assignCategory(std::optional<Bytes>& chunk, const LoopTagField& field, const Value& value, platform::Error* error)
{
    const bool isList = field.kind == LoopTagField::Kind::list;
    if (!chunk && (isList ? assignedLoopTexts(value).empty() : assignedLoopText(value).empty()))
        return true;
    Bytes bytes = chunk ? *chunk : newChunk(sizeof(CategoryChunk));
    const auto layout = layoutOf(bytes);
    if (!layout && bytes.size() < sizeof(CategoryChunk))
        return failForCut(error, "cate", bytes.size(), sizeof(CategoryChunk));
    if (!layout)
        return failWith(error, LoopTagsError::damagedChunk,
                        "its chunk \"cate\" is of version " + std::to_string(loadBE<std::uint32_t>(bytes.data())) +
                            ", whose layout is not known");
    if (isList) {
        assignDescriptors(bytes, *layout, assignedLoopTexts(value));
    } else {
        const std::size_t offset = offsetInCategories(field.key);
        if (fieldText(BytesView(bytes).subspan(offset, kCategoryTextSize)) != assignedLoopText(value))
            storeField(bytes.data() + offset, assignedLoopText(value));
    }
    if (bytes == chunk)
        return true;
    chunk = std::move(bytes);
    if (isZeroFrom(*chunk, offsetof(CategoryChunk, instrumentType)))
        chunk.reset();
    return true;
}

// AIFF "COMT": a count, then for each comment a time stamp (4 bytes), a marker (2), the text's size (2) and the text;
// the next comment begins at an even offset.

constexpr std::size_t kCommentSizeAt = 8;
constexpr std::size_t kCommentTextAt = 10;

struct FirstComment {
    std::string_view text; // as it stands
    std::size_t next;      // start of what follows
};

std::optional<FirstComment> firstComment(BytesView chunk)
{
    if (chunk.size() < kCommentTextAt || loadBE<std::uint16_t>(chunk.data()) == 0)
        return std::nullopt;
    const std::size_t size = loadBE<std::uint16_t>(chunk.data() + kCommentSizeAt);
    return FirstComment{textOf(chunk).substr(kCommentTextAt, size),
                        std::min(kCommentTextAt + size + (size & 1), chunk.size())};
}

// None if no comment is left.
std::optional<Bytes> assignedComment(const std::optional<Bytes>& chunk, const std::string& text)
{
    using Types = VireoLoopFileInfoChunkDataTypes;
    const auto old = chunk ? firstComment(*chunk) : std::nullopt;
    if (old && !text.empty() && Types::commentStringFromAifCommentChunkData(*chunk) == text)
        return chunk;
    const bool isAlone = !old || (loadBE<std::uint16_t>(chunk->data()) == 1 && isZeroFrom(*chunk, old->next));
    if (text.empty() && isAlone)
        return std::nullopt;
    Bytes bytes = Types::commentDataFromAifCommentChunkStrings(text);
    if (!old)
        return bytes;
    if (!isAlone) {
        const std::size_t size = text.empty() ? 0 : loadBE<std::uint16_t>(bytes.data() + kCommentSizeAt);
        storeBE(bytes.data() + kCommentSizeAt, static_cast<std::uint16_t>(size));
        bytes.resize(kCommentTextAt + size + (size & 1)); // one of the zero bytes after the text is the pad byte
        bytes.insert(bytes.end(), chunk->begin() + static_cast<std::ptrdiff_t>(old->next), chunk->end());
    }
    std::copy_n(chunk->begin(), kCommentSizeAt, bytes.begin()); // count, time stamp and marker
    return bytes;
}

void assignAIFFText(std::map<FourCC, Bytes>& texts, const LoopTagField& field, const std::string& text)
{
    const FourCC id = VireoLoopFileInfoChunkDataTypes::fileInfoTypeForKey(field.key);
    const auto found = texts.find(id);
    const auto old = found == texts.end() ? std::nullopt : std::optional(found->second);
    std::optional<Bytes> bytes;
    if (field.key == std::string_view(VireoLoopFileInfoChunkDataCommentsKey))
        bytes = assignedComment(old, text);
    else if (!text.empty() && old && fieldText(*old) == text)
        bytes = old;
    else if (!text.empty())
        bytes.emplace(bytesOf(text).begin(), bytesOf(text).end());
    if (bytes)
        texts[id] = std::move(*bytes);
    else
        texts.erase(id);
}

} // namespace

bool assignAIFFLoopTags(RawLoopTags& tags, std::span<const LoopTagAssignment> assignments, platform::Error* error)
{
    for (const auto& [field, value] : assignments) {
        if (field->isFileInfo)
            assignAIFFText(tags.texts, *field, assignedLoopText(value));
        else if (field->kind == LoopTagField::Kind::number &&
                 !assignBasic(tags.basic, field->key, assignedLoopNumber(value), error))
            return false;
        else if (field->kind != LoopTagField::Kind::number && field->kind != LoopTagField::Kind::transients &&
                 !assignCategory(tags.categories, *field, value, error))
            return false;
    }
    return true;
}

std::optional<std::string> rawAIFFLoopText(const RawLoopTags& tags, const LoopTagField& field)
{
    std::string_view text;
    const auto found = tags.texts.find(VireoLoopFileInfoChunkDataTypes::fileInfoTypeForKey(field.key));
    if (!field.isFileInfo && tags.categories && layoutOf(*tags.categories)) {
        text = fieldText(BytesView(*tags.categories).subspan(offsetInCategories(field.key), kCategoryTextSize));
    } else if (field.isFileInfo && found != tags.texts.end()) {
        const bool isComment = field.key == std::string_view(VireoLoopFileInfoChunkDataCommentsKey);
        const auto comment = isComment ? firstComment(found->second) : std::nullopt;
        text = comment ? comment->text : isComment ? std::string_view() : fieldText(found->second);
    }
    return text.empty() ? std::nullopt : std::optional(std::string(text));
}

std::vector<std::string> rawAIFFLoopDescriptors(const RawLoopTags& tags)
{
    const auto layout = tags.categories ? layoutOf(*tags.categories) : std::nullopt;
    return layout ? descriptorFields(*tags.categories, *layout).texts : std::vector<std::string>();
}

bool hasUnknownLoopCategories(const RawLoopTags& tags)
{
    return tags.categories && !layoutOf(*tags.categories);
}
