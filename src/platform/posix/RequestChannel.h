// How an access asks the processes that present an item: a connection per question, a message each way.
#pragma once

#include "platform/SecureHash.h"
#include "platform/posix/CoordinationDirectory.h"

#include <chrono>
#include <cstdint>
#include <memory>
#include <mutex>
#include <vector>

namespace platform {

/// A question as it travels between processes of one machine.
struct Request {
    std::uint32_t magic = kMagic;
    std::uint8_t byWriter = 0;   // 1: relinquish to a writer, 0: to a reader
    std::uint8_t holdsQueue = 0; // 1: the writer holds the item's queue until it is answered
    std::uint16_t reserved = 0;
    std::uint64_t asker = 0;     // address of the asker's own presenter, which is not asked, or 0 …
    std::uint64_t askerHome = 0; // … and the copy of the library in which that address is valid
    SHA256Digest key{};

    static constexpr std::uint32_t kMagic = 0x4B544631;
};
static_assert(sizeof(Request) == 56);

/// The presenting end of a connection; the registry answers through it once its presenters have.
class Connection {
public:
    explicit Connection(Descriptor socket) : socket_(std::move(socket)) {}

    /// Answers and ends the connection, so that the asker can leave without waking anybody.
    void agree();
    void close();
    bool isOpen() const;
    enum class Heard { request, nothing, end };
    /// Reads what has arrived, without waiting; an unknown message counts as an end.
    Heard receive(Request& request) const;

private:
    mutable std::mutex mutex_;
    Descriptor socket_;
};

/// The asking end: several questions at a time.
class Questions {
public:
    enum class Asked { yes, nobodyThere };

    /// Answered sockets go to `spent`, because closing one takes longer than everything else that is left to do then.
    Questions(CoordinationDirectory& directory, std::vector<Descriptor>& spent) : directory_(directory), spent_(spent)
    {
    }

    /// Throws std::system_error if there is no descriptor or memory for a socket.
    Asked ask(int slot, const Request& request);
    bool empty() const { return open_.empty(); }
    /// Waits until every question has an answer or its connection ended.
    void wait();
    /// As wait(); false if `limit` passes first.
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
