#include "platform/FileSystem.h"

#include <cerrno>
#include <vector>

#include <pwd.h>
#include <unistd.h>

namespace platform {

String homeDirectory(const std::string& name)
{
    passwd record = {};
    passwd* found = nullptr;
    std::vector<char> texts(1024);
    for (;;) {
        const int error = name.empty() ? getpwuid_r(getuid(), &record, texts.data(), texts.size(), &found)
                                       : getpwnam_r(name.c_str(), &record, texts.data(), texts.size(), &found);
        if (error != ERANGE || texts.size() > (1U << 20))
            break;
        texts.resize(texts.size() * 2);
    }
    return found == nullptr ? nullptr : String::fromFileSystemRepresentation(found->pw_dir);
}

} // namespace platform
