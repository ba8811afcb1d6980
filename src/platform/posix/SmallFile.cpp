#include "platform/posix/SmallFile.h"

#include "platform/SystemCalls.h"

#include <cerrno>

namespace platform {

std::optional<Bytes> readSmallFile(const char* path, std::size_t limit)
{
    const SystemCalls& calls = systemCalls();
    FileStatus status;
    const int descriptor = calls.openFile(path, OpenFor::reading, &status);
    if (descriptor < 0)
        return std::nullopt;

    Bytes content;
    bool complete = false;
    if (status.size >= 0 && static_cast<std::uint64_t>(status.size) <= limit) {
        content.resize(static_cast<std::size_t>(status.size));
        std::size_t filled = 0;
        std::int64_t got = 1;
        while (filled < content.size() && got > 0) {
            got = calls.pread(descriptor, content.data() + filled, content.size() - filled,
                              static_cast<std::int64_t>(filled));
            if (got < 0 && errno == EINTR)
                got = 1;
            else if (got > 0)
                filled += static_cast<std::size_t>(got);
        }
        complete = filled == content.size();
    }
    calls.close(descriptor);
    return complete ? std::optional(std::move(content)) : std::nullopt;
}

} // namespace platform
