#include "audiofile/CCoordinatedEdit.h"

#include "platform/FileCoordination.h"
#include "platform/FileLock.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <chrono>
#include <fcntl.h>
#include <filesystem>
#include <future>

using platform::CoordinatedAccess;
using platform::FileCoordinator;
using platform::FileLockResult;

namespace {

FileProblem refusal(std::int32_t status)
{
    return {.kind = FileProblem::Kind::refused, .status = status};
}

/// Runs `wait`, which may block, on another thread; false on a timeout, or if no thread can be started. After a timeout
/// it continues there, so it must own what it uses.
bool isDoneWithin(double seconds, std::function<void()> wait)
{
    constexpr double least = 0.1, most = 1e8; // even what is free takes a moment to be acquired
    const auto task = std::make_shared<std::packaged_task<void()>>(std::move(wait));
    std::future<void> done = task->get_future();
    return platform::runInBackground([task] { (*task)(); }) &&
           done.wait_for(std::chrono::duration<double>(seconds > least ? std::min(seconds, most) : least)) ==
               std::future_status::ready;
}

FileProblem takeAccess(const platform::CoordinatedItem& item, const CoordinatedEditOptions& options,
                       std::unique_ptr<CoordinatedAccess>& access)
{
    using WritingOptions = FileCoordinator::WritingOptions;
    const WritingOptions writing = options.inPlace ? WritingOptions::none : WritingOptions::forReplacing;
    access = FileCoordinator().tryToOpenForWriting(item);
    if (access != nullptr)
        return {};
    struct Opening {
        std::unique_ptr<CoordinatedAccess> access;
        platform::Error error;
    };
    const auto opening = std::make_shared<Opening>();
    const auto open = [opening, item, writing] {
        opening->access = FileCoordinator().openForWriting(item, writing, &opening->error);
    };
    if (!options.timeoutSeconds)
        open();
    else if (!isDoneWithin(*options.timeoutSeconds, open))
        return refusal(kStatusFileBusy);
    access = std::move(opening->access);
    return access != nullptr ? FileProblem() : refusal(NSErrorToOSErr(&opening->error));
}

/// Waits for a lock on the open file, which another edit holds. The lock belongs to the open file: if it is acquired
/// too late, it is released with the last descriptor, the copy.
std::int32_t waitForLock(int descriptor, double seconds)
{
    const auto copy = std::make_shared<platform::OwnedDescriptor>(::fcntl(descriptor, F_DUPFD_CLOEXEC, 0));
    if (!*copy)
        return PosixErrorToOSErr();
    return isDoneWithin(seconds, [copy] { platform::waitToLockFile(copy->get()); }) ? kStatusOK : kStatusFileBusy;
}

} // namespace

CCoordinatedEdit::CCoordinatedEdit() = default;
CCoordinatedEdit::~CCoordinatedEdit() = default;

FileProblem CCoordinatedEdit::Begin(const std::string& path, CoordinatedEditOptions options)
{
    std::error_code error;
    const std::string target = std::filesystem::canonical(path, error).string();
    if (error)
        return {FileProblem::Kind::system, error.value()};
    const platform::CoordinatedItem item(platform::URL::createWithFileSystemBytes(target, false));
    if (!options.hasAccess)
        if (FileProblem problem = takeAccess(item, options, access_))
            return problem;
    if (options.timeoutSeconds && !options.waitForLock)
        options.waitForLock = [seconds = *options.timeoutSeconds](int descriptor, const std::string&) {
            return waitForLock(descriptor, seconds);
        };
    return edit_.Begin(target, std::move(options));
}
