// Coordinated access to files between all processes of a user: coordinators, which ask for access, and presenters,
// which are asked to let them through. No daemon, no polling; what a killed process held is free at once.
//
// Items are coordinated one by one: nobody who presents an enclosing folder is asked. The rules below bind those who
// use this service; the file itself stays open to everybody else. docs/coordination.md has the protocol.
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

/// A file as the service knows it: by the digest of its path with the symbolic links resolved, as far as it exists.
/// Making one looks at the file system; whoever asks often keeps it.
class KT_EXPORT CoordinatedItem {
public:
    CoordinatedItem(URLRef url); // a URL is meant wherever an item is taken

    /// False for a null URL and one without an absolute path; every access to it fails.
    bool isValid() const { return isValid_; }
    const URLRef& url() const { return url_; }
    const SHA256Digest& key() const { return key_; }

private:
    URLRef url_;
    SHA256Digest key_{};
    bool isValid_ = false;
};

/// Says that a presenter is ready to continue: an answer, given once; calls after the first do nothing. It is also
/// given when the last copy is dropped, and when the presenter is unregistered.
using Reacquirer = std::function<void()>;

/// Whose accesses ask a presenter.
enum class AskedBy : unsigned { nobody = 0, readers = 1, writers = 2, both = 3 };

/// Presents an item: is asked before another party's coordinated access to it begins. Requests of a kind come one at a
/// time, the next when the one before is answered, as operations of the presenter's queue; those of the two kinds may
/// come side by side.
class KT_EXPORT FilePresenter {
public:
    virtual ~FilePresenter(); // unregisters it

    virtual URLRef presentedItemURL() const = 0;
    virtual OperationQueue& presentedItemOperationQueue() = 0;
    /// May block, or keep the reacquirer and return. The access waits for the answer.
    virtual void relinquishPresentedItemToReader(Reacquirer reacquirer) = 0;
    virtual void relinquishPresentedItemToWriter(Reacquirer reacquirer) = 0;
};

/// Coordinated access that is open for as long as this lives, whichever thread ends it.
class KT_EXPORT CoordinatedAccess {
public:
    virtual ~CoordinatedAccess();

    /// The URL to use for the file.
    const URLRef& url() const { return url_; }

protected:
    explicit CoordinatedAccess(URLRef url) : url_(std::move(url)) {}

private:
    URLRef url_;
};

/// Asks for coordinated access. Readers share an item, a writer has it alone. Both calls wait until every presenter
/// that must be asked, save the coordinator's own, has answered and the item is free; then run the accessor, with the
/// URL to use, on the calling thread; access ends when it returns or throws. First come, first served. An access inside
/// an accessor to the same item waits for itself.
class KT_EXPORT FileCoordinator {
public:
    using Accessor = std::function<void(const URLRef& newURL)>;
    enum class ReadingOptions { none };
    enum class WritingOptions { none, forReplacing };

    FileCoordinator() = default;
    /// A coordinator of this presenter, which it never asks. While the presenter owes a writer an answer, its own
    /// coordinated writes go first, so that it can save before it answers.
    explicit FileCoordinator(std::shared_ptr<FilePresenter> presenter) : presenter_(std::move(presenter)) {}

    /// False, and the accessor not run, when the item is not valid or the system refuses: a bad coordination folder, no
    /// descriptors (EMFILE), no memory for locks (ENOLCK).
    bool coordinateReading(const CoordinatedItem& item, ReadingOptions options, const Accessor& accessor,
                           Error* error = nullptr) const;
    bool coordinateWriting(const CoordinatedItem& item, WritingOptions options, const Accessor& accessor,
                           Error* error = nullptr) const;
    /// The same without an accessor: null when the system refuses.
    std::unique_ptr<CoordinatedAccess> openForReading(const CoordinatedItem& item, ReadingOptions options,
                                                      Error* error = nullptr) const;
    std::unique_ptr<CoordinatedAccess> openForWriting(const CoordinatedItem& item, WritingOptions options,
                                                      Error* error = nullptr) const;
    /// Access that is there for the asking; null when somebody has, presents or waits for the item, or the system
    /// refuses.
    std::unique_ptr<CoordinatedAccess> tryToOpenForReading(const CoordinatedItem& item) const;
    std::unique_ptr<CoordinatedAccess> tryToOpenForWriting(const CoordinatedItem& item) const;
    /// A write in whose accessor the presenter comes to hold the item for longer: it waits for its turn though the
    /// presenter owes an answer, since that answer would otherwise be given to a writer who finds the item held.
    bool coordinateAcquiring(const CoordinatedItem& item, const Accessor& accessor, Error* error = nullptr) const;

    /// Registers a presenter for its item, for as long as it lives or until it is removed; it is not kept alive. False
    /// when the item is not valid or the system refuses. While one is registered that was ever to be asked, the process
    /// has one thread of the service.
    static bool addFilePresenter(const std::shared_ptr<FilePresenter>& presenter, AskedBy askedBy = AskedBy::both,
                                 Error* error = nullptr);
    /// Answers what it was asked and had not answered. Nothing happens to one that is not registered.
    static void removeFilePresenter(const FilePresenter& presenter);
    /// Whose accesses ask a registered presenter from now on. A presenter that nobody asks costs nobody anything, even
    /// in a stopped process. When the system refuses it is as it was.
    static bool setAskedBy(const FilePresenter& presenter, AskedBy askedBy, Error* error = nullptr);

    /// The folder in which processes meet, for a host that has reason to choose it; all that shall meet must choose the
    /// same. Empty means the system's place. For accesses that begin after this; call it before presenters are
    /// registered.
    static void setCoordinationFolder(const std::string& path);

private:
    enum class Kind { reading, writing, acquiring };
    std::unique_ptr<CoordinatedAccess> tryToOpen(const CoordinatedItem& item, Kind kind) const;
    std::unique_ptr<CoordinatedAccess> open(const CoordinatedItem& item, Kind kind, Error* error) const;
    bool coordinate(const CoordinatedItem& item, Kind kind, const Accessor& accessor, Error* error) const;

    std::shared_ptr<FilePresenter> presenter_;
};

/// What a process has to do with an item.
struct CoordinationParty {
    enum class Role { presents, holds, waits };

    int processID = 0;
    Role role = Role::holds;
    bool isWriting = false;       // holds or waits for write access; for a presenter: is asked by writers
    std::uint64_t itemNumber = 0; // equal for equal items (coordinationItemNumber)

    friend bool operator==(const CoordinationParty&, const CoordinationParty&) = default;
};

/// A number for an item, which is all that a listing knows of it: 46 bits of its key.
KT_EXPORT std::uint64_t coordinationItemNumber(const CoordinatedItem& item);

/// Who presents, holds and waits now, by process id, role, kind; a process once for each of these. A presenter counts
/// while it has to be asked. A snapshot: others come and go meanwhile. Of processes that this one may not look into
/// nothing is said. On failure empty, with the error.
KT_EXPORT std::vector<CoordinationParty> coordinationParties(Error* error = nullptr);
KT_EXPORT std::vector<CoordinationParty> coordinationParties(const CoordinatedItem& item, Error* error = nullptr);

} // namespace platform
