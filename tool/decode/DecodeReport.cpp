#include "tool/decode/DecodeReport.h"

#include "tool/shared/output/ClockTime.h"
#include "tool/shared/output/Terminal.h"

#include <nlohmann/json.hpp>

#include <cmath>
#include <utility>

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

nlohmann::ordered_json asJson(const std::string& path, const DecodeResult& result)
{
    const DecodedSound& sound = result.sound;
    nlohmann::ordered_json json{{"path", path},
                                {"output", result.output},
                                {"format", result.container},
                                {"sampleRate", std::llround(sound.sampleRate)},
                                {"channels", sound.channels},
                                {"bits", sound.depth.bits},
                                {"floatingPoint", sound.depth.isFloat},
                                {"frames", sound.frames},
                                {"clippedSamples", result.clippedSamples},
                                {"missingFrames", result.missingFrames},
                                {"tags", result.tags.keys}};
    if (!result.tags.notKept.empty())
        json["notKept"] = result.tags.notKept;
    return json;
}

} // namespace

void DecodeReport::add(const std::string& path, const DecodeResult& result)
{
    if (form_ == Form::json)
        addJson(jsonText(asJson(path, result)));
    else if (form_ != Form::none)
        output_.print("{}: decoded to {}, {}{}\n", printable(path), printable(result.output), soundText(result),
                      result.tags.keys.empty() ? "" : ", with its tags");
    if (form_ == Form::table)
        output_.flush(); // the next file may take its time
}

void DecodeReport::addFailure(const std::string& path, const std::string& text)
{
    if (form_ == Form::json)
        addJson(jsonText({{"path", path}, {"error", text}}));
}

void DecodeReport::addJson(const std::string& json)
{
    output_.print("{}{}", std::exchange(first_, false) ? "[\n" : ",\n", json);
}

void DecodeReport::finish()
{
    if (form_ == Form::json)
        output_.print("{}]\n", first_ ? "[" : "\n");
}
