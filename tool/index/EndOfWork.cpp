#include "tool/index/EndOfWork.h"

#include "platform/SignalHold.h"
#include "tool/shared/output/Output.h"
#include "tool/shared/output/ProgressLine.h"

#include <atomic>
#include <csignal>

namespace {

std::atomic<int> endingSignal = 0;
static_assert(std::atomic<int>::is_always_lock_free);

extern "C" void noteEndingSignal(int signal)
{
    endingSignal = signal;
}

} // namespace

EndOfWork::EndOfWork()
{
    for (const int signal : platform::endingSignals()) {
        struct sigaction action = {};
        ::sigaction(signal, nullptr, &action);
        if (action.sa_handler == SIG_IGN) // on purpose, as by nohup
            continue;
        action = {};
        action.sa_handler = noteEndingSignal;
        action.sa_flags = static_cast<int>(SA_RESETHAND);
        ::sigaction(signal, &action, nullptr);
    }
}

bool EndOfWork::isAsked()
{
    return endingSignal != 0;
}

void EndOfWork::endIfAsked()
{
    const int signal = endingSignal;
    if (signal == 0)
        return;
    Output::standard().flush();
    ::signal(signal, SIG_DFL);
    ::raise(signal);
}
