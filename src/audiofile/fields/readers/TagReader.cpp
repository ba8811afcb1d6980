#include "audiofile/fields/readers/TagReader.h"

#include "audiofile/FileWindow.h"
#include "audiofile/SoundProblem.h"
#include "media/containers/AudioHandle.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>
#include <utility>

namespace {

// Tagging systems, and the groups of their fields.
constexpr std::array<std::pair<std::string_view, std::string_view>, 7> kSystems = {{{"ID3v1", "id3v1"},
                                                                                    {"ID3v2", "id3v2"},
                                                                                    {"Vorbis comment", "vorbis"},
                                                                                    {"FLAC", "flac"},
                                                                                    {"APE", "ape"},
                                                                                    {"MP4", "mp4"},
                                                                                    {"ASF", "asf"}}};

std::string_view groupOf(std::string_view system)
{
    const auto found = std::ranges::find(kSystems, system, &std::pair<std::string_view, std::string_view>::first);
    return found == kSystems.end() ? "tag" : found->second;
}

/// Whether it is an audio file of any kind, with sound that can be read.
bool isAudio(const CFileRef& ref, platform::Error* error)
{
    const auto fail = [error](std::string description) {
        return platform::fail(error, kMetadataErrorDomain, static_cast<std::int64_t>(MetadataError::noAudio),
                              std::move(description));
    };
    CAudioFileIO audio;
    if (const std::int32_t status = audio.Open(ref, 0); status != kStatusOK)
        return platform::fail(error, platform::ErrorDomain::status, status, StatusText(status));
    platform::Error why;
    std::int32_t status = audio.InfoStatus();
    if (status == platform::AudioHandle::kFormatNotSupported)
        status = audio.OpenDecoder(&why);
    if (status == kStatusOK && (audio.Info().fileType != 0 || audio.InfoStatus() != kStatusOK))
        return true;
    if (status == platform::AudioHandle::kFormatNotSupported && why.code == status)
        return fail(why.description);
    const ContainerProblem problem = SoundProblem(audio);
    return fail(problem ? problem.Description() : StatusText(status));
}

} // namespace

void addTag(const platform::EmbeddedTag& tag, MetaFields& fields)
{
    for (const std::string& value : tag.values)
        fields.text(tag.key, value, tag.name == tag.key ? "" : tag.name);
    if (tag.values.empty())
        fields.preview(tag.key, tag.head, tag.size, tag.pictureKind.empty() ? tag.mimeType : tag.pictureKind);
}

std::optional<FileMetadata> readTags(CAudioFileIO& file, const CFileRef& ref, platform::Error* error)
{
    const CFileBytes bytes(file);
    std::vector<platform::EmbeddedTag> tags;
    platform::Error why;
    const std::int32_t status =
        platform::readEmbeddedTags(bytes, static_cast<std::uint64_t>(file.GetEOF()), tags, &why);
    const bool isDescribed = file.InfoStatus() == kStatusOK && file.Info().fileType != 0;
    if (tags.empty() && !isDescribed && !isAudio(ref, error))
        return std::nullopt;
    if (status != kStatusOK) {
        platform::fail(error, kMetadataErrorDomain, static_cast<std::int64_t>(MetadataError::badTag),
                       std::move(why.description));
        return std::nullopt;
    }
    MetaFields fields(0);
    for (const platform::EmbeddedTag& tag : tags) {
        fields.enterShared({}, groupOf(tag.system));
        addTag(tag, fields);
    }
    return FileMetadata{0, fields.take()};
}

std::span<const std::string_view> tagGroups()
{
    static const auto groups = [] {
        std::array<std::string_view, kSystems.size()> names;
        std::ranges::transform(kSystems, names.begin(), &std::pair<std::string_view, std::string_view>::second);
        return names;
    }();
    return groups;
}
