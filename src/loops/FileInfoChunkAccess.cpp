#include "loops/FileInfoChunkAccess.h"

#include "loops/VireoLoopBaseChunk.h"
#include "loops/VireoLoopFileInfoChunkData.h"
#include "loops/VireoLoopUserDataUtils.h"
#include "platform/KeyedArchive.h"
#include "platform/String.h"
#include "platform/core/Status.h"

using InfoTypes = VireoLoopFileInfoChunkDataTypes;
using UserData = VireoLoopUserDataUtils;
using platform::Dictionary;

namespace {

constexpr const char* kKeys[] = {VireoLoopFileInfoChunkDataTitleKey, VireoLoopFileInfoChunkDataArtistKey,
                                 VireoLoopFileInfoChunkDataCopyrightKey, VireoLoopFileInfoChunkDataCommentsKey};

/// The text of an AIFF text chunk up to its first NUL; none if it is not UTF-8.
std::optional<std::string> textIn(std::string_view key, BytesView data)
{
    if (key == VireoLoopFileInfoChunkDataCommentsKey)
        return InfoTypes::commentStringFromAifCommentChunkData(data);
    const std::string_view text = textOf(data);
    const auto valid = platform::String::fromUTF8(text.substr(0, text.find('\0')));
    return valid ? std::optional(valid.utf8()) : std::nullopt;
}

} // namespace

void FileInfoCafChunkReader::readChunk()
{
    Dictionary information;
    if (file_.information(information) != kStatusOK)
        return;
    // The data object reads the archive, which holds UTF-8 only; entries of other programs may be in another encoding.
    std::erase_if(information, [](const auto& entry) {
        const auto* text = entry.second.template get<std::string>();
        return text == nullptr || !platform::String::fromUTF8(entry.first) || !platform::String::fromUTF8(*text);
    });
    // If the file holds none of these entries, the object stays as it is.
    if (auto* info = chunk_.chunkDataOfClass<VireoLoopFileInfoChunkData>()) { // without the detour through an archive
        if (Dictionary known = InfoTypes::fileInfoChunkDataDictionaryFromCafInformation(information); !known.empty())
            info->setDataDictionary(std::move(known));
        return;
    }
    const auto archive = platform::archiveDictionary(information);
    if (archive && !InfoTypes::fileInfoChunkDataDictionaryFromCafChunkData(*archive).empty())
        chunk_.chunkData().setChunkData(*archive, fourCC("caff"));
}

bool FileInfoCafChunkWriter::writeChunk()
{
    const auto archive = chunk_.chunkData().chunkDataForAudioFileType(fourCC("caff"));
    Dictionary information;
    if (!archive || file_.information(information) != kStatusOK)
        return false;
    const Dictionary info = InfoTypes::fileInfoChunkDataDictionaryFromCafChunkData(*archive);
    return file_.setInformation(InfoTypes::cafFileInfoPropertyForMergingChunkDataDict(info, information)) == kStatusOK;
}

bool FileInfoCafChunkRemover::removeChunk()
{
    Dictionary information;
    if (file_.information(information) != kStatusOK)
        return false;
    const std::size_t before = information.size();
    for (const auto& [key, empty] : InfoTypes::cafFileInfoPropertyForMergingChunkDataDict({}, {}))
        information.erase(key);
    return information.size() == before || file_.setInformation(information) == kStatusOK;
}

void FileInfoAifChunkReader::readChunk()
{
    Dictionary texts;
    for (const char* key : kKeys) {
        const auto data = UserData::read(file_, InfoTypes::fileInfoTypeForKey(key), 0);
        if (auto text = data ? textIn(key, *data) : std::nullopt)
            texts[InfoTypes::fileInfoKeyForKey(key)] = std::move(*text);
    }
    if (texts.empty())
        return;
    if (auto* info = chunk_.chunkDataOfClass<VireoLoopFileInfoChunkData>()) // without the detour through an archive
        return info->setDataDictionary(InfoTypes::fileInfoChunkDataDictionaryFromAifTexts(texts));
    if (const auto archive = platform::archiveDictionary(texts))
        chunk_.chunkData().setChunkData(*archive, fourCC("AIFF"));
}

bool FileInfoAifChunkWriter::writeChunk()
{
    const auto archive = chunk_.chunkData().chunkDataForAudioFileType(fourCC("AIFF"));
    if (!archive)
        return false;
    for (const char* key : kKeys) {
        const auto part = InfoTypes::aifChunkDataPartFromAifChunkData(*archive, key);
        if (part && !UserData::write(file_, InfoTypes::fileInfoTypeForKey(key), 0, *part))
            return false;
    }
    return true;
}

bool FileInfoAifChunkRemover::removeChunk()
{
    bool gone = true;
    for (const char* key : kKeys)
        gone = UserData::removeAll(file_, InfoTypes::fileInfoTypeForKey(key)) && gone;
    return gone;
}
