#include "tool/shared/edits/EndingSignals.h"

#include "files/CTemporaryFile.h"
#include "platform/SignalHold.h"
#include "tool/shared/output/ProgressLine.h"

#include <atomic>
#include <csignal>
#include <ctime>
#include <mutex>
#include <unistd.h>

namespace {

std::atomic<bool> isEnding = false;
std::atomic<int> beingMade = 0; // temporary files, by other threads
static_assert(std::atomic<int>::is_always_lock_free && std::atomic<bool>::is_always_lock_free);

// A thread that makes one for longer than half a second has a disk that will not keep it either.
void awaitThoseBeingMade()
{
    constexpr timespec moment{0, 1'000'000};
    isEnding = true;
    for (int i = 0; i < 500 && beingMade > 0; ++i)
        ::nanosleep(&moment, nullptr);
}

extern "C" void removeTemporaryFiles(int signal)
{
    progressline::clearFromSignalHandler();
    awaitThoseBeingMade();
    CTemporaryFile::RemoveAllFromSignalHandler();
    ::signal(signal, SIG_DFL);
    ::raise(signal);
}

} // namespace

void removeTemporaryFilesAtEndingSignals()
{
    static std::once_flag installed;
    std::call_once(installed, [] {
        for (const int signal : platform::endingSignals()) {
            struct sigaction action = {};
            ::sigaction(signal, nullptr, &action);
            if (action.sa_handler != SIG_DFL) // ignored on purpose, as by nohup
                continue;
            action.sa_handler = removeTemporaryFiles;
            ::sigaction(signal, &action, nullptr);
        }
    });
}

BeforeTheEnd::BeforeTheEnd()
{
    ++beingMade;
    if (!isEnding)
        return;
    --beingMade;
    for (;;)
        ::pause();
}

BeforeTheEnd::~BeforeTheEnd()
{
    --beingMade;
}
