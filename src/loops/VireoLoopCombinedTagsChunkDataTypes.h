// The musical tags of a loop as a dictionary, and its conversions from and to what AIFF and CAF files hold.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"
#include "platform/core/Value.h"

#include <map>
#include <optional>
#include <string>
#include <vector>

// The keys of the dictionary. Numbers are integers; descriptors are an array of texts, sorted and each once.
inline constexpr const char* VireoLoopCombinedTagsChunkDataBeatCountKey = "VireoLoopCombinedTagsChunkDataBeatCount";
inline constexpr const char* VireoLoopCombinedTagsChunkDataMidiRootNoteKey =
    "VireoLoopCombinedTagsChunkDataMidiRootNote";
// Kept: the one name of the family without "Key" at its end.
inline constexpr const char* VireoLoopCombinedTagsChunkDataKeyType = "VireoLoopCombinedTagsChunkDataKeyType";
inline constexpr const char* VireoLoopCombinedTagsChunkDataSignatureTopKey =
    "VireoLoopCombinedTagsChunkDataSignatureTop";
inline constexpr const char* VireoLoopCombinedTagsChunkDataSignatureBottomKey =
    "VireoLoopCombinedTagsChunkDataSignatureBottom";
inline constexpr const char* VireoLoopCombinedTagsChunkDataFileTypeKey = "VireoLoopCombinedTagsChunkDataFileType";
inline constexpr const char* VireoLoopCombinedTagsChunkDataInstrumentTypeKey =
    "VireoLoopCombinedTagsChunkDataInstrumentType";
inline constexpr const char* VireoLoopCombinedTagsChunkDataInstrumentSubTypeKey =
    "VireoLoopCombinedTagsChunkDataInstrumentSubType";
inline constexpr const char* VireoLoopCombinedTagsChunkDataGenreKey = "VireoLoopCombinedTagsChunkDataGenre";
inline constexpr const char* VireoLoopCombinedTagsChunkDataDescriptorsKey = "VireoLoopCombinedTagsChunkDataDescriptors";

// The entries of the archive in which an AIFF file's "basc" and "cate" travel together.
inline constexpr const char* VireoLoopCombinedBasicTaggingDataKey = "VireoLoopCombinedBasicTaggingData";
inline constexpr const char* VireoLoopCombinedCategoryDataKey = "VireoLoopCombinedCategoryData";

/// Class operations only.
class KT_EXPORT VireoLoopCombinedTagsChunkDataTypes {
public:
    /// The whole number under a key; 0 when there is none.
    static std::int64_t numberFor(const platform::Dictionary& tags, const char* key);

    /// combinedTagsChunkDataDictionaryFromAifChunkData: — `archive` is the combined form; none for empty bytes.
    static std::optional<platform::Dictionary> combinedTagsChunkDataDictionaryFromAifChunkData(BytesView archive);
    /// What the former gives for the archive of these parts, of which either may be empty, without the archive.
    static platform::Dictionary combinedTagsChunkDataDictionaryFromAifChunks(BytesView basicTaggingData,
                                                                             BytesView categoryData);
    /// aifChunkDataFromCombinedTagsChunkDataDictionary: — texts are cut at 49 bytes.
    static std::optional<Bytes> aifChunkDataFromCombinedTagsChunkDataDictionary(const platform::Dictionary& tags);
    /// combinedTagsChunkDataDictionaryFromCafChunkData: — `payload` is the string pairs behind the UUID.
    static platform::Dictionary combinedTagsChunkDataDictionaryFromCafChunkData(BytesView payload);
    /// cafChunkDataFromCombinedTagsChunkDataDictionary:
    static std::optional<Bytes> cafChunkDataFromCombinedTagsChunkDataDictionary(const platform::Dictionary& tags);

    using SearchInfo = std::map<std::string, std::vector<std::string>>;
    /// extractSearchInfoFromData: — each value of the pairs, split at its commas.
    static SearchInfo extractSearchInfoFromData(BytesView payload);
    /// rootNoteKeyFromCafDict: — a MIDI note from "key signature"; 0 when there is none.
    static std::int64_t rootNoteKeyFromCafDict(const SearchInfo& info);
    /// keyTypeFromCafDict:
    static std::int64_t keyTypeFromCafDict(const SearchInfo& info);

    /// combinedAifChunkDataFrom:andCategoryData: — an empty part is left out.
    static std::optional<Bytes> combinedAifChunkDataFrom(BytesView basicTaggingData, BytesView categoryData);
    /// basicTaggingDataFromCombinedAidChunkData: and categoryDataFromCombinedAidChunkData: (Kept: "Aid") — empty when
    /// the archive has no such entry.
    static Bytes basicTaggingDataFromCombinedAidChunkData(BytesView archive);
    static Bytes categoryDataFromCombinedAidChunkData(BytesView archive);
};
