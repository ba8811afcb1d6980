// Title, artist, copyright and comments as a dictionary, and its conversions from and to what AIFF and CAF files hold.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"
#include "platform/core/Value.h"

#include <optional>
#include <string>

// The keys of the dictionary; all values are texts.
inline constexpr const char* VireoLoopFileInfoChunkDataTitleKey = "VireoLoopFileInfoChunkDataTitle";
inline constexpr const char* VireoLoopFileInfoChunkDataArtistKey = "VireoLoopFileInfoChunkDataArtist";
inline constexpr const char* VireoLoopFileInfoChunkDataCopyrightKey = "VireoLoopFileInfoChunkDataCopyright";
inline constexpr const char* VireoLoopFileInfoChunkDataCommentsKey = "VireoLoopFileInfoChunkDataComments";

/// Class operations only. The AIFF and CAF forms are keyed archives of a dictionary of texts, under "NAME", "AUTH",
/// "(c) ", "COMT" and under "title", "artist", "copyright", "comments".
class KT_EXPORT VireoLoopFileInfoChunkDataTypes {
public:
    /// fileInfoChunkDataDictionaryFromAifChunkData: and its three siblings. Absent and empty values are left out.
    static platform::Dictionary fileInfoChunkDataDictionaryFromAifChunkData(BytesView archive);
    static std::optional<Bytes> aifChunkDataFromFileInfoChunkDataDictionary(const platform::Dictionary& info);
    static platform::Dictionary fileInfoChunkDataDictionaryFromCafChunkData(BytesView archive);
    static std::optional<Bytes> cafChunkDataFromFileInfoChunkDataDictionary(const platform::Dictionary& info);

    /// What the readers of archives give for the archive of these texts, without the archive: by AIFF key, and by CAF
    /// key as the "info" chunk has them.
    static platform::Dictionary fileInfoChunkDataDictionaryFromAifTexts(const platform::Dictionary& texts);
    static platform::Dictionary fileInfoChunkDataDictionaryFromCafInformation(const platform::Dictionary& information);

    /// fileInfoTypeForKey: — the AIFF chunk id; 0 for any other key.
    static std::uint32_t fileInfoTypeForKey(std::string_view key);
    /// fileInfoKeyForKey: — the key in the AIFF archive; "" for any other key.
    static std::string fileInfoKeyForKey(std::string_view key);
    /// aifChunkDataPartFromAifChunkData:forKey: — the bytes of one AIFF chunk; none when the value is absent or empty.
    static std::optional<Bytes> aifChunkDataPartFromAifChunkData(BytesView archive, std::string_view key);

    /// commentStringFromAifCommentChunkData: — the first comment of a "COMT" chunk; none when there is none.
    static std::optional<std::string> commentStringFromAifCommentChunkData(BytesView data);
    /// commentDataFromAifCommentChunkStrings: — a "COMT" chunk of one comment, at most 65,535 bytes of text.
    static Bytes commentDataFromAifCommentChunkStrings(std::string_view comment);

    /// cafFileInfoPropertyForMergingChunkDataDict:intoFileInfoPropertyDictionary: — `existing` with all four entries
    /// overwritten, by "" where `info` has no value.
    static platform::Dictionary cafFileInfoPropertyForMergingChunkDataDict(const platform::Dictionary& info,
                                                                           const platform::Dictionary& existing);
};
