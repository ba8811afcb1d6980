#include "tool/adm/AdmWords.h"

#include "adm/ADMAudioBlockFormat_DirectSpeaker.h"
#include "adm/ADMAudioBlockFormat_Object.h"
#include "tool/shared/adm/AdmText.h"

#include <fmt/format.h>

#include <array>
#include <cmath>
#include <iterator>

namespace {

using Words = std::vector<std::string>;

constexpr std::int64_t kSecond = 1'000'000;

// Minutes and seconds, with hours if there are any; milliseconds, and finer only if necessary.
std::string timeText(std::int64_t microseconds)
{
    const bool isNegative = microseconds < 0;
    const std::uint64_t time =
        isNegative ? 0 - static_cast<std::uint64_t>(microseconds) : static_cast<std::uint64_t>(microseconds);
    const std::uint64_t minutes = time / kSecond / 60;
    std::string text = isNegative ? "-" : "";
    auto out = std::back_inserter(text);
    if (minutes < 60)
        fmt::format_to(out, "{}", minutes);
    else
        fmt::format_to(out, "{}:{:02}", minutes / 60, minutes % 60);
    fmt::format_to(out, ":{:02}.{:06}", time / kSecond % 60, time % kSecond);
    for (int spare = 0; spare < 3 && text.ends_with('0'); ++spare)
        text.pop_back();
    return text;
}

// "0:01.000–0:02.500"; empty for the whole duration.
std::string spanText(std::int64_t start, std::int64_t end)
{
    if (start == kADMInvalidTime)
        return "at an unreadable time";
    if (end != kADMInvalidTime)
        return timeText(start) + "–" + timeText(end);
    return start == 0 ? "" : "from " + timeText(start);
}

std::int64_t endOf(std::int64_t start, std::int64_t duration)
{
    std::int64_t end = 0;
    if (start == kADMInvalidTime || duration == kADMInvalidTime || __builtin_add_overflow(start, duration, &end))
        return kADMInvalidTime;
    return end;
}

// At most four digits, which is finer than anything audible.
std::string numberText(double value)
{
    if (std::isinf(value)) // beyond the range of a double
        return value > 0 ? "∞" : "-∞";
    return fmt::format("{:.4g}", value == 0 ? 0 : value); // no "-0"
}

// Empty for a gain that changes nothing.
std::string gainText(float gain, int unit)
{
    if (gain == (unit == 1 ? 0.0F : 1.0F))
        return "";
    if (unit == 1)
        return "gain " + numberText(gain) + " dB";
    if (gain == 0)
        return "silent";
    if (gain < 0 || std::isinf(gain))
        return "gain " + numberText(gain);
    return fmt::format("gain {} ({:.1f} dB)", numberText(gain), 20 * std::log10(static_cast<double>(gain)));
}

void add(Words& words, std::string text)
{
    if (!text.empty())
        words.push_back(std::move(text));
}

void addIf(Words& words, bool holds, std::string_view text)
{
    if (holds)
        words.emplace_back(text);
}

void addLabels(Words& words, const ADMLabels& labels)
{
    for (const auto& [language, text] : labels)
        words.push_back(language + " \"" + text + "\"");
}

// One axis of a position: "30° left". Nothing at zero.
void addAxis(std::string& text, double value, std::string_view unit, const char* positive, const char* negative)
{
    if (value == 0)
        return;
    text += (text.empty() ? "" : ", ") + numberText(std::fabs(value)) + std::string(unit) + " " +
            (value > 0 ? positive : negative);
}

std::string polarText(double azimuth, double elevation)
{
    std::string text;
    if (std::fabs(azimuth) == 180)
        text = "back";
    else
        addAxis(text, azimuth, "°", "left", "right"); // seen from above, angles are counterclockwise
    addAxis(text, elevation, "°", "up", "down");
    return text.empty() ? "front" : text;
}

std::string cartesianText(double x, double y, double z)
{
    std::string text;
    addAxis(text, x, "", "right", "left");
    addAxis(text, y, "", "front", "back");
    addAxis(text, z, "", "up", "down");
    return text.empty() ? "centre" : text;
}

std::string positionText(const ADMPosition& position)
{
    if (position.cartesian)
        return cartesianText(position.X, position.Y, position.Z);
    std::string text = polarText(position.azimuth, position.elevation);
    if (position.distance != 1)
        text += " at distance " + numberText(position.distance);
    return text;
}

void addOffsets(Words& words, const ADMAudioObject& object)
{
    const ADMPolarOffset polar = object.polarOffset();
    if (polar.azimuth != 0 || polar.elevation != 0)
        words.push_back("moved " + polarText(polar.azimuth, polar.elevation));
    if (polar.distance != 0)
        words.push_back(
            fmt::format("moved {} {}", numberText(std::fabs(polar.distance)), polar.distance > 0 ? "away" : "nearer"));
    const ADMCartesianOffset cartesian = object.cartesianOffset();
    if (cartesian != ADMCartesianOffset())
        words.push_back("moved " + cartesianText(cartesian.X, cartesian.Y, cartesian.Z));
}

template <std::size_t size>
std::string kindText(const std::array<const char*, size>& names, std::int64_t kind, const char* otherwise)
{
    return kind > 0 && kind < std::int64_t{size} ? names[static_cast<std::size_t>(kind)] : otherwise;
}

// The dialogue of a content, with the kinds of ITU-R BS.2076.
std::string dialogueText(const ADMAudioContent& content)
{
    static constexpr std::array<const char*, 3> nonDialogue{"", "music", "effects"};
    static constexpr std::array<const char*, 7> dialogue{
        "", "dialogue", "voiceover", "spoken subtitles", "audio description", "commentary", "emergency"};
    static constexpr std::array<const char*, 4> mixed{"", "complete main", "mixed", "for hearing-impaired people"};
    switch (content.dialogueMode()) {
    case 0:
        return kindText(nonDialogue, content.nonDialogueContentKind(), "no dialogue");
    case 1:
        return kindText(dialogue, content.dialogueContentKind(), "dialogue");
    default: // also if the document does not say
        return kindText(mixed, content.mixedContentKind(), "");
    }
}

void addImportance(Words& words, double importance, double usual)
{
    if (importance != usual)
        words.push_back("importance " + numberText(importance));
}

std::string nameAndID(const std::string& name, const std::string& id)
{
    return name.empty() ? shortened(id) : shortened(name) + " (" + shortened(id) + ")";
}

void addObjectBlock(Words& words, const ADMAudioBlockFormat_Object& block)
{
    if (block.hasWidth() || block.hasHeight() || block.hasDepth()) {
        std::string size;
        const auto addSize = [&](bool isThere, float value, const char* what) {
            if (isThere)
                size += (size.empty() ? "" : " ") + numberText(value) + " " + what;
        };
        addSize(block.hasWidth(), block.width(), "wide");
        addSize(block.hasHeight(), block.height(), "high");
        addSize(block.hasDepth(), block.depth(), "deep");
        words.push_back(size);
    }
    if (block.diffuse() != 0)
        words.push_back("diffuse " + numberText(block.diffuse()));
    if (block.jumpPosition())
        words.push_back(block.interpolationLength() > 0
                            ? "jumps within " + numberText(block.interpolationLength()) + " s"
                            : "jumps");
    addIf(words, block.screenRef(), "relative to the screen");
}

} // namespace

AdmNode describe(const ADMAudioProgramme& programme)
{
    AdmNode node{"programme", programme.audioProgrammeName(), programme.audioProgrammeID(), {}};
    add(node.details, programme.audioProgrammeLanguage().value_or(""));
    add(node.details, spanText(programme.exactStart(), programme.exactEnd()));
    if (programme.maxDuckingDepth() != 0)
        node.details.push_back(fmt::format("ducks to {} dB", programme.maxDuckingDepth()));
    addLabels(node.details, programme.audioProgrammeLabels());
    return node;
}

AdmNode describe(const ADMAudioContent& content)
{
    AdmNode node{"content", content.audioContentName(), content.audioContentID(), {}};
    add(node.details, content.audioContentLanguage().value_or(""));
    add(node.details, dialogueText(content));
    addLabels(node.details, content.audioContentLabels());
    return node;
}

AdmNode describe(const ADMAudioObject& object)
{
    AdmNode node{"object", object.audioObjectName(), object.audioObjectID(), {}};
    add(node.details, spanText(object.exactStart(), endOf(object.exactStart(), object.exactDuration())));
    add(node.details, gainText(object.gain(), object.gainUnit()));
    addIf(node.details, object.mute(), "muted");
    addIf(node.details, object.dialogueMode() == 0, "no dialogue");
    addIf(node.details, object.dialogueMode() == 1, "dialogue");
    addIf(node.details, object.headLocked(), "head-locked");
    addIf(node.details, object.interact(), "interactive");
    addIf(node.details, object.disallowDucking(), "never ducked");
    addImportance(node.details, static_cast<double>(object.importance()), 10);
    addOffsets(node.details, object);
    addLabels(node.details, object.audioObjectLabels());
    return node;
}

AdmNode describe(const ADMAudioPackFormat& pack)
{
    AdmNode node{"pack", pack.audioPackFormatName(), pack.audioPackFormatID(), {ADMGetNameForType(pack.type())}};
    addImportance(node.details, static_cast<double>(static_cast<std::int64_t>(pack.importance())), 10);
    if (pack.absoluteDistance() != 0)
        node.details.push_back("distances in " + numberText(pack.absoluteDistance()) + " m");
    return node;
}

AdmNode describe(const ADMAudioChannelFormat& channel)
{
    return {"channel",
            channel.audioChannelFormatName(),
            channel.audioChannelFormatID(),
            {ADMGetNameForType(channel.type()), countText(channel.audioBlockFormat().size(), "block")}};
}

AdmNode describe(const ADMAudioStreamFormat& stream)
{
    return {
        "stream", stream.audioStreamFormatName(), stream.audioStreamFormatID(), {ADMGetNameForFormat(stream.format())}};
}

AdmNode describe(const ADMAudioTrackFormat& track)
{
    AdmNode node{"track format", track.audioTrackFormatName(), track.audioTrackFormatID(), {}};
    add(node.details, track.formatDefinition().value_or(track.formatLabel().value_or("")));
    if (track.audioStreamFormatRefID())
        node.details.push_back("of stream " + *track.audioStreamFormatRefID());
    return node;
}

AdmNode describe(const ADMAudioTrackUID& track)
{
    AdmNode node{"track", "", track.audioTrackUIDID(), {}};
    const ADMAudioTrackFormat* format = track.audioTrackFormat();
    if (format != nullptr)
        node.name = shortened(format->audioTrackFormatName());
    else if (track.audioChannelFormat() != nullptr)
        node.name = shortened(track.audioChannelFormat()->audioChannelFormatName());
    if (track.sampleRate() != 0)
        node.details.push_back(fmt::format("{:.10g} kHz", static_cast<double>(track.sampleRate()) / 1000));
    if (track.bitDepth() != 0)
        node.details.push_back(fmt::format("{}-bit", track.bitDepth()));
    if (track.audioTrackFormatIDRef() && format == nullptr)
        node.details.push_back(*track.audioTrackFormatIDRef() + " is missing");
    if (format == nullptr)
        return node;
    const ADMAudioStreamFormat* stream = format->audioStreamFormat();
    if (stream != nullptr)
        node.details.push_back("stream " + nameAndID(stream->audioStreamFormatName(), stream->audioStreamFormatID()));
    else if (format->audioStreamFormatRefID())
        node.details.push_back(*format->audioStreamFormatRefID() + " is missing");
    return node;
}

AdmNode describe(const ADMAudioBlockFormat& block)
{
    AdmNode node{"block", "", block.audioBlockFormatID(), {}};
    Words& words = node.details;
    const std::string span = spanText(block.exactRtime(), endOf(block.exactRtime(), block.exactDuration()));
    words.push_back(span.empty() ? "throughout" : span);
    const auto* object = dynamic_cast<const ADMAudioBlockFormat_Object*>(&block);
    if (object != nullptr)
        words.push_back(positionText(object->position()));
    else if (const auto* speaker = dynamic_cast<const ADMAudioBlockFormat_DirectSpeaker*>(&block))
        words.push_back(speaker->speakerLabel() ? "loudspeaker " + *speaker->speakerLabel()
                                                : "a loudspeaker without label");
    add(words, gainText(block.gain(), block.gainUnit()));
    addImportance(words, block.importance(), 1);
    addIf(words, block.headLocked(), "head-locked");
    addIf(words, block.headphoneVirtualize(), "virtualised on headphones");
    if (object != nullptr)
        addObjectBlock(words, *object);
    return node;
}
