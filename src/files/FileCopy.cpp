#include "files/FileCopy.h"

#include "platform/SystemCalls.h"

#include <algorithm>
#include <cerrno>
#include <memory>

using platform::systemCalls;

namespace {

constexpr std::size_t kPiece = std::size_t{8} << 20;

bool isFull(int error)
{
    return error == ENOSPC || error == EFBIG || error == EDQUOT;
}

class Copy {
public:
    Copy(int from, int to, std::int64_t size, const FileCopyProgress& progress)
        : from_(from),
          to_(to),
          size_(size),
          progress_(progress)
    {
    }

    /// Copies up to `end`; the bytes ahead of `begin` are a hole.
    FileProblem extent(std::int64_t begin, std::int64_t end)
    {
        bool inSystem = true;
        for (tell(begin); begin < end; tell(begin)) {
            const std::size_t count = std::min(static_cast<std::size_t>(end - begin), kPiece);
            const std::int64_t copied =
                inSystem ? systemCalls().copyRange(from_, to_, begin, count) : pieceByHand(begin, count);
            if (copied > 0)
                begin += copied;
            else if (copied < 0 && (isFull(errno) || (!inSystem && errno != EINTR)))
                return FileProblem::ofSystem();
            else if (copied == 0 && !inSystem)
                return {FileProblem::Kind::shortened};
            else if (inSystem)
                inSystem = false;
        }
        return {};
    }

private:
    /// Copies through memory where the system cannot copy between the two files. Returns the number of bytes, 0 at the
    /// end of `from`.
    std::int64_t pieceByHand(std::int64_t offset, std::size_t count)
    {
        if (!buffer_)
            buffer_ = std::make_unique_for_overwrite<char[]>(kPiece);
        const std::int64_t got = systemCalls().pread(from_, buffer_.get(), count, offset);
        for (std::int64_t put = 0; put < got;) {
            const std::int64_t now =
                systemCalls().pwrite(to_, buffer_.get() + put, static_cast<std::size_t>(got - put), offset + put);
            if (now < 0 && errno != EINTR)
                return -1;
            put += std::max<std::int64_t>(now, 0);
        }
        return got;
    }

    void tell(std::int64_t done) const
    {
        if (progress_)
            progress_(done, size_);
    }

    int from_, to_;
    std::int64_t size_;
    const FileCopyProgress& progress_;
    std::unique_ptr<char[]> buffer_;
};

} // namespace

FileProblem CopyFileContent(int from, int to, const FileCopyProgress& progress)
{
    if (systemCalls().shareContent(from, to) == 0)
        return {};
    platform::FileStatus status;
    if (!systemCalls().status(from, &status) || systemCalls().ftruncate(to, status.size) != 0)
        return FileProblem::ofSystem();
    Copy copy(from, to, status.size, progress);
    for (std::int64_t position = 0; position < status.size;) {
        std::int64_t begin = 0, end = 0;
        if (!systemCalls().nextData(from, position, &begin, &end))
            return errno == ENXIO ? copy.extent(status.size, status.size) // only a hole remains
                                  : FileProblem::ofSystem();
        end = std::min<std::int64_t>(end, status.size);
        if (FileProblem problem = copy.extent(begin, end))
            return problem;
        position = std::max(end, begin);
    }
    return {};
}

FileProblem CopyFileAttributes(int from, const platform::FileAttributes& attributes, int to, KeptTimes times)
{
    using Kind = FileProblem::Kind;
    platform::FileAttributes own;
    if (!platform::fileAttributes(to, own))
        return FileProblem::ofSystem();
    const bool isForeign = own.owner != attributes.owner || own.group != attributes.group;
    if (isForeign && systemCalls().setOwner(to, attributes.owner, attributes.group) != 0)
        return FileProblem::ofSystem(Kind::owner);
    // Set after the owner, because a change of owner clears set-id bits.
    if (!platform::setPermissions(to, attributes.permissions))
        return FileProblem::ofSystem();
    std::string lost;
    if (!platform::copyExtendedAttributes(from, to, lost))
        return FileProblem::ofSystem(lost.empty() ? Kind::system : Kind::attribute, lost);
    if (!platform::setFileTimes(to, attributes.accessed, times == KeptTimes::all ? &attributes.modified : nullptr))
        return FileProblem::ofSystem();
    return {};
}
