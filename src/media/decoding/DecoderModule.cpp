#include "media/decoding/DecoderModule.h"

#include "media/decoding/PolyphaseResampler.h"
#include "platform/LoadedModule.h"
#include "platform/core/Status.h"

#include <cmath>

namespace platform {

namespace {

constexpr const char* kModule = "libktfiles-decoders.so";
constexpr const char* kSymbol = "ktfiles_decoderModule";
constexpr const char* kPackage = "libktfiles-ffmpeg";

const DecoderModule* replacement = nullptr;

/// Reports in `status` and `error` that nothing could decode the file; `status` may already have a reason.
void failWith(std::int32_t& status, Error* error, const char* reason)
{
    if (status == kStatusOK)
        status = AudioHandle::kFormatNotSupported;
    fail(error, ErrorDomain::status, status, status == AudioHandle::kFormatNotSupported ? reason : StatusText(status));
}

/// Reports that there is no module for `what`.
void failWithoutModule(std::int32_t& status, Error* error, const std::string& what)
{
    status = AudioHandle::kFormatNotSupported;
    fail(error, ErrorDomain::status, status, what + " ktfiles/" + kModule + " (install " + kPackage + ")");
}

} // namespace

const DecoderModule* decoderModule()
{
    const auto load = [] {
        static const auto* const loaded = static_cast<const DecoderModule*>(loadModule(kModule, kSymbol));
        return loaded;
    };
    const DecoderModule* module = replacement != nullptr ? replacement : load();
    return module != nullptr && module->version == DecoderModule::currentVersion ? module : nullptr;
}

void replaceDecoderModule(const DecoderModule* module)
{
    replacement = module;
}

std::unique_ptr<AudioDecoder> openWithDecoderModule(const std::string& path, std::int32_t& status, Error* error)
{
    const DecoderModule* module = decoderModule();
    if (module == nullptr) {
        failWithoutModule(status, error, "not linear PCM; other formats need");
        return nullptr;
    }
    status = kStatusOK;
    std::unique_ptr<AudioDecoder> decoder;
    if (std::unique_ptr<PacketSource> packets = openPacketSource(path, &status))
        decoder.reset(module->openPackets(packets.release(), &status));
    else if (status == AudioHandle::kFormatNotSupported)
        decoder.reset(module->openFile(path.c_str(), &status));
    if (!decoder)
        failWith(status, error, "no audio that can be decoded");
    return decoder;
}

std::unique_ptr<Resampler> makeResampler(std::uint32_t channels, double fromRate, double toRate, std::int32_t& status,
                                         Error* error)
{
    const auto isRate = [](double rate) {
        return rate >= 1 && rate <= Resampler::kMaxRate && rate == std::floor(rate);
    };
    std::unique_ptr<Resampler> resampler;
    status = kStatusOK;
    if (isRate(fromRate) && isRate(toRate))
        resampler = PolyphaseResampler::make(channels, static_cast<std::uint32_t>(fromRate),
                                             static_cast<std::uint32_t>(toRate));
    if (!resampler && isRate(fromRate) && isRate(toRate) && channels <= Resampler::kMaxChannels) {
        const DecoderModule* module = decoderModule();
        if (module == nullptr) {
            failWithoutModule(status, error, "another sample rate needs");
            return nullptr;
        }
        resampler.reset(module->makeResampler(channels, static_cast<std::uint32_t>(fromRate),
                                              static_cast<std::uint32_t>(toRate), &status));
    }
    if (!resampler)
        failWith(status, error, "a sample rate that cannot be converted to");
    return resampler;
}

} // namespace platform
