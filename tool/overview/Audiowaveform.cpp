#include "tool/overview/Audiowaveform.h"

#include "platform/core/Packed.h"
#include "tool/overview/SampleColumns.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <iterator>
#include <limits>

namespace {

constexpr std::int32_t kVersion = 2;
constexpr std::uint32_t kEightBits = 1;
constexpr std::int64_t kPointsAtOnce = 4096;

int eightBits(float sample)
{
    constexpr float kFullScale = 128;
    return static_cast<int>(std::lrint(std::clamp(sample * kFullScale, -kFullScale, kFullScale - 1)));
}

std::string head(const AudiowaveformSettings& settings, std::int32_t rate, std::uint32_t length)
{
    const auto channels = static_cast<std::int32_t>(settings.lanes.size());
    if (settings.format == AudiowaveformFormat::json)
        return fmt::format("{{\"version\":{},\"channels\":{},\"sample_rate\":{},\"samples_per_pixel\":{},\"bits\":8,"
                           "\"length\":{},\"data\":[",
                           kVersion, channels, rate, settings.framesPerPoint, length);
    // Little-endian; the lowest bit of the flags says 8 bits instead of 16.
    const std::array<std::uint32_t, 6> fields{kVersion,
                                              kEightBits,
                                              static_cast<std::uint32_t>(rate),
                                              static_cast<std::uint32_t>(settings.framesPerPoint),
                                              length,
                                              static_cast<std::uint32_t>(channels)};
    std::string header(sizeof fields, '\0');
    for (std::size_t i = 0; i < fields.size(); ++i)
        storeLE(header.data() + i * sizeof fields[i], fields[i]);
    return header;
}

} // namespace

std::optional<AudiowaveformFormat> audiowaveformFormatOf(const std::string& out)
{
    const auto endsWith = [&out](std::string_view extension) {
        return out.size() > extension.size() &&
               std::equal(extension.rbegin(), extension.rend(), out.rbegin(), [](char wanted, char c) {
                   return wanted == (c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c);
               });
    };
    if (out == "-" || endsWith(".json"))
        return AudiowaveformFormat::json;
    return endsWith(".dat") ? std::optional(AudiowaveformFormat::dat) : std::nullopt;
}

void writeAudiowaveform(SoundReader& sound, const AudiowaveformSettings& settings, const Sink& sink,
                        const std::function<void(std::int64_t frames)>& progress)
{
    const std::int64_t length = (settings.to - settings.from - 1) / settings.framesPerPoint + 1;
    const double rate = std::round(sound.info().exactSampleRate);
    if (length > std::numeric_limits<std::uint32_t>::max() || rate > std::numeric_limits<std::int32_t>::max())
        throw Failure("is beyond what the format counts: more --frames-per-point are needed");
    sink(head(settings, static_cast<std::int32_t>(rate), static_cast<std::uint32_t>(length)));
    std::string bytes;
    for (std::int64_t point = 0; point < length; point += kPointsAtOnce) {
        const std::int64_t count = std::min(kPointsAtOnce, length - point);
        const std::int64_t first = settings.from + point * settings.framesPerPoint;
        SampleColumns columns(settings.lanes, sound.info().channels, static_cast<double>(first),
                              settings.framesPerPoint, static_cast<std::size_t>(count));
        std::int64_t frame = first;
        sound.read(first, std::min(columns.endFrame(), settings.to), [&](const float* samples, std::int64_t frames) {
            columns.add(samples, frame, frames);
            frame += frames;
            progress(frames);
        });
        std::vector<std::vector<WaveformColumn>> lanes;
        for (std::size_t lane = 0; lane < settings.lanes.size(); ++lane)
            lanes.push_back(columns.take(lane));
        bytes.clear();
        for (std::size_t i = 0; i < static_cast<std::size_t>(count); ++i)
            for (const auto& lane : lanes)
                for (const float sample : {lane[i].low, lane[i].high}) {
                    if (settings.format == AudiowaveformFormat::dat)
                        bytes += static_cast<char>(eightBits(sample));
                    else
                        fmt::format_to(std::back_inserter(bytes), "{},", eightBits(sample));
                }
        if (settings.format == AudiowaveformFormat::json && point + count == length)
            bytes.back() = ']';
        sink(bytes);
    }
    if (settings.format == AudiowaveformFormat::json)
        sink("}\n");
}
