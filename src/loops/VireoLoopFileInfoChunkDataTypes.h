// Title, artist, copyright and comments as a dictionary, and conversions between it and the bytes of AIFF and CAF
// files.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"
#include "platform/core/Value.h"

#include <optional>
#include <string>

/// Each a key of the dictionary, whose values are texts.
inline constexpr const char* VireoLoopFileInfoChunkDataTitleKey = "VireoLoopFileInfoChunkDataTitle";
inline constexpr const char* VireoLoopFileInfoChunkDataArtistKey = "VireoLoopFileInfoChunkDataArtist";
inline constexpr const char* VireoLoopFileInfoChunkDataCopyrightKey = "VireoLoopFileInfoChunkDataCopyright";
inline constexpr const char* VireoLoopFileInfoChunkDataCommentsKey = "VireoLoopFileInfoChunkDataComments";

/// The conversions; static functions only. The AIFF and CAF forms are keyed archives of a dictionary of texts, under
/// "NAME", "AUTH", "(c) ", "COMT" and under "title", "artist", "copyright", "comments".
class KT_EXPORT VireoLoopFileInfoChunkDataTypes {
public:
    /// `fileInfoChunkDataDictionaryFromAifChunkData:` and its three siblings: each converts between the dictionary
    /// and an archive. Absent and empty values are left out.
    static platform::Dictionary fileInfoChunkDataDictionaryFromAifChunkData(BytesView archive);
    static std::optional<Bytes> aifChunkDataFromFileInfoChunkDataDictionary(const platform::Dictionary& info);
    static platform::Dictionary fileInfoChunkDataDictionaryFromCafChunkData(BytesView archive);
    static std::optional<Bytes> cafChunkDataFromFileInfoChunkDataDictionary(const platform::Dictionary& info);

    /// Each the dictionary that the archive of these texts would give, without making it: by AIFF key, and by CAF key
    /// as the "info" chunk has them.
    static platform::Dictionary fileInfoChunkDataDictionaryFromAifTexts(const platform::Dictionary& texts);
    static platform::Dictionary fileInfoChunkDataDictionaryFromCafInformation(const platform::Dictionary& information);

    /// `fileInfoTypeForKey:`: the AIFF chunk id; 0 for any other key.
    static std::uint32_t fileInfoTypeForKey(std::string_view key);
    /// `fileInfoKeyForKey:`: the key in the AIFF archive; "" for any other key.
    static std::string fileInfoKeyForKey(std::string_view key);
    /// `aifChunkDataPartFromAifChunkData:forKey:`: the bytes of one AIFF chunk; null when the value is absent or
    /// empty.
    static std::optional<Bytes> aifChunkDataPartFromAifChunkData(BytesView archive, std::string_view key);

    /// `commentStringFromAifCommentChunkData:`: the first comment of a "COMT" chunk; null when there is none.
    static std::optional<std::string> commentStringFromAifCommentChunkData(BytesView data);
    /// `commentDataFromAifCommentChunkStrings:`: a "COMT" chunk of one comment, at most 65,535 bytes of text.
    static Bytes commentDataFromAifCommentChunkStrings(std::string_view comment);

    /// `cafFileInfoPropertyForMergingChunkDataDict:intoFileInfoPropertyDictionary:`: `existing` with all four entries
    /// overwritten, with "" where `info` has no value.
    static platform::Dictionary cafFileInfoPropertyForMergingChunkDataDict(const platform::Dictionary& info,
                                                                           const platform::Dictionary& existing);
};
