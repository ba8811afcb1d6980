// The parent's side of an agent (agent/Agent.h).
#pragma once

#include <deque>
#include <set>
#include <string>

#include <sys/types.h>

class AgentProcess {
public:
    /// Starts the agent with a coordination folder.
    explicit AgentProcess(const std::string& folder);
    /// Kills the agent unless it has ended.
    ~AgentProcess();
    AgentProcess(const AgentProcess&) = delete;
    AgentProcess& operator=(const AgentProcess&) = delete;

    pid_t id() const { return id_; }
    void tell(const std::string& line);
    /// Reads lines up to this one and keeps earlier ones for later. False, failing the test, if it does not arrive
    /// within a minute.
    bool expect(const std::string& line);
    /// Whether the line has arrived.
    bool hasSaid(const std::string& line);
    /// The next whole line with this start; empty as with expect.
    std::string expectStart(const std::string& start);

    /// Begins an access ("read", "write"), or makes a lock ("presenterlock 0") and retains it.
    void begin(const std::string& name, const std::string& what, const std::string& path);
    /// Waits until it is acquired.
    bool gets(const std::string& name) { return expect(name + (locks_.contains(name) ? " held" : " in")); }
    /// Whether it is acquired already.
    bool has(const std::string& name) { return hasSaid(name + (locks_.contains(name) ? " held" : " in")); }
    /// Releases the lock, or leaves the access as soon as it is acquired.
    void end(const std::string& name) { tell(name + (locks_.contains(name) ? " release" : " leave")); }
    bool beginsAndGets(const std::string& name, const std::string& what, const std::string& path)
    {
        begin(name, what, path);
        return gets(name);
    }

    void signal(int number) const;
    /// Sends SIGKILL and waits for the end.
    void kill();
    /// Closes the agent's input and waits for its end; false if it hangs.
    bool finish();
    /// Reads available output, waiting up to `milliseconds` if there is none; false at the end.
    bool read(int milliseconds);
    const std::deque<std::string>& lines() const { return lines_; }
    void clearLines() { lines_.clear(); }

private:
    pid_t id_ = -1;
    int input_ = -1, output_ = -1;
    std::string partial_;
    std::deque<std::string> lines_;
    std::set<std::string> locks_; // names of locks
};

/// Waits until the kernel shows, according to coordinationParties, that the process waits for the item; false after a
/// minute.
bool awaitWaiting(const AgentProcess& agent, const std::string& path, bool isWriting);
