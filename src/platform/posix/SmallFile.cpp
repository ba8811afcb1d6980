#include "platform/SmallFile.h"

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

bool writeContent(int descriptor, BytesView content)
{
    const SystemCalls& calls = systemCalls();
    const auto length = static_cast<std::int64_t>(content.size());
    // Not every file system can reserve space, but each reports a full disk.
    if (length > 0 && calls.preallocate(descriptor, 0, length) != 0 && (errno == ENOSPC || errno == EDQUOT))
        return false;
    std::size_t written = 0;
    while (written < content.size()) {
        const std::int64_t count = calls.pwrite(descriptor, content.data() + written, content.size() - written,
                                                static_cast<std::int64_t>(written));
        if (count > 0)
            written += static_cast<std::size_t>(count);
        else if (count == 0)
            errno = EIO;
        if (count == 0 || (count < 0 && errno != EINTR))
            return false;
    }
    return calls.ftruncate(descriptor, length) == 0;
}

bool writeSmallFile(const char* path, BytesView content)
{
    const SystemCalls& calls = systemCalls();
    int descriptor = calls.openFile(path, OpenFor::readingAndWriting, nullptr);
    if (descriptor < 0 && errno == ENOENT)
        descriptor = calls.createFile(path, 0666);
    if (descriptor < 0)
        return false;
    const bool written = writeContent(descriptor, content);
    const int reason = errno;
    const bool closed = calls.close(descriptor) == 0;
    if (!written)
        errno = reason;
    return written && closed;
}

} // namespace platform
