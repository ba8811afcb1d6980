#include "platform/posix/PresenterRegistry.h"

#include "platform/posix/ItemWindow.h"

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <iterator>
#include <random>
#include <system_error>

namespace platform {

namespace {

/// Agrees once the last presenter that was asked has answered.
class Reply {
public:
    explicit Reply(std::shared_ptr<Connection> connection) : connection_(std::move(connection)) {}
    ~Reply() { connection_->agree(); }
    Reply(const Reply&) = delete;
    Reply& operator=(const Reply&) = delete;

private:
    std::shared_ptr<Connection> connection_;
};

bool asks(bool isWriter, AskedBy askedBy)
{
    return askedBy == AskedBy::both || askedBy == (isWriter ? AskedBy::writers : AskedBy::readers);
}

std::uint64_t randomNumber()
{
    std::random_device random;
    return static_cast<std::uint64_t>(random()) << 32 | random();
}

} // namespace

/// One presenter's answer to one request.
class PresenterRegistry::Answer {
public:
    Answer(PresenterRegistry& registry, std::shared_ptr<Registration> registration, std::shared_ptr<Reply> reply,
           const Connection* askedThrough, const Request& request)
        : connection(askedThrough),
          byWriter(request.byWriter != 0),
          holdsQueue(request.holdsQueue != 0),
          registry_(registry),
          registration_(std::move(registration)),
          reply_(std::move(reply))
    {
    }
    ~Answer() { give(); }
    Answer(const Answer&) = delete;
    Answer& operator=(const Answer&) = delete;

    /// Takes the registry's mutex.
    void give()
    {
        if (given_.exchange(true))
            return;
        registry_.answered(registration_, *this);
        reply_.reset();
    }

    const Connection* const connection; // identifies the answer
    const bool byWriter;
    const bool holdsQueue;

private:
    PresenterRegistry& registry_;
    const std::shared_ptr<Registration> registration_;
    std::shared_ptr<Reply> reply_;
    std::atomic<bool> given_ = false;
};

PresenterRegistry& PresenterRegistry::shared()
{
    static PerProcess<PresenterRegistry> registry;
    return registry.get();
}

PresenterRegistry::PresenterRegistry() : home_(randomNumber())
{
}

void PresenterRegistry::add(const std::shared_ptr<FilePresenter>& presenter, const SHA256Digest& key, AskedBy askedBy)
{
    std::vector<std::unique_ptr<Home>> retired;
    const std::lock_guard lock(mutex_);
    auto registration = std::make_shared<Registration>();
    registration->presenter = presenter;
    registration->queue = presenter->presentedItemOperationQueue();
    registration->key = key;
    if (!registrations_.emplace(presenter.get(), registration).second)
        return;
    try {
        change(*registration, askedBy, retired);
    } catch (...) {
        registrations_.erase(presenter.get());
        throw;
    }
}

void PresenterRegistry::setAskedBy(const FilePresenter& presenter, AskedBy askedBy)
{
    std::vector<std::unique_ptr<Home>> retired;
    const std::lock_guard lock(mutex_);
    const auto found = registrations_.find(&presenter);
    if (found != registrations_.end())
        change(*found->second, askedBy, retired);
}

void PresenterRegistry::remove(const FilePresenter& presenter)
{
    std::unique_ptr<Home> left;
    Answers owed;
    {
        const std::lock_guard lock(mutex_);
        const auto found = registrations_.find(&presenter);
        if (found == registrations_.end())
            return;
        std::vector<std::unique_ptr<Home>> none;
        change(*found->second, AskedBy::nobody, none);
        for (Lane& lane : found->second->lanes) {
            owed.insert(owed.end(), std::move_iterator(lane.waiting.begin()), std::move_iterator(lane.waiting.end()));
            lane.waiting.clear();
            if (auto current = lane.current.lock())
                owed.push_back(std::move(current));
        }
        registrations_.erase(found);
        if (registrations_.empty())
            left = std::move(homeNow_);
    }
    for (const auto& answer : owed)
        answer->give();
}

void PresenterRegistry::followFolder()
{
    std::vector<std::unique_ptr<Home>> retired;
    const std::lock_guard lock(mutex_);
    if (homeNow_)
        moveHome(retired);
}

std::optional<std::int64_t> PresenterRegistry::presenceOfOnly(const FilePresenter* own, const SHA256Digest& key,
                                                              const CoordinationDirectory& directory)
{
    const std::lock_guard lock(mutex_);
    const auto found = registrations_.find(own);
    if (found == registrations_.end() || !homeNow_ || homeNow_->server.directory().get() != &directory ||
        found->second->key != key || found->second->askedBy == AskedBy::nobody)
        return std::nullopt;
    const auto presence = presences_.find({key, found->second->askedBy});
    if (presence == presences_.end() || presence->second != 1)
        return std::nullopt;
    return presenceOffset(found->second->askedBy) + homeNow_->server.slot();
}

bool PresenterRegistry::owesQueue(const FilePresenter* presenter)
{
    const std::lock_guard lock(mutex_);
    const auto found = registrations_.find(presenter);
    return found != registrations_.end() && found->second->owedToQueue > 0;
}

/// Raises the new presence before it lowers the old one, so that the presenter is asked throughout.
void PresenterRegistry::change(Registration& registration, AskedBy askedBy, std::vector<std::unique_ptr<Home>>& retired)
{
    if (askedBy == registration.askedBy)
        return;
    if (askedBy != AskedBy::nobody)
        raise(registration.key, askedBy, retired);
    if (registration.askedBy != AskedBy::nobody)
        lower(registration.key, registration.askedBy);
    registration.askedBy = askedBy;
}

/// Makes others ask for an item by raising its presence byte. Nothing is on disk but empty files; what others see is
/// held by locks and a socket of this process, which the kernel takes back when it dies. Called with the mutex held, in
/// this order:
///
/// 1. moveHome: a slot, its listening socket and the thread that answers. Nobody looks there yet. If the folder in
///    force changed, everything that is raised already is raised in the new one before the old home retires, so that an
///    item always has its presence in one of them.
/// 2. Home::raise: an exclusive lock on the presence byte. From here on whoever looks asks. The socket listened first,
///    so an asker that sees the byte always reaches somebody.
/// 3. A look whether the folder of the lock is still the one in force. If it was deleted in between, the lock is in a
///    file that nobody opens any more, and all begins again in the new folder.
///
/// Only then is the presence counted. A process that dies after 1 leaves a socket at which nobody listens, which the
/// next owner of the slot replaces; after 2 its byte falls with it, and askers that found nobody listening wait for
/// just that. An exception leaves the byte down and the presence uncounted.
void PresenterRegistry::raise(const SHA256Digest& key, AskedBy askedBy, std::vector<std::unique_ptr<Home>>& retired)
{
    const auto presence = presences_.emplace(std::pair(key, askedBy), 0).first;
    try {
        for (bool isRaised = presence->second > 0; !isRaised;)
            try {
                moveHome(retired);
                isRaised = homeNow_->raise(key, askedBy);
            } catch (const std::system_error& failure) {
                if (failure.code().value() != ESTALE) // on ESTALE there is another folder to move to
                    throw;
            }
    } catch (...) {
        presences_.erase(presence);
        throw;
    }
    ++presence->second;
}

void PresenterRegistry::lower(const SHA256Digest& key, AskedBy askedBy)
{
    const auto presence = presences_.find({key, askedBy});
    if (--presence->second > 0)
        return;
    if (homeNow_)
        homeNow_->lower(key, askedBy);
    presences_.erase(presence);
}

/// Moves to the folder in force if it changed. Everything that is raised is raised there before the old folder is let
/// go.
void PresenterRegistry::moveHome(std::vector<std::unique_ptr<Home>>& retired)
{
    while (!homeNow_ || homeNow_->server.directory() != CoordinationDirectory::current()) {
        auto home = std::make_unique<Home>(*this, CoordinationDirectory::current());
        bool complete = true;
        if (homeNow_)
            for (const auto& [presence, count] : presences_)
                complete = complete && (count == 0 || home->raise(presence.first, presence.second));
        if (!complete) {
            retired.push_back(std::move(home));
            continue;
        }
        if (homeNow_)
            retired.push_back(std::move(homeNow_));
        homeNow_ = std::move(home);
    }
}

PresenterRegistry::Home::Home(PresenterRegistry& registry, std::shared_ptr<CoordinationDirectory> directory)
    : server(std::move(directory),
             {.request = [&registry](const Request& request,
                                     const auto& connection) { registry.handle(request, connection); },
              .gone = [&registry](const Connection& connection) { registry.forget(connection); }})
{
}

PresenterRegistry::Home::~Home() = default;

bool PresenterRegistry::Home::raise(const SHA256Digest& key, AskedBy askedBy)
{
    const ItemWindow window(key);
    CoordinationDirectory& directory = *server.directory();
    auto stripe = stripes.find(window.stripe);
    if (stripe == stripes.end())
        stripe = stripes.emplace(window.stripe, Stripe{directory.takeStripe(window.stripe), 0}).first;
    const ByteRange byte = window.range(presenceOffset(askedBy) + server.slot());
    // The slot is ours, and so is its byte, as soon as all descriptors of a killed predecessor are closed.
    waitForLock(stripe->second.descriptor.get(), byte, LockKind::exclusive);
    if (!directory.stillThere(stripe->second.descriptor))
        return false;
    ++stripe->second.raised;
    return true;
}

void PresenterRegistry::Home::lower(const SHA256Digest& key, AskedBy askedBy)
{
    const ItemWindow window(key);
    const auto stripe = stripes.find(window.stripe);
    if (stripe == stripes.end())
        return;
    unlock(stripe->second.descriptor.get(), window.range(presenceOffset(askedBy) + server.slot()));
    if (--stripe->second.raised == 0) {
        server.directory()->putStripe(window.stripe, std::move(stripe->second.descriptor));
        stripes.erase(stripe);
    }
}

/// Calls the presenter for the oldest waiting request, unless it still owes the answer to an earlier one.
void PresenterRegistry::startNext(Registration& registration, bool byWriter, Answers& released)
{
    Lane& lane = registration.lanes[byWriter];
    if (lane.busyWith != nullptr || lane.waiting.empty())
        return;
    const std::shared_ptr<Answer>& answer = released.emplace_back(lane.waiting.front());
    const bool added = registration.queue.add([answer, byWriter, weak = registration.presenter] {
        const std::shared_ptr<FilePresenter> presenter = weak.lock();
        if (!presenter)
            return;
        const Reacquirer reacquirer = [answer] { answer->give(); };
        if (byWriter)
            presenter->relinquishPresentedItemToWriter(reacquirer);
        else
            presenter->relinquishPresentedItemToReader(reacquirer);
    });
    if (!added)
        return; // no thread: it stays first in line until the next request or answer
    lane.busyWith = answer.get();
    lane.current = answer;
    lane.waiting.pop_front();
}

void PresenterRegistry::handle(const Request& request, const std::shared_ptr<Connection>& connection)
{
    const bool byWriter = request.byWriter != 0;
    Answers released;
    const auto reply = std::make_shared<Reply>(connection); // agrees at once if nobody here is to be asked
    const std::lock_guard lock(mutex_);
    for (const auto& [presenter, registration] : registrations_) {
        const bool isAsker = request.askerHome == home_ && request.asker == reinterpret_cast<std::uintptr_t>(presenter);
        if (isAsker || registration->key != request.key || !asks(byWriter, registration->askedBy))
            continue;
        registration->lanes[byWriter].waiting.push_back(
            std::make_shared<Answer>(*this, registration, reply, connection.get(), request));
        registration->owedToQueue += request.holdsQueue != 0 ? 1 : 0;
        startNext(*registration, byWriter, released);
    }
}

void PresenterRegistry::forget(const Connection& connection)
{
    Answers released;
    const std::lock_guard lock(mutex_);
    for (const auto& [presenter, registration] : registrations_)
        for (Lane& lane : registration->lanes) {
            const auto kept = [&](const auto& answer) { return answer->connection != &connection; };
            const auto gone = std::stable_partition(lane.waiting.begin(), lane.waiting.end(), kept);
            std::move(gone, lane.waiting.end(), std::back_inserter(released));
            lane.waiting.erase(gone, lane.waiting.end());
        }
}

void PresenterRegistry::answered(const std::shared_ptr<Registration>& registration, const Answer& answer)
{
    Answers released;
    const std::lock_guard lock(mutex_);
    registration->owedToQueue -= answer.holdsQueue ? 1 : 0;
    Lane& lane = registration->lanes[answer.byWriter];
    if (lane.busyWith != &answer)
        return;
    lane.busyWith = nullptr;
    startNext(*registration, answer.byWriter, released);
}

} // namespace platform
