#include "agent/Agent.h"

#include <future>
#include <thread>

#include <signal.h>

using namespace platform;

namespace {

class Access : public Actor {
public:
    Access(std::string name, bool isWriting, const std::string& path)
        : thread_([this, name = std::move(name), isWriting, path] {
              sigset_t none;
              sigemptyset(&none);
              pthread_sigmask(SIG_SETMASK, &none, nullptr);
              const auto accessor = [&](const URLRef&) {
                  say(name + " in");
                  leave_.get_future().wait();
                  say(name + " leaves");
              };
              Error error;
              const bool isHad = isWriting ? FileCoordinator().coordinateWriting(
                                                 urlOf(path), FileCoordinator::WritingOptions::none, accessor, &error)
                                           : FileCoordinator().coordinateReading(
                                                 urlOf(path), FileCoordinator::ReadingOptions::none, accessor, &error);
              say(isHad ? name + " out" : name + " error " + std::to_string(error.code) + " " + error.description);
          })
    {
        thread_.detach(); // the process ends by _exit
    }
    void command(const std::string&) override { leave_.set_value(); }

private:
    std::promise<void> leave_;
    std::thread thread_;
};

/// Treats writers' requests as told; lets readers through.
class Presenter : public FilePresenter, public std::enable_shared_from_this<Presenter> {
public:
    Presenter(std::string name, std::string behaviour, const std::string& path)
        : name_(std::move(name)),
          behaviour_(std::move(behaviour)),
          url_(urlOf(path))
    {
    }

    URLRef presentedItemURL() const override { return url_; }
    OperationQueue& presentedItemOperationQueue() override { return queue_; }
    void relinquishPresentedItemToReader(Reacquirer reacquirer) override
    {
        say(name_ + " asked by reader");
        reacquirer();
    }
    void relinquishPresentedItemToWriter(Reacquirer reacquirer) override
    {
        if (behaviour_ == "never") {
            const std::lock_guard lock(mutex_);
            kept_ = reacquirer;
        }
        say(name_ + " asked by writer");
        if (behaviour_ == "save") {
            Error error;
            const bool saved = FileCoordinator(shared_from_this())
                                   .coordinateWriting(
                                       url_, FileCoordinator::WritingOptions::none,
                                       [this](const URLRef&) { say(name_ + " saves"); }, &error);
            say(name_ + (saved ? " saved" : " failed to save"));
            reacquirer();
        } else if (behaviour_ == "twice") {
            reacquirer();
            reacquirer();
        } else if (behaviour_ == "atonce") {
            reacquirer();
        } // drop: the last copy goes when this returns
    }
    void answer()
    {
        const std::lock_guard lock(mutex_);
        std::exchange(kept_, nullptr)();
    }

private:
    const std::string name_, behaviour_;
    const URLRef url_;
    OperationQueue queue_{2};
    std::mutex mutex_; // guards `kept_`: the command to answer arrives on another thread
    Reacquirer kept_;
};

class PresenterActor : public Actor {
public:
    PresenterActor(const std::string& name, const std::string& behaviour, const std::string& path)
        : name_(name),
          presenter_(std::make_shared<Presenter>(name, behaviour, path))
    {
        Error error;
        say(FileCoordinator::addFilePresenter(presenter_, AskedBy::both, &error)
                ? name + " presents"
                : name + " error " + std::to_string(error.code) + " " + error.description);
    }
    void command(const std::string& verb) override
    {
        if (verb == "answer")
            return presenter_->answer();
        FileCoordinator::removeFilePresenter(*presenter_);
        say(name_ + " unregistered");
    }

private:
    const std::string name_;
    std::shared_ptr<Presenter> presenter_;
};

} // namespace

std::unique_ptr<Actor> makeAccess(const std::string& name, bool isWriting, const std::string& path)
{
    return std::make_unique<Access>(name, isWriting, path);
}

std::unique_ptr<Actor> makePresenter(const std::string& name, const std::string& behaviour, const std::string& path)
{
    return std::make_unique<PresenterActor>(name, behaviour, path);
}
