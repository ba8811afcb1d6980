// Where decoders of everything but linear PCM come from: a module that lies beside the library and is loaded when the
// first such file is met, so that hosts of linear PCM never pay for it.
#pragma once

#include "platform/audio/AudioDecoder.h"
#include "platform/core/Error.h"

#include <cstdint>
#include <memory>
#include <string>

namespace platform {

/// What the module "ktfiles/libktfiles-decoders.so", beside the library, exports as "ktfiles_openDecoder": the file's
/// decoder, for `delete`, or null with `*status` (AudioHandle::kFormatNotSupported when the format is none of its own).
/// Throws nothing.
using OpenDecoder = AudioDecoder* (*)(const char* path, std::int32_t* status);

/// The function in force; null lets the module be looked for. Only tests assign to it.
OpenDecoder& decoderOpener();

/// Null with `status` and `error` (which may be null); without the module it is kFormatNotSupported, and the error
/// names what to install.
std::unique_ptr<AudioDecoder> openWithDecoderModule(const std::string& path, std::int32_t& status, Error* error);

} // namespace platform
