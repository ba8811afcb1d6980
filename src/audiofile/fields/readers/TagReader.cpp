#include "tool/meta/TagReader.h"

#include "audiofile/FileWindow.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"

#include <algorithm>
#include <array>
#include <utility>

namespace {

// The systems of tags, and the groups that their fields are of.
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

} // namespace

void addTag(const platform::EmbeddedTag& tag, MetaFields& fields)
{
    for (const std::string& value : tag.values)
        fields.text(tag.key, value, tag.name == tag.key ? "" : tag.name);
    if (tag.values.empty())
        fields.preview(tag.key, tag.head, tag.size, tag.pictureKind.empty() ? tag.mimeType : tag.pictureKind);
}

FileMetadata readTags(CAudioFileIO& file, const std::string& path)
{
    const CFileBytes bytes(file);
    std::vector<platform::EmbeddedTag> tags;
    platform::Error error;
    const std::int32_t status =
        platform::readEmbeddedTags(bytes, static_cast<std::uint64_t>(file.GetEOF()), tags, &error);
    if (tags.empty()) {
        CAudioFileIO audio;
        openAudio(audio, path);
    }
    if (status != kStatusOK)
        throw Failure(error.description);
    MetaFields fields(0);
    for (const platform::EmbeddedTag& tag : tags) {
        fields.enterShared({}, groupOf(tag.system));
        addTag(tag, fields);
    }
    return {0, fields.take()};
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
