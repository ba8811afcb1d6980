#include "loops/VireoLoopFileInfoChunkDataTypes.h"

#include "platform/KeyedArchive.h"
#include "platform/String.h"
#include "platform/core/ByteReader.h"
#include "platform/core/ByteWriter.h"
#include "platform/core/FourCC.h"

#include <limits>

using platform::Dictionary;

namespace {

struct FileInfoKey {
    const char* key;
    FourCC chunkID;
    const char* aiffKey;
    const char* cafKey;
};

constexpr FileInfoKey kFileInfoKeys[] = {
    {VireoLoopFileInfoChunkDataTitleKey, fourCC("NAME"), "NAME", "title"},
    {VireoLoopFileInfoChunkDataArtistKey, fourCC("AUTH"), "AUTH", "artist"},
    {VireoLoopFileInfoChunkDataCopyrightKey, fourCC("(c) "), "(c) ", "copyright"},
    {VireoLoopFileInfoChunkDataCommentsKey, fourCC("COMT"), "COMT", "comments"},
};

const FileInfoKey* rowOf(std::string_view key)
{
    for (const FileInfoKey& row : kFileInfoKeys)
        if (key == row.key)
            return &row;
    return nullptr;
}

std::string textFor(const Dictionary& dictionary, std::string_view key)
{
    const auto* text = platform::find<std::string>(dictionary, key);
    return text != nullptr ? *text : std::string();
}

/// The texts of `from` under other keys, without empty ones.
Dictionary rekeyed(const Dictionary& from, const char* FileInfoKey::*fromKey, const char* FileInfoKey::*toKey)
{
    Dictionary to;
    for (const FileInfoKey& row : kFileInfoKeys)
        if (std::string text = textFor(from, row.*fromKey); !text.empty())
            to[row.*toKey] = std::move(text);
    return to;
}

/// The size of the white space character that a text begins or ends with; 0 if it has none. White space is Unicode's,
/// in UTF-8, and NUL.
std::size_t whiteSpaceAt(std::string_view text, bool (std::string_view::*isAt)(std::string_view) const noexcept)
{
    using namespace std::string_view_literals;
    static constexpr std::string_view spaces[] = {
        " "sv,      "\t"sv,     "\n"sv,     "\v"sv,     "\f"sv,     "\r"sv,     "\0"sv,     "\xC2\x85"sv, "\u00A0"sv,
        "\u1680"sv, "\u2000"sv, "\u2001"sv, "\u2002"sv, "\u2003"sv, "\u2004"sv, "\u2005"sv, "\u2006"sv,   "\u2007"sv,
        "\u2008"sv, "\u2009"sv, "\u200A"sv, "\u2028"sv, "\u2029"sv, "\u202F"sv, "\u205F"sv, "\u3000"sv};
    for (const std::string_view space : spaces)
        if ((text.*isAt)(space))
            return space.size();
    return 0;
}

std::string_view trimmed(std::string_view text)
{
    while (const std::size_t size = whiteSpaceAt(text, &std::string_view::starts_with))
        text.remove_prefix(size);
    while (const std::size_t size = whiteSpaceAt(text, &std::string_view::ends_with))
        text.remove_suffix(size);
    return text;
}

} // namespace

Dictionary VireoLoopFileInfoChunkDataTypes::fileInfoChunkDataDictionaryFromAifChunkData(BytesView archive)
{
    return fileInfoChunkDataDictionaryFromAifTexts(platform::unarchiveDictionary(archive).value_or(Dictionary()));
}

std::optional<Bytes>
VireoLoopFileInfoChunkDataTypes::aifChunkDataFromFileInfoChunkDataDictionary(const Dictionary& info)
{
    return platform::archiveDictionary(rekeyed(info, &FileInfoKey::key, &FileInfoKey::aiffKey));
}

Dictionary VireoLoopFileInfoChunkDataTypes::fileInfoChunkDataDictionaryFromCafChunkData(BytesView archive)
{
    return fileInfoChunkDataDictionaryFromCafInformation(platform::unarchiveDictionary(archive).value_or(Dictionary()));
}

std::optional<Bytes>
VireoLoopFileInfoChunkDataTypes::cafChunkDataFromFileInfoChunkDataDictionary(const Dictionary& info)
{
    return platform::archiveDictionary(rekeyed(info, &FileInfoKey::key, &FileInfoKey::cafKey));
}

Dictionary VireoLoopFileInfoChunkDataTypes::fileInfoChunkDataDictionaryFromAifTexts(const Dictionary& texts)
{
    return rekeyed(texts, &FileInfoKey::aiffKey, &FileInfoKey::key);
}

Dictionary VireoLoopFileInfoChunkDataTypes::fileInfoChunkDataDictionaryFromCafInformation(const Dictionary& information)
{
    return rekeyed(information, &FileInfoKey::cafKey, &FileInfoKey::key);
}

std::uint32_t VireoLoopFileInfoChunkDataTypes::fileInfoTypeForKey(std::string_view key)
{
    const FileInfoKey* row = rowOf(key);
    return row != nullptr ? row->chunkID : 0;
}

std::string VireoLoopFileInfoChunkDataTypes::fileInfoKeyForKey(std::string_view key)
{
    const FileInfoKey* row = rowOf(key);
    return row != nullptr ? row->aiffKey : "";
}

std::optional<Bytes> VireoLoopFileInfoChunkDataTypes::aifChunkDataPartFromAifChunkData(BytesView archive,
                                                                                       std::string_view key)
{
    const auto dictionary = platform::unarchiveDictionary(archive);
    const std::string text = dictionary ? textFor(*dictionary, fileInfoKeyForKey(key)) : std::string();
    if (text.empty())
        return std::nullopt;
    if (key == VireoLoopFileInfoChunkDataCommentsKey)
        return commentDataFromAifCommentChunkStrings(text);
    const BytesView bytes = bytesOf(text);
    return Bytes(bytes.begin(), bytes.end());
}

std::optional<std::string> VireoLoopFileInfoChunkDataTypes::commentStringFromAifCommentChunkData(BytesView data)
{
    ByteReader reader(data);
    if (reader.read<std::uint16_t>() == 0)
        return std::nullopt;
    reader.skip(6); // time stamp and marker id
    const std::size_t claimed = reader.read<std::uint16_t>();
    if (!reader.ok())
        return std::nullopt;
    const std::string_view there = textOf(reader.take(std::min(claimed, reader.remaining())));
    const auto text = platform::String::fromUTF8(trimmed(there));
    return text ? std::optional(text.utf8()) : std::nullopt;
}

Bytes VireoLoopFileInfoChunkDataTypes::commentDataFromAifCommentChunkStrings(std::string_view comment)
{
    // Kept: the format has a space ahead of the text and 8 zero bytes behind it, which no count includes.
    std::string text = " " + std::string(trimmed(comment));
    constexpr std::size_t limit = std::numeric_limits<std::uint16_t>::max();
    if (text.size() > limit) {
        text.resize(limit);
        while (!platform::String::fromUTF8(text) && text.size() > limit - 4)
            text.pop_back(); // a character that was cut in two
    }
    ByteWriter writer;
    writer.write(std::uint16_t{1}); // comments
    writer.writeZeros(6);           // time stamp and marker id
    writer.write(static_cast<std::uint16_t>(text.size()));
    writer.write(bytesOf(text));
    writer.writeZeros(8);
    return writer.take();
}

Dictionary VireoLoopFileInfoChunkDataTypes::cafFileInfoPropertyForMergingChunkDataDict(const Dictionary& info,
                                                                                       const Dictionary& existing)
{
    Dictionary merged = existing;
    for (const FileInfoKey& row : kFileInfoKeys)
        merged[row.cafKey] = textFor(info, row.key);
    return merged;
}
