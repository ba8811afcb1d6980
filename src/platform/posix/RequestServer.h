// The thread of a presenting process: receives the questions of other accesses and passes them on.
#pragma once

#include "platform/posix/RequestChannel.h"

#include <functional>
#include <map>
#include <thread>

namespace platform {

/// Owns a slot, its socket and a thread. The thread never runs the host's code.
class RequestServer {
public:
    struct Handlers {
        /// A question to be answered through the connection, which stays open until the asker leaves.
        std::function<void(const Request&, const std::shared_ptr<Connection>&)> request;
        /// The asker left, so its question is obsolete.
        std::function<void(const Connection&)> gone;
    };

    /// Throws std::system_error if there is no slot, descriptor or thread. Nobody sees the slot before its socket
    /// listens, because its owner raises presences later.
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
    bool takeRequest(Client& client); // false if the client left

    std::shared_ptr<CoordinationDirectory> directory_;
    Handlers handlers_;
    Descriptor slots_;
    int slot_ = -1;
    Descriptor listener_;
    Descriptor stop_;
    Descriptor events_;
    std::map<std::uint64_t, Client> clients_; // by the names of their events; used by the thread only
    std::uint64_t lastName_ = kListenerEvent;
    std::thread thread_;
};

} // namespace platform
