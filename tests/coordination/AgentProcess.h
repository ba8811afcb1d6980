// The parent's side of an agent (agent/Agent.h).
#pragma once

#include <deque>
#include <set>
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

    /// Begins an access ("read", "write"), or makes a lock ("presenterlock 0") and retains it.
    void begin(const std::string& name, const std::string& what, const std::string& path);
    /// Awaits that it is had.
    bool gets(const std::string& name) { return expect(name + (locks_.contains(name) ? " held" : " in")); }
    /// Whether it is had already.
    bool has(const std::string& name) { return hasSaid(name + (locks_.contains(name) ? " held" : " in")); }
    /// The lock is released; an access is left, as soon as it is had.
    void end(const std::string& name) { tell(name + (locks_.contains(name) ? " release" : " leave")); }
    bool beginsAndGets(const std::string& name, const std::string& what, const std::string& path)
    {
        begin(name, what, path);
        return gets(name);
    }

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
    std::set<std::string> locks_; // the names that are those of locks
};

/// Waits until the kernel shows that the process waits for the item, as coordinationParties tells; false after a
/// minute.
bool awaitWaiting(const AgentProcess& agent, const std::string& path, bool isWriting);
