// The presenters of this process: who they are, which of them others can see, and which questions they have not
// answered yet.
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

/// For each item, one presence byte is raised for each kind of asker while presenters here are to be asked. The mutex
/// is never held while the host's code runs.
class PresenterRegistry {
public:
    static PresenterRegistry& shared();
    PresenterRegistry();

    /// These throw std::system_error if the system refuses.
    void add(const std::shared_ptr<FilePresenter>& presenter, const SHA256Digest& key, AskedBy askedBy);
    void setAskedBy(const FilePresenter& presenter, AskedBy askedBy);
    void remove(const FilePresenter& presenter);

    /// Moves all that is raised to the folder in force, if that changed.
    void followFolder();

    /// Identifies this copy of the library, within which the addresses of its presenters are meaningful.
    std::uint64_t home() const { return home_; }
    /// The presence byte that stands for `own` alone, as an offset in the item's window, so that an access of `own`
    /// need not ask there; none if there is no such byte.
    std::optional<std::int64_t> presenceOfOnly(const FilePresenter* own, const SHA256Digest& key,
                                               const CoordinationDirectory& directory);
    /// Whether the presenter owes an answer to a writer that holds the queue.
    bool owesQueue(const FilePresenter* presenter);

private:
    class Answer;
    /// Answers to drop, which gives them. Giving takes the mutex, so this is declared before the lock.
    using Answers = std::vector<std::shared_ptr<Answer>>;
    // Requests of one kind to one presenter.
    struct Lane {
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
    // Where others find this process.
    struct Home {
        std::map<int, Stripe> stripes;
        RequestServer server;

        Home(PresenterRegistry& registry, std::shared_ptr<CoordinationDirectory> directory);
        ~Home();
        bool raise(const SHA256Digest& key, AskedBy askedBy); // false when the folder was deleted
        void lower(const SHA256Digest& key, AskedBy askedBy);
    };
    using Presences = std::map<std::pair<SHA256Digest, AskedBy>, int>; // number of presenters

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
