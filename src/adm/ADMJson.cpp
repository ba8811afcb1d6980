#include "adm/ADMJson.h"

#include "adm/ADMAudioBlockFormat_DirectSpeaker.h"
#include "adm/ADMAudioBlockFormat_Object.h"
#include "platform/core/JsonWriter.h"

namespace {

std::optional<std::int64_t> knownTime(std::int64_t microseconds)
{
    return microseconds == kADMInvalidTime ? std::nullopt : std::optional(microseconds);
}

/// What is unknown when it is zero or less.
template <class Number>
std::optional<Number> positive(Number number)
{
    return number > 0 ? std::optional(number) : std::nullopt;
}

void writeLabels(JsonWriter& json, std::string_view key, const ADMLabels& labels)
{
    json.key(key);
    json.beginObject();
    for (const auto& [language, text] : labels)
        json.member(language, text);
    json.endObject();
}

void writePosition(JsonWriter& json, const ADMPosition& position)
{
    json.key("position");
    json.beginObject();
    json.member("cartesian", position.cartesian);
    json.knownMember("X", position.X);
    json.knownMember("Y", position.Y);
    json.knownMember("Z", position.Z);
    json.knownMember("azimuth", position.azimuth);
    json.knownMember("elevation", position.elevation);
    json.knownMember("distance", position.distance);
    json.endObject();
}

void writeMembers(JsonWriter& json, const ADMAudioProgramme& programme)
{
    json.member("audioProgrammeID", programme.audioProgrammeID());
    json.member("index", programme.index());
    json.knownMember("audioProgrammeName", programme.audioProgrammeName());
    json.knownMember("audioProgrammeLanguage", programme.audioProgrammeLanguage());
    json.knownMember("start", knownTime(programme.exactStart()));
    json.knownMember("end", knownTime(programme.exactEnd()));
    json.knownMember("maxDuckingDepth", programme.maxDuckingDepth());
    json.member("audioContentIDs", programme.audioContentIDs());
    writeLabels(json, "audioProgrammeLabels", programme.audioProgrammeLabels());
}

void writeMembers(JsonWriter& json, const ADMAudioContent& content)
{
    json.member("audioContentID", content.audioContentID());
    json.member("index", content.index());
    json.knownMember("audioContentName", content.audioContentName());
    json.knownMember("audioContentLanguage", content.audioContentLanguage());
    json.member("audioObjectIDRefs", content.audioObjectIDRefs());
    writeLabels(json, "audioContentLabels", content.audioContentLabels());
    json.member("dialogueMode", content.dialogueMode());
    json.member("nonDialogueContentKind", content.nonDialogueContentKind());
    json.member("dialogueContentKind", content.dialogueContentKind());
    json.member("mixedContentKind", content.mixedContentKind());
}

void writeMembers(JsonWriter& json, const ADMAudioObject& object)
{
    json.member("audioObjectID", object.audioObjectID());
    json.knownMember("audioObjectName", object.audioObjectName());
    json.knownMember("start", knownTime(object.exactStart()));
    json.knownMember("duration", knownTime(object.exactDuration()));
    json.member("dialogueMode", object.dialogueMode());
    json.member("importance", object.importance());
    json.member("interact", object.interact());
    json.member("disallowDucking", object.disallowDucking());
    json.member("audioPackFormatIDRefs", object.audioPackFormatIDRefs());
    json.member("audioObjectIDRefs", object.audioObjectIDRefs());
    json.member("audioTrackUIDRefs", object.audioTrackUIDRefs());
    writeLabels(json, "audioObjectLabels", object.audioObjectLabels());
    json.knownMember("gain", object.gain());
    json.member("gainUnit", object.gainUnit());
    json.member("headLocked", object.headLocked());
    json.member("mute", object.mute());
    json.key("polarOffset");
    json.beginObject();
    json.knownMember("azimuth", object.polarOffset().azimuth);
    json.knownMember("elevation", object.polarOffset().elevation);
    json.knownMember("distance", object.polarOffset().distance);
    json.endObject();
    json.key("cartesianOffset");
    json.beginObject();
    json.knownMember("X", object.cartesianOffset().X);
    json.knownMember("Y", object.cartesianOffset().Y);
    json.knownMember("Z", object.cartesianOffset().Z);
    json.endObject();
}

void writeMembers(JsonWriter& json, const ADMAudioPackFormat& pack)
{
    json.member("audioPackFormatID", pack.audioPackFormatID());
    json.knownMember("audioPackFormatName", pack.audioPackFormatName());
    json.member("type", pack.type());
    json.member("importance", static_cast<std::int64_t>(pack.importance())); // one below zero is kept unsigned
    json.knownMember("absoluteDistance", pack.absoluteDistance());
    json.member("audioChannelFormatIDRefs", pack.audioChannelFormatIDRefs());
    json.member("audioPackFormatIDRefs", pack.audioPackFormatIDRefs());
}

void writeObjectBlock(JsonWriter& json, const ADMAudioBlockFormat_Object& block)
{
    writePosition(json, block.position());
    json.member("hasCartesianX", block.hasCartesianX());
    json.member("hasCartesianY", block.hasCartesianY());
    json.member("hasCartesianZ", block.hasCartesianZ());
    json.member("hasPolarAzimuth", block.hasPolarAzimuth());
    json.member("hasPolarElevation", block.hasPolarElevation());
    json.member("hasPolarDistance", block.hasPolarDistance());
    json.knownMember("width", block.width());
    json.knownMember("height", block.height());
    json.knownMember("depth", block.depth());
    json.member("hasWidth", block.hasWidth());
    json.member("hasHeight", block.hasHeight());
    json.member("hasDepth", block.hasDepth());
    json.member("diffuse", block.diffuse());
    json.member("jumpPosition", block.jumpPosition());
    json.member("interpolationLength", block.interpolationLength());
    json.member("screenRef", block.screenRef());
}

void writeBlock(JsonWriter& json, const ADMAudioBlockFormat& block)
{
    json.newLine();
    json.beginObject();
    json.member("audioBlockFormatID", block.audioBlockFormatID());
    json.member("type", block.type());
    json.member("index", block.index());
    json.member("blockIndex", block.blockIndex());
    json.knownMember("rtime", knownTime(block.exactRtime()));
    json.knownMember("duration", knownTime(block.exactDuration()));
    json.member("hasGain", block.hasGain());
    json.knownMember("gain", block.gain());
    json.member("gainUnit", block.gainUnit());
    json.member("importance", block.importance());
    json.member("headLocked", block.headLocked());
    json.member("headphoneVirtualize", block.headphoneVirtualize());
    if (const auto* object = dynamic_cast<const ADMAudioBlockFormat_Object*>(&block)) {
        writeObjectBlock(json, *object);
    } else if (const auto* speaker = dynamic_cast<const ADMAudioBlockFormat_DirectSpeaker*>(&block)) {
        json.knownMember("speakerLabel", speaker->speakerLabel());
        writePosition(json, speaker->position());
    }
    json.endObject();
}

void writeMembers(JsonWriter& json, const ADMAudioChannelFormat& channel)
{
    json.member("audioChannelFormatID", channel.audioChannelFormatID());
    json.knownMember("audioChannelFormatName", channel.audioChannelFormatName());
    json.member("type", channel.type());
    json.key("audioBlockFormat");
    json.beginArray();
    for (const auto& block : channel.audioBlockFormat())
        writeBlock(json, *block);
    json.endArray();
}

void writeMembers(JsonWriter& json, const ADMAudioStreamFormat& stream)
{
    json.member("audioStreamFormatID", stream.audioStreamFormatID());
    json.knownMember("audioStreamFormatName", stream.audioStreamFormatName());
    json.member("format", stream.format());
    json.knownMember("audioChannelFormatIDRef", stream.audioChannelFormatIDRef());
    json.knownMember("audioPackFormatIDRef", stream.audioPackFormatIDRef());
    json.member("audioTrackFormatIDRefs", stream.audioTrackFormatIDRefs());
}

void writeMembers(JsonWriter& json, const ADMAudioTrackFormat& track)
{
    json.member("audioTrackFormatID", track.audioTrackFormatID());
    json.knownMember("audioTrackFormatName", track.audioTrackFormatName());
    json.knownMember("formatLabel", track.formatLabel());
    json.knownMember("formatDefinition", track.formatDefinition());
    json.knownMember("audioStreamFormatRefID", track.audioStreamFormatRefID());
    json.member("formatIDRefs", track.formatIDRefs());
}

void writeMembers(JsonWriter& json, const ADMAudioTrackUID& track)
{
    json.member("audioTrackUIDID", track.audioTrackUIDID());
    json.member("index", track.index());
    json.knownMember("sampleRate", positive(track.sampleRate()));
    json.knownMember("bitDepth", positive(track.bitDepth()));
    json.knownMember("audioTrackFormatIDRef", track.audioTrackFormatIDRef());
    json.knownMember("audioChannelFormatIDRef", track.audioChannelFormatIDRef());
    json.knownMember("audioPackFormatIDRef", track.audioPackFormatIDRef());
}

template <class Element>
void writeElements(JsonWriter& json, std::string_view key, const ADMElementTable<Element>& elements)
{
    json.newLine();
    json.key(key);
    json.beginArray();
    for (const Element& element : elements) {
        json.newLine();
        json.beginObject();
        writeMembers(json, element);
        json.endObject();
    }
    json.endArray();
}

} // namespace

void writeADMJson(JsonWriter& json, const std::string& path, const ADMDocument& document,
                  const std::vector<ADMDiagnostic>* diagnostics)
{
    json.beginObject();
    json.member("path", path);
    writeElements(json, "programmes", document.audioProgrammes());
    writeElements(json, "contents", document.audioContents());
    writeElements(json, "objects", document.audioObjects());
    writeElements(json, "packFormats", document.audioPackFormats());
    writeElements(json, "channelFormats", document.audioChannelFormats());
    writeElements(json, "streamFormats", document.audioStreamFormats());
    writeElements(json, "trackFormats", document.audioTrackFormats());
    writeElements(json, "trackUIDs", document.audioTrackUIDs());
    if (diagnostics != nullptr) {
        json.newLine();
        json.key("diagnostics");
        writeADMDiagnostics(json, *diagnostics);
    }
    json.endObject();
}

void writeADMDiagnostics(JsonWriter& json, const std::vector<ADMDiagnostic>& diagnostics)
{
    json.beginArray();
    for (const ADMDiagnostic& diagnostic : diagnostics) {
        json.newLine();
        json.beginObject();
        if (diagnostic.position.line > 0)
            json.member("line", diagnostic.position.line).knownMember("column", positive(diagnostic.position.column));
        json.member("name", diagnostic.kind);
        json.knownMember("elementID", diagnostic.elementID);
        json.member("reason", diagnostic.text);
        json.endObject();
    }
    json.endArray();
}
