// The parent's side of an agent (agent/Agent.h).
#pragma once

#include <deque>
#include <string>

#include <sys/types.h>

class AgentProcess {
public:
    /// Starts it with a coordination folder.
    explicit AgentProcess(const std::string& folder);
    /// Kills it when it has not ended.
    ~AgentProcess();
    AgentProcess(const AgentProcess&) = delete;
    AgentProcess& operator=(const AgentProcess&) = delete;

    pid_t id() const { return id_; }
    void tell(const std::string& line);
    /// Reads lines until this one; false, and the test fails, when it does not come within a minute. The lines before
    /// it are kept for later.
    bool expect(const std::string& line);
    /// Whether the line has come.
    bool hasSaid(const std::string& line);
    /// The next line that begins so, whole; empty as with expect.
    std::string expectStart(const std::string& start);
    void signal(int number) const;
    /// Waits for its end after SIGKILL.
    void kill();
    /// Ends its input and waits for its end; false when it is stuck.
    bool finish();
    /// Reads whatever there is, waiting for `milliseconds` at most when there is nothing; false at the end.
    bool read(int milliseconds);
    const std::deque<std::string>& lines() const { return lines_; }
    void clearLines() { lines_.clear(); }

private:
    pid_t id_ = -1;
    int input_ = -1, output_ = -1;
    std::string partial_;
    std::deque<std::string> lines_;
};

/// Waits until the kernel shows that the process waits for the item, as coordinationParties tells; false after a
/// minute.
bool awaitWaiting(const AgentProcess& agent, const std::string& path, bool isWriting);
