#include "LoopTagsPatch.h"

#include "CAFTextPairs.h"
#include "Failure.h"
#include "audiofile/ContainerHeaders.h"
#include "loops/VireoLoopCombinedTagsChunkDataTypes.h"
#include "loops/VireoLoopFileInfoChunkDataTypes.h"
#include "loops/tagging/Chunks.h"
#include "platform/String.h"

#include <fmt/format.h>

#include <algorithm>
#include <cstring>
#include <set>

using platform::Value;
using tagging::BasicTaggingChunk;
using tagging::CategoryChunk;
using tagging::kCategoryTextSize;

namespace {

constexpr FourCC kInfo = fourCC("info");
constexpr std::string_view kBeatCount = VireoLoopCombinedTagsChunkDataBeatCountKey;
constexpr std::string_view kRootNote = VireoLoopCombinedTagsChunkDataMidiRootNoteKey;
constexpr std::string_view kKeyType = VireoLoopCombinedTagsChunkDataKeyType;
constexpr std::string_view kTop = VireoLoopCombinedTagsChunkDataSignatureTopKey;
constexpr std::string_view kBottom = VireoLoopCombinedTagsChunkDataSignatureBottomKey;
constexpr std::string_view kDescriptors = VireoLoopCombinedTagsChunkDataDescriptorsKey;

std::int64_t numberIn(const Value& value)
{
    const auto* number = value.get<std::int64_t>();
    return number != nullptr ? *number : 0;
}

std::string textIn(const Value& value)
{
    const auto* text = value.get<std::string>();
    return text != nullptr ? *text : std::string();
}

std::vector<std::string> textsIn(const Value& value)
{
    std::vector<std::string> texts;
    if (const auto* list = value.get<platform::Array>())
        for (const Value& each : *list)
            texts.push_back(textIn(each));
    return texts;
}

bool isZeroFrom(BytesView bytes, std::size_t start)
{
    return std::ranges::all_of(bytes.subspan(std::min(start, bytes.size())),
                               [](std::byte b) { return b == std::byte{}; });
}

// A new chunk of version 1.
Bytes newChunk(std::size_t size)
{
    Bytes bytes(size);
    storeBE(bytes.data(), std::uint32_t{1});
    return bytes;
}

// AIFF "basc".

std::size_t offsetInBasic(std::string_view key)
{
    return key == kRootNote  ? offsetof(BasicTaggingChunk, midiRootNote)
           : key == kKeyType ? offsetof(BasicTaggingChunk, keyType)
           : key == kTop     ? offsetof(BasicTaggingChunk, signatureTop)
           : key == kBottom  ? offsetof(BasicTaggingChunk, signatureBottom)
                             : offsetof(BasicTaggingChunk, fileType);
}

void assignBasic(std::optional<Bytes>& chunk, std::string_view key, std::int64_t number)
{
    if (!chunk && number == 0)
        return;
    Bytes bytes = chunk ? *chunk : newChunk(sizeof(BasicTaggingChunk));
    if (bytes.size() < sizeof(BasicTaggingChunk))
        throw Failure(fmt::format("its chunk \"basc\" is cut short ({} of {} bytes); tags remove takes it off",
                                  bytes.size(), sizeof(BasicTaggingChunk)));
    if (key == kBeatCount)
        storeBE(bytes.data() + offsetof(BasicTaggingChunk, beatCount), static_cast<std::int32_t>(number));
    else
        storeBE(bytes.data() + offsetInBasic(key), static_cast<std::int16_t>(number));
    if (bytes == chunk)
        return;
    chunk = std::move(bytes);
    if (isZeroFrom(*chunk, offsetof(BasicTaggingChunk, beatCount)))
        chunk.reset();
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

// The fields of the descriptors, and where what lies behind them begins.
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

void assignCategory(std::optional<Bytes>& chunk, const TagField& field, const Value& value)
{
    const bool isList = field.kind == TagField::Kind::list;
    if (!chunk && (isList ? textsIn(value).empty() : textIn(value).empty()))
        return;
    Bytes bytes = chunk ? *chunk : newChunk(sizeof(CategoryChunk));
    const auto layout = layoutOf(bytes);
    if (!layout && bytes.size() < sizeof(CategoryChunk))
        throw Failure(fmt::format("its chunk \"cate\" is cut short ({} of {} bytes); tags remove takes it off",
                                  bytes.size(), sizeof(CategoryChunk)));
    if (!layout)
        throw Failure(fmt::format("its chunk \"cate\" is of version {}, whose layout is not known",
                                  loadBE<std::uint32_t>(bytes.data())));
    if (isList) {
        assignDescriptors(bytes, *layout, textsIn(value));
    } else {
        const std::size_t offset = offsetInCategories(field.key);
        if (fieldText(BytesView(bytes).subspan(offset, kCategoryTextSize)) != textIn(value))
            storeField(bytes.data() + offset, textIn(value));
    }
    if (bytes == chunk)
        return;
    chunk = std::move(bytes);
    if (isZeroFrom(*chunk, offsetof(CategoryChunk, instrumentType)))
        chunk.reset();
}

// AIFF "COMT": a count, then for each comment a time stamp (4 bytes), a marker (2), the text's size (2) and the text,
// which a further comment follows at an even place.

constexpr std::size_t kCommentSizeAt = 8;
constexpr std::size_t kCommentTextAt = 10;

struct FirstComment {
    std::string_view text; // as it stands
    std::size_t next;      // where what lies behind it begins
};

std::optional<FirstComment> firstComment(BytesView chunk)
{
    if (chunk.size() < kCommentTextAt || loadBE<std::uint16_t>(chunk.data()) == 0)
        return std::nullopt;
    const std::size_t size = loadBE<std::uint16_t>(chunk.data() + kCommentSizeAt);
    return FirstComment{textOf(chunk).substr(kCommentTextAt, size),
                        std::min(kCommentTextAt + size + (size & 1), chunk.size())};
}

// None when no comment is left.
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
        bytes.resize(kCommentTextAt + size + (size & 1)); // a zero byte of those behind the text is the pad byte
        bytes.insert(bytes.end(), chunk->begin() + static_cast<std::ptrdiff_t>(old->next), chunk->end());
    }
    std::copy_n(chunk->begin(), kCommentSizeAt, bytes.begin()); // count, time stamp and marker
    return bytes;
}

void assignAIFFText(std::map<FourCC, Bytes>& texts, const TagField& field, const std::string& text)
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

// The pairs of CAF.

// The pair that holds the field; both parts of a signature are in one. Null for the file type, which none holds.
const char* cafKeyOf(const TagField& field)
{
    static constexpr std::pair<std::string_view, const char*> keys[] = {
        {kBeatCount, "beat count"},
        {kTop, "time signature"},
        {kBottom, "time signature"},
        {kRootNote, "key signature"},
        {kKeyType, "key type"},
        {VireoLoopCombinedTagsChunkDataInstrumentTypeKey, "category"},
        {VireoLoopCombinedTagsChunkDataInstrumentSubTypeKey, "subcategory"},
        {VireoLoopCombinedTagsChunkDataGenreKey, "genre"},
        {kDescriptors, "descriptors"},
    };
    if (field.isFileInfo)
        return field.name; // the names are those of the pairs
    for (const auto& [key, name] : keys)
        if (field.key != nullptr && key == field.key)
            return name;
    return nullptr;
}

// The text that stands for a value; empty when none does.
std::string cafText(const TagField& field, const Value& value)
{
    constexpr std::int64_t lowestNote = 48, highestNote = 59, lastKeyType = 4;
    const std::int64_t number = numberIn(value);
    if (field.kind == TagField::Kind::text)
        return textIn(value);
    if (field.kind == TagField::Kind::list)
        return fmt::format("{}", fmt::join(textsIn(value), ","));
    if (field.key == kBeatCount)
        return number > 0 ? std::to_string(number) : "";
    if (field.key == kRootNote)
        return number >= lowestNote && number <= highestNote ? noteName(number) : "";
    return number > 0 && number <= lastKeyType ? modeName(number) : "";
}

// Nothing changes where the library reads what is asked for already; a text is compared as it stands.
void assignPair(CAFTextPairs& pairs, const platform::Dictionary& read, const TagField& field, const Value& value)
{
    const std::string text = cafText(field, value);
    const auto there = read.find(field.key);
    const bool isText = field.kind == TagField::Kind::text;
    if (text.empty())
        pairs.erase(cafKeyOf(field));
    else if (isText || there == read.end() || there->second != value)
        pairs.set(cafKeyOf(field), text);
}

void assignSignature(CAFTextPairs& pairs, const platform::Dictionary& read, std::span<const TagAssignment> assignments)
{
    std::int64_t parts[] = {0, 0};
    const std::string_view keys[] = {kTop, kBottom};
    bool isNamed = false, differs = false;
    for (std::size_t i = 0; i < 2; ++i) {
        const auto* there = platform::find<std::int64_t>(read, keys[i]);
        parts[i] = there != nullptr ? *there : 0;
        for (const TagAssignment& assignment : assignments)
            if (assignment.field->key != nullptr && assignment.field->key == keys[i]) {
                isNamed = true;
                differs = differs || numberIn(assignment.value) != parts[i];
                parts[i] = numberIn(assignment.value);
            }
    }
    if (isNamed && (parts[0] < 1 || parts[1] < 1))
        pairs.erase("time signature");
    else if (differs)
        pairs.set("time signature", fmt::format("{}/{}", parts[0], parts[1]));
}

CAFTextPairs pairsOf(const std::optional<Bytes>& payload)
{
    return payload ? CAFTextPairs(*payload) : CAFTextPairs();
}

std::optional<Bytes> infoOf(const RawLoopTags& tags)
{
    const auto found = tags.texts.find(kInfo);
    return found == tags.texts.end() ? std::nullopt : std::optional(found->second);
}

CAFTextPairs pairsWith(const RawLoopTags& tags, const TagField& field)
{
    return pairsOf(field.isFileInfo ? infoOf(tags) : tags.basic);
}

void storePairs(RawLoopTags& tags, bool isFileInfo, const CAFTextPairs& pairs)
{
    if (pairs.isEmpty() && isFileInfo)
        tags.texts.erase(kInfo);
    else if (pairs.isEmpty())
        tags.basic.reset();
    else
        (isFileInfo ? tags.texts[kInfo] : tags.basic.emplace()) = pairs.payload();
}

void assignCAF(RawLoopTags& tags, std::span<const TagAssignment> assignments)
{
    const platform::Dictionary read = combinedTagsOf(tags);
    CAFTextPairs basic = pairsOf(tags.basic), info = pairsOf(infoOf(tags));
    const CAFTextPairs basicBefore = basic, infoBefore = info;
    assignSignature(basic, read, assignments);
    for (const auto& [field, value] : assignments)
        if (cafKeyOf(*field) != nullptr && field->key != kTop && field->key != kBottom)
            assignPair(field->isFileInfo ? info : basic, read, *field, value);
    if (basic != basicBefore)
        storePairs(tags, false, basic);
    if (info != infoBefore)
        storePairs(tags, true, info);
}

} // namespace

void assignTags(RawLoopTags& tags, std::span<const TagAssignment> assignments)
{
    if (tags.fileType != kAIFF)
        return assignCAF(tags, assignments);
    for (const auto& [field, value] : assignments)
        if (field->isFileInfo)
            assignAIFFText(tags.texts, *field, textIn(value));
        else if (field->kind == TagField::Kind::number)
            assignBasic(tags.basic, field->key, numberIn(value));
        else if (field->kind != TagField::Kind::transients)
            assignCategory(tags.categories, *field, value);
}

std::optional<std::string> rawText(const RawLoopTags& tags, const TagField& field)
{
    if (tags.fileType != kAIFF)
        return pairText(tags, field);
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

std::vector<std::string> rawDescriptors(const RawLoopTags& tags)
{
    if (tags.fileType != kAIFF) {
        const CAFTextPairs pairs = pairsOf(tags.basic);
        const std::string* text = pairs.find("descriptors");
        return text != nullptr ? std::vector{*text} : std::vector<std::string>();
    }
    const auto layout = tags.categories ? layoutOf(*tags.categories) : std::nullopt;
    return layout ? descriptorFields(*tags.categories, *layout).texts : std::vector<std::string>();
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

std::optional<std::string> pairText(const RawLoopTags& tags, const TagField& field)
{
    const char* const key = tags.fileType != kAIFF ? cafKeyOf(field) : nullptr;
    const CAFTextPairs pairs = key != nullptr ? pairsWith(tags, field) : CAFTextPairs();
    const std::string* text = key != nullptr ? pairs.find(key) : nullptr;
    return text != nullptr && !text->empty() ? std::optional(*text) : std::nullopt;
}

bool copyPair(RawLoopTags& to, const RawLoopTags& from, const TagField& field)
{
    const auto text = pairText(from, field);
    if (!text)
        return false;
    CAFTextPairs pairs = pairsWith(to, field);
    pairs.set(cafKeyOf(field), *text);
    if (pairs != pairsWith(to, field))
        storePairs(to, field.isFileInfo, pairs);
    return true;
}

bool hasUnknownCategories(const RawLoopTags& tags)
{
    return tags.categories && !layoutOf(*tags.categories);
}
