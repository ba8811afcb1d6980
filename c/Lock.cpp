// Coordinated access that C callers hold.
#include "c/Calls.h"
#include "platform/FileCoordination.h"
#include "platform/OperationQueue.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <functional>
#include <future>
#include <memory>
#include <utility>

using platform::CoordinatedAccess;
using platform::CoordinatedItem;
using platform::FileCoordinator;

struct ktf_access {
    std::unique_ptr<CoordinatedAccess> held;
};

namespace {

enum class Wait { done, timeIsUp, noThread };

/// Runs `work` on the calling thread, or with a time limit on another, which is left to itself when the time is up.
Wait waitFor(std::function<void()> work, double timeout)
{
    if (timeout < 0) {
        work();
        return Wait::done;
    }
    const auto task = std::make_shared<std::packaged_task<void()>>(std::move(work));
    std::future<void> done = task->get_future();
    if (!platform::runInBackground([task] { (*task)(); }))
        return Wait::noThread;
    constexpr double longest = 1e9; // which no clock overflows by
    if (done.wait_for(std::chrono::duration<double>(std::min(timeout, longest))) != std::future_status::ready)
        return Wait::timeIsUp;
    done.get();
    return Wait::done;
}

std::unique_ptr<CoordinatedAccess> tryToOpen(const CoordinatedItem& item, bool isWriting)
{
    return isWriting ? FileCoordinator().tryToOpenForWriting(item) : FileCoordinator().tryToOpenForReading(item);
}

/// Access, or null and a status that is told of.
std::unique_ptr<CoordinatedAccess> openAccess(const char* path, const platform::URLRef& location, bool isWriting,
                                              double timeout, ktf_status& status)
{
    const CoordinatedItem item(location);
    if (auto access = tryToOpen(item, isWriting))
        return access;
    struct Opening {
        std::unique_ptr<CoordinatedAccess> access;
        platform::Error error;
    };
    const auto opening = std::make_shared<Opening>();
    Wait wait = Wait::timeIsUp;
    if (timeout != 0)
        wait = waitFor(
            [item, isWriting, opening] {
                const FileCoordinator coordinator;
                opening->access =
                    isWriting
                        ? coordinator.openForWriting(item, FileCoordinator::WritingOptions::none, &opening->error)
                        : coordinator.openForReading(item, FileCoordinator::ReadingOptions::none, &opening->error);
            },
            timeout);
    if (wait == Wait::noThread)
        status = failCall(path, KTF_OUT_OF_MEMORY, "no thread can be had to wait with a time limit");
    else if (wait == Wait::done && !opening->access)
        status = failCallByError(path, opening->error);
    else if (wait == Wait::done)
        return std::move(opening->access);
    else if (platform::Error refusal; platform::coordinationParties(item, &refusal).empty() && !refusal.domain.empty())
        status = failCallByError(path, refusal);
    else
        status = failCall(path, KTF_BUSY, "is used by others");
    return nullptr;
}

} // namespace

ktf_status ktf_lock(const char* path, std::int32_t mode, double timeout, ktf_access** access)
{
    if (access != nullptr)
        *access = nullptr;
    if (path == nullptr || access == nullptr)
        return failCallByNull(path);
    return guardedCall(path, [&]() -> ktf_status {
        if ((mode != KTF_LOCK_READ && mode != KTF_LOCK_WRITE) || std::isnan(timeout))
            return failCall(path, KTF_PARAMETER_ERROR);
        const platform::URLRef location = locationOfPath(path);
        if (!location)
            return failCall(path, KTF_FILE_NOT_FOUND);
        auto opened = std::make_unique<ktf_access>();
        ktf_status status = KTF_OK;
        opened->held = openAccess(path, location, mode == KTF_LOCK_WRITE, timeout, status);
        if (status == KTF_OK)
            *access = opened.release();
        return status;
    });
}

void ktf_unlock(ktf_access** access)
{
    if (access != nullptr)
        delete std::exchange(*access, nullptr);
}
