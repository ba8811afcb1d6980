#include "tool/shared/edits/EndingSignals.h"

#include "files/CTemporaryFile.h"
#include "platform/SignalHold.h"

#include <csignal>
#include <utility>

namespace {

extern "C" void removeTemporaryFiles(int signal)
{
    CTemporaryFile::RemoveAllFromSignalHandler();
    ::signal(signal, SIG_DFL);
    ::raise(signal);
}

} // namespace

void removeTemporaryFilesAtEndingSignals()
{
    static bool installed = false;
    if (std::exchange(installed, true))
        return;
    for (const int signal : platform::endingSignals()) {
        struct sigaction action = {};
        ::sigaction(signal, nullptr, &action);
        if (action.sa_handler != SIG_DFL) // ignored on purpose, as by nohup
            continue;
        action.sa_handler = removeTemporaryFiles;
        ::sigaction(signal, &action, nullptr);
    }
}
