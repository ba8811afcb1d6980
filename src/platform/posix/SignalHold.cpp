#include "platform/SignalHold.h"

#include <array>
#include <cstring>

#include <signal.h>

namespace platform {

namespace {

constexpr std::array kEndingSignals{SIGINT, SIGTERM, SIGHUP, SIGQUIT, SIGPIPE, SIGALRM, SIGXCPU};

} // namespace

std::span<const int> endingSignals()
{
    return kEndingSignals;
}

SignalHold::SignalHold()
{
    static_assert(sizeof before_ >= sizeof(sigset_t));
    sigset_t ending, before;
    sigemptyset(&ending);
    for (const int signal : kEndingSignals)
        sigaddset(&ending, signal);
    pthread_sigmask(SIG_BLOCK, &ending, &before);
    std::memcpy(before_.data(), &before, sizeof before);
}

SignalHold::~SignalHold()
{
    sigset_t before;
    std::memcpy(&before, before_.data(), sizeof before);
    pthread_sigmask(SIG_SETMASK, &before, nullptr);
}

} // namespace platform
