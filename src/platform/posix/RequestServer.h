// The thread of a process that presents: takes the questions of other accesses and hands them on.
#pragma once

#include "platform/posix/RequestChannel.h"

#include <functional>
#include <map>
#include <thread>

namespace platform {

/// Has a slot, its socket and a thread for as long as it lives. The thread never runs the host's code.
class RequestServer {
public:
    struct Handlers {
        /// A question to be answered through the connection, which stays open until the asker has gone.
        std::function<void(const Request&, const std::shared_ptr<Connection>&)> request;
        /// The asker has gone; what it asked need not be asked any more.
        std::function<void(const Connection&)> gone;
    };

    /// Throws std::system_error when there is no slot, descriptor or thread. Nobody can see the slot before its socket
    /// listens: presence is raised later, and by someone else.
    RequestServer(std::shared_ptr<CoordinationDirectory> directory, Handlers handlers);
    /// Ends the thread and every connection.
    ~RequestServer();

    int slot() const { return slot_; }
    const std::shared_ptr<CoordinationDirectory>& directory() const { return directory_; }

private:
    static constexpr std::uint64_t kStopEvent = 0, kListenerEvent = 1;
    struct Client {
        std::shared_ptr<Connection> connection;
        bool hasAsked = false;
    };
    void takeSlot();
    void listen();
    bool watch(int operation, int descriptor, std::uint64_t name, bool isWanted = true);
    void serve();
    bool acceptClients();
    void hear(std::uint64_t name);
    bool takeRequest(Client& client); // false when it has gone

    std::shared_ptr<CoordinationDirectory> directory_;
    Handlers handlers_;
    Descriptor slots_;
    int slot_ = -1;
    Descriptor listener_;
    Descriptor stop_;
    Descriptor events_;
    std::map<std::uint64_t, Client> clients_; // of the thread, by the names of their events
    std::uint64_t lastName_ = kListenerEvent;
    std::thread thread_;
};

} // namespace platform
