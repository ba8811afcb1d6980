#include "tool/page/ServerModule.h"

#include "platform/SignalHold.h"

#include <dlfcn.h>
#include <string>

const ServerModule* serverModule()
{
    // It lies where the library's modules do, in the folder "ktfiles" beside the library.
    Dl_info library = {};
    if (::dladdr(reinterpret_cast<const void*>(&platform::endingSignals), &library) == 0 ||
        library.dli_fname == nullptr)
        return nullptr;
    const std::string path = library.dli_fname, folder = path.substr(0, path.rfind('/') + 1);
    if (folder.empty()) // a bare name would be searched for in the system's folders
        return nullptr;
    void* const module =
        ::dlopen((folder + "ktfiles/libktfiles-server.so").c_str(), RTLD_NOW | RTLD_LOCAL | RTLD_NODELETE);
    if (module == nullptr)
        return nullptr;
    const auto* const found = static_cast<const ServerModule*>(::dlsym(module, "ktfiles_serverModule"));
    return found != nullptr && found->version == ServerModule::currentVersion ? found : nullptr;
}
