#include "AgentProcess.h"

#include "platform/FileCoordination.h"
#include "support/URLs.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <thread>

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

using Clock = std::chrono::steady_clock;
constexpr std::chrono::seconds kPatience{60};

} // namespace

AgentProcess::AgentProcess(const std::string& folder)
{
    int input[2], output[2];
    if (pipe2(input, O_CLOEXEC) != 0 || pipe2(output, O_CLOEXEC) != 0)
        std::abort();
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, input[0], STDIN_FILENO);
    posix_spawn_file_actions_adddup2(&actions, output[1], STDOUT_FILENO);
    std::string name = KTFILES_AGENT;
    char* arguments[] = {name.data(), nullptr};
    if (posix_spawn(&id_, name.c_str(), &actions, nullptr, arguments, environ) != 0)
        std::abort();
    posix_spawn_file_actions_destroy(&actions);
    close(input[0]);
    close(output[1]);
    input_ = input[1];
    output_ = output[0];
    tell("folder " + folder);
}

AgentProcess::~AgentProcess()
{
    kill();
    close(input_);
    close(output_);
}

void AgentProcess::tell(const std::string& line)
{
    const std::string whole = line + "\n";
    EXPECT_EQ(write(input_, whole.data(), whole.size()), static_cast<ssize_t>(whole.size()));
}

bool AgentProcess::read(int milliseconds)
{
    pollfd ready = {output_, POLLIN, 0};
    if (poll(&ready, 1, milliseconds) <= 0)
        return true;
    char bytes[4096];
    const ssize_t count = ::read(output_, bytes, sizeof bytes);
    if (count <= 0)
        return false;
    partial_.append(bytes, static_cast<std::size_t>(count));
    for (std::size_t end; (end = partial_.find('\n')) != partial_.npos; partial_.erase(0, end + 1))
        lines_.push_back(partial_.substr(0, end));
    return true;
}

bool AgentProcess::hasSaid(const std::string& line)
{
    read(0);
    return std::find(lines_.begin(), lines_.end(), line) != lines_.end();
}

std::string AgentProcess::expectStart(const std::string& start)
{
    const Clock::time_point end = Clock::now() + kPatience;
    for (bool isOpen = true;; isOpen = isOpen && read(100)) {
        const auto found = std::find_if(lines_.begin(), lines_.end(),
                                        [&](const std::string& line) { return line.starts_with(start); });
        if (found != lines_.end()) {
            const std::string line = *found;
            lines_.erase(found);
            return line;
        }
        if (!isOpen || Clock::now() > end) {
            std::string said;
            for (const std::string& line : lines_)
                said += "\n  " + line;
            ADD_FAILURE() << "not said: " << start << "; but:" << said;
            return {};
        }
    }
}

bool AgentProcess::expect(const std::string& line)
{
    return expectStart(line) == line;
}

void AgentProcess::begin(const std::string& name, const std::string& what, const std::string& path)
{
    tell(name + " " + what + " " + path);
    if (what == "read" || what == "write")
        return;
    locks_.insert(name);
    tell(name + " retain");
}

void AgentProcess::signal(int number) const
{
    ::kill(id_, number);
}

void AgentProcess::kill()
{
    if (id_ < 0)
        return;
    signal(SIGKILL);
    waitpid(id_, nullptr, 0);
    id_ = -1;
}

bool AgentProcess::finish()
{
    close(std::exchange(input_, -1));
    const Clock::time_point end = Clock::now() + kPatience;
    while (read(100) && Clock::now() < end) {
    }
    const bool hasEnded = std::find(lines_.begin(), lines_.end(), "end") != lines_.end();
    kill();
    return hasEnded;
}

bool awaitWaiting(const AgentProcess& agent, const std::string& path, bool isWriting)
{
    using namespace platform;
    const CoordinatedItem item(urlOf(path));
    const CoordinationParty wanted = {agent.id(), CoordinationParty::Role::waits, isWriting,
                                      coordinationItemNumber(item)};
    const Clock::time_point end = Clock::now() + kPatience;
    while (Clock::now() < end) {
        const auto parties = coordinationParties(item);
        if (std::find(parties.begin(), parties.end(), wanted) != parties.end())
            return true;
        std::this_thread::yield();
    }
    ADD_FAILURE() << "process " << agent.id() << " does not wait";
    return false;
}
