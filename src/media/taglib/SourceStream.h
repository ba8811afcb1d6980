// A file's bytes as TagLib reads them.
#pragma once

#include "media/containers/ByteSource.h"

#include <cstdint>
#include <taglib/tiostream.h>
#include <vector>

namespace platform::taglib {

/// `length` bytes of `source` from `start` on, with chapter ids hidden (ChapterIds.h). `source` must outlive it.
/// Writing operations do nothing.
class SourceStream final : public TagLib::IOStream {
public:
    SourceStream(const ByteSource& source, std::uint64_t start, long length)
        : source_(source),
          start_(start),
          length_(length)
    {
    }

    /// 0, or the status of the first failed read, after which nothing that was read is reliable.
    std::int32_t status() const { return status_; }

    TagLib::FileName name() const override { return ""; }
    TagLib::ByteVector readBlock(unsigned long length) override;
    void writeBlock(const TagLib::ByteVector&) override {}
    void insert(const TagLib::ByteVector&, unsigned long, unsigned long) override {}
    void removeBlock(unsigned long, unsigned long) override {}
    bool readOnly() const override { return true; }
    bool isOpen() const override { return true; }
    void seek(long offset, Position from) override;
    long tell() const override { return position_; }
    long length() override { return length_; }
    void truncate(long) override {}

private:
    static constexpr unsigned long kMaxBlock = 1UL << 30;
    static constexpr unsigned long kBoxHeader = 8;
    static constexpr std::size_t kDeepestBox = 64;

    /// Ends reading before boxes of an MP4 file nest too deeply, since TagLib follows them by recursion without a
    /// limit.
    void followBoxes(const TagLib::ByteVector& header, long at);

    const ByteSource& source_;
    std::uint64_t start_;
    long length_;
    long position_ = 0;
    std::int32_t status_ = 0;
    std::vector<long> boxEnds_; // ends of the MP4 boxes around the last header read
};

} // namespace platform::taglib
