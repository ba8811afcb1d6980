#include "tool/project/ProjectEdit.h"

#include "platform/SignalHold.h"
#include "tool/project/ProjectPackage.h"
#include "tool/shared/access/FileAccess.h"

#include <csignal>

void editProject(const std::string& package, const WaitOptions& wait,
                 const std::function<void(const std::string& package)>& edit)
{
    const std::string resolved = resolvedFolder(package);
    const FileAccess access = accessForWriting(resolved, platform::FileCoordinator::WritingOptions::none, wait);
    const platform::SignalHold hold;
    edit(resolved);
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
