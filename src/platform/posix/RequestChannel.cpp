#include "platform/posix/RequestChannel.h"

#include "platform/posix/SocketAddress.h"

#include <cerrno>
#include <system_error>

#include <poll.h>
#include <sys/socket.h>

namespace platform {

void Connection::agree()
{
    Descriptor closed;
    const std::lock_guard lock(mutex_);
    const char yes = 1;
    if (socket_)
        ::send(socket_.get(), &yes, 1, MSG_NOSIGNAL | MSG_DONTWAIT);
    closed = std::move(socket_);
}

bool Connection::isOpen() const
{
    const std::lock_guard lock(mutex_);
    return static_cast<bool>(socket_);
}

Connection::Heard Connection::receive(Request& request) const
{
    const std::lock_guard lock(mutex_);
    const ssize_t got = socket_ ? ::recv(socket_.get(), &request, sizeof request, MSG_DONTWAIT | MSG_TRUNC) : 0;
    if (got < 0 && (errno == EAGAIN || errno == EINTR))
        return Heard::nothing;
    const bool isRequest = got == static_cast<ssize_t>(sizeof request) && request.magic == Request::kMagic;
    return isRequest ? Heard::request : Heard::end;
}

void Connection::close()
{
    Descriptor closed;
    const std::lock_guard lock(mutex_);
    closed = std::move(socket_);
}

Questions::Asked Questions::ask(int slot, const Request& request)
{
    Descriptor socket([] { return ::socket(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0); });
    if (!socket)
        throw std::system_error(errno, std::generic_category(), "coordination socket");
    const SocketAddress address(directory_.socketPath(slot));
    int result = 0;
    do
        result = ::connect(socket.get(), address.get(), address.size()); // waits only for room in the backlog
    while (result != 0 && errno == EINTR);
    if (result != 0) {
        if (errno == ECONNREFUSED || errno == ENOENT || errno == ECONNRESET)
            return Asked::nobodyThere;
        throw std::system_error(errno, std::generic_category(), "coordination socket");
    }
    ssize_t sent = 0;
    do
        sent = ::send(socket.get(), &request, sizeof request, MSG_NOSIGNAL);
    while (sent < 0 && errno == EINTR);
    if (sent != static_cast<ssize_t>(sizeof request))
        return Asked::nobodyThere; // the process ended meanwhile
    open_.push_back({slot, std::move(socket)});
    return Asked::yes;
}

/// Takes an answer or the end of the connection.
void Questions::take(Open& answered)
{
    char answer = 0;
    ssize_t got = 0;
    do
        got = ::recv(answered.socket.get(), &answer, 1, 0);
    while (got < 0 && errno == EINTR);
    if (got == 1)
        agreed_.push_back(answered.slot);
    spent_.push_back(std::move(answered.socket));
}

/// Waits for one after another, since all are needed; the call that waits also receives the answer.
void Questions::wait()
{
    for (Open& one : open_)
        take(one);
    open_.clear();
}

bool Questions::waitFor(std::chrono::milliseconds limit)
{
    using Clock = std::chrono::steady_clock;
    const Clock::time_point end = Clock::now() + limit;
    while (!open_.empty()) {
        std::vector<pollfd> polled;
        for (const Open& one : open_)
            polled.push_back({one.socket.get(), POLLIN, 0});
        const auto left = std::chrono::ceil<std::chrono::milliseconds>(end - Clock::now()).count();
        const int ready = ::poll(polled.data(), polled.size(), left > 0 ? static_cast<int>(left) : 0);
        if (ready == 0)
            return false;
        if (ready < 0 && errno != EINTR)
            throw std::system_error(errno, std::generic_category(), "coordination socket");
        for (std::size_t i = polled.size(); ready > 0 && i-- > 0;) {
            if (polled[i].revents == 0)
                continue;
            take(open_[i]);
            open_.erase(open_.begin() + static_cast<std::ptrdiff_t>(i));
        }
    }
    return true;
}

} // namespace platform
