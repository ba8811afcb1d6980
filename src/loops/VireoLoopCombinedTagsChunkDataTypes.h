// The musical tags of a loop as a dictionary, and conversions between it and the bytes of AIFF and CAF files.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"
#include "platform/core/Value.h"

#include <map>
#include <optional>
#include <string>
#include <vector>

/// The keys of the dictionary. Numbers are integers; descriptors are an array of texts, sorted and each once.
/// in the whole loop
inline constexpr const char* VireoLoopCombinedTagsChunkDataBeatCountKey = "VireoLoopCombinedTagsChunkDataBeatCount";
/// A MIDI note.
inline constexpr const char* VireoLoopCombinedTagsChunkDataMidiRootNoteKey =
    "VireoLoopCombinedTagsChunkDataMidiRootNote";
// Kept: the one name of the family without "Key" at its end.
/// 0 none, 1 minor, 2 major, 3 neither, 4 both
inline constexpr const char* VireoLoopCombinedTagsChunkDataKeyType = "VireoLoopCombinedTagsChunkDataKeyType";
/// Beats in a bar.
inline constexpr const char* VireoLoopCombinedTagsChunkDataSignatureTopKey =
    "VireoLoopCombinedTagsChunkDataSignatureTop";
/// The note that is one beat.
inline constexpr const char* VireoLoopCombinedTagsChunkDataSignatureBottomKey =
    "VireoLoopCombinedTagsChunkDataSignatureBottom";
/// 1: a loop
inline constexpr const char* VireoLoopCombinedTagsChunkDataFileTypeKey = "VireoLoopCombinedTagsChunkDataFileType";
/// Such as "Bass".
inline constexpr const char* VireoLoopCombinedTagsChunkDataInstrumentTypeKey =
    "VireoLoopCombinedTagsChunkDataInstrumentType";
/// Such as "Synthetic Bass".
inline constexpr const char* VireoLoopCombinedTagsChunkDataInstrumentSubTypeKey =
    "VireoLoopCombinedTagsChunkDataInstrumentSubType";
/// such as "Electronic"
inline constexpr const char* VireoLoopCombinedTagsChunkDataGenreKey = "VireoLoopCombinedTagsChunkDataGenre";
/// Such as "Dry".
inline constexpr const char* VireoLoopCombinedTagsChunkDataDescriptorsKey = "VireoLoopCombinedTagsChunkDataDescriptors";

// The entries of the archive in which an AIFF file's "basc" and "cate" travel together.
/// bytes of "basc"
inline constexpr const char* VireoLoopCombinedBasicTaggingDataKey = "VireoLoopCombinedBasicTaggingData";
inline constexpr const char* VireoLoopCombinedCategoryDataKey = "VireoLoopCombinedCategoryData"; // bytes of "cate"

/// The conversions; static functions only.
class KT_EXPORT VireoLoopCombinedTagsChunkDataTypes {
public:
    /// The whole number under a key; 0 when there is none.
    static std::int64_t numberFor(const platform::Dictionary& tags, const char* key);

    /// `combinedTagsChunkDataDictionaryFromAifChunkData:`: the tags of an archive of both chunks; null for empty
    /// bytes.
    static std::optional<platform::Dictionary> combinedTagsChunkDataDictionaryFromAifChunkData(BytesView archive);
    /// The tags of the archive of these parts, without making it; either part may be empty.
    static platform::Dictionary combinedTagsChunkDataDictionaryFromAifChunks(BytesView basicTaggingData,
                                                                             BytesView categoryData);
    /// `aifChunkDataFromCombinedTagsChunkDataDictionary:`: the archive; texts are cut at 49 bytes.
    static std::optional<Bytes> aifChunkDataFromCombinedTagsChunkDataDictionary(const platform::Dictionary& tags);
    /// `combinedTagsChunkDataDictionaryFromCafChunkData:`: the tags of the string pairs after the UUID.
    static platform::Dictionary combinedTagsChunkDataDictionaryFromCafChunkData(BytesView payload);
    /// `cafChunkDataFromCombinedTagsChunkDataDictionary:`: the string pairs.
    static std::optional<Bytes> cafChunkDataFromCombinedTagsChunkDataDictionary(const platform::Dictionary& tags);

    /// Key to values.
    using SearchInfo = std::map<std::string, std::vector<std::string>>;
    /// `extractSearchInfoFromData:`: each value of the pairs, split at its commas.
    static SearchInfo extractSearchInfoFromData(BytesView payload);
    /// `rootNoteKeyFromCafDict:`: a MIDI note from "key signature"; 0 for none.
    static std::int64_t rootNoteKeyFromCafDict(const SearchInfo& info);
    /// `keyTypeFromCafDict:`: the key type, 0 for none.
    static std::int64_t keyTypeFromCafDict(const SearchInfo& info);

    /// `combinedAifChunkDataFrom:andCategoryData:`: the archive of both chunks; an empty part is left out.
    static std::optional<Bytes> combinedAifChunkDataFrom(BytesView basicTaggingData, BytesView categoryData);
    /// `basicTaggingDataFromCombinedAidChunkData:`, `categoryDataFromCombinedAidChunkData:` (Kept: "Aid"): each a
    /// part of the archive; empty when it has none.
    static Bytes basicTaggingDataFromCombinedAidChunkData(BytesView archive);
    static Bytes categoryDataFromCombinedAidChunkData(BytesView archive);
};
