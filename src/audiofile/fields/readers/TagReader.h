// Reads the tags of files without chunks: MP3, AAC, FLAC, Ogg, MP4, APE, WavPack, Musepack, ASF, DSF.
#pragma once

#include "audiofile/CAudioFileIO.h"
#include "audiofile/fields/FileMetadata.h"
#include "audiofile/fields/readers/MetaFields.h"
#include "media/tags/EmbeddedTags.h"

#include <span>

/// Adds the values of a tag as fields of the entered chunk, under their keys.
void addTag(const platform::EmbeddedTag& tag, MetaFields& fields);

/// Reads the tags of the open file `ref`. None if it is no audio file.
std::optional<FileMetadata> readTags(CAudioFileIO& file, const CFileRef& ref, platform::Error* error);

/// The groups of the tags' fields, in lower case.
std::span<const std::string_view> tagGroups();
