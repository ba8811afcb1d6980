// Where work goes that must not keep its caller: a concurrent background queue, and queues of limited width over it.
//
// Threads are borrowed, not owned: an idle one waits a second for more work and then ends, so that a process in which
// nothing is locked or presented soon has no thread of ours.
#pragma once

#include "platform/core/Export.h"

#include <functional>
#include <memory>

namespace platform {

/// Runs `work` on a background thread of default priority, at once: no piece of work waits for another to end, since
/// what runs here may block for as long as a lock is held. False when the system gives no thread; `work` is not run
/// then.
KT_EXPORT bool runInBackground(std::function<void()> work);

/// Operations in order of arrival, at most `maxConcurrentOperations` at a time. Copies are the same queue; operations
/// that were added run although the last copy has gone.
class KT_EXPORT OperationQueue {
public:
    explicit OperationQueue(int maxConcurrentOperations = 1);

    /// False when no thread is to be had and none of the queue's is running, which would have taken it: not added then.
    bool add(std::function<void()> operation);

private:
    struct State;
    std::shared_ptr<State> state_;
};

} // namespace platform
