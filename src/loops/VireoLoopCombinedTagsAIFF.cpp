// The AIFF side of the combined tags: "basc" and "cate" in one archive.
#include "loops/VireoLoopCombinedTagsChunkDataTypes.h"
#include "loops/tagging/Chunks.h"
#include "platform/KeyedArchive.h"
#include "platform/String.h"

#include <algorithm>
#include <cstring>
#include <limits>

using platform::Dictionary;
using tagging::BasicTaggingChunk;
using tagging::CategoryChunk;
using tagging::CategoryText;
using tagging::kCategoryTextSize;

namespace {

std::string textFor(const Dictionary& tags, const char* key)
{
    const auto* text = platform::find<std::string>(tags, key);
    return text != nullptr ? *text : std::string();
}

/// The text of a 50-byte field up to its first NUL.
std::string_view fieldText(const std::byte* field)
{
    const auto* text = reinterpret_cast<const char*>(field);
    return {text, strnlen(text, kCategoryTextSize)};
}

/// A field's text, or an empty string if it is not UTF-8. An incomplete last character, which is what a writer leaves
/// that cuts a long text, is dropped.
std::string fieldTextOrNothing(const std::byte* field)
{
    std::string_view text = fieldText(field);
    for (int dropped = 0; dropped < 4; ++dropped) {
        if (const auto valid = platform::String::fromUTF8(text))
            return valid.utf8();
        if (text.size() < kCategoryTextSize - 4)
            break;
        text.remove_suffix(1);
    }
    return {};
}

/// `text` cut to 49 bytes and filled up with NULs.
CategoryText field(std::string_view text)
{
    CategoryText to{};
    std::copy_n(text.data(), std::min(text.size(), kCategoryTextSize - 1), to.data());
    return to;
}

void readBasicTagging(BytesView bytes, Dictionary& tags)
{
    if (bytes.size() < sizeof(BasicTaggingChunk))
        return;
    BasicTaggingChunk basic;
    std::memcpy(&basic, bytes.data(), sizeof basic);
    tagging::SwapBasicTaggingChunkToHost(&basic);
    const std::pair<const char*, std::int64_t> numbers[] = {
        // In the order of the dictionary.
        {VireoLoopCombinedTagsChunkDataBeatCountKey, basic.beatCount},
        {VireoLoopCombinedTagsChunkDataFileTypeKey, basic.fileType},
        {VireoLoopCombinedTagsChunkDataKeyType, basic.keyType},
        {VireoLoopCombinedTagsChunkDataMidiRootNoteKey, basic.midiRootNote},
        {VireoLoopCombinedTagsChunkDataSignatureBottomKey, basic.signatureBottom},
        {VireoLoopCombinedTagsChunkDataSignatureTopKey, basic.signatureTop},
    };
    for (const auto& [key, number] : numbers)
        tags.emplace_hint(tags.end(), key, number);
}

/// Reads at most `claimed` descriptors, as many as the bytes hold; skips one that is not UTF-8.
platform::Array descriptorsIn(BytesView bytes, std::size_t claimed)
{
    std::vector<std::string_view> texts;
    texts.reserve(std::min(claimed, bytes.size() / kCategoryTextSize));
    for (std::size_t i = 0; i < std::min(claimed, bytes.size() / kCategoryTextSize); ++i)
        if (const std::string_view text = fieldText(bytes.data() + i * kCategoryTextSize);
            platform::String::fromUTF8(text))
            texts.push_back(text);
    std::sort(texts.begin(), texts.end());
    texts.erase(std::unique(texts.begin(), texts.end()), texts.end());
    platform::Array descriptors;
    descriptors.reserve(texts.size());
    for (const std::string_view text : texts)
        descriptors.emplace_back(std::string(text));
    return descriptors;
}

void readCategories(BytesView bytes, Dictionary& tags)
{
    if (bytes.size() < sizeof(CategoryChunk))
        return;
    std::size_t countOffset = offsetof(CategoryChunk, descriptorCount);
    std::size_t descriptorsOffset = sizeof(CategoryChunk);
    switch (loadBE<std::uint32_t>(bytes.data())) {
    case 1:
        break;
    case 2:
        countOffset = tagging::kCategoryV2CountOffset;
        descriptorsOffset = tagging::kCategoryV2DescriptorsOffset;
        break;
    default:
        return;
    }
    const std::pair<const char*, std::size_t> texts[] = {
        {VireoLoopCombinedTagsChunkDataInstrumentTypeKey, offsetof(CategoryChunk, instrumentType)},
        {VireoLoopCombinedTagsChunkDataInstrumentSubTypeKey, offsetof(CategoryChunk, instrumentSubType)},
        {VireoLoopCombinedTagsChunkDataGenreKey, offsetof(CategoryChunk, genre)},
    };
    for (const auto& [key, offset] : texts)
        if (std::string text = fieldTextOrNothing(bytes.data() + offset); !text.empty())
            tags.emplace(key, std::move(text));
    if (bytes.size() < descriptorsOffset)
        return;
    if (const auto count = loadBE<std::uint16_t>(bytes.data() + countOffset); count != 0)
        tags.emplace(VireoLoopCombinedTagsChunkDataDescriptorsKey,
                     descriptorsIn(bytes.subspan(descriptorsOffset), count));
}

BasicTaggingChunk basicTaggingOf(const Dictionary& tags)
{
    const auto number16 = [&](const char* key) {
        return static_cast<std::int16_t>(VireoLoopCombinedTagsChunkDataTypes::numberFor(tags, key));
    };
    BasicTaggingChunk basic;
    basic.beatCount = static_cast<std::int32_t>(std::clamp<std::int64_t>(
        VireoLoopCombinedTagsChunkDataTypes::numberFor(tags, VireoLoopCombinedTagsChunkDataBeatCountKey), INT32_MIN,
        INT32_MAX));
    basic.midiRootNote = number16(VireoLoopCombinedTagsChunkDataMidiRootNoteKey);
    basic.keyType = number16(VireoLoopCombinedTagsChunkDataKeyType);
    basic.signatureTop = number16(VireoLoopCombinedTagsChunkDataSignatureTopKey);
    basic.signatureBottom = number16(VireoLoopCombinedTagsChunkDataSignatureBottomKey);
    basic.fileType = number16(VireoLoopCombinedTagsChunkDataFileTypeKey);
    tagging::SwapBasicTaggingChunkToBig(&basic);
    return basic;
}

Bytes categoriesOf(const Dictionary& tags)
{
    std::vector<CategoryText> descriptors;
    if (const auto* array = platform::find<platform::Array>(tags, VireoLoopCombinedTagsChunkDataDescriptorsKey))
        for (const platform::Value& value : *array)
            if (const auto* text = value.get<std::string>())
                descriptors.push_back(field(*text));
    descriptors.resize(std::min<std::size_t>(descriptors.size(), std::numeric_limits<std::uint16_t>::max()));

    CategoryChunk head;
    head.instrumentType = field(textFor(tags, VireoLoopCombinedTagsChunkDataInstrumentTypeKey));
    head.instrumentSubType = field(textFor(tags, VireoLoopCombinedTagsChunkDataInstrumentSubTypeKey));
    head.genre = field(textFor(tags, VireoLoopCombinedTagsChunkDataGenreKey));
    head.descriptorCount = static_cast<std::uint16_t>(descriptors.size());
    tagging::SwapCategoryChunkToBig(&head);
    const BytesView headBytes = std::as_bytes(std::span(&head, 1));
    const BytesView descriptorBytes = std::as_bytes(std::span(descriptors));
    Bytes bytes(headBytes.begin(), headBytes.end());
    bytes.insert(bytes.end(), descriptorBytes.begin(), descriptorBytes.end());
    return bytes;
}

Bytes takeEntry(std::optional<Dictionary>& dictionary, const char* key)
{
    const auto found = dictionary ? dictionary->find(key) : Dictionary::iterator();
    Bytes* bytes = dictionary && found != dictionary->end() ? found->second.get<Bytes>() : nullptr;
    return bytes != nullptr ? std::move(*bytes) : Bytes();
}

Bytes archiveEntry(BytesView archive, const char* key)
{
    auto dictionary = platform::unarchiveDictionary(archive);
    return takeEntry(dictionary, key);
}

} // namespace

std::optional<Dictionary>
VireoLoopCombinedTagsChunkDataTypes::combinedTagsChunkDataDictionaryFromAifChunkData(BytesView archive)
{
    if (archive.empty())
        return std::nullopt;
    auto parts = platform::unarchiveDictionary(archive);
    return combinedTagsChunkDataDictionaryFromAifChunks(takeEntry(parts, VireoLoopCombinedBasicTaggingDataKey),
                                                        takeEntry(parts, VireoLoopCombinedCategoryDataKey));
}

Dictionary VireoLoopCombinedTagsChunkDataTypes::combinedTagsChunkDataDictionaryFromAifChunks(BytesView basicTaggingData,
                                                                                             BytesView categoryData)
{
    Dictionary tags;
    readBasicTagging(basicTaggingData, tags);
    readCategories(categoryData, tags);
    return tags;
}

std::optional<Bytes>
VireoLoopCombinedTagsChunkDataTypes::aifChunkDataFromCombinedTagsChunkDataDictionary(const Dictionary& tags)
{
    const BasicTaggingChunk basic = basicTaggingOf(tags);
    return combinedAifChunkDataFrom(std::as_bytes(std::span(&basic, 1)), categoriesOf(tags));
}

std::optional<Bytes> VireoLoopCombinedTagsChunkDataTypes::combinedAifChunkDataFrom(BytesView basicTaggingData,
                                                                                   BytesView categoryData)
{
    Dictionary parts;
    if (!basicTaggingData.empty())
        parts[VireoLoopCombinedBasicTaggingDataKey] = Bytes(basicTaggingData.begin(), basicTaggingData.end());
    if (!categoryData.empty())
        parts[VireoLoopCombinedCategoryDataKey] = Bytes(categoryData.begin(), categoryData.end());
    return platform::archiveDictionary(parts);
}

Bytes VireoLoopCombinedTagsChunkDataTypes::basicTaggingDataFromCombinedAidChunkData(BytesView archive)
{
    return archiveEntry(archive, VireoLoopCombinedBasicTaggingDataKey);
}

Bytes VireoLoopCombinedTagsChunkDataTypes::categoryDataFromCombinedAidChunkData(BytesView archive)
{
    return archiveEntry(archive, VireoLoopCombinedCategoryDataKey);
}
