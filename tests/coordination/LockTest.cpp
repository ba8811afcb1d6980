// The counting of both lock classes, within one process: handlers, cancellation, tables.
#include "CoordinationFolder.h"

#include "coordination/KTFileCoordinationLock.h"
#include "coordination/KTFilePresenterLock.h"
#include "platform/Log.h"

#include <gtest/gtest.h>

#include <array>
#include <atomic>
#include <condition_variable>
#include <fstream>
#include <future>
#include <thread>

using namespace platform;

namespace {

/// An access in progress on a thread of its own, until it is left.
class OpenAccess {
public:
    explicit OpenAccess(URLRef url, bool isWriting = true)
        : thread_([this, url, isWriting] {
              const auto accessor = [this](const URLRef&) {
                  entered_.set_value();
                  left_.get_future().wait();
              };
              isWriting ? FileCoordinator().coordinateWriting(url, FileCoordinator::WritingOptions::none, accessor)
                        : FileCoordinator().coordinateReading(url, FileCoordinator::ReadingOptions::none, accessor);
          })
    {
    }
    ~OpenAccess()
    {
        if (!isLeft_)
            left_.set_value();
        if (thread_.joinable())
            thread_.join();
    }
    void awaitEntry() { entered_.get_future().wait(); }
    /// As soon as it has entered.
    void letLeave() { left_.set_value(), isLeft_ = true; }
    void leave()
    {
        letLeave();
        thread_.join();
    }

private:
    std::promise<void> entered_, left_;
    bool isLeft_ = false;
    std::thread thread_;
};

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

/// Returns once everything that was acquired on the item before has been let go of.
void awaitFree(const URLRef& url)
{
    EXPECT_TRUE(FileCoordinator().coordinateWriting(url, FileCoordinator::WritingOptions::none, [](const URLRef&) {}));
}

template <class Lock>
std::shared_ptr<Lock> makeLock(const URLRef& url)
{
    if constexpr (std::is_same_v<Lock, KTFilePresenterLock>)
        return Lock::initLockWithType(Lock::LockType::readersAndWriters, url);
    else
        return Lock::initLockForWritingAtURL(url);
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
class CoordinationLockTest : public CoordinationFolder {};

} // namespace

TYPED_TEST_SUITE(LockCountTest, LockClasses);

TYPED_TEST(LockCountTest, HoldersThatComeDuringTheAcquisitionAreCountedAndCalledInOrder)
{
    OpenAccess other(this->itemURL());
    other.awaitEntry();
    for (const char name : {'a', 'b', 'c'})
        this->lock->retainLockWithFinishedHandler(this->calls.handler(name));
    EXPECT_EQ(this->lock->lockCount(), 0);
    EXPECT_TRUE(this->lock->isInUse());
    EXPECT_FALSE(this->lock->isLocking());
    other.leave();
    EXPECT_EQ(this->calls.await(3), "abc");
    EXPECT_EQ(this->lock->lockCount(), 3);
    this->lock->retainLockWithFinishedHandler(this->calls.handler('d')); // held: at once, on this thread
    EXPECT_EQ(this->calls.text(), "abcd");
    this->lock->releaseLock();
    EXPECT_EQ(this->lock->lockCount(), 3);
    this->lock->resetLock();
    EXPECT_EQ(this->lock->lockCount(), 0);
    EXPECT_FALSE(this->lock->isInUse());
    awaitFree(this->itemURL());
}

TYPED_TEST(LockCountTest, AReleaseDuringTheAcquisitionTakesALaterHolderOrCancels)
{
    struct {
        const char* steps; // + retains, - releases, in the acquisition
        std::int64_t count;
    } const cases[] = {{"+", 1},    {"+-", 0},   {"++-", 1},  {"++--", 0},  {"+-+", 1},
                       {"+--+", 1}, {"+-++", 2}, {"+-+-", 0}, {"+++--", 1}, {"-+", 1}};
    for (const auto& one : cases) {
        SCOPED_TRACE(one.steps);
        const auto fresh = makeLock<TypeParam>(this->itemURL());
        Calls called;
        std::size_t retains = 0;
        {
            OpenAccess other(this->itemURL());
            other.awaitEntry();
            for (const char step : std::string(one.steps))
                if (step == '+') {
                    fresh->retainLockWithFinishedHandler(called.handler('x'));
                    ++retains;
                } else {
                    fresh->releaseLock();
                }
        }
        called.await(retains); // every handler is called, also those of holders that have left
        if (one.count == 0)
            awaitFree(this->itemURL());
        EXPECT_EQ(fresh->lockCount(), one.count);
        fresh->resetLock();
        awaitFree(this->itemURL());
        EXPECT_EQ(called.text().size(), retains);
    }
}

TYPED_TEST(LockCountTest, HandlersMayRetainAndRelease)
{
    std::promise<std::int64_t> count;
    this->lock->retainLockWithFinishedHandler([&] {
        this->lock->retainLockWithFinishedHandler(this->calls.handler('i'));
        this->lock->releaseLock();
        this->lock->releaseLock();
        count.set_value(this->lock->lockCount());
    });
    EXPECT_EQ(count.get_future().get(), 0);
    awaitFree(this->itemURL());
    EXPECT_EQ(this->calls.text(), "i");
    EXPECT_FALSE(this->lock->isInUse());
    this->lock->retainLockWithFinishedHandler(this->calls.handler('j')); // and it starts anew
    EXPECT_EQ(this->calls.await(2), "ij");
    EXPECT_EQ(this->lock->lockCount(), 1);
    this->lock->releaseLock();
}

TYPED_TEST(LockCountTest, AnAcquisitionThatFailsCallsNobodyAndLeavesTheLockIdle)
{
    FileCoordinator::setCoordinationFolder(this->item("no/such/folder"));
    const LogHandler before = setLogHandler(nullptr);
    this->lock->retainLockWithFinishedHandler(this->calls.handler('a'));
    while (this->lock->isInUse())
        std::this_thread::yield();
    EXPECT_EQ(this->lock->lockCount(), 0);
    FileCoordinator::setCoordinationFolder(this->folder());
    this->lock->retainLockWithFinishedHandler(this->calls.handler('b'));
    EXPECT_EQ(this->calls.await(1), "b");
    this->lock->releaseLock();
    setLogHandler(before);
}

TEST_F(PresenterLockTest, ItsOwnCoordinatorIsNotAsked)
{
    const auto lock =
        KTFilePresenterLock::initLockWithType(KTFilePresenterLock::LockType::readersAndWriters, itemURL());
    Calls calls;
    lock->retainLockWithFinishedHandler(calls.handler('a'));
    calls.await(1);
    awaitFree(urlOf(item("another"))); // nor are other items its business
    EXPECT_TRUE(FileCoordinator(lock).coordinateWriting(itemURL(), FileCoordinator::WritingOptions::forReplacing,
                                                        [&](const URLRef&) { calls.handler('w')(); }));
    EXPECT_EQ(calls.text(), "aw");
    EXPECT_FALSE(lock->isWriterWaiting());
    lock->releaseLock();
}

TEST_F(PresenterLockTest, OfTwoLocksOfOneFileOneAtATimeIsHeld)
{
    // Both are seen as being acquired by the time that one comes to be held.
    const auto make = [&] {
        return KTFilePresenterLock::initLockWithType(KTFilePresenterLock::LockType::readersAndWriters, itemURL());
    };
    const std::array locks = {make(), make()};
    for (int round = 0; round < 100; ++round) {
        OpenAccess other(itemURL());
        other.awaitEntry();
        Calls calls;
        for (std::size_t i = 0; i < 2; ++i)
            locks[i]->retainLockWithFinishedHandler(calls.handler(static_cast<char>('0' + i)));
        other.leave();
        const std::size_t first = calls.await(1)[0] == '0' ? 0 : 1;
        while (!locks[first]->isWriterWaiting())
            std::this_thread::yield();
        ASSERT_EQ(calls.text().size(), 1u);
        locks[first]->releaseLock();
        calls.await(2);
        locks[1 - first]->releaseLock();
    }
}

TEST_F(PresenterLockTest, TellsWhoWaitsAndWhenNobodyDoesAnyMore)
{
    const auto lock = KTFilePresenterLock::addLockWithType(KTFilePresenterLock::LockType::readersAndWriters, itemURL());
    Calls calls;
    lock->retainLockWithFinishedHandler(calls.handler('a'));
    calls.await(1);
    OpenAccess writer(itemURL()), reader(itemURL(), false);
    while (!lock->isWriterWaiting() || !lock->isReaderWaiting())
        std::this_thread::yield();
    EXPECT_EQ(KTFilePresenterLock::_logLocks(), "\nLocked: YES Count:   1 R: YES W: YES Path: '" + item() + "'\n");
    lock->releaseLock();
    EXPECT_FALSE(lock->isWriterWaiting() || lock->isReaderWaiting());
    writer.letLeave(); // either may be the first
    reader.leave();
    EXPECT_EQ(KTFilePresenterLock::_logLocks(), "\nLocked: NO  Count:   0 R: NO  W: NO  Path: '" + item() + "'\n");
    KTFilePresenterLock::removeUnusedLocks();
    EXPECT_EQ(KTFilePresenterLock::_logLocks(), "\n");
}

TEST_F(PresenterLockTest, TheTableSharesALockByWhereThePathLeads)
{
    namespace fs = std::filesystem;
    fs::create_directory(item("real"));
    fs::create_directory_symlink(item("real"), item("linked"));
    const auto lock =
        KTFilePresenterLock::addLockWithType(KTFilePresenterLock::LockType::writersOnly, urlOf(item("real/new.wav")));
    for (const char* name : {"real/new.wav", "linked/new.wav", "linked/./new.wav"})
        EXPECT_EQ(KTFilePresenterLock::lockForURL(urlOf(item(name))), lock) << name;
    std::ofstream(item("real/new.wav")) << "created";
    EXPECT_EQ(KTFilePresenterLock::lockForURL(urlOf(item("linked/new.wav"))), lock);
    EXPECT_EQ(
        KTFilePresenterLock::addLockWithType(KTFilePresenterLock::LockType::readersOnly, urlOf(item("real/new.wav"))),
        lock);
    EXPECT_EQ(lock->lockType(), KTFilePresenterLock::LockType::writersOnly);
    EXPECT_EQ(KTFilePresenterLock::lockForURL(urlOf(item("real/other.wav"))), nullptr);
    EXPECT_EQ(KTFilePresenterLock::addLockWithType(KTFilePresenterLock::LockType::writersOnly, nullptr), nullptr);
    KTFilePresenterLock::removeLockForURL(urlOf(item("linked/new.wav")));
    EXPECT_EQ(KTFilePresenterLock::lockForURL(urlOf(item("real/new.wav"))), nullptr);
}

TEST_F(PresenterLockTest, LocksInUseAreNotRemoved)
{
    Calls calls;
    OpenAccess other(itemURL());
    other.awaitEntry();
    KTFilePresenterLock::retainLockForURL(itemURL(), {.requestSecurityScopedURLAccess = true}, calls.handler('a'));
    const auto lock = KTFileLock::lockForURL(itemURL());
    ASSERT_TRUE(lock);
    const auto isRegistered = [&] { return KTFileLock::lockForURL(itemURL()) == lock; };
    for (const bool isHeld : {false, true}) { // being acquired, and held
        if (isHeld) {
            other.leave();
            calls.await(1);
        }
        KTFileLock::removeUnusedLocks();
        KTFilePresenterLock::removeLockForURL(itemURL());
        EXPECT_TRUE(isRegistered()) << isHeld;
    }
    KTFileLock::retainLockForURL(itemURL()); // held: keeps the flags of the first holder
    EXPECT_TRUE(KTFilePresenterLock::lockForURL(itemURL())->requestSecurityScopedURLAccess());
    KTFileLock::releaseLockForURL(itemURL());
    EXPECT_EQ(lock->lockCount(), 1);
    KTFileLock::releaseLockForURL(itemURL());
    KTFileLock::removeUnusedLocks();
    EXPECT_FALSE(isRegistered());
}

TEST_F(CoordinationLockTest, GivesTheURLOfTheAccessAndKeepsItOpen)
{
    Calls calls;
    KTFileCoordinationLock::retainWriteLockForURL(itemURL(), calls.handler('a'));
    const auto lock = KTFileCoordinationLock::lockForURL(itemURL());
    calls.await(1);
    ASSERT_TRUE(lock->coordinationBlockURL());
    EXPECT_EQ(lock->coordinationBlockURL()->posixPath(), item());
    EXPECT_EQ(KTFileCoordinationLock::_logLocks(), "\nLocked: YES Count:   1 Path: '" + item() + "'\n");
    KTFileCoordinationLock::removeLockForURL(itemURL());
    EXPECT_EQ(KTFileCoordinationLock::lockForURL(itemURL()), lock);
    EXPECT_EQ(KTFileCoordinationLock::addLockForReadingAtURL(itemURL()), lock);
    KTFileCoordinationLock::releaseWriteLockForURL(itemURL());
    awaitFree(itemURL());
    KTFileCoordinationLock::removeLockForURL(itemURL());
    EXPECT_EQ(KTFileCoordinationLock::lockForURL(itemURL()), nullptr);
}

TEST_F(CoordinationLockTest, ReadersShareTheItem)
{
    const auto first = KTFileCoordinationLock::initLockForReadingAtURL(itemURL());
    const auto second = KTFileCoordinationLock::fileCoordinationLockForReadingAtURL(itemURL());
    Calls calls;
    first->retainLockWithFinishedHandler(calls.handler('a'));
    second->retainLockWithFinishedHandler(calls.handler('b'));
    EXPECT_EQ(calls.await(2).size(), 2u);
    first->releaseLock();
    second->releaseLock();
    awaitFree(itemURL());
}

/// What thread sanitizer is to look at: all operations at once, and a count that comes out even.
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
    while (this->lock
               ->isInUse()) // an acquisition may be under way, and resets may have taken holders before their release
        this->lock->resetLock();
    while (const auto table = KTFilePresenterLock::lockForURL(this->itemURL())) {
        table->resetLock();
        KTFilePresenterLock::removeUnusedLocks();
    }
    awaitFree(this->itemURL());
    EXPECT_EQ(called, 4 * kRounds); // every handler once
}
