#include "binding/Coordination.h"

#include "binding/Interpreter.h"
#include "binding/Location.h"
#include "binding/Problem.h"

#include "platform/FileLock.h"
#include "platform/OperationQueue.h"

#include <cerrno>
#include <chrono>
#include <cmath>
#include <condition_variable>
#include <map>
#include <mutex>
#include <thread>
#include <utility>

using platform::CoordinatedAccess;
using platform::CoordinatedItem;
using platform::FileCoordinator;

namespace {

using Clock = std::chrono::steady_clock;
constexpr std::chrono::milliseconds kBetweenSignals{50};

Clock::time_point endOf(Timeout timeout)
{
    constexpr double aYear = 366.0 * 86400;
    if (!timeout || !(*timeout < aYear))
        return Clock::time_point::max();
    return Clock::now() + std::chrono::duration_cast<Clock::duration>(std::chrono::duration<double>(*timeout));
}

[[noreturn]] void throwTimedOut(const std::string& path)
{
    throw Problem(path, kStatusFileBusy, "still in use by another process", ETIMEDOUT);
}

/// The accesses of this process that `ktfiles.lock` holds, by item.
class HeldItems {
public:
    struct Count {
        int readers = 0;
        int writers = 0;
    };

    void add(const CoordinatedItem& item, bool isWriting, int change)
    {
        const std::lock_guard lock(mutex_);
        Count& count = counts_[item.key()];
        (isWriting ? count.writers : count.readers) += change;
        if (count.readers == 0 && count.writers == 0)
            counts_.erase(item.key());
    }
    Count of(const CoordinatedItem& item)
    {
        const std::lock_guard lock(mutex_);
        const auto found = counts_.find(item.key());
        return found != counts_.end() ? found->second : Count();
    }

private:
    std::mutex mutex_;
    std::map<platform::SHA256Digest, Count> counts_;
};

HeldItems& heldItems()
{
    static auto* const items = new HeldItems; // outlives the threads that wait when the process ends
    return *items;
}

std::unique_ptr<CoordinatedAccess> tryToOpen(const CoordinatedItem& item, bool isWriting)
{
    return isWriting ? FileCoordinator().tryToOpenForWriting(item) : FileCoordinator().tryToOpenForReading(item);
}

/// Had by a thread that may wait for as long as that takes; what comes too late is given back.
struct Opening {
    std::mutex mutex;
    std::condition_variable changed;
    bool isDone = false;
    std::unique_ptr<CoordinatedAccess> access;
    platform::Error error;

    void open(const CoordinatedItem& item, bool isWriting, FileCoordinator::WritingOptions options)
    {
        platform::Error why;
        auto had = isWriting ? FileCoordinator().openForWriting(item, options, &why)
                             : FileCoordinator().openForReading(item, FileCoordinator::ReadingOptions::none, &why);
        const std::lock_guard lock(mutex);
        access = std::move(had);
        error = std::move(why);
        isDone = true;
        changed.notify_all();
    }
};

std::unique_ptr<CoordinatedAccess> open(const std::string& path, const CoordinatedItem& item, bool isWriting,
                                        FileCoordinator::WritingOptions options, Timeout timeout)
{
    if (auto access = tryToOpen(item, isWriting))
        return access;
    const Clock::time_point end = endOf(timeout);
    const auto opening = std::make_shared<Opening>();
    if (!platform::runInBackground([=] { opening->open(item, isWriting, options); }))
        throwSystemProblem(path, EAGAIN);
    std::unique_lock lock(opening->mutex);
    while (!opening->isDone) {
        if (Clock::now() >= end)
            throwTimedOut(path);
        opening->changed.wait_until(lock, std::min(end, Clock::now() + kBetweenSignals));
        if (opening->isDone)
            break;
        lock.unlock();
        heedSignals();
        lock.lock();
    }
    if (!opening->access)
        throwProblem(path, opening->error);
    return std::move(opening->access);
}

} // namespace

HeldAccess::HeldAccess(const std::string& path, bool isWriting, Timeout timeout)
    : item_(locationOf(path)),
      isWriting_(isWriting),
      access_(open(path, item_, isWriting, FileCoordinator::WritingOptions::none, timeout))
{
    heldItems().add(item_, isWriting_, 1);
}

HeldAccess::~HeldAccess()
{
    heldItems().add(item_, isWriting_, -1);
}

std::unique_ptr<CoordinatedAccess> accessForEdit(const std::string& path, bool inPlace, Timeout timeout)
{
    const CoordinatedItem item(locationOf(path));
    const HeldItems::Count held = heldItems().of(item);
    if (held.writers > 0)
        return nullptr;
    if (held.readers > 0)
        throw Problem(path, kStatusFileBusy, "is locked for reading by this process, and an edit would wait for that");
    return open(path, item, true,
                inPlace ? FileCoordinator::WritingOptions::none : FileCoordinator::WritingOptions::forReplacing,
                timeout);
}

std::int32_t waitForEdits(int descriptor, const std::string& path, Timeout timeout)
{
    const Clock::time_point end = endOf(timeout);
    while (platform::tryToLockFile(descriptor) == platform::FileLockResult::busy) {
        if (Clock::now() >= end)
            throwTimedOut(path);
        heedSignals();
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    return kStatusOK;
}
