#include "media/loudness/LoudnessMeter.h"

#include "media/containers/AudioHandle.h"
#include "platform/LoadedModule.h"
#include "platform/core/Status.h"

#include <array>
#include <bit>
#include <string>

namespace platform {

namespace {

/// Indexed by the number of channels, as bits of WAVE's channel mask.
constexpr std::array<std::uint32_t, 9> kUsualSpeakers{0, 0x4, 0x3, 0x7, 0x33, 0x37, 0x3F, 0, 0x63F};

const LoudnessModule* loudnessModule()
{
    static const auto* const loaded =
        static_cast<const LoudnessModule*>(loadModule("libktfiles-loudness.so", "ktfiles_loudnessModule"));
    return loaded != nullptr && loaded->version == LoudnessModule::currentVersion ? loaded : nullptr;
}

/// Why a format cannot be measured; empty if it can.
std::string objectionTo(std::uint32_t channels, std::uint32_t sampleRate, std::uint32_t speakers)
{
    if (channels == 0 || channels > LoudnessMeter::kMostChannels)
        return "has " + std::to_string(channels) + " channels; loudness is measured of 1 to " +
               std::to_string(LoudnessMeter::kMostChannels);
    if (sampleRate < LoudnessMeter::kLowestRate || sampleRate > LoudnessMeter::kHighestRate)
        return "has a sample rate of " + std::to_string(sampleRate) + " Hz; loudness is measured of " +
               std::to_string(LoudnessMeter::kLowestRate) + " to " + std::to_string(LoudnessMeter::kHighestRate);
    if (speakers == 0)
        return "does not say where its " + std::to_string(channels) + " channels are heard, by which loudness counts";
    return {};
}

} // namespace

std::unique_ptr<LoudnessMeter> makeLoudnessMeter(std::uint32_t channels, std::uint32_t sampleRate,
                                                 std::uint32_t speakers, std::int32_t& status, Error* error)
{
    if (static_cast<std::uint32_t>(std::popcount(speakers)) != channels)
        speakers = channels < kUsualSpeakers.size() ? kUsualSpeakers[channels] : 0;
    std::unique_ptr<LoudnessMeter> meter;
    status = kStatusParameterError;
    if (const std::string objection = objectionTo(channels, sampleRate, speakers); !objection.empty()) {
        fail(error, ErrorDomain::status, status, objection);
    } else if (const LoudnessModule* const module = loudnessModule(); module == nullptr) {
        status = AudioHandle::kFormatNotSupported;
        fail(error, ErrorDomain::status, status,
             "measuring loudness needs ktfiles/libktfiles-loudness.so (install libktfiles-ebur128)");
    } else {
        meter.reset(module->make(channels, sampleRate, speakers));
        status = meter != nullptr ? kStatusOK : kStatusOutOfMemory;
        if (meter == nullptr)
            fail(error, ErrorDomain::status, status, StatusText(status));
    }
    return meter;
}

} // namespace platform
