// Tags of the formats that the library does not annotate itself: ID3, Vorbis comments, APE, MP4 and ASF, each value
// under the key that stands in the file.
#pragma once

#include "media/containers/ByteSource.h"
#include "platform/core/Bytes.h"
#include "platform/core/Error.h"
#include "platform/core/Export.h"

#include <cstdint>
#include <string>
#include <vector>

namespace platform {

/// One entry of a tag. `values` is empty where it is no text: a picture, or bytes that only some program knows.
struct EmbeddedTag {
    static constexpr std::size_t kMaxHead = 64;

    std::string system; ///< where it stands: "ID3v1", "ID3v2", "Vorbis comment", "FLAC", "APE", "MP4", "ASF"
    /// As the system spells it ("TIT2", "©nam", "WM/AlbumTitle"), with what tells entries of one kind apart behind
    /// colons: "COMM:eng:notes" by language and description, "TXXX:BARCODE" by description, "PRIV:owner".
    std::string key;
    std::string name;                ///< what programs call it whatever the system ("TITLE"); empty for no common one
    std::vector<std::string> values; ///< in UTF-8
    std::string mimeType;            ///< of a picture or an attached file, as stated
    std::string pictureKind;         ///< of a picture: "Front Cover"…; empty for what is none
    std::string description;         ///< of a picture or an attached file
    std::uint64_t size = 0;          ///< of what is no text, in bytes
    Bytes head;                      ///< its first bytes, kMaxHead at most
};

/// The tags of an open file of `length` bytes, in the order in which the file's systems are read: MP3, AAC, FLAC, Ogg
/// (Vorbis, Opus, Speex, FLAC), MP4, APE, WavPack, Musepack, True Audio, ASF and DSF. Empty for what is none of these,
/// and for one without tags. By the module "ktfiles/libktfiles-tags.so" beside the library; without it
/// AudioHandle::kFormatNotSupported, and `error` (which may be null) names what to install. Else 0, or the status of a
/// read that failed.
KT_EXPORT std::int32_t readEmbeddedTags(const ByteSource& bytes, std::uint64_t length, std::vector<EmbeddedTag>& tags,
                                        Error* error);
/// The same of an ID3v2 tag alone, as WAVE ("id3 ") and AIFF ("ID3 ") files have it in a chunk.
KT_EXPORT std::int32_t readID3Chunk(BytesView chunk, std::vector<EmbeddedTag>& tags, Error* error);

/// What the module exports as "ktfiles_tagModule". Its function throws nothing.
struct TagModule {
    static constexpr std::uint32_t currentVersion = 1; // of this struct and of EmbeddedTag; another is not used

    std::uint32_t version;
    std::int32_t (*read)(const ByteSource& bytes, std::uint64_t length, std::vector<EmbeddedTag>& tags);
};

} // namespace platform
