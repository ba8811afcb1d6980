#include "tool/shared/access/FileAccess.h"

#include "tool/shared/access/Parties.h"
#include "tool/shared/input/FileLocation.h"
#include "tool/shared/output/Failure.h"

#include <fmt/core.h>

#include <functional>

using platform::FileCoordinator;

namespace {

/// Opens with `open`; if others are in the way, on another thread.
FileAccess opened(const std::string& path, const platform::CoordinatedItem& item, bool isWriting,
                  const WaitOptions& wait, const std::function<FileAccess(platform::Error*)>& open,
                  platform::Error* error)
{
    struct Opening {
        FileAccess access;
        platform::Error error;
    };
    const auto opening = std::make_shared<Opening>();
    awaitOthers(
        path, wait, [&] { return blockersText(item, isWriting); },
        [opening, open] { opening->access = open(&opening->error); });
    if (error != nullptr)
        *error = opening->error;
    return std::move(opening->access);
}

} // namespace

FileAccess accessForReading(const std::string& path, const WaitOptions& wait)
{
    const platform::CoordinatedItem item(fileLocation(path));
    if (lockAbove(item))
        return nullptr;
    if (FileAccess access = FileCoordinator().tryToOpenForReading(item))
        return access;
    return opened(
        path, item, false, wait,
        [item](platform::Error* error) {
            return FileCoordinator().openForReading(item, FileCoordinator::ReadingOptions::none, error);
        },
        nullptr);
}

FileAccess accessForWriting(const std::string& path, FileCoordinator::WritingOptions options, const WaitOptions& wait)
{
    const platform::CoordinatedItem item(fileLocation(path));
    if (const auto lock = lockAbove(item)) {
        if (lock->isWriting)
            return nullptr;
        throw Failure(
            fmt::format("is locked for reading by process {}, which waits for this command", lock->processID));
    }
    if (FileAccess access = FileCoordinator().tryToOpenForWriting(item))
        return access;
    platform::Error error;
    FileAccess access = opened(
        path, item, true, wait,
        [item, options](platform::Error* why) { return FileCoordinator().openForWriting(item, options, why); }, &error);
    if (!access)
        throw Failure("other programs cannot be held back from it: " + error.description);
    return access;
}
