// Loads the module that decodes everything but linear PCM and converts sample rates. It lies beside the library and is
// loaded when the first such file is met, so hosts that only read linear PCM never pay for it.
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
/// return an object for `delete`, or null with `*status`: AudioHandle::kFormatNotSupported if they do not know the
/// format. They throw nothing.
struct DecoderModule {
    // Of this struct and the interfaces; a module of another version is not used.
    static constexpr std::uint32_t currentVersion = 3;

    std::uint32_t version;
    /// Always takes ownership of the source.
    AudioDecoder* (*openPackets)(PacketSource* source, std::int32_t* status);
    AudioDecoder* (*openFile)(const char* path, std::int32_t* status);
    Resampler* (*makeResampler)(std::uint32_t channels, std::uint32_t fromRate, std::uint32_t toRate,
                                std::int32_t* status);
};

/// The module in use, loaded at the first call; null if there is none of the current version.
const DecoderModule* decoderModule();
/// Replaces the module for tests; null restores it. A module of another version counts as none.
void replaceDecoderModule(const DecoderModule* module);

/// The decoder of a file that is not linear PCM. Null with `status` and `error` (which may be null); without a module
/// it is kFormatNotSupported, and the error names the package to install.
std::unique_ptr<AudioDecoder> openWithDecoderModule(const std::string& path, std::int32_t& status, Error* error);
/// A sample rate conversion between whole rates in hertz; null as above.
std::unique_ptr<Resampler> makeResampler(std::uint32_t channels, double fromRate, double toRate, std::int32_t& status,
                                         Error* error);

} // namespace platform
