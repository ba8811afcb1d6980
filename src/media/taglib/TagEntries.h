// The entries of each tagging system, as TagLib presents them.
#pragma once

#include "media/tags/EmbeddedTags.h"

#include <string>
#include <taglib/apetag.h>
#include <taglib/asftag.h>
#include <taglib/flacpicture.h>
#include <taglib/id3v1tag.h>
#include <taglib/id3v2tag.h>
#include <taglib/mp4tag.h>
#include <taglib/tpropertymap.h>
#include <taglib/xiphcomment.h>
#include <vector>

namespace platform::taglib {

using Entries = std::vector<EmbeddedTag>;

void addID3v1(const TagLib::ID3v1::Tag& tag, Entries& entries);
void addID3v2(const TagLib::ID3v2::Tag& tag, Entries& entries);
void addVorbisComment(TagLib::Ogg::XiphComment& comment, Entries& entries);
void addPictures(const TagLib::List<TagLib::FLAC::Picture*>& pictures, const char* system, Entries& entries);
void addAPE(TagLib::APE::Tag& tag, Entries& entries);
void addMP4(TagLib::MP4::Tag& tag, Entries& entries);
void addASF(TagLib::ASF::Tag& tag, Entries& entries);

// Shared by all systems.

inline std::string utf8(const TagLib::String& text)
{
    return text.to8Bit(true);
}

/// Corrects `text`, which was read as Latin-1, by common use: bytes that are UTF-8 are read as UTF-8.
TagLib::String byUse(const TagLib::String& text);
EmbeddedTag textEntry(const char* system, std::string key, const TagLib::StringList& values);
/// An entry for `bytes` that are not text.
EmbeddedTag dataEntry(const char* system, std::string key, const TagLib::ByteVector& bytes);
/// The common name of an entry, if `properties`, TagLib's view of it, has exactly one.
std::string commonName(const TagLib::PropertyMap& properties);
/// "Front Cover" and so on, by the number that ID3v2 and FLAC share.
std::string pictureKind(int number);

} // namespace platform::taglib
