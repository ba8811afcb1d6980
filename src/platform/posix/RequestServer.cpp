#include "platform/posix/RequestServer.h"

#include "platform/posix/ItemWindow.h"
#include "platform/posix/RangeLock.h"
#include "platform/posix/SocketAddress.h"

#include <array>
#include <cerrno>
#include <system_error>
#include <utility>

#include <signal.h>
#include <sys/epoll.h>
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <unistd.h>

namespace platform {

namespace {

[[noreturn]] void fail(const char* what)
{
    throw std::system_error(errno, std::generic_category(), what);
}

bool isThisUser(int socket)
{
    ucred peer = {};
    socklen_t size = sizeof peer;
    return ::getsockopt(socket, SOL_SOCKET, SO_PEERCRED, &peer, &size) == 0 && peer.uid == ::geteuid();
}

} // namespace

RequestServer::RequestServer(std::shared_ptr<CoordinationDirectory> directory, Handlers handlers)
    : directory_(std::move(directory)),
      handlers_(std::move(handlers))
{
    takeSlot();
    listen();
    stop_ = Descriptor([] { return ::eventfd(0, EFD_CLOEXEC); });
    events_ = Descriptor([] { return ::epoll_create1(EPOLL_CLOEXEC); });
    if (!stop_ || !events_ || !watch(EPOLL_CTL_ADD, stop_.get(), kStopEvent) ||
        !watch(EPOLL_CTL_ADD, listener_.get(), kListenerEvent))
        fail("coordination event");
    sigset_t all, before; // signals of the host are handled by the host's threads
    sigfillset(&all);
    pthread_sigmask(SIG_SETMASK, &all, &before);
    try {
        thread_ = std::thread([this] { serve(); });
    } catch (...) {
        pthread_sigmask(SIG_SETMASK, &before, nullptr);
        throw;
    }
    pthread_sigmask(SIG_SETMASK, &before, nullptr);
}

RequestServer::~RequestServer()
{
    const std::uint64_t one = 1;
    [[maybe_unused]] const ssize_t written = ::write(stop_.get(), &one, sizeof one);
    thread_.join();
    for (const auto& [name, client] : clients_)
        client.connection->close();
    ::unlink(directory_->socketPath(slot_).c_str());
}

void RequestServer::takeSlot()
{
    slots_ = directory_->openSlots();
    const int first = static_cast<int>(::getpid()) % kSlotCount;
    for (int i = 0; i < kSlotCount; ++i) {
        const int candidate = (first + i) % kSlotCount;
        if (tryLock(slots_.get(), {candidate, 1}, LockKind::exclusive)) {
            slot_ = candidate;
            return;
        }
    }
    throw std::system_error(ENOLCK, std::generic_category(), "every slot for presenting processes is taken");
}

void RequestServer::listen()
{
    listener_ = Descriptor([] { return ::socket(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC | SOCK_NONBLOCK, 0); });
    if (!listener_)
        fail("coordination socket");
    const std::string path = directory_->socketPath(slot_);
    ::unlink(path.c_str()); // left by a former owner of the slot, which was killed
    const SocketAddress address(path);
    if (::bind(listener_.get(), address.get(), address.size()) != 0 || ::listen(listener_.get(), SOMAXCONN) != 0)
        fail("coordination socket");
}

/// A closed descriptor needs no removal, because descriptors are never copied.
bool RequestServer::watch(int operation, int descriptor, std::uint64_t name, bool isWanted)
{
    epoll_event event = {};
    event.events = isWanted ? std::uint32_t{EPOLLIN} : 0;
    event.data.u64 = name;
    return ::epoll_ctl(events_.get(), operation, descriptor, &event) == 0;
}

void RequestServer::serve()
{
    constexpr int kPauseWithoutDescriptors = 20; // milliseconds
    for (bool canAccept = true;;) {
        std::array<epoll_event, 64> events;
        const int count = ::epoll_wait(events_.get(), events.data(), static_cast<int>(events.size()),
                                       canAccept ? -1 : kPauseWithoutDescriptors);
        bool mayAccept = !canAccept;
        for (int i = 0; i < count; ++i) {
            const std::uint64_t name = events[static_cast<std::size_t>(i)].data.u64;
            if (name == kStopEvent)
                return;
            if (name == kListenerEvent)
                mayAccept = true;
            else
                hear(name);
        }
        if (!mayAccept)
            continue;
        std::erase_if(clients_, [](const auto& client) { return !client.second.connection->isOpen(); }); // answered
        // Without descriptors clients wait in the backlog, because they must not take a closed connection for an
        // answer.
        if (const bool could = std::exchange(canAccept, acceptClients()); could != canAccept)
            watch(EPOLL_CTL_MOD, listener_.get(), kListenerEvent, canAccept);
    }
}

bool RequestServer::acceptClients()
{
    for (;;) {
        Descriptor socket(
            [this] { return ::accept4(listener_.get(), nullptr, nullptr, SOCK_CLOEXEC | SOCK_NONBLOCK); });
        if (!socket)
            return errno != EMFILE && errno != ENFILE && errno != ENOBUFS && errno != ENOMEM;
        if (!isThisUser(socket.get()))
            continue;
        const std::uint64_t name = ++lastName_;
        if (!watch(EPOLL_CTL_ADD, socket.get(), name))
            return false;
        clients_.emplace(name, Client{std::make_shared<Connection>(std::move(socket)), false});
        hear(name); // most have sent their question already
    }
}

void RequestServer::hear(std::uint64_t name)
{
    const auto client = clients_.find(name);
    if (client == clients_.end() || takeRequest(client->second))
        return;
    client->second.connection->close();
    handlers_.gone(*client->second.connection);
    clients_.erase(client);
}

bool RequestServer::takeRequest(Client& client)
{
    Request request;
    const Connection::Heard heard = client.connection->receive(request);
    if (heard != Connection::Heard::request)
        return heard == Connection::Heard::nothing;
    if (std::exchange(client.hasAsked, true))
        return false;
    handlers_.request(request, client.connection);
    return true;
}

} // namespace platform
