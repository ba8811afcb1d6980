// Faults around the service: misbehaving presenters, stopped and forked processes, a bad folder, a failing system.
#include "AgentProcess.h"
#include "CoordinationFolder.h"

#include "coordination/KTFileCoordinationLock.h"
#include "coordination/KTFilePresenterLock.h"
#include "platform/core/Status.h"
#include "platform/posix/CoordinationDirectory.h"
#include "platform/posix/ItemWindow.h"

#include <gtest/gtest.h>

#include <atomic>
#include <cerrno>
#include <fstream>
#include <functional>
#include <future>
#include <latch>
#include <thread>

#include <dlfcn.h>
#include <fcntl.h>
#include <signal.h>
#include <sys/stat.h>
#include <unistd.h>

namespace fs = std::filesystem;
using namespace platform;

namespace {

class FaultTest : public CoordinationFolder {
protected:
    /// The error with which a write fails; 0 if it succeeds.
    int errorOfWrite(const std::string& path)
    {
        Error error;
        return FileCoordinator().coordinateWriting(
                   urlOf(path), FileCoordinator::WritingOptions::none, [](const URLRef&) {}, &error)
                   ? 0
                   : static_cast<int>(error.code);
    }
    int errorOfWrite() { return errorOfWrite(item()); }
};

struct Misbehaviour {
    const char* behaviour;
    const char* release; // what lets the writer through if nothing else does
    const char* sign;    // what is reported before
};

std::size_t openDescriptors()
{
    return static_cast<std::size_t>(std::distance(fs::directory_iterator("/proc/self/fd"), fs::directory_iterator()));
}

std::size_t threads()
{
    return static_cast<std::size_t>(std::distance(fs::directory_iterator("/proc/self/task"), fs::directory_iterator()));
}

} // namespace

TEST_F(FaultTest, APresenterMayNotAnswerAnswerTwiceDropTheAnswerLeaveOrSave)
{
    for (const Misbehaviour& one : {Misbehaviour{"never", "p answer", ""},
                                    {"never", "p unregister", ""},
                                    {"twice", nullptr, ""},
                                    {"drop", nullptr, ""},
                                    {"save", nullptr, "p saved"},
                                    {"atonce", nullptr, ""}}) {
        SCOPED_TRACE(std::string(one.behaviour) + (one.release != nullptr ? one.release : ""));
        AgentProcess presenter(folder()), writer(folder()), next(folder()), reader(folder());
        presenter.tell(std::string("p present ") + one.behaviour + " " + item());
        ASSERT_TRUE(presenter.expect("p presents"));
        writer.begin("w", "write", item());
        ASSERT_TRUE(presenter.expect("p asked by writer"));
        if (one.release != nullptr) {
            ASSERT_TRUE(awaitWaiting(writer, item(), true));
            next.begin("n", "write", item()); // behind it in the queue, and not in the way of readers
            ASSERT_TRUE(awaitWaiting(next, item(), true));
            ASSERT_TRUE(reader.beginsAndGets("r", "read", item()));
            reader.end("r");
            EXPECT_FALSE(writer.has("w"));
            presenter.tell(one.release);
        }
        if (*one.sign != '\0') {
            ASSERT_TRUE(presenter.expect(one.sign));
        }
        ASSERT_TRUE(writer.gets("w"));
        writer.end("w");
        ASSERT_TRUE(writer.expect("w out"));
    }
}

TEST_F(FaultTest, ASecondRequestOfAKindWaitsForItsTurn)
{
    AgentProcess presenter(folder()), first(folder()), second(folder());
    ASSERT_TRUE(presenter.beginsAndGets("p", "presenterlock 1", item()));
    for (AgentProcess* reader : {&first, &second}) {
        reader->begin("r", "read", item());
        ASSERT_TRUE(awaitWaiting(*reader, item(), false));
    }
    for (std::string state; !state.ends_with(" R"); state = presenter.expectStart("p count"))
        presenter.tell("p state");
    presenter.end("p");
    for (AgentProcess* reader : {&first, &second})
        ASSERT_TRUE(reader->gets("r"));
    presenter.tell("p state");
    EXPECT_TRUE(presenter.expect("p count 0"));
}

TEST_F(FaultTest, AStoppedProcessThatHoldsNothingStopsNobody)
{
    AgentProcess stopped(folder()), writer(folder());
    ASSERT_TRUE(stopped.beginsAndGets("p", "presenterlock 0", item()));
    stopped.end("p");
    ASSERT_TRUE(stopped.expect("p releases"));
    stopped.tell("p state");
    ASSERT_TRUE(stopped.expect("p count 0"));
    ASSERT_EQ(errorOfWrite(), 0); // the accessor that acquired the lock has ended too
    stopped.signal(SIGSTOP);
    EXPECT_TRUE(writer.beginsAndGets("w", "write", item()));
}

TEST_F(FaultTest, AForkedChildKeepsNothingOfItsParents)
{
    for (const char* held : {"presenterlock 0", "coordlock 1"}) {
        AgentProcess parent(folder()), writer(folder());
        ASSERT_TRUE(parent.beginsAndGets("a", held, item()));
        parent.tell("fork");
        const pid_t child = std::stoi(parent.expectStart("forked ").substr(7));
        writer.begin("w", "write", item());
        ASSERT_TRUE(awaitWaiting(writer, item(), true));
        parent.kill();
        EXPECT_TRUE(writer.gets("w"));
        EXPECT_EQ(::kill(child, SIGKILL), 0); // it was there all the time
    }
}

TEST_F(FaultTest, InterruptingSignalsDoNotShow)
{
    AgentProcess holder(folder()), presenter(folder()), writer(folder()), reader(folder());
    for (AgentProcess* agent : {&holder, &presenter, &writer, &reader})
        agent->tell("storm");
    presenter.tell("p present never " + item());
    ASSERT_TRUE(presenter.expect("p presents"));
    ASSERT_TRUE(holder.beginsAndGets("h", "coordlock 0", item()));
    writer.begin("w", "write", item());
    ASSERT_TRUE(presenter.expect("p asked by writer"));
    presenter.tell("p answer");
    ASSERT_TRUE(awaitWaiting(writer, item(), true)); // now for the reader
    reader.begin("r", "read", item());
    holder.end("h");
    writer.end("w");
    reader.end("r"); // it may have overtaken the writer meanwhile
    EXPECT_TRUE(writer.expect("w out"));
    EXPECT_TRUE(reader.expect("r out"));
}

TEST_F(FaultTest, WithoutDescriptorsTheErrorSaysSo)
{
#ifdef __SANITIZE_ADDRESS__
    GTEST_SKIP() << "the sanitizers need descriptors of their own to look at an object's type";
#endif
    AgentProcess poor(folder()), presenter(folder()), writer(folder());
    poor.tell("limit 3"); // input, output, errors
    ASSERT_TRUE(poor.expect("limited"));
    poor.begin("w", "write", item());
    EXPECT_EQ(poor.expectStart("w error").substr(0, 10), "w error " + std::to_string(EMFILE));
    poor.tell("p present atonce " + item());
    EXPECT_EQ(poor.expectStart("p error").substr(0, 10), "p error " + std::to_string(EMFILE));
    poor.begin("l", "presenterlock 0", item());
    for (std::string state; state != "l count 0";) {
        poor.tell("l state");
        state = poor.expectStart("l count");
        ASSERT_FALSE(state.empty());
    }
    writer.begin("w", "write", item()); // nothing was left behind
    EXPECT_TRUE(writer.gets("w"));
}

TEST_F(FaultTest, WithoutMemoryForLocksTheErrorSaysSoAndNothingIsHeld)
{
    static int left;
    static LockCall real;
    real = lockCall();
    bool isDone = false;
    for (int calls = 0; !isDone; ++calls) { // each lock call in turn
        left = calls;
        lockCall() = [](int descriptor, int command, void* lock) {
            if (left-- > 0)
                return real(descriptor, command, lock);
            errno = ENOLCK;
            return -1;
        };
        const int error = errorOfWrite();
        isDone = left >= 0;
        lockCall() = real;
        EXPECT_EQ(error, isDone || error == 0 ? 0 : ENOLCK);
        EXPECT_EQ(errorOfWrite(), 0); // hangs if something was left behind
    }
}

TEST_F(FaultTest, AFolderThatIsNotOursAloneIsRefused)
{
    const auto expectRefused = [&](const char* what, int error) {
        FileCoordinator::setCoordinationFolder(folder());
        EXPECT_EQ(errorOfWrite(), error) << what;
        fs::remove_all(folder());
    };
    fs::create_directory(folder());
    fs::permissions(folder(), fs::perms::owner_all | fs::perms::group_exec);
    expectRefused("open to others", EACCES);
    fs::create_directory(item("elsewhere"));
    fs::permissions(item("elsewhere"), fs::perms::owner_all);
    fs::create_directory_symlink(item("elsewhere"), folder());
    expectRefused("a symbolic link", ENOTDIR);
    std::ofstream(folder()) << "x";
    expectRefused("a file", ENOTDIR);
    fs::create_directory(folder());
    fs::permissions(folder(), fs::perms::owner_all);
    const std::string stripe =
        folder() + "/" + CoordinationDirectory::stripeName(ItemWindow(CoordinatedItem(itemURL()).key()).stripe);
    fs::create_symlink(item("target"), stripe);
    expectRefused("a stripe that is a symbolic link", ELOOP);
    if (geteuid() == 0) {
        fs::create_directory(folder());
        fs::permissions(folder(), fs::perms::owner_all);
        ASSERT_EQ(chown(folder().c_str(), 65534, 65534), 0);
        Error error;
        FileCoordinator::setCoordinationFolder(folder());
        EXPECT_FALSE(FileCoordinator().openForReading(itemURL(), FileCoordinator::ReadingOptions::none, &error));
        EXPECT_NE(error.description.find("user 65534"), std::string::npos) << error.description;
        expectRefused("of another user", EACCES);
    }
    expectRefused("missing, and made", 0);
    FileCoordinator::setCoordinationFolder(item("no/folder"));
    EXPECT_EQ(errorOfWrite(), ENOENT);
}

TEST_F(FaultTest, ADeletedFolderIsMadeAgainAndWaitersFindEachOtherThere)
{
    AgentProcess holder(folder()), waiter(folder()), presenter(folder());
    ASSERT_TRUE(presenter.beginsAndGets("p", "presenterlock 0", item("presented")));
    ASSERT_TRUE(holder.beginsAndGets("h", "write", item()));
    waiter.begin("w", "write", item());
    ASSERT_TRUE(awaitWaiting(waiter, item(), true));
    fs::remove_all(folder());
    ASSERT_EQ(errorOfWrite(item("other")), 0); // makes it again
    ASSERT_TRUE(fs::exists(folder()));
    holder.end("h");
    ASSERT_TRUE(waiter.gets("w")); // in the new folder, where another finds it
    AgentProcess late(folder());
    late.begin("l", "write", item());
    ASSERT_TRUE(awaitWaiting(late, item(), true));
    waiter.end("w");
    ASSERT_TRUE(late.gets("l"));
    // A presenter that notices moves what it holds.
    ASSERT_TRUE(presenter.beginsAndGets("q", "presenterlock 0", item("more")));
    late.begin("m", "write", item("presented"));
    ASSERT_TRUE(awaitWaiting(late, item("presented"), true));
    presenter.end("p");
    EXPECT_TRUE(late.gets("m"));
}

TEST_F(FaultTest, WithoutTicketsAccessStillExcludesAndEnds)
{
    const ItemWindow window(CoordinatedItem(itemURL()).key());
    AgentProcess holder(folder()), writer(folder()), reader(folder());
    ASSERT_TRUE(holder.beginsAndGets("h", "write", item()));
    Descriptor last = CoordinationDirectory::current()->takeStripe(window.stripe);
    ASSERT_TRUE(tryLock(last.get(), window.range(kWriterTickets + kTicketCount - 1), LockKind::exclusive));
    writer.begin("w", "write", item());
    reader.begin("r", "read", item());
    ASSERT_TRUE(awaitWaiting(reader, item(), false));
    ASSERT_TRUE(awaitWaiting(writer, item(), false));
    holder.end("h");
    ASSERT_TRUE(holder.expect("h out"));
    EXPECT_FALSE(writer.has("w") || reader.has("r")); // the ticket is ahead of both
    unlock(last.get(), window.whole());
    writer.end("w");
    reader.end("r");
    EXPECT_TRUE(writer.expect("w out"));
    EXPECT_TRUE(reader.expect("r out"));
}

TEST_F(FaultTest, WhoWaitsStandsBehindTheLastTicketWhateverGapsTheKilledLeft)
{
    const ItemWindow window(CoordinatedItem(itemURL()).key());
    const std::vector<std::int64_t> sets[] = {{0},
                                              {0, 1, 2, 3, 4, 5, 6},
                                              {0, 3, 5},
                                              {3},
                                              {0, 1000},
                                              {0, 2, 5, 9, 11},
                                              {2, 4, 8, 9, 200, 4000, 70000},
                                              {kTicketCount - 2}};
    for (const auto& taken : sets)
        for (const std::int64_t tickets : {kWriterTickets, kReaderTickets}) {
            AgentProcess holder(folder()), writer(folder());
            ASSERT_TRUE(holder.beginsAndGets("h", "write", item()));
            Descriptor others = CoordinationDirectory::current()->takeStripe(window.stripe);
            for (const std::int64_t number : taken)
                ASSERT_TRUE(tryLock(others.get(), window.range(tickets + number), LockKind::exclusive));
            writer.begin("w", "write", item());
            ASSERT_TRUE(awaitWaiting(writer, item(), true));
            const auto found = findExclusiveLock(others.get(), window.range(kWriterTickets, kTicketCount));
            ASSERT_TRUE(found);
            EXPECT_EQ(window.offsetOf(found->start) - kWriterTickets, taken.back() + 1);
            EXPECT_EQ(found->length, 1);
        }
}

// A process that is present but cannot be asked has just ended or begun; its slot may pass to others.
TEST_F(FaultTest, ThePresenceOfOneWhoCannotBeAskedIsWaitedForAndLeftAlone)
{
    const ItemWindow window(CoordinatedItem(itemURL()).key());
    Descriptor gone = CoordinationDirectory::current()->takeStripe(window.stripe);
    for (const auto& [askedBy, isWriting] : {std::pair(AskedBy::readers, false), std::pair(AskedBy::writers, true),
                                             std::pair(AskedBy::both, false), std::pair(AskedBy::both, true)}) {
        const ByteRange byte = window.range(presenceOffset(askedBy) + 3);
        ASSERT_TRUE(tryLock(gone.get(), byte, LockKind::exclusive));
        AgentProcess comer(folder());
        comer.begin("c", isWriting ? "write" : "read", item());
        ASSERT_TRUE(awaitWaiting(comer, item(), isWriting));
        unlock(gone.get(), byte);
        ASSERT_TRUE(comer.gets("c"));
        EXPECT_TRUE(tryLock(gone.get(), byte, LockKind::exclusive)) << (isWriting ? "write" : "read");
        unlock(gone.get(), window.whole());
    }
}

TEST_F(FaultTest, AFileMayBeCreatedReplacedAndRenamedWhileItIsLocked)
{
    const auto write = [](const std::string& path) { std::ofstream(path) << "content"; };
    const std::string path = item();
    const std::pair<const char*, std::function<void()>> steps[] = {
        {"created", [&] { write(path); }},
        {"replaced", [&] { write(item("fresh")), fs::rename(item("fresh"), path); }},
        {"renamed", [&] { fs::rename(path, item("away.wav")); }}, // the lock is the name's
        {"linked", [&] { fs::create_directory_symlink(fs::path(path).parent_path(), item("folder")); }},
    };
    for (const auto& [name, step] : steps) {
        SCOPED_TRACE(name);
        AgentProcess holder(folder()), writer(folder());
        ASSERT_TRUE(holder.beginsAndGets("h", "presenterlock 0", path));
        step();
        const std::string asked = fs::exists(item("folder")) ? item("folder/song.wav") : path;
        writer.begin("w", "write", asked);
        ASSERT_TRUE(awaitWaiting(writer, asked, true));
        holder.end("h");
        EXPECT_TRUE(writer.gets("w"));
    }
}

TEST_F(FaultTest, DescriptorsThreadsAndTheFolderReturnToTheirLevel)
{
    constexpr std::size_t kMany = 500, kPool = 32;
    std::thread([] {}).join(); // a sanitizer starts a thread of its own with the first one
    const auto before = std::pair(openDescriptors(), threads());
    std::vector<std::shared_ptr<KTFilePresenterLock>> held;
    std::latch called(kMany);
    std::atomic<std::size_t> entered = 0;
    for (std::size_t i = 0; i < kMany; ++i) {
        held.push_back(KTFilePresenterLock::initLockWithType(KTFilePresenterLock::LockType::readersAndWriters,
                                                             urlOf(item("song-" + std::to_string(i)))));
        held.back()->retainLockWithFinishedHandler([&] { called.count_down(); });
    }
    called.wait();
    std::vector<std::thread> waiting;
    for (const auto& lock : held)
        waiting.emplace_back([&, url = lock->url()] {
            FileCoordinator().openForWriting(url, FileCoordinator::WritingOptions::none);
            ++entered;
        });
    for (const auto& lock : held)
        while (!lock->isWriterWaiting())
            std::this_thread::yield();
    EXPECT_EQ(entered, 0u);
    for (const auto& lock : held)
        lock->releaseLock();
    for (std::thread& thread : waiting)
        thread.join();
    EXPECT_EQ(entered, kMany);
    held.clear();
    while (threads() > before.second) // idle threads end by themselves
        std::this_thread::yield();
    EXPECT_LE(openDescriptors(), before.first + kPool);
    for (const auto& entry : fs::directory_iterator(folder()))
        EXPECT_TRUE(fs::is_regular_file(entry) && fs::file_size(entry) == 0) << entry; // no socket is left
}

TEST_F(FaultTest, TwoCopiesOfTheLibraryInAProcessHoldEachOtherBack)
{
    void* copy = dlopen(KTFILES_COPY, RTLD_NOW | RTLD_LOCAL);
    ASSERT_NE(copy, nullptr) << dlerror();
    using Write = bool (*)(const char*, const char*, void (*)(void*), void*);
    const auto writeInCopy = reinterpret_cast<Write>(dlsym(copy, "writeInCopy"));
    ASSERT_NE(writeInCopy, nullptr);
    const auto lock =
        KTFilePresenterLock::initLockWithType(KTFilePresenterLock::LockType::readersAndWriters, itemURL());
    std::promise<void> isHeld;
    lock->retainLockWithFinishedHandler([&] { isHeld.set_value(); });
    isHeld.get_future().wait();
    std::atomic<bool> isReleased = false;
    struct Entry {
        std::atomic<bool>& isReleased;
        bool wasReleased = false;
    } entry{isReleased};
    std::thread other([&] {
        EXPECT_TRUE(writeInCopy(
            folder().c_str(), item().c_str(),
            [](void* context) {
                Entry& mine = *static_cast<Entry*>(context);
                mine.wasReleased = mine.isReleased;
            },
            &entry));
    });
    while (!lock->isWriterWaiting()) // asked through the slot of the first copy, by an access of the second
        std::this_thread::yield();
    isReleased = true;
    lock->releaseLock();
    other.join();
    EXPECT_TRUE(entry.wasReleased);
}

TEST_F(FaultTest, AURLWithoutAPathIsRefused)
{
    Error error;
    for (const URLRef& url : {URLRef(), URL::createWithString("https://example.com/a.wav")}) {
        EXPECT_FALSE(FileCoordinator().coordinateReading(
            url, FileCoordinator::ReadingOptions::none, [](const URLRef&) { FAIL(); }, &error));
        EXPECT_EQ(error.code, kStatusBadReference);
    }
}
