#include "ProjectEdit.h"

#include "Descriptor.h"
#include "Failure.h"
#include "FileAccess.h"
#include "TemporaryFile.h"

#include <cerrno>
#include <fcntl.h>

void editProject(const std::string& package, const std::function<void()>& edit)
{
    const Descriptor folder(::open(package.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!folder)
        throw Failure(systemErrorText(errno));
    const FileAccess access = accessForWriting(package, platform::FileCoordinator::WritingOptions::none, {});
    const SignalHold hold;
    edit();
}

bool endIsWanted()
{
    sigset_t waiting;
    if (::sigpending(&waiting) != 0)
        return false;
    for (const int signal : {SIGINT, SIGTERM, SIGHUP})
        if (sigismember(&waiting, signal) == 1)
            return true;
    return false;
}
