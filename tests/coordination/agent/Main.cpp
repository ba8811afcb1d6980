#include "agent/Agent.h"

#include <atomic>
#include <iostream>
#include <sstream>
#include <thread>

#include <signal.h>
#include <sys/resource.h>
#include <sys/time.h>
#include <unistd.h>

void say(const std::string& line)
{
    static std::mutex& mutex = *new std::mutex;
    const std::lock_guard lock(mutex);
    const std::string whole = line + "\n";
    if (write(STDOUT_FILENO, whole.data(), whole.size()) < 0)
        _exit(9);
}

namespace {

/// Sends a thousand signals per second, which restart nothing that they interrupt, to the access threads, which unblock
/// them.
void startStorm()
{
    sigset_t alarm;
    sigemptyset(&alarm);
    sigaddset(&alarm, SIGALRM);
    pthread_sigmask(SIG_BLOCK, &alarm, nullptr);

    struct sigaction action = {};
    action.sa_handler = [](int) {};
    sigaction(SIGALRM, &action, nullptr);
    const itimerval often = {{0, 1000}, {0, 1000}};
    setitimer(ITIMER_REAL, &often, nullptr);
}

/// A child that idles until its standard input, which it shares with this process, ends.
void forkIdleChild()
{
    const pid_t child = fork();
    if (child == 0) {
        for (;;)
            pause();
    }
    say("forked " + std::to_string(child));
}

void limitDescriptors(rlim_t limit)
{
    const rlimit wanted = {limit, limit};
    setrlimit(RLIMIT_NOFILE, &wanted);
    say("limited");
}

std::unique_ptr<Actor> make(const std::string& name, const std::string& verb, std::istream& words)
{
    std::string kind, path;
    if (verb != "read" && verb != "write")
        words >> kind;
    words >> path;
    if (verb == "read" || verb == "write")
        return makeAccess(name, verb == "write", path);
    if (verb == "presenterlock")
        return makePresenterLock(name, static_cast<unsigned>(std::stoul(kind)), path);
    if (verb == "coordlock")
        return makeCoordinationLock(name, static_cast<unsigned>(std::stoul(kind)), path);
    if (verb == "present")
        return makePresenter(name, kind, path);
    return nullptr;
}

} // namespace

/// Lines are "folder PATH", "storm", "fork", "limit N", "churn SEED PATH WITNESS", "NAME VERB ARGUMENTS" to make an
/// object, and "NAME VERB" to use it.
int main()
{
    std::map<std::string, std::unique_ptr<Actor>> actors;
    std::thread churning;
    std::atomic<bool> isOver = false;
    for (std::string line; std::getline(std::cin, line);) {
        std::istringstream words(line);
        std::string name, verb;
        words >> name >> verb;
        if (name == "folder") {
            platform::FileCoordinator::setCoordinationFolder(verb);
        } else if (name == "storm") {
            startStorm();
        } else if (name == "fork") {
            forkIdleChild();
        } else if (name == "limit") {
            limitDescriptors(static_cast<rlim_t>(std::stoul(verb)));
        } else if (name == "churn") {
            std::string path, witness;
            words >> path >> witness;
            churning = std::thread([=, &isOver, seed = static_cast<unsigned>(std::stoul(verb))] {
                churn(seed, path, witness, [&isOver] { return isOver.load(); });
            });
        } else if (const auto found = actors.find(name); found != actors.end()) {
            found->second->command(verb);
        } else if (auto actor = make(name, verb, words)) {
            actors.emplace(name, std::move(actor));
        } else {
            say("what? " + line);
        }
    }
    isOver = true;
    if (churning.joinable())
        churning.join();
    say("end");
    _exit(0); // regardless of what still waits
}
