#include "media/packets/PacketFile.h"

#include "media/containers/AudioHandle.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <utility>

namespace platform {

namespace {

constexpr std::size_t kWindowSize = 2 * PacketFile::kMostAtOnce;

} // namespace

BytesView PacketFile::load(std::uint64_t position, std::size_t count)
{
    if (position >= length_)
        return {};
    // What reaches to the end of the file is all that there is.
    if (const std::uint64_t end = windowStart_ + windowSize_; end == length_ && position >= windowStart_)
        return {window_.data() + (position - windowStart_), std::min(count, static_cast<std::size_t>(end - position))};
    const auto wanted = static_cast<std::size_t>(std::min<std::uint64_t>(kWindowSize, length_ - position));
    if (window_.size() < wanted)
        window_.resize(wanted);
    windowStart_ = position;
    const std::int32_t status = bytes_.readSome(position, window_.data(), wanted, windowSize_);
    if (status != kStatusOK)
        windowSize_ = 0;
    if (status_ == kStatusOK)
        status_ = status;
    return {window_.data(), std::min(count, windowSize_)};
}

std::int32_t PacketFile::read(std::uint64_t position, std::uint64_t count, Bytes& to)
{
    if (position > length_ || count > length_ - position)
        return kStatusEndOfFile;
    if (count > kLargestPacket)
        return kStatusIOError;
    const auto size = static_cast<std::size_t>(count);
    to.resize(size);
    if (size > kMostAtOnce)
        return bytes_.read(position, to.data(), size);
    const BytesView found = at(position, size);
    if (found.size() < size) {
        const std::int32_t status = takeStatus();
        return status != kStatusOK ? status : kStatusEndOfFile; // the file was cut meanwhile
    }
    std::ranges::copy(found, to.begin());
    return kStatusOK;
}

std::int32_t PacketFile::takeStatus()
{
    return std::exchange(status_, kStatusOK);
}

std::int32_t PacketFile::takeStatus(bool isOfKind)
{
    const std::int32_t status = takeStatus();
    return status == kStatusOK && !isOfKind ? AudioHandle::kFormatNotSupported : status;
}

} // namespace platform
