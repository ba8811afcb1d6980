#include "tool/lock/ChildProcess.h"

#include "tool/shared/output/Failure.h"

#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

constexpr std::array kForwardedSignals{SIGHUP, SIGINT, SIGQUIT, SIGTERM, SIGUSR1, SIGUSR2};
enum : int { kExitCannotRun = 126, kExitNotFound = 127, kExitSignal = 128 };

/// Blocks the signals of interest for sigwaitinfo during its lifetime.
class HeldSignals {
public:
    HeldSignals()
    {
        struct sigaction byDefault = {};
        byDefault.sa_handler = SIG_DFL;
        // If SIGCHLD were ignored, the exit status would be lost.
        ::sigaction(SIGCHLD, &byDefault, &childAction_);
        sigemptyset(&held_);
        sigaddset(&held_, SIGCHLD);
        for (const int signal : kForwardedSignals)
            sigaddset(&held_, signal);
        ::pthread_sigmask(SIG_BLOCK, &held_, &before_);
    }
    ~HeldSignals()
    {
        ::pthread_sigmask(SIG_SETMASK, &before_, nullptr);
        ::sigaction(SIGCHLD, &childAction_, nullptr);
    }
    HeldSignals(const HeldSignals&) = delete;
    HeldSignals& operator=(const HeldSignals&) = delete;

    const sigset_t& held() const { return held_; }
    const sigset_t& before() const { return before_; }

private:
    sigset_t held_, before_;
    struct sigaction childAction_;
};

int spawn(const std::vector<std::string>& words, const sigset_t& mask, pid_t& child)
{
    std::vector<char*> arguments;
    for (const std::string& word : words)
        arguments.push_back(const_cast<char*>(word.c_str()));
    arguments.push_back(nullptr);
    sigset_t ours; // without what `main` ignores for itself
    sigemptyset(&ours);
    sigaddset(&ours, SIGXFSZ);
    posix_spawnattr_t attributes;
    ::posix_spawnattr_init(&attributes);
    ::posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
    ::posix_spawnattr_setsigmask(&attributes, &mask);
    ::posix_spawnattr_setsigdefault(&attributes, &ours);
    const int error = ::posix_spawnp(&child, arguments[0], nullptr, &attributes, arguments.data(), environ);
    ::posix_spawnattr_destroy(&attributes);
    return error;
}

int awaitEnd(pid_t child, const sigset_t& held)
{
    for (;;) {
        siginfo_t signal = {};
        if (::sigwaitinfo(&held, &signal) < 0)
            continue; // interrupted
        if (signal.si_signo != SIGCHLD) {
            if (signal.si_code != SI_KERNEL)
                ::kill(child, signal.si_signo);
            continue;
        }
        int status = 0;
        if (::waitpid(child, &status, WNOHANG) == child)
            return WIFSIGNALED(status) ? kExitSignal + WTERMSIG(status) : WEXITSTATUS(status);
    }
}

} // namespace

int runChild(const std::vector<std::string>& words)
{
    const HeldSignals signals;
    pid_t child = 0;
    if (const int error = spawn(words, signals.before(), child); error != 0) {
        reportFailure(words.front(), SystemErrorText(error));
        return error == ENOENT ? kExitNotFound : kExitCannotRun;
    }
    return awaitEnd(child, signals.held());
}
