#include "platform/posix/RequestServer.h"

#include "platform/posix/ItemWindow.h"
#include "platform/posix/RangeLock.h"
#include "platform/posix/SocketAddress.h"

#include <cerrno>
#include <system_error>

#include <poll.h>
#include <signal.h>
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
    if (!stop_)
        fail("coordination event");
    sigset_t all, before; // the host's signal handlers are the business of the host's threads
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
    for (const Client& client : clients_)
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
    ::unlink(path.c_str()); // whoever had the slot before was killed
    const SocketAddress address(path);
    if (::bind(listener_.get(), address.get(), address.size()) != 0 || ::listen(listener_.get(), SOMAXCONN) != 0)
        fail("coordination socket");
}

void RequestServer::serve()
{
    constexpr int kPauseWithoutDescriptors = 20; // milliseconds
    bool canAccept = true;
    for (;;) {
        // Without descriptors clients wait in line: they must not take the end of a connection for an answer.
        std::vector<pollfd> polled = {{stop_.get(), POLLIN, 0}, {canAccept ? listener_.get() : -1, POLLIN, 0}};
        for (const Client& client : clients_)
            polled.push_back({client.connection->descriptor(), POLLIN, 0});
        ::poll(polled.data(), polled.size(), canAccept ? -1 : kPauseWithoutDescriptors);
        if (polled[0].revents != 0)
            return;
        for (std::size_t i = polled.size(); i-- > 2;) {
            const auto client = clients_.begin() + static_cast<std::ptrdiff_t>(i - 2);
            if (polled[i].revents != 0 && !hear(*client)) {
                client->connection->close();
                handlers_.gone(*client->connection);
                clients_.erase(client);
            }
        }
        if (!canAccept || polled[1].revents != 0)
            canAccept = acceptClients();
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
        clients_.push_back({std::make_shared<Connection>(std::move(socket)), false});
        if (!hear(clients_.back())) { // most have asked already
            clients_.back().connection->close();
            handlers_.gone(*clients_.back().connection);
            clients_.pop_back();
        }
    }
}

bool RequestServer::hear(Client& client)
{
    Request request;
    const ssize_t got = ::recv(client.connection->descriptor(), &request, sizeof request, MSG_DONTWAIT | MSG_TRUNC);
    if (got < 0)
        return errno == EAGAIN || errno == EINTR;
    if (client.hasAsked || got != static_cast<ssize_t>(sizeof request) || request.magic != Request::kMagic)
        return false;
    client.hasAsked = true;
    handlers_.request(request, client.connection);
    return true;
}

} // namespace platform
