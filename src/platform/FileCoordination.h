// Coordinated access to files between all processes of a user: coordinators ask for access, and presenters are asked
// to let them through. There is no daemon and no polling; what a killed process held is free at once.
//
// Items are coordinated one by one: presenters of an enclosing folder are not asked. The rules bind those who use
// this service; the file itself stays open to everybody else. docs/coordination.md has the protocol.
#pragma once

#include "platform/OperationQueue.h"
#include "platform/SecureHash.h"
#include "platform/URL.h"
#include "platform/core/Error.h"

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace platform {

/// A file as the service knows it: the digest of its path, with the symbolic links resolved as far as it exists.
/// Making one reads the file system, so callers that ask often keep it.
class KT_EXPORT CoordinatedItem {
public:
    /// Implicit, so that a URL can stand wherever an item is taken.
    CoordinatedItem(URLRef url); // a URL is meant wherever an item is taken

    /// False for a null URL and for one without an absolute path; every access to it fails.
    bool isValid() const { return isValid_; }
    /// The URL as it was given.
    const URLRef& url() const { return url_; }
    /// The digest by which processes agree on the file.
    const SHA256Digest& key() const { return key_; }

private:
    URLRef url_;
    SHA256Digest key_{};
    bool isValid_ = false;
};

/// A presenter's answer: it is ready to continue. The first call counts, later ones do nothing. The answer is also
/// given when the last copy is dropped and when the presenter is unregistered.
using Reacquirer = std::function<void()>;

/// Whose accesses ask a presenter.
enum class AskedBy : unsigned { nobody = 0, readers = 1, writers = 2, both = 3 };

/// Presents an item: it is asked before another party's coordinated access begins. Requests of one kind come one at a
/// time, each after the answer to the one before, as operations of the presenter's queue; a read and a write request
/// may run side by side.
class KT_EXPORT FilePresenter {
public:
    virtual ~FilePresenter(); // unregisters it

    /// The item, asked once, when the presenter is registered.
    virtual URLRef presentedItemURL() const = 0;
    /// The queue on which requests run; asked once, when the presenter is registered.
    virtual OperationQueue& presentedItemOperationQueue() = 0;
    /// Called ahead of a read. It may block, or keep the reacquirer and return; the access waits for the answer.
    virtual void relinquishPresentedItemToReader(Reacquirer reacquirer) = 0;
    /// The same, ahead of a write.
    virtual void relinquishPresentedItemToWriter(Reacquirer reacquirer) = 0;
};

/// Coordinated access that lasts as long as this object, on whichever thread it ends.
class KT_EXPORT CoordinatedAccess {
public:
    virtual ~CoordinatedAccess();

    /// The URL to use for the file.
    const URLRef& url() const { return url_; }

protected:
    /// For the service, which opens accesses.
    explicit CoordinatedAccess(URLRef url) : url_(std::move(url)) {}

private:
    URLRef url_;
};

/// Asks for coordinated access. Readers share an item; a writer has it alone. Both calls wait until the item is free
/// and every presenter to be asked, other than the coordinator's own, has answered. Then they run the accessor, with
/// the URL to use, on the calling thread; access ends when it returns or throws. First come, first served. An access
/// within an accessor to the same item waits for itself for ever.
class KT_EXPORT FileCoordinator {
public:
    /// The work to do while access lasts; `newURL` is where the file is now.
    using Accessor = std::function<void(const URLRef& newURL)>;
    /// Room for options.
    enum class ReadingOptions { none };
    /// forReplacing: the accessor puts another file in the item's place.
    enum class WritingOptions { none, forReplacing };

    FileCoordinator() = default;
    /// A coordinator of this presenter, which it never asks. While the presenter owes a writer an answer, its own
    /// coordinated writes go first, so that it can save before it answers.
    explicit FileCoordinator(std::shared_ptr<FilePresenter> presenter) : presenter_(std::move(presenter)) {}

    /// Reads. False, and the accessor not run, when the item is not valid or the system refuses: a bad coordination
    /// folder, no descriptors (EMFILE), no memory for locks (ENOLCK).
    bool coordinateReading(const CoordinatedItem& item, ReadingOptions options, const Accessor& accessor,
                           Error* error = nullptr) const;
    /// Writes. Fails as coordinateReading() does.
    bool coordinateWriting(const CoordinatedItem& item, WritingOptions options, const Accessor& accessor,
                           Error* error = nullptr) const;
    /// Opens access for reading, which lasts as long as the result; null when the system refuses.
    std::unique_ptr<CoordinatedAccess> openForReading(const CoordinatedItem& item, ReadingOptions options,
                                                      Error* error = nullptr) const;
    /// Opens access for writing, which lasts as long as the result; null when the system refuses.
    std::unique_ptr<CoordinatedAccess> openForWriting(const CoordinatedItem& item, WritingOptions options,
                                                      Error* error = nullptr) const;
    /// Access without waiting; null when somebody holds, presents or waits for the item, or the system refuses.
    std::unique_ptr<CoordinatedAccess> tryToOpenForReading(const CoordinatedItem& item) const;
    /// The same for writing.
    std::unique_ptr<CoordinatedAccess> tryToOpenForWriting(const CoordinatedItem& item) const;
    /// A write whose accessor lets the presenter hold the item for longer. It waits for its turn even if the
    /// presenter owes an answer, since that answer would otherwise go to a writer who finds the item held.
    bool coordinateAcquiring(const CoordinatedItem& item, const Accessor& accessor, Error* error = nullptr) const;

    /// Registers a presenter for its item until it is removed or destroyed; the service does not keep it alive. False
    /// when the item is not valid or the system refuses. As long as a presenter is registered that is or was to be
    /// asked, the process has one thread of the service.
    static bool addFilePresenter(const std::shared_ptr<FilePresenter>& presenter, AskedBy askedBy = AskedBy::both,
                                 Error* error = nullptr);
    /// Unregisters a presenter and answers its open requests. Does nothing to one that is not registered.
    static void removeFilePresenter(const FilePresenter& presenter);
    /// Whose accesses ask a registered presenter from now on. A presenter that nobody asks costs nothing, even in a
    /// stopped process. False, and unchanged, when the system refuses.
    static bool setAskedBy(const FilePresenter& presenter, AskedBy askedBy, Error* error = nullptr);

    /// The folder in which processes meet, for hosts that have to choose it; all that shall meet must choose the
    /// same. Empty means the system's place. It holds for later accesses: call it before presenters are registered.
    static void setCoordinationFolder(const std::string& path);

private:
    enum class Kind { reading, writing, acquiring };
    std::unique_ptr<CoordinatedAccess> tryToOpen(const CoordinatedItem& item, Kind kind) const;
    std::unique_ptr<CoordinatedAccess> open(const CoordinatedItem& item, Kind kind, Error* error) const;
    bool coordinate(const CoordinatedItem& item, Kind kind, const Accessor& accessor, Error* error) const;

    std::shared_ptr<FilePresenter> presenter_;
};

/// A process's part in an item.
struct CoordinationParty {
    /// presents: is asked; holds: has access; waits: has asked for access.
    enum class Role { presents, holds, waits };

    int processID = 0;            // the system's number of the process
    Role role = Role::holds;      // its part
    bool isWriting = false;       // holds or waits for write access; of a presenter: is asked by writers
    std::uint64_t itemNumber = 0; // equal for equal items (coordinationItemNumber)

    friend bool operator==(const CoordinationParty&, const CoordinationParty&) = default;
};

/// A number for an item, all that a listing knows of it: 46 bits of its key.
KT_EXPORT std::uint64_t coordinationItemNumber(const CoordinatedItem& item);

/// Who presents, holds and waits now, sorted by process id, role and kind; each process once for each of these. A
/// presenter counts while it has to be asked. The result is a snapshot, and leaves out processes that this one may
/// not inspect. Empty, with the error, on failure.
KT_EXPORT std::vector<CoordinationParty> coordinationParties(Error* error = nullptr);
/// The same for one item.
KT_EXPORT std::vector<CoordinationParty> coordinationParties(const CoordinatedItem& item, Error* error = nullptr);

} // namespace platform
