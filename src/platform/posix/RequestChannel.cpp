#include "platform/posix/RequestChannel.h"

#include "platform/posix/SocketAddress.h"

#include <cerrno>
#include <system_error>

#include <poll.h>
#include <sys/socket.h>

namespace platform {

void Connection::agree()
{
    const std::lock_guard lock(mutex_);
    const char yes = 1;
    if (socket_)
        ::send(socket_.get(), &yes, 1, MSG_NOSIGNAL | MSG_DONTWAIT);
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
        result = ::connect(socket.get(), address.get(), address.size()); // waits only for room in the listener's line
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
        return Asked::nobodyThere; // it ended since
    open_.push_back({slot, std::move(socket)});
    return Asked::yes;
}

bool Questions::wait(std::optional<std::chrono::milliseconds> limit)
{
    using Clock = std::chrono::steady_clock;
    const Clock::time_point end = Clock::now() + limit.value_or(std::chrono::milliseconds(0));
    while (!open_.empty()) {
        std::vector<pollfd> polled;
        for (const Open& one : open_)
            polled.push_back({one.socket.get(), POLLIN, 0});
        int timeout = -1;
        if (limit) {
            const auto left = std::chrono::ceil<std::chrono::milliseconds>(end - Clock::now()).count();
            timeout = left > 0 ? static_cast<int>(left) : 0;
        }
        const int ready = ::poll(polled.data(), polled.size(), timeout);
        if (ready == 0)
            return false;
        if (ready < 0 && errno != EINTR)
            throw std::system_error(errno, std::generic_category(), "coordination socket");
        for (std::size_t i = polled.size(); ready > 0 && i-- > 0;) {
            if (polled[i].revents == 0)
                continue;
            char answer = 0;
            if (::recv(polled[i].fd, &answer, 1, MSG_DONTWAIT) == 1)
                agreed_.push_back(open_[i].slot);
            open_.erase(open_.begin() + static_cast<std::ptrdiff_t>(i));
        }
    }
    return true;
}

} // namespace platform
