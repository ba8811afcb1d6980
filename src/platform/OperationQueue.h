// Work that must not keep its caller: a concurrent background queue, and queues of limited width over it.
//
// Threads are borrowed, not owned: an idle thread waits a second for more work and ends, so that a process in which
// nothing is locked or presented soon has no thread of the library.
#pragma once

#include "platform/core/Export.h"

#include <functional>
#include <memory>

namespace platform {

/// Runs `work` at once on a background thread of default priority. No piece of work waits for another to end, since
/// work here may block for as long as a lock is held. False, and `work` not run, when the system gives no thread.
KT_EXPORT bool runInBackground(std::function<void()> work);

/// Operations in order of arrival, at most `maxConcurrentOperations` at a time. Copies are the same queue; added
/// operations run even when the last copy is gone.
class KT_EXPORT OperationQueue {
public:
    /// An empty queue; at least 1 operation at a time.
    explicit OperationQueue(int maxConcurrentOperations = 1);

    /// Appends an operation. False, and not added, when the system gives no thread and the queue has none running.
    bool add(std::function<void()> operation);

private:
    struct State;
    std::shared_ptr<State> state_;
};

} // namespace platform
