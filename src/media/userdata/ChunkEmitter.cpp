#include "media/userdata/ChunkEmitter.h"

#include "platform/core/Status.h"

#include <algorithm>

namespace platform {

namespace {
constexpr std::size_t kGather = 64 * 1024;
}

void ChunkEmitter::header(FourCC id, std::uint64_t size)
{
    const auto header = layout_.header(id, size);
    bytes(BytesView(header).first(static_cast<std::size_t>(layout_.headerSize())));
}

void ChunkEmitter::bytes(BytesView bytes)
{
    if (gathered_.size() + bytes.size() > kGather) {
        flush();
        if (bytes.size() > kGather) {
            if (status_ == kStatusOK)
                status_ = file_.write(position_, bytes.data(), bytes.size());
            position_ += bytes.size();
            return;
        }
    }
    gathered_.insert(gathered_.end(), bytes.begin(), bytes.end());
}

void ChunkEmitter::copy(std::uint64_t from, std::uint64_t size)
{
    Bytes block(static_cast<std::size_t>(std::min<std::uint64_t>(size, kGather)));
    while (size > 0 && status_ == kStatusOK) {
        const auto count = static_cast<std::size_t>(std::min<std::uint64_t>(size, block.size()));
        status_ = file_.read(from, block.data(), count);
        bytes(BytesView(block).first(count));
        from += count;
        size -= count;
    }
}

void ChunkEmitter::pad(std::uint64_t size)
{
    const std::byte zero{0};
    if (layout_.padOf(size) != 0)
        bytes({&zero, 1});
}

std::int32_t ChunkEmitter::flush()
{
    if (status_ == kStatusOK && !gathered_.empty())
        status_ = file_.write(position_, gathered_.data(), gathered_.size());
    position_ += gathered_.size();
    gathered_.clear();
    return status_;
}

} // namespace platform
