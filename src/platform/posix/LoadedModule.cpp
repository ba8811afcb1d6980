#include "platform/LoadedModule.h"

#include <dlfcn.h>
#include <string>

namespace platform {

namespace {

/// The folder of the library, or of the program that contains it, with a trailing slash; empty if it is unknown.
std::string ownFolder()
{
    Dl_info info;
    if (dladdr(reinterpret_cast<const void*>(&loadModule), &info) == 0 || info.dli_fname == nullptr)
        return {};
    const std::string path = info.dli_fname;
    return path.substr(0, path.rfind('/') + 1);
}

} // namespace

const void* loadModule(const char* file, const char* symbol)
{
    const std::string folder = ownFolder();
    if (folder.empty()) // a bare name would be searched for in the system's folders
        return nullptr;
    void* library = dlopen((folder + "ktfiles/" + file).c_str(), RTLD_NOW | RTLD_LOCAL | RTLD_NODELETE);
    return library != nullptr ? dlsym(library, symbol) : nullptr;
}

} // namespace platform
