// The tags of files that have no chunks: MP3, AAC, FLAC, Ogg, MP4, APE, WavPack, Musepack, ASF, DSF.
#pragma once

#include "audiofile/CAudioFileIO.h"
#include "media/tags/EmbeddedTags.h"
#include "tool/meta/FileMetadata.h"

#include <span>

/// The values of a tag as fields of what was entered, each under its key.
void addTag(const platform::EmbeddedTag& tag, MetaFields& fields);

/// Throws Failure; for what is no audio file that of `info`.
FileMetadata readTags(CAudioFileIO& file, const std::string& path);

/// The groups of their fields, in small letters.
std::span<const std::string_view> tagGroups();
