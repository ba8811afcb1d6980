// Where decoders of everything but linear PCM, and conversion of sample rates, come from: a module that lies beside the
// library and is loaded when the first such file is met, so that hosts of linear PCM never pay for it.
#pragma once

#include "media/decoding/AudioDecoder.h"
#include "media/decoding/Resampler.h"
#include "media/packets/PacketSource.h"
#include "platform/core/Error.h"

#include <cstdint>
#include <memory>
#include <string>

namespace platform {

/// What the module "ktfiles/libktfiles-decoders.so", beside the library, exports as "ktfiles_decoderModule". Functions
/// give an object for `delete`, or null with `*status`, AudioHandle::kFormatNotSupported when they know no way. They
/// throw nothing.
struct DecoderModule {
    static constexpr std::uint32_t currentVersion = 3; // of this struct and of the interfaces; another is not used

    std::uint32_t version;
    /// Takes the source over in any case.
    AudioDecoder* (*openPackets)(PacketSource* source, std::int32_t* status);
    AudioDecoder* (*openFile)(const char* path, std::int32_t* status);
    Resampler* (*makeResampler)(std::uint32_t channels, std::uint32_t fromRate, std::uint32_t toRate,
                                std::int32_t* status);
};

/// The module in force, loaded when this is asked for the first time; null when there is none of the current version.
const DecoderModule* decoderModule();
/// Puts another in its place, for tests; null gives it back. One of another version stands for no module.
void replaceDecoderModule(const DecoderModule* module);

/// The decoder of a file that is not linear PCM. Null with `status` and `error` (which may be null); without the module
/// it is kFormatNotSupported, and the error names what to install.
std::unique_ptr<AudioDecoder> openWithDecoderModule(const std::string& path, std::int32_t& status, Error* error);
/// A conversion of sample rates, which must be whole hertz; null as above.
std::unique_ptr<Resampler> makeResampler(std::uint32_t channels, double fromRate, double toRate, std::int32_t& status,
                                         Error* error);

} // namespace platform
