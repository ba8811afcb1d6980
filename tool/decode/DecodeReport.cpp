#include "tool/decode/DecodeReport.h"

#include "tool/shared/output/ClockTime.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Terminal.h"

#include <cmath>

namespace {

std::string soundText(const DecodeResult& result)
{
    const DecodedSound& sound = result.sound;
    const std::string channels = sound.channels == 1   ? "mono"
                                 : sound.channels == 2 ? "stereo"
                                                       : fmt::format("{} channels", sound.channels);
    const double seconds = sound.sampleRate > 0 ? static_cast<double>(sound.frames) / sound.sampleRate : 0;
    return fmt::format("{}, {}, {:.10g} kHz, {}, {}", result.container, durationText(seconds), sound.sampleRate / 1000,
                       depthText(sound.depth), channels);
}

/// Lists what was carried over.
std::string withText(const DecodeResult& result)
{
    std::vector<std::string> parts = result.kept;
    if (!result.tags.keys.empty())
        parts.emplace_back("its tags");
    return parts.empty() ? "" : fmt::format(", with {}", fmt::join(parts, ", "));
}

void writeJson(JsonWriter& json, const std::string& path, const DecodeResult& result)
{
    const DecodedSound& sound = result.sound;
    json.beginObject();
    json.member("path", path);
    json.member("output", result.output);
    json.member("containerName", result.container);
    json.member("sampleRate", std::llround(sound.sampleRate));
    json.member("bitsPerSample", sound.depth.bits);
    json.member("floatingPoint", sound.depth.isFloat);
    json.member("channels", sound.channels);
    json.member("frames", sound.frames);
    if (sound.sampleRate > 0)
        json.member("durationSeconds", static_cast<double>(sound.frames) / sound.sampleRate);
    json.member("clippedSamples", result.clippedSamples);
    json.member("missingFrames", result.missingFrames);
    json.member("tags", result.tags.keys);
    if (!result.kept.empty())
        json.member("kept", result.kept);
    if (!result.tags.notKept.empty())
        json.member("notKept", result.tags.notKept);
    json.endObject();
}

} // namespace

void DecodeReport::add(const std::string& path, const DecodeResult& result)
{
    if (form_ == Form::json) {
        writeJson(json_.begin(), path, result);
        json_.end();
    } else if (form_ != Form::none)
        output_.print("{}: decoded to {}, {}{}\n", printable(path), printable(result.output), soundText(result),
                      withText(result));
    if (form_ == Form::table)
        output_.flush(); // the next file may take a while
    if (quiet_ || result.notes.empty())
        return;
    output_.flush();
    for (const std::string& note : result.notes)
        reportFailure(path, note);
}

void DecodeReport::addFailure(const std::string& path, const std::string& text)
{
    json_.addFailure(path, text);
}

void DecodeReport::finish()
{
    json_.finish();
}
