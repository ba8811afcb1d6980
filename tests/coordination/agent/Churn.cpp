#include "agent/Agent.h"

#include "coordination/KTFileCoordinationLock.h"
#include "coordination/KTFilePresenterLock.h"

#include <future>
#include <random>
#include <thread>

#include <fcntl.h>
#include <unistd.h>

using namespace platform;

namespace {

/// Byte 0: shared by readers, exclusive for writers. Bytes 1 and 2: shared by readers, and by locks for which only
/// readers wait; never both at once, so each checks the other's byte while holding its own.
class Witness {
public:
    explicit Witness(const std::string& path) : file_(open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600)) {}

    void take(int byte, int type)
    {
        if (set(byte, type) != 0)
            say("violation byte " + std::to_string(byte) + (type == F_WRLCK ? " exclusive" : " shared"));
    }
    void takeAgainst(int byte, int others)
    {
        take(byte, F_RDLCK);
        struct flock lock = request(others, F_WRLCK);
        if (fcntl(file_, F_GETLK, &lock) != 0 || lock.l_type != F_UNLCK)
            say("violation byte " + std::to_string(byte) + " against " + std::to_string(others));
    }
    void drop()
    {
        for (const int byte : {0, 1, 2})
            set(byte, F_UNLCK);
    }

private:
    static struct flock request(int byte, int type)
    {
        struct flock lock = {};
        lock.l_type = static_cast<short>(type);
        lock.l_start = byte;
        lock.l_len = 1;
        return lock;
    }
    int set(int byte, int type) const
    {
        struct flock lock = request(byte, type);
        return fcntl(file_, F_SETLK, &lock);
    }
    int file_;
};

class Churn {
public:
    Churn(unsigned seed, const std::string& path, const std::string& witness)
        : random_(seed),
          witness_(witness),
          item_(urlOf(path)),
          coordinationLocks_{KTFileCoordinationLock::initLockForReadingAtURL(item_.url()),
                             KTFileCoordinationLock::initLockForWritingAtURL(item_.url())}
    {
        for (unsigned type = 0; type < 3; ++type)
            presenterLocks_.push_back(
                KTFilePresenterLock::initLockWithType(static_cast<KTFilePresenterLock::LockType>(type), item_.url()));
    }

    void step()
    {
        const std::size_t kind = random_() % 7;
        if (kind < 2)
            access(kind == 1);
        else if (kind < 4)
            hold(*coordinationLocks_[kind - 2], kind == 3 ? Held::writing : Held::reading);
        else
            hold(*presenterLocks_[kind - 4],
                 std::array{Held::writing, Held::keepsReadersOut, Held::keepsWritersOut}[kind - 4]);
    }

private:
    enum class Held { reading, writing, keepsReadersOut, keepsWritersOut };

    void bearWitness(Held held)
    {
        if (held != Held::keepsReadersOut)
            witness_.take(0, held == Held::writing ? F_WRLCK : F_RDLCK);
        if (held == Held::reading)
            witness_.takeAgainst(1, 2);
        if (held == Held::keepsReadersOut)
            witness_.takeAgainst(2, 1);
        if (const auto microseconds = static_cast<useconds_t>(random_() % 200); microseconds > 50)
            usleep(microseconds);
    }

    void access(bool isWriting)
    {
        const auto accessor = [&](const URLRef&) {
            bearWitness(isWriting ? Held::writing : Held::reading);
            witness_.drop();
        };
        Error error;
        if (!(isWriting
                  ? FileCoordinator().coordinateWriting(item_, FileCoordinator::WritingOptions::none, accessor, &error)
                  : FileCoordinator().coordinateReading(item_, FileCoordinator::ReadingOptions::none, accessor,
                                                        &error)))
            say("error " + error.description);
    }

    template <class Lock>
    void hold(Lock& lock, Held held)
    {
        std::promise<void> isHeld;
        lock.retainLockWithFinishedHandler([&] { isHeld.set_value(); });
        isHeld.get_future().wait();
        bearWitness(held);
        witness_.drop();
        lock.releaseLock();
    }

    std::mt19937 random_;
    Witness witness_;
    const CoordinatedItem item_;
    const std::array<std::shared_ptr<KTFileCoordinationLock>, 2> coordinationLocks_;
    std::vector<std::shared_ptr<KTFilePresenterLock>> presenterLocks_;
};

} // namespace

void churn(unsigned seed, const std::string& path, const std::string& witness, const std::function<bool()>& isOver)
{
    Churn work(seed, path, witness);
    for (unsigned steps = 1; !isOver(); ++steps) {
        work.step();
        if (steps % 64 == 0)
            say("steps");
    }
}
