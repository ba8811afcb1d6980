#include "agent/Agent.h"

#include "coordination/KTFileCoordinationLock.h"
#include "coordination/KTFilePresenterLock.h"

namespace {

template <class Lock>
class LockActor : public Actor {
public:
    LockActor(std::string name, std::shared_ptr<Lock> lock) : name_(std::move(name)), lock_(std::move(lock))
    {
        say(name_ + " made");
    }
    void command(const std::string& verb) override
    {
        if (verb == "retain") {
            lock_->retainLockWithFinishedHandler([name = name_] { say(name + " held"); });
        } else if (verb == "release") {
            say(name_ + " releases");
            lock_->releaseLock();
        } else {
            state();
        }
    }

private:
    void state()
    {
        std::string text = name_ + " count " + std::to_string(lock_->lockCount());
        if constexpr (requires { lock_->isReaderWaiting(); })
            text += std::string(lock_->isReaderWaiting() ? " R" : "") + (lock_->isWriterWaiting() ? " W" : "");
        say(text);
    }

    const std::string name_;
    const std::shared_ptr<Lock> lock_;
};

} // namespace

std::unique_ptr<Actor> makePresenterLock(const std::string& name, unsigned type, const std::string& path)
{
    using Lock = KTFilePresenterLock;
    return std::make_unique<LockActor<Lock>>(name,
                                             Lock::initLockWithType(static_cast<Lock::LockType>(type), urlOf(path)));
}

std::unique_ptr<Actor> makeCoordinationLock(const std::string& name, unsigned type, const std::string& path)
{
    using Lock = KTFileCoordinationLock;
    return std::make_unique<LockActor<Lock>>(name, Lock::initLock(static_cast<Lock::LockType>(type), urlOf(path)));
}
