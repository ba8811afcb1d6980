#include "tool/decode/BroadcastMetadata.h"

#include "audiofile/metadata/BroadcastExtension.h"

#include <fmt/format.h>

#include <charconv>
#include <optional>
#include <string_view>

namespace {

std::uint64_t movedTime(std::uint64_t time, const SoundChange& change)
{
    std::uint64_t moved = 0;
    return __builtin_add_overflow(change.scaled(time), change.start, &moved) ? UINT64_MAX : moved;
}

/// A line of the coding history, with its line end.
std::string historyLine(const DecodedSound& sound)
{
    const char* const mode = sound.channels == 1 ? "mono" : sound.channels == 2 ? "stereo" : "multichannel";
    return fmt::format("A=PCM,F={:.0f},W={},M={},T=ktfiles decode\r\n", sound.sampleRate, sound.depth.bits, mode);
}

void addToHistory(BroadcastExtension& extension, const DecodedSound& sound)
{
    std::string history(textOf(extension.codingHistory));
    history.resize(history.find_last_not_of('\0') + 1); // padding that writers leave
    if (!history.empty() && !history.ends_with("\n"))
        history += "\r\n";
    history += historyLine(sound);
    const BytesView bytes = bytesOf(history);
    extension.codingHistory.assign(bytes.begin(), bytes.end());
}

/// Replaces numbers between tags of an XML text without parsing the rest of it.
class NumbersInXML {
public:
    explicit NumbersInXML(std::string text) : text_(std::move(text)) {}

    std::optional<std::uint64_t> find(std::string_view name) const
    {
        const auto place = placeOf(name);
        if (!place)
            return std::nullopt;
        std::uint64_t value = 0;
        const char* const begin = text_.data() + place->first;
        const char* const end = begin + place->second;
        const auto read = std::from_chars(begin, end, value);
        return read.ec == std::errc() && read.ptr == end ? std::optional(value) : std::nullopt;
    }
    /// Does nothing if there is no number.
    void set(std::string_view name, std::uint64_t value)
    {
        if (find(name))
            text_.replace(placeOf(name)->first, placeOf(name)->second, std::to_string(value));
    }
    bool has(std::string_view name) const { return text_.find(fmt::format("<{}>", name)) != text_.npos; }
    const std::string& text() const { return text_; }

private:
    /// Position and length of the text in the first element with this name.
    std::optional<std::pair<std::size_t, std::size_t>> placeOf(std::string_view name) const
    {
        const std::size_t open = text_.find(fmt::format("<{}>", name));
        const std::size_t begin = open == text_.npos ? open : open + name.size() + 2;
        const std::size_t end = begin == text_.npos ? begin : text_.find('<', begin);
        if (end == text_.npos || text_.compare(end, name.size() + 3, fmt::format("</{}>", name)) != 0)
            return std::nullopt;
        return std::pair(begin, end - begin);
    }

    std::string text_;
};

/// Moves a time in two halves of 32 bits. False if it should have been moved but cannot be read.
bool moveTime(NumbersInXML& xml, std::string_view high, std::string_view low, const SoundChange& change)
{
    const auto highHalf = xml.find(high), lowHalf = xml.find(low);
    if (!lowHalf || *lowHalf > UINT32_MAX || highHalf.value_or(0) > UINT32_MAX)
        return !xml.has(low);
    const std::uint64_t moved = movedTime(highHalf.value_or(0) << 32 | *lowHalf, change);
    if (!highHalf && moved > UINT32_MAX)
        return false;
    xml.set(high, moved >> 32);
    xml.set(low, moved & UINT32_MAX);
    return true;
}

} // namespace

Bytes changedBroadcastExtension(BytesView body, std::endian order, const BroadcastChange& changed)
{
    auto extension = BroadcastExtension::read(body, order);
    if (!extension)
        return {body.begin(), body.end()};
    if (!changed.change.keepsPlaces())
        extension->setTimeReference(movedTime(extension->timeReference(), changed.change));
    if (extension->hasLoudness() && (!changed.change.isWhole || !changed.keepsChannels))
        for (Packed<std::int16_t>* const value :
             {&extension->loudnessValue, &extension->loudnessRange, &extension->maxTruePeakLevel,
              &extension->maxMomentaryLoudness, &extension->maxShortTermLoudness})
            *value = BroadcastFields::kNoLoudness;
    if (changed.isRecoded)
        addToHistory(*extension, changed.sound);
    return extension->write();
}

Bytes changedIXML(BytesView body, const BroadcastChange& changed, std::vector<std::string>& stale)
{
    const SoundChange& change = changed.change;
    const auto sourceRate = static_cast<std::uint64_t>(std::llround(change.sourceRate));
    const auto rate = static_cast<std::uint64_t>(std::llround(change.rate));
    NumbersInXML xml{std::string(textOf(body))};
    bool isTrue = true;
    if (!change.keepsPlaces()) {
        const auto clock = xml.find("TIMESTAMP_SAMPLE_RATE");
        isTrue = !clock || *clock == sourceRate; // otherwise times are in frames of another length
        if (isTrue) {
            isTrue =
                moveTime(xml, "TIMESTAMP_SAMPLES_SINCE_MIDNIGHT_HI", "TIMESTAMP_SAMPLES_SINCE_MIDNIGHT_LO", change) &&
                moveTime(xml, "BWF_TIME_REFERENCE_HIGH", "BWF_TIME_REFERENCE_LOW", change);
            xml.set("TIMESTAMP_SAMPLE_RATE", rate);
        }
        isTrue = isTrue && !xml.has("SYNC_POINT_LOW");
    }
    if (!change.keepsRate() && xml.find("FILE_SAMPLE_RATE") == sourceRate)
        xml.set("FILE_SAMPLE_RATE", rate);
    if (changed.isRecoded)
        xml.set("AUDIO_BIT_DEPTH", static_cast<std::uint64_t>(changed.sound.depth.bits));
    if (!isTrue)
        stale.emplace_back("iXML still has times of the whole file at its own rate");
    if (!changed.keepsChannels && xml.has("TRACK"))
        stale.emplace_back("iXML still has the tracks of the file");
    const BytesView bytes = bytesOf(xml.text());
    return {bytes.begin(), bytes.end()};
}
