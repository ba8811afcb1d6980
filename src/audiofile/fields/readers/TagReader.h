// The tags of files that have no chunks: MP3, AAC, FLAC, Ogg, MP4, APE, WavPack, Musepack, ASF, DSF.
#pragma once

#include "audiofile/CAudioFileIO.h"
#include "audiofile/fields/FileMetadata.h"
#include "audiofile/fields/readers/MetaFields.h"
#include "media/tags/EmbeddedTags.h"

#include <span>

/// The values of a tag as fields of what was entered, each under its key.
void addTag(const platform::EmbeddedTag& tag, MetaFields& fields);

/// Of the open file `ref`. None for what is no audio file.
std::optional<FileMetadata> readTags(CAudioFileIO& file, const CFileRef& ref, platform::Error* error);

/// The groups of their fields, in small letters.
std::span<const std::string_view> tagGroups();
