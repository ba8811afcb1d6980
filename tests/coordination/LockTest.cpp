// Counting in both lock classes within one process: handlers, cancellation, races.
#include "CoordinationFolder.h"

#include "coordination/KTFileCoordinationLock.h"
#include "coordination/KTFilePresenterLock.h"
#include "support/QuietLog.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <chrono>
#include <condition_variable>
#include <filesystem>
#include <future>
#include <thread>

using namespace platform;

namespace {

/// Waits for access, which lasts until it is dropped.
std::unique_ptr<CoordinatedAccess> openForWriting(const URLRef& url)
{
    return FileCoordinator().openForWriting(url, FileCoordinator::WritingOptions::none);
}

/// Calls of handlers, in order.
class Calls {
public:
    KTFileLockHandler handler(char name)
    {
        return [this, name] {
            const std::lock_guard guard(mutex_);
            text_ += name;
            changed_.notify_all();
        };
    }
    std::string await(std::size_t count)
    {
        std::unique_lock guard(mutex_);
        changed_.wait(guard, [&] { return text_.size() >= count; });
        return text_;
    }
    std::string text()
    {
        const std::lock_guard guard(mutex_);
        return text_;
    }

private:
    std::mutex mutex_;
    std::condition_variable changed_;
    std::string text_;
};

/// Returns once everything acquired on the item before is released.
void awaitFree(const URLRef& url)
{
    EXPECT_TRUE(openForWriting(url));
}

template <class Lock>
std::shared_ptr<Lock> makeLock(const URLRef& url)
{
    if constexpr (std::is_same_v<Lock, KTFilePresenterLock>)
        return Lock::initLockWithType(Lock::LockType::readersAndWriters, url);
    else
        return Lock::initLockForWritingAtURL(url);
}

/// Waits for a handler to be called on this thread, after which all acquisition handlers have returned.
template <class Lock>
void retainUntilCalledAtOnce(Lock& lock)
{
    for (auto caller = std::make_shared<std::atomic<std::thread::id>>(); *caller != std::this_thread::get_id();)
        lock.retainLockWithFinishedHandler([caller] { *caller = std::this_thread::get_id(); });
}

/// Both classes count alike.
template <class Lock>
class LockCountTest : public CoordinationFolder {
protected:
    std::shared_ptr<Lock> lock = makeLock<Lock>(itemURL());
    Calls calls;
};

using LockClasses = ::testing::Types<KTFilePresenterLock, KTFileCoordinationLock>;

class PresenterLockTest : public CoordinationFolder {};

} // namespace

TYPED_TEST_SUITE(LockCountTest, LockClasses);

TYPED_TEST(LockCountTest, AReleaseDuringTheAcquisitionTakesALaterHolderOrCancels)
{
    struct {
        const char* steps; // + retains, - releases, during the acquisition
        std::int64_t count;
    } const cases[] = {{"+", 1},    {"+-", 0},   {"++-", 1},  {"++--", 0},  {"+-+", 1},
                       {"+--+", 1}, {"+-++", 2}, {"+-+-", 0}, {"+++--", 1}, {"-+", 1}};
    for (const auto& one : cases) {
        SCOPED_TRACE(one.steps);
        const auto fresh = makeLock<TypeParam>(this->itemURL());
        Calls called;
        std::size_t retains = 0;
        {
            const auto other = openForWriting(this->itemURL());
            for (const char step : std::string(one.steps))
                if (step == '+') {
                    fresh->retainLockWithFinishedHandler(called.handler('x'));
                    ++retains;
                } else {
                    fresh->releaseLock();
                }
        }
        called.await(retains); // all handlers are called, also those of holders that left
        if (one.count == 0)
            awaitFree(this->itemURL());
        EXPECT_EQ(fresh->lockCount(), one.count);
        fresh->resetLock();
        awaitFree(this->itemURL());
        EXPECT_EQ(called.text().size(), retains);
    }
}

TYPED_TEST(LockCountTest, WhoRetainsDuringTheFirstHandlerIsCalledBehindTheOthers)
{
    std::promise<void> begun, goOn;
    {
        const auto other = openForWriting(this->itemURL());
        this->lock->retainLockWithFinishedHandler([&] {
            begun.set_value();
            goOn.get_future().wait();
            this->calls.handler('a')();
        });
        this->lock->retainLockWithFinishedHandler(this->calls.handler('b'));
    }
    begun.get_future().wait();
    this->lock->retainLockWithFinishedHandler(this->calls.handler('c'));
    EXPECT_EQ(this->lock->lockCount(), 3);
    EXPECT_EQ(this->calls.text(), "");
    goOn.set_value();
    EXPECT_EQ(this->calls.await(3), "abc");
    this->lock->resetLock();
    awaitFree(this->itemURL());
    this->lock->retainLockWithFinishedHandler(this->calls.handler('d'));
    this->calls.await(4);
    retainUntilCalledAtOnce(*this->lock);
    this->lock->resetLock();
}

TYPED_TEST(LockCountTest, AnAcquisitionThatFailsCallsNobodyAndLeavesTheLockIdle)
{
    FileCoordinator::setCoordinationFolder(this->item("no/such/folder"));
    const QuietLog quiet;
    this->lock->retainLockWithFinishedHandler(this->calls.handler('a'));
    while (this->lock->isInUse())
        std::this_thread::yield();
    EXPECT_EQ(this->lock->lockCount(), 0);
    FileCoordinator::setCoordinationFolder(this->folder());
    this->lock->retainLockWithFinishedHandler(this->calls.handler('b'));
    EXPECT_EQ(this->calls.await(1), "b");
    this->lock->releaseLock();
}

namespace {

/// Number of this process's sockets, through which others find its presenters.
std::ptrdiff_t sockets()
{
    std::error_code error;
    const std::filesystem::directory_iterator all("/proc/self/fd");
    return std::count_if(begin(all), end(all), [&](const auto& entry) {
        return std::filesystem::read_symlink(entry.path(), error).string().starts_with("socket:");
    });
}

template <class Lock>
void retainByURL(const URLRef& url, KTFileLockHandler handler)
{
    if constexpr (std::is_same_v<Lock, KTFilePresenterLock>)
        Lock::retainLockForURL(url, {}, std::move(handler));
    else
        Lock::retainWriteLockForURL(url, std::move(handler));
}

} // namespace

TYPED_TEST(LockCountTest, TheTableKnowsALockUntilItIsRemoved)
{
    this->lock.reset(); // it is presented too
    const std::ptrdiff_t before = sockets();
    EXPECT_FALSE(TypeParam::lockForURL(this->itemURL()));
    retainByURL<TypeParam>(this->itemURL(), this->calls.handler('a'));
    this->calls.await(1);
    const auto kept = TypeParam::lockForURL(this->itemURL());
    ASSERT_TRUE(kept);
    EXPECT_EQ(kept->lockCount(), 1);
    const bool presents = std::is_same_v<TypeParam, KTFilePresenterLock>;
    EXPECT_NE(TypeParam::_logLocks().find("\nLocked: YES Count:   1 " + std::string(presents ? "R: NO  W: NO  " : "") +
                                          "Path: '" + this->item() + "'"),
              std::string::npos);
    retainUntilCalledAtOnce(*kept);
    const std::int64_t count = kept->lockCount();
    // An exception of a host's handler reaches the host and leaves the table intact.
    EXPECT_THROW(retainByURL<TypeParam>(this->itemURL(), [] { throw 1; }), int);
    EXPECT_EQ(kept->lockCount(), count + 1);
    kept->resetLock();
    awaitFree(this->itemURL());
    TypeParam::removeLockForURL(this->itemURL());
    EXPECT_FALSE(TypeParam::lockForURL(this->itemURL()));
    EXPECT_LE(sockets(), before); // no longer presented, although somebody holds it
}

TEST_F(PresenterLockTest, OfTwoLocksOfOneFileOneAtATimeIsHeld)
{
    // Both are visible as being acquired by the time one is held.
    const auto make = [&] {
        return KTFilePresenterLock::initLockWithType(KTFilePresenterLock::LockType::readersAndWriters, itemURL());
    };
    const std::array locks = {make(), make()};
    for (int round = 0; round < 100; ++round) {
        auto other = openForWriting(itemURL());
        Calls calls;
        for (std::size_t i = 0; i < 2; ++i)
            locks[i]->retainLockWithFinishedHandler(calls.handler(static_cast<char>('0' + i)));
        other.reset();
        const std::size_t first = calls.await(1)[0] == '0' ? 0 : 1;
        while (!locks[first]->isWriterWaiting())
            std::this_thread::yield();
        ASSERT_EQ(calls.text().size(), 1u);
        locks[first]->releaseLock();
        calls.await(2);
        locks[1 - first]->releaseLock();
    }
}

/// For thread sanitizer: all operations at once, with a count that must balance.
TYPED_TEST(LockCountTest, RacesOfRetainReleaseResetEndIdle)
{
    constexpr int kRounds = 300;
    std::atomic<int> called = 0;
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i)
        threads.emplace_back([&, i] {
            for (int round = 0; round < kRounds; ++round) {
                this->lock->retainLockWithFinishedHandler([&] { ++called; });
                if (i == 3 && round % 16 == 0)
                    this->lock->resetLock();
                if (i == 0)
                    KTFilePresenterLock::retainLockForURL(this->itemURL());
                this->lock->releaseLock();
                if (i == 0)
                    KTFilePresenterLock::releaseLockForURL(this->itemURL());
                if (i == 1)
                    KTFilePresenterLock::removeUnusedLocks();
                this->lock->lockCount();
            }
        });
    for (std::thread& thread : threads)
        thread.join();
    // An acquisition may be in progress, and resets may have removed holders before their release.
    while (this->lock->isInUse())
        this->lock->resetLock();
    while (const auto table = KTFilePresenterLock::lockForURL(this->itemURL())) {
        table->resetLock();
        KTFilePresenterLock::removeUnusedLocks();
    }
    awaitFree(this->itemURL());
    // An acquisition whose holders were reset still calls their handlers.
    for (int i = 0; i < 60'000 && called < 4 * kRounds; ++i)
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
    EXPECT_EQ(called, 4 * kRounds); // every handler once
}
