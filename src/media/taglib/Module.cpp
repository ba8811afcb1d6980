// The module's entry point.
#include "media/taglib/ChapterIds.h"
#include "media/taglib/SourceStream.h"
#include "media/taglib/TagEntries.h"
#include "platform/core/Export.h"
#include "platform/core/Packed.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>
#include <limits>
#include <new>
#include <string_view>
#include <taglib/apefile.h>
#include <taglib/asffile.h>
#include <taglib/flacfile.h>
#include <taglib/mp4file.h>
#include <taglib/mpcfile.h>
#include <taglib/mpegfile.h>
#include <taglib/oggflacfile.h>
#include <taglib/opusfile.h>
#include <taglib/speexfile.h>
#include <taglib/trueaudiofile.h>
#include <taglib/vorbisfile.h>
#include <taglib/wavpackfile.h>

namespace {

using namespace platform;
using platform::taglib::Entries;
using platform::taglib::SourceStream;

/// Position of the tags in a DSF file, from its header (DSF 1.01); 0 if there are none.
std::uint64_t tagsOfDSF(BytesView start)
{
    constexpr std::size_t kHeaderSize = 28, kPointer = 20;
    return start.size() >= kHeaderSize && textOf(start).starts_with("DSD ") ? loadLE<std::uint64_t>(&start[kPointer])
                                                                            : 0;
}

void addMPEG(TagLib::MPEG::File& file, Entries& entries)
{
    if (file.hasID3v2Tag())
        taglib::addID3v2(*file.ID3v2Tag(), entries);
    if (file.hasAPETag())
        taglib::addAPE(*file.APETag(), entries);
    if (file.hasID3v1Tag())
        taglib::addID3v1(*file.ID3v1Tag(), entries);
}

void addFLAC(TagLib::FLAC::File& file, Entries& entries)
{
    if (file.hasID3v2Tag())
        taglib::addID3v2(*file.ID3v2Tag(), entries);
    if (file.hasXiphComment())
        taglib::addVorbisComment(*file.xiphComment(), entries);
    taglib::addPictures(file.pictureList(), "FLAC", entries);
    if (file.hasID3v1Tag())
        taglib::addID3v1(*file.ID3v1Tag(), entries);
}

/// For APE, Musepack and WavPack.
template <typename File>
void addAPEFile(File& file, Entries& entries)
{
    if (file.hasAPETag())
        taglib::addAPE(*file.APETag(), entries);
    if (file.hasID3v1Tag())
        taglib::addID3v1(*file.ID3v1Tag(), entries);
}

void addTrueAudio(TagLib::TrueAudio::File& file, Entries& entries)
{
    if (file.hasID3v2Tag())
        taglib::addID3v2(*file.ID3v2Tag(), entries);
    if (file.hasID3v1Tag())
        taglib::addID3v1(*file.ID3v1Tag(), entries);
}

/// For the kinds of Ogg.
template <typename File>
void addComment(File& file, Entries& entries)
{
    if (file.tag() != nullptr)
        taglib::addVorbisComment(*file.tag(), entries);
}

void addMP4File(TagLib::MP4::File& file, Entries& entries)
{
    if (file.tag() != nullptr)
        taglib::addMP4(*file.tag(), entries);
}

void addASFFile(TagLib::ASF::File& file, Entries& entries)
{
    if (file.tag() != nullptr)
        taglib::addASF(*file.tag(), entries);
}

/// Whether the stream is a file of this class; if so, adds its entries.
template <typename File>
bool addedAs(void (*add)(File&, Entries&), SourceStream& stream, Entries& entries)
{
    if (!File::isSupported(&stream))
        return false;
    stream.seek(0, SourceStream::Beginning);
    File file(&stream, false);
    if (file.isValid())
        add(file, entries);
    return true;
}

/// As above, for classes whose tags may be ID3v2.
template <typename File>
bool addedWithFrames(void (*add)(File&, Entries&), SourceStream& stream, Entries& entries)
{
    if (!File::isSupported(&stream))
        return false;
    stream.seek(0, SourceStream::Beginning);
    File file(&stream, TagLib::ID3v2::FrameFactory::instance(), false);
    if (file.isValid())
        add(file, entries);
    return true;
}

/// Whether the file may be MPEG audio whose frames TagLib does not recognize: AAC, or a tag alone.
bool mayBeTaggedMPEG(BytesView start)
{
    const bool isSync =
        start.size() >= 2 && start[0] == std::byte{0xFF} && (start[1] & std::byte{0xE0}) == std::byte{0xE0};
    return isSync || textOf(start).starts_with("ID3");
}

/// Containers that the library reads itself, some of which TagLib knows too.
bool isOwnContainer(BytesView start)
{
    constexpr std::array<std::string_view, 6> ids = {"RIFF", "RIFX", "RF64", "BW64", "FORM", "caff"};
    return std::any_of(ids.begin(), ids.end(), [&](std::string_view id) { return textOf(start).starts_with(id); });
}

void showHidden(EmbeddedTag& entry)
{
    taglib::showChapterIds(entry.key);
    taglib::showChapterIds(entry.name);
    taglib::showChapterIds(entry.description);
    for (std::string& value : entry.values)
        taglib::showChapterIds(value);
}

std::int32_t readThrowing(const ByteSource& bytes, std::uint64_t length, Entries& entries)
{
    std::array<std::byte, 32> first{};
    std::size_t got = 0;
    if (const std::int32_t status = bytes.readSome(0, first.data(), first.size(), got); status != kStatusOK)
        return status;
    const BytesView start(first.data(), got);
    const std::uint64_t skipped = tagsOfDSF(start);
    constexpr auto kLongest = static_cast<std::uint64_t>(std::numeric_limits<long>::max());
    if (isOwnContainer(start) || skipped >= length || length > kLongest)
        return kStatusOK;

    SourceStream stream(bytes, skipped, static_cast<long>(length - skipped));
    const bool isTagAlone = skipped > 0;
    // The order matters: little identifies MPEG audio, but nothing else is mistaken for it.
    const bool isKnown =
        !isTagAlone &&
        (addedWithFrames(addMPEG, stream, entries) || addedAs(addComment<TagLib::Ogg::Vorbis::File>, stream, entries) ||
         addedAs(addComment<TagLib::Ogg::FLAC::File>, stream, entries) || addedWithFrames(addFLAC, stream, entries) ||
         addedAs(addAPEFile<TagLib::MPC::File>, stream, entries) ||
         addedAs(addAPEFile<TagLib::WavPack::File>, stream, entries) ||
         addedAs(addComment<TagLib::Ogg::Speex::File>, stream, entries) ||
         addedAs(addComment<TagLib::Ogg::Opus::File>, stream, entries) ||
         addedWithFrames(addTrueAudio, stream, entries) || addedAs(addMP4File, stream, entries) ||
         addedAs(addASFFile, stream, entries) || addedAs(addAPEFile<TagLib::APE::File>, stream, entries));
    if (isTagAlone || (!isKnown && mayBeTaggedMPEG(start))) {
        stream.seek(0, SourceStream::Beginning);
        TagLib::MPEG::File mpeg(&stream, TagLib::ID3v2::FrameFactory::instance(), false);
        addMPEG(mpeg, entries);
    }
    for (EmbeddedTag& entry : entries)
        showHidden(entry);
    if (stream.status() != kStatusOK)
        entries.clear();
    return stream.status();
}

/// Keeps exceptions from crossing the module's border.
std::int32_t read(const ByteSource& bytes, std::uint64_t length, std::vector<EmbeddedTag>& tags)
{
    try {
        return readThrowing(bytes, length, tags);
    } catch (const std::bad_alloc&) {
        return kStatusOutOfMemory;
    } catch (...) {
        return kStatusIOError;
    }
}

} // namespace

extern "C" KT_EXPORT const platform::TagModule ktfiles_tagModule;
const platform::TagModule ktfiles_tagModule = {
    .version = platform::TagModule::currentVersion,
    .read = read,
};
