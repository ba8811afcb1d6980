#include "tool/page/PageRow.h"

#include "tool/page/PageWave.h"
#include "tool/shared/indexing/BoundedText.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cmath>
#include <sys/stat.h>

namespace {

// Containers with what is in them; an empty coding stands for all.
struct PlayedType {
    std::string_view container, coding;
    const char* type;
    bool everywhere;
};
constexpr std::array kPlayedTypes = {
    PlayedType{"WAVE", "PCM", "audio/wav", true},
    PlayedType{"MP3", "", "audio/mpeg", true},
    PlayedType{"FLAC", "", "audio/flac", true},
    PlayedType{"M4A", "AAC-LC", "audio/mp4; codecs=\"mp4a.40.2\"", true},
    PlayedType{"MP4", "AAC-LC", "audio/mp4; codecs=\"mp4a.40.2\"", true},
    PlayedType{"AAC", "", "audio/aac", true},
    PlayedType{"Ogg", "Vorbis", "audio/ogg; codecs=\"vorbis\"", false},
    PlayedType{"Ogg", "Opus", "audio/ogg; codecs=\"opus\"", false},
    PlayedType{"Ogg", "FLAC", "audio/ogg; codecs=\"flac\"", false},
    PlayedType{"M4A", "ALAC", "audio/mp4; codecs=\"alac\"", false},
    PlayedType{"Matroska", "Opus", "audio/webm; codecs=\"opus\"", false},
    PlayedType{"Matroska", "Vorbis", "audio/webm; codecs=\"vorbis\"", false},
    PlayedType{"AIFF", "PCM", "audio/aiff", false},
    PlayedType{"AIFC", "PCM", "audio/aiff", false},
    PlayedType{"CAF", "", "audio/x-caf", false},
};
constexpr std::int64_t kMostFloatBits = 32; // that browsers read in WAVE

// Longer texts are cut, so that a comment of pages does not make the page large.
constexpr std::size_t kMostWords = 240;

std::string keyInSigns(const std::string& key)
{
    if (key.size() > 1 && key[1] == '#')
        return key.substr(0, 1) + "♯" + key.substr(2);
    if (key.size() > 1 && key[1] == 'b')
        return key.substr(0, 1) + "♭" + key.substr(2);
    return key;
}

std::optional<double> roundedTo(double scale, const std::optional<double>& value)
{
    if (!value || !std::isfinite(*value) || *value < 0)
        return {};
    return std::round(*value * scale) / scale;
}

std::string detailOf(const LibraryRecord& record)
{
    std::string text;
    if (record.coding == "PCM" && record.bitsPerSample)
        text = fmt::format("{}-bit{}", *record.bitsPerSample, record.floatingPoint.value_or(0) != 0 ? " float" : "");
    else if (record.coding != record.containerName)
        text = record.coding;
    if (record.coding != "PCM" && record.sourceBits)
        text += fmt::format("{}{}-bit", text.empty() ? "" : " ", *record.sourceBits);
    if (record.sampleRate)
        text += fmt::format("{}{:.4g}k", text.empty() ? "" : " ", *record.sampleRate / 1000);
    return text;
}

std::string wordsOf(const LibraryRecord& record)
{
    std::string words;
    for (const std::string* const text : {&record.title, &record.artist, &record.album, &record.genre,
                                          &record.subCategory, &record.descriptors, &record.comment})
        if (!text->empty() && words.size() < kMostWords)
            words += (words.empty() ? "" : "\n") + boundedLine(*text, kMostWords);
    return words;
}

std::string problemOf(const LibraryRecord& record)
{
    if (record.state != "unreadable")
        return {};
    return record.problems.empty() ? "It cannot be read" : "It " + record.problems.front().text;
}

} // namespace

std::string browserType(const LibraryRecord& record)
{
    if (record.containerName == "WAVE" && record.floatingPoint.value_or(0) != 0 &&
        record.bitsPerSample.value_or(0) > kMostFloatBits)
        return {};
    const auto found = std::ranges::find_if(kPlayedTypes, [&](const PlayedType& played) {
        return played.container == record.containerName && (played.coding.empty() || played.coding == record.coding);
    });
    return found != kPlayedTypes.end() ? found->type : std::string();
}

bool isPlayedEverywhere(const std::string& type)
{
    return std::ranges::any_of(kPlayedTypes,
                               [&](const PlayedType& played) { return played.everywhere && played.type == type; });
}

PageRow pageRow(const LibraryRecord& record)
{
    PageRow row;
    row.place = record.place;
    row.size = record.stamp.size;
    row.modified = record.stamp.modified;
    row.tempo = roundedTo(1000, record.tempo);
    row.durationSeconds = roundedTo(1000, record.durationSeconds);
    row.key = keyInSigns(record.key);
    if (record.keyNote && *record.keyNote >= 0 && *record.keyNote < 12)
        row.note = static_cast<int>(*record.keyNote);
    row.mode = record.mode;
    row.category = record.category;
    row.kind = record.kind;
    row.format = record.containerName.empty() ? record.fileType : record.containerName;
    row.detail = detailOf(record);
    row.type = browserType(record);
    row.words = wordsOf(record);
    row.problem = problemOf(record);
    if (record.overview)
        row.wave = pageWave(record.overview->points);
    struct stat status = {};
    if (::stat(record.place.path().c_str(), &status) != 0) {
        row.isGone = errno == ENOENT || errno == ENOTDIR;
        if (!row.isGone)
            row.problem = "It cannot be read: " + SystemErrorText(errno);
    }
    return row;
}
