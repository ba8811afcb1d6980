// How an access asks the processes that present an item: one connection per question, one message each way.
#pragma once

#include "platform/SecureHash.h"
#include "platform/posix/CoordinationDirectory.h"

#include <chrono>
#include <cstdint>
#include <memory>
#include <mutex>
#include <vector>

namespace platform {

/// A question, as it travels between processes on one machine.
struct Request {
    std::uint32_t magic = kMagic;
    std::uint8_t byWriter = 0;   // 1: relinquish to a writer, 0: to a reader
    std::uint8_t holdsQueue = 0; // 1: the writer keeps the item's queue until it is answered
    std::uint16_t reserved = 0;
    std::uint64_t asker = 0;     // the address of the asker's own presenter, which is not asked, or 0 …
    std::uint64_t askerHome = 0; // … and the number of the copy of the library in which that address means something
    SHA256Digest key{};

    static constexpr std::uint32_t kMagic = 0x4B544631;
};
static_assert(sizeof(Request) == 56);

/// The presenting end of a connection. The answer is sent when the object that stands for it goes.
class Connection {
public:
    explicit Connection(Descriptor socket) : socket_(std::move(socket)) {}

    /// Answers, and ends the connection: from here on the asker can go without waking anybody.
    void agree();
    void close();
    bool isOpen() const;
    enum class Heard { request, nothing, end };
    /// What has come, without waiting; a message that is none of ours is an end.
    Heard receive(Request& request) const;

private:
    mutable std::mutex mutex_;
    Descriptor socket_;
};

/// The asking end: questions that are out at the same time.
class Questions {
public:
    enum class Asked { yes, nobodyThere };

    /// What has been answered goes to `spent`, as closing a socket takes longer than all that is left to do then.
    Questions(CoordinationDirectory& directory, std::vector<Descriptor>& spent) : directory_(directory), spent_(spent)
    {
    }

    /// Throws std::system_error when there is no descriptor or memory for a socket.
    Asked ask(int slot, const Request& request);
    bool empty() const { return open_.empty(); }
    /// Waits until every question has its answer or the end of its connection.
    void wait();
    /// The same; false when `limit` passed first.
    bool waitFor(std::chrono::milliseconds limit);
    /// The slots whose processes agreed.
    const std::vector<int>& agreed() const { return agreed_; }

private:
    struct Open {
        int slot;
        Descriptor socket;
    };
    void take(Open& answered);

    CoordinationDirectory& directory_;
    std::vector<Descriptor>& spent_;
    std::vector<Open> open_;
    std::vector<int> agreed_;
};

} // namespace platform
