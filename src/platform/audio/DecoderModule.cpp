#include "platform/audio/DecoderModule.h"

#include "platform/core/Status.h"

#include <dlfcn.h>

namespace platform {

namespace {

constexpr const char* kModule = "ktfiles/libktfiles-decoders.so";
constexpr const char* kFunction = "ktfiles_openDecoder";
constexpr const char* kPackage = "libktfiles-ffmpeg";

/// The folder of the library, or of the program that it is linked into, with a slash; empty when it is not known.
std::string ownFolder()
{
    Dl_info info;
    if (dladdr(reinterpret_cast<const void*>(&openWithDecoderModule), &info) == 0 || info.dli_fname == nullptr)
        return {};
    const std::string path = info.dli_fname;
    return path.substr(0, path.rfind('/') + 1);
}

/// Null when there is no module. Once loaded it stays: its decoders are anybody's.
OpenDecoder loadModule()
{
    const std::string folder = ownFolder();
    if (folder.empty()) // what follows would be looked for in the system's folders
        return nullptr;
    void* module = dlopen((folder + kModule).c_str(), RTLD_NOW | RTLD_LOCAL | RTLD_NODELETE);
    return module != nullptr ? reinterpret_cast<OpenDecoder>(dlsym(module, kFunction)) : nullptr;
}

} // namespace

OpenDecoder& decoderOpener()
{
    static OpenDecoder opener = nullptr;
    return opener;
}

std::unique_ptr<AudioDecoder> openWithDecoderModule(const std::string& path, std::int32_t& status, Error* error)
{
    OpenDecoder open = decoderOpener();
    if (open == nullptr) {
        static const OpenDecoder loaded = loadModule();
        open = loaded;
    }
    if (open == nullptr) {
        status = AudioHandle::kFormatNotSupported;
        fail(error, ErrorDomain::status, status,
             std::string("not linear PCM; other formats need ") + kModule + " (install " + kPackage + ")");
        return nullptr;
    }
    status = kStatusOK;
    std::unique_ptr<AudioDecoder> decoder(open(path.c_str(), &status));
    if (decoder)
        return decoder;
    if (status == kStatusOK)
        status = AudioHandle::kFormatNotSupported;
    fail(error, ErrorDomain::status, status,
         status == AudioHandle::kFormatNotSupported ? "no audio that can be decoded" : StatusText(status));
    return nullptr;
}

} // namespace platform
