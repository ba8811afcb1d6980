#include "media/taglib/SourceStream.h"

#include "media/taglib/ChapterIds.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>
#include <string_view>

namespace platform::taglib {

TagLib::ByteVector SourceStream::readBlock(unsigned long length)
{
    // Allocates no more than the file still holds, whatever size it states.
    const auto left = static_cast<unsigned long>(std::max(length_ - position_, 0L));
    TagLib::ByteVector block(static_cast<unsigned int>(std::min({length, left, kMaxBlock})), '\0');
    std::size_t got = 0;
    if (status_ == kStatusOK && !block.isEmpty())
        status_ = source_.readSome(start_ + static_cast<std::uint64_t>(position_), block.data(), block.size(), got);
    if (status_ != kStatusOK)
        got = 0;
    block.resize(static_cast<unsigned int>(got));
    hideChapterIds(block);
    position_ += static_cast<long>(got);
    if (length != kBoxHeader || got != kBoxHeader)
        return block;
    followBoxes(block, position_ - static_cast<long>(got));
    return status_ == kStatusOK ? block : TagLib::ByteVector();
}

void SourceStream::followBoxes(const TagLib::ByteVector& header, long at)
{
    constexpr std::array<std::string_view, 11> containers = {"moov", "udta", "mdia", "meta", "ilst", "stbl",
                                                             "minf", "moof", "traf", "trak", "stsd"};
    if (std::find(containers.begin(), containers.end(), std::string_view(header.data() + 4, 4)) == containers.end())
        return;
    while (!boxEnds_.empty() && boxEnds_.back() <= at)
        boxEnds_.pop_back();
    // 0 means up to the end of the file; 1 announces a 64-bit size, which may be as large.
    const unsigned int size = header.toUInt();
    boxEnds_.push_back(size <= 1 ? length_ : at + static_cast<long>(size));
    if (boxEnds_.size() > kDeepestBox)
        status_ = kStatusParameterError;
}

void SourceStream::seek(long offset, Position from)
{
    const long base = from == Beginning ? 0 : from == Current ? position_ : length_;
    // Offsets come from the file: a position outside it becomes its start or end.
    if (__builtin_add_overflow(base, offset, &position_))
        position_ = offset < 0 ? 0 : length_;
    position_ = std::max(position_, 0L);
}

} // namespace platform::taglib
