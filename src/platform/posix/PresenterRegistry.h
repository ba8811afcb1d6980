// The presenters of this process: who they are, which of them others can see, what they were asked and have not
// answered.
#pragma once

#include "platform/FileCoordination.h"
#include "platform/posix/RequestServer.h"

#include <array>
#include <deque>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <utility>

namespace platform {

/// A presence byte is raised for an item while presenters here are to be asked, one for each kind of those that ask.
/// The mutex is never held while the host's code runs.
class PresenterRegistry {
public:
    static PresenterRegistry& shared();
    PresenterRegistry();

    /// These throw std::system_error when the system refuses.
    void add(const std::shared_ptr<FilePresenter>& presenter, const SHA256Digest& key, AskedBy askedBy);
    void setAskedBy(const FilePresenter& presenter, AskedBy askedBy);
    void remove(const FilePresenter& presenter);

    /// Takes what is raised along to the folder in force, when that is another.
    void followFolder();

    /// The number of this copy of the library, in which the addresses of its presenters mean something.
    std::uint64_t home() const { return home_; }
    /// The presence byte that stands for `own` and no other presenter, by its offset in the item's window, so that an
    /// access of its own need not ask there; none when there is none.
    std::optional<std::int64_t> presenceOfOnly(const FilePresenter* own, const SHA256Digest& key,
                                               const CoordinationDirectory& directory);
    /// Whether the presenter owes an answer to a writer that keeps the queue until it has it.
    bool owesQueue(const FilePresenter* presenter);

private:
    class Answer;
    /// Answers that may be dropped, and so given, only without the mutex, which that takes: declared before the lock.
    using Answers = std::vector<std::shared_ptr<Answer>>;
    struct Lane { // requests of one kind to one presenter
        std::deque<std::shared_ptr<Answer>> waiting;
        std::weak_ptr<Answer> current;
        const Answer* busyWith = nullptr;
    };
    struct Registration {
        std::weak_ptr<FilePresenter> presenter;
        OperationQueue queue;
        SHA256Digest key;
        AskedBy askedBy = AskedBy::nobody;
        int owedToQueue = 0;
        std::array<Lane, 2> lanes; // readers, writers
    };
    struct Stripe {
        Descriptor descriptor;
        int raised = 0;
    };
    struct Home { // where others find this process
        std::map<int, Stripe> stripes;
        RequestServer server;

        Home(PresenterRegistry& registry, std::shared_ptr<CoordinationDirectory> directory);
        ~Home();
        bool raise(const SHA256Digest& key, AskedBy askedBy); // false when the folder was deleted
        void lower(const SHA256Digest& key, AskedBy askedBy);
    };
    using Presences = std::map<std::pair<SHA256Digest, AskedBy>, int>; // presenters whom these ask

    void change(Registration& registration, AskedBy askedBy, std::vector<std::unique_ptr<Home>>& retired);
    void raise(const SHA256Digest& key, AskedBy askedBy, std::vector<std::unique_ptr<Home>>& retired);
    void lower(const SHA256Digest& key, AskedBy askedBy);
    void moveHome(std::vector<std::unique_ptr<Home>>& retired);
    void startNext(Registration& registration, bool byWriter, Answers& released);
    void handle(const Request& request, const std::shared_ptr<Connection>& connection);
    void forget(const Connection& connection);
    void answered(const std::shared_ptr<Registration>& registration, const Answer& answer);

    const std::uint64_t home_;
    std::mutex mutex_;
    std::map<const FilePresenter*, std::shared_ptr<Registration>> registrations_;
    Presences presences_;
    std::unique_ptr<Home> homeNow_; // from the first raise until the last presenter is removed
};

} // namespace platform
