// Tags of the formats that the library does not annotate itself: ID3, Vorbis comments, APE, MP4 and ASF, each value
// under the key that the file has.
#pragma once

#include "media/containers/ByteSource.h"
#include "platform/core/Bytes.h"
#include "platform/core/Error.h"
#include "platform/core/Export.h"

#include <cstdint>
#include <string>
#include <vector>

namespace platform {

/// One entry of a tag. `values` is empty for an entry that is no text: a picture, or bytes that only some program
/// understands.
struct EmbeddedTag {
    static constexpr std::size_t kMaxHead = 64; // bytes of `head`

    std::string system; ///< the tag system: "ID3v1", "ID3v2", "Vorbis comment", "FLAC", "APE", "MP4", "ASF"
    /// As the system spells it ("TIT2", "©nam", "WM/AlbumTitle"), followed by a colon and what distinguishes entries
    /// of one kind: "COMM:eng:notes" by language and description, "TXXX:BARCODE" by description, "PRIV:owner".
    std::string key;
    std::string name;                ///< what programs call it whatever the system ("TITLE"); empty for no common one
    std::vector<std::string> values; ///< in UTF-8
    std::string mimeType;            ///< of a picture or an attached file, as stated
    std::string pictureKind;         ///< of a picture: "Front Cover"…; empty for what is none
    std::string description;         ///< of a picture or an attached file
    std::uint64_t size = 0;          ///< of what is no text, in bytes
    Bytes head;                      ///< its first bytes, kMaxHead at most
};

/// Reads the tags of an open file of `length` bytes, in the order of the file's systems: MP3, AAC, FLAC, Ogg (Vorbis,
/// Opus, Speex, FLAC), MP4, APE, WavPack, Musepack, True Audio, ASF and DSF. Empty for other files and for files
/// without tags. Needs the module "ktfiles/libktfiles-tags.so" beside the library: without it
/// AudioHandle::kFormatNotSupported, and `error` (may be null) names what to install. Else 0, or the status of a
/// failed read.
KT_EXPORT std::int32_t readEmbeddedTags(const ByteSource& bytes, std::uint64_t length, std::vector<EmbeddedTag>& tags,
                                        Error* error);
/// Reads an ID3v2 tag alone, which WAVE ("id3 ") and AIFF ("ID3 ") files have in a chunk.
KT_EXPORT std::int32_t readID3Chunk(BytesView chunk, std::vector<EmbeddedTag>& tags, Error* error);

/// What the module exports as "ktfiles_tagModule". Its function throws nothing.
struct TagModule {
    static constexpr std::uint32_t currentVersion = 1; // of this struct and of EmbeddedTag; another is not used

    std::uint32_t version; // as currentVersion when the module was built
    /// does the work of readEmbeddedTags()
    std::int32_t (*read)(const ByteSource& bytes, std::uint64_t length, std::vector<EmbeddedTag>& tags);
};

} // namespace platform
