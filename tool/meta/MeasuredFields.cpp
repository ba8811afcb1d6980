#include "tool/meta/MeasuredFields.h"

#include "audiofile/AudioDigest.h"
#include "media/loudness/LoudnessMeter.h"
#include "platform/core/HexText.h"
#include "platform/core/Status.h"
#include "tool/shared/arguments/UsageError.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/input/SoundReader.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Progress.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>

namespace {

using platform::Loudness;

struct LoudnessField {
    const char* name;
    std::optional<double> Loudness::*value;
    double shortest; // seconds of sound required
    const char* unit;
};
constexpr std::array kLoudnessFields{LoudnessField{"bext.loudnessValue", &Loudness::integrated, 0.4, "LUFS"},
                                     LoudnessField{"bext.loudnessRange", &Loudness::range, 3, "LU"},
                                     LoudnessField{"bext.maxTruePeakLevel", &Loudness::maxTruePeak, 0, "dBTP"},
                                     LoudnessField{"bext.maxMomentaryLoudness", &Loudness::maxMomentary, 0.4, "LUFS"},
                                     LoudnessField{"bext.maxShortTermLoudness", &Loudness::maxShortTerm, 3, "LUFS"}};
constexpr double kMostStored = 99.99; // positive or negative

/// A file that was cut must not be measured, since the rest may still arrive.
void requireWhole(const std::string& path)
{
    CAudioFileIO file;
    openContainer(file, path, 0);
    if (file.Info().missingDataSize > 0)
        throw Failure(fmt::format("ends ahead of its sound, {} bytes of which are missing: nothing is measured",
                                  file.Info().missingDataSize));
}

Loudness measure(SoundReader& sound, const std::string& path, bool quiet)
{
    const AudioFileInfo& info = sound.info();
    platform::Error error;
    std::int32_t status = kStatusOK;
    const auto meter = platform::makeLoudnessMeter(static_cast<std::uint32_t>(info.channels),
                                                   static_cast<std::uint32_t>(std::clamp<std::int64_t>(
                                                       info.sampleRate, 0, std::numeric_limits<std::uint32_t>::max())),
                                                   info.speakers, status, &error);
    if (meter == nullptr)
        throw Failure(error.description);
    Progress progress("measuring", info.frames, quiet, path);
    sound.read(0, info.frames, [&](const float* samples, std::int64_t frames) {
        status = meter->add(samples, static_cast<std::size_t>(frames));
        if (status == kStatusParameterError)
            throw Failure("holds samples that are no numbers");
        requireOK(status);
        progress.advance(frames);
    });
    return meter->measured();
}

std::string whyNone(const LoudnessField& field, const Loudness& loudness, double seconds)
{
    if (const std::optional<double>& value = loudness.*field.value)
        return fmt::format("{:.2f} {}, which cannot be stored", *value, field.unit);
    return seconds < field.shortest ? fmt::format("shorter than {} s", field.shortest)
           : loudness.maxTruePeak   ? "quieter than -70 LUFS"
                                    : "silent";
}

void addLoudness(const std::string& path, bool quiet, std::vector<MetaStep>& steps,
                 std::vector<UnmeasuredField>& unmeasured)
{
    SoundReader sound(path);
    const Loudness loudness = measure(sound, path, quiet);
    const double seconds = static_cast<double>(sound.info().frames) / sampleRateOf(sound.info());
    for (const LoudnessField& field : kLoudnessFields) {
        const std::optional<double>& value = loudness.*field.value;
        const bool isStored = value && std::abs(*value) <= kMostStored;
        if (!isStored)
            unmeasured.push_back({field.name, whyNone(field, loudness, seconds)});
        steps.push_back(metaStep(field.name, isStored ? fmt::format("{:.2f}", *value) : "", false));
    }
}

MetaStep digestStep(const Bytes& digest)
{
    return metaStep("md5", hexText(digest), false);
}

/// The digest of the sample bytes, of which there may be none.
Bytes digestOf(const std::string& path, bool quiet)
{
    CAudioFileIO file;
    openContainer(file, path, 0);
    const AudioFileInfo& info = file.Info();
    platform::Digest digest(platform::Digest::Kind::md5);
    platform::Digest* const digests[] = {&digest};
    Progress progress("reading", info.dataSize, quiet, path);
    if (info.dataSize > 0)
        requireOK(DigestAudio(file, info, digests, [&] {
            progress.advance(1 << 20); // called before each MiB
            return true;
        }));
    return digest.finish();
}

} // namespace

void requireNotTyped(const MeasuredFields& wanted, const std::vector<MetaStep>& steps)
{
    for (const MetaStep& step : steps) {
        if (step.name.parts.front().number() != 0U)
            continue; // a second "bext"
        const std::string name = step.name.pattern(false);
        if (wanted.loudness && std::ranges::find(kLoudnessFields, name, &LoudnessField::name) != kLoudnessFields.end())
            throw UsageError(name + " is what --loudness measures");
        if (wanted.md5 && name == "md5")
            throw UsageError("md5 is what --md5 reckons");
        if (wanted.loudness && name == "bext.version" && step.number() != 2)
            throw UsageError("--loudness sets fields of version 2 of bext");
    }
}

MetaPlan planMeasured(const std::string& path, std::vector<MetaStep> steps, const MeasuredFields& wanted,
                      bool isLenient, bool quiet)
{
    if (!wanted.any())
        return planMetadata(path, steps, isLenient);
    std::vector<UnmeasuredField> unmeasured;
    if (wanted.loudness) {
        std::erase_if(steps, [](const MetaStep& step) { return step.name.text == "bext.version"; });
        steps.push_back(metaStep("bext.version", "2", false));
    }
    std::vector<MetaStep> tried = steps;
    if (wanted.md5)
        tried.push_back(digestStep(Bytes(16)));
    planMetadata(path, tried, isLenient);
    requireWhole(path);
    if (wanted.loudness)
        addLoudness(path, quiet, steps, unmeasured);
    if (wanted.md5)
        steps.push_back(digestStep(digestOf(path, quiet)));
    MetaPlan plan = planMetadata(path, steps, isLenient);
    plan.unmeasured = std::move(unmeasured);
    return plan;
}
