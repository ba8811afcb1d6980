#include "media/containers/FileBytes.h"

#include "platform/core/Status.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <limits>

namespace platform {

namespace {

bool inFileRange(std::uint64_t position, std::size_t count)
{
    constexpr auto limit = static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max());
    return position <= limit && count <= limit - position;
}

/// Status of the call that just failed; an input/output error if errno does not say why.
std::int32_t failure()
{
    const std::int32_t status = PosixErrorToOSErr();
    return status != kStatusOK ? status : kStatusIOError;
}

} // namespace

FileBytes::~FileBytes()
{
    if (lent_ == nullptr)
        systemCalls().close(descriptor_);
}

std::int32_t FileBytes::length(std::uint64_t& length) const
{
    if (lent_ != nullptr) {
        length = lentLength_;
        return kStatusOK;
    }
    FileStatus status;
    if (!systemCalls().status(descriptor_, &status))
        return failure();
    length = status.size > 0 ? static_cast<std::uint64_t>(status.size) : 0;
    return kStatusOK;
}

std::int32_t FileBytes::readSome(std::uint64_t position, void* to, std::size_t count, std::size_t& got) const
{
    got = 0;
    if (!inFileRange(position, count))
        return kStatusParameterError;
    if (lent_ != nullptr)
        return lent_->readSome(position, to, count, got);
    while (got < count) {
        const std::int64_t step = systemCalls().pread(descriptor_, static_cast<std::byte*>(to) + got, count - got,
                                                      static_cast<std::int64_t>(position + got));
        if (step < 0 && errno == EINTR)
            continue;
        if (step < 0)
            return failure();
        if (step == 0)
            break;
        got += static_cast<std::size_t>(step);
    }
    return kStatusOK;
}

std::int32_t FileBytes::read(std::uint64_t position, void* to, std::size_t count) const
{
    std::size_t got = 0;
    const std::int32_t status = readSome(position, to, count, got);
    return status != kStatusOK ? status : got == count ? kStatusOK : kStatusEndOfFile;
}

std::int32_t FileBytes::write(std::uint64_t position, const void* from, std::size_t count) const
{
    if (!inFileRange(position, count))
        return kStatusFileTooBig;
    for (std::size_t done = 0; done < count;) {
        const std::int64_t step = systemCalls().pwrite(descriptor_, static_cast<const std::byte*>(from) + done,
                                                       count - done, static_cast<std::int64_t>(position + done));
        if (step < 0 && errno == EINTR)
            continue;
        if (step < 0)
            return failure();
        if (step == 0)
            return kStatusDiskFull;
        done += static_cast<std::size_t>(step);
    }
    return kStatusOK;
}

std::int32_t FileBytes::overwrite(std::uint64_t position, BytesView bytes) const
{
    Bytes former(bytes.size());
    if (const std::int32_t status = read(position, former.data(), former.size()); status != kStatusOK)
        return status;
    if (std::ranges::equal(former, bytes))
        return kStatusOK;
    const std::int32_t status = write(position, bytes.data(), bytes.size());
    if (status != kStatusOK)
        write(position, former.data(), former.size());
    return status;
}

std::int32_t FileBytes::setLength(std::uint64_t length) const
{
    if (!inFileRange(length, 0))
        return kStatusFileTooBig;
    int result;
    do
        result = systemCalls().ftruncate(descriptor_, static_cast<std::int64_t>(length));
    while (result != 0 && errno == EINTR);
    return result == 0 ? kStatusOK : failure();
}

std::int32_t FileBytes::flush() const
{
    int result;
    do
        result = systemCalls().fsync(descriptor_);
    while (result != 0 && errno == EINTR);
    return result == 0 || errno == EINVAL || errno == ENOSYS || errno == EOPNOTSUPP ? kStatusOK : failure();
}

} // namespace platform
