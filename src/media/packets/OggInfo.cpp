#include "media/packets/OggInfo.h"

#include "media/packets/OggCoding.h"
#include "media/packets/OggPage.h"
#include "platform/core/Status.h"

#include <algorithm>

namespace platform {

namespace {

/// The last bytes of a part of a file, as many as are needed.
class FileTail {
public:
    /// For the part from `start` to `end`. Does not own the file.
    FileTail(PacketFile& file, std::uint64_t start, std::uint64_t end) : file_(file), start_(start), end_(end) {}

    /// Reads that many bytes, then twice as many at each call. False if all were read before, if they are too many, and
    /// if they cannot be read, with the status.
    bool grow(std::int32_t& status)
    {
        constexpr std::size_t first = std::size_t{1} << 17, most = std::size_t{1} << 23;
        const std::uint64_t all = end_ - start_;
        if (bytes_.size() == all || bytes_.size() >= most)
            return false;
        status = file_.read(end_ - std::min<std::uint64_t>(all, std::max(first, 2 * bytes_.size())),
                            std::min<std::uint64_t>(all, std::max(first, 2 * bytes_.size())), bytes_);
        return status == 0;
    }
    BytesView bytes() const { return bytes_; }
    bool isAll() const { return bytes_.size() == end_ - start_; }

private:
    PacketFile& file_;
    std::uint64_t start_, end_;
    Bytes bytes_;
};

/// More than any coding makes; a stream with more was forged.
constexpr std::uint64_t kMostFramesPerByte = 8192;

class OggEnds {
public:
    explicit OggEnds(PacketFile& file) : file_(file) {}

    /// 0, or as describeByEnds.
    std::int32_t describe(CompressedAudio& audio)
    {
        const bool isProven = readHeaders() && readFirstSound() && readLastPages();
        if (!isProven)
            return status_ != kStatusOK && status_ != kStatusEndOfFile ? status_ : file_.takeStatus(false);
        audio.fileType = fourCC("ogg ");
        audio.format = coding_->format();
        audio.frames = end_ - coding_->primingFrames();
        audio.facts = {.speakers = coding_->speakers()};
        return kStatusOK;
    }

private:
    bool nextPage(OggPage& page);
    bool readHeaders();
    bool readFirstSound();
    bool readLastPages();
    bool isRun(std::span<const OggPage> pages, bool areAll);
    bool counts(const OggPage& page);

    PacketFile& file_;
    std::int32_t status_ = kStatusOK;
    std::uint64_t next_ = 0; // position of the next page, and its number
    std::uint32_t number_ = 0;
    std::uint32_t serial_ = 0;
    Bytes page_;
    OggPackets packets_;
    std::unique_ptr<OggCoding> coding_;
    std::uint64_t soundStart_ = 0;
    std::uint64_t granule_ = 0; // of the last page passed to counts()
    bool isCounted_ = true;     // it is valid
    std::uint64_t end_ = 0;
};

/// False at the end, and if the next page is not the stream's.
bool OggEnds::nextPage(OggPage& page)
{
    const BytesView start = file_.at(next_, OggPage::kHeaderSize + 255);
    if (start.size() < OggPage::kHeaderSize)
        return false;
    std::size_t size = OggPage::kHeaderSize + std::to_integer<std::size_t>(start[OggPage::kHeaderSize - 1]);
    for (const std::byte segment : start.first(std::min(start.size(), size)).subspan(OggPage::kHeaderSize))
        size += std::to_integer<std::size_t>(segment);
    status_ = file_.read(next_, std::min<std::uint64_t>(size, file_.length() - next_), page_);
    if (status_ != kStatusOK)
        return false;
    const auto parsed = OggPage::parse(page_);
    if (!parsed || parsed->number != number_ || (number_ > 0 && parsed->serial != serial_) ||
        parsed->isFirst != (number_ == 0))
        return false;
    page = *parsed;
    serial_ = page.serial;
    ++number_;
    next_ += page.size();
    return true;
}

/// The first page holds only the first header, and sound begins on a new page.
bool OggEnds::readHeaders()
{
    constexpr std::uint64_t most = std::uint64_t{1} << 24; // bytes; comments may contain pictures
    OggPage page;
    const auto takeHeader = [&](BytesView packet) {
        if (coding_)
            return !coding_->hasHeaders() && coding_->takeHeader(packet);
        coding_ = OggCoding::of(packet);
        return coding_ != nullptr;
    };
    while (!coding_ || !coding_->hasHeaders()) {
        const bool isFirst = number_ == 0;
        if (next_ > most || !nextPage(page) || page.isLast || page.granule > 0 || !packets_.add(page, takeHeader) ||
            (isFirst && (!coding_ || packets_.isInsidePacket())))
            return false;
    }
    soundStart_ = next_;
    return !packets_.isInsidePacket();
}

/// Whether the page's count is that of the page before plus the frames of its packets; the last page may count less,
/// which cuts its last packet. If the count before is unknown, the page's own becomes known.
bool OggEnds::counts(const OggPage& page)
{
    std::uint64_t frames = 0, lastOnPage = 0;
    int known = 0;
    const bool isSound = packets_.add(page, [&](BytesView packet) {
        const auto ofPacket = coding_->framesOf(packet);
        const auto first = coding_->firstFrame();
        if (!ofPacket || (isCounted_ && first && *first != granule_ + frames))
            return false;
        frames += *ofPacket;
        lastOnPage = *ofPacket > 0 ? *ofPacket : lastOnPage;
        ++known;
        return true;
    });
    const bool endsPacket = page.endsPacket();
    if (!isSound || page.isFirst || page.serial != serial_ || endsPacket != (page.granule != OggPage::kNoGranule))
        return false;
    if (!endsPacket)
        return !page.isLast;
    const std::uint64_t ahead = granule_;
    granule_ = static_cast<std::uint64_t>(page.granule);
    if (page.granule < 0 || !isCounted_) {
        isCounted_ = known > 0;
        return page.granule >= 0 && !page.isLast;
    }
    const std::uint64_t all = ahead + frames;
    return granule_ == all ||
           (page.isLast && coding_->endsInsidePacket() && granule_ < all && granule_ + lastOnPage > all);
}

/// Reads up to the page that counts the first sound.
bool OggEnds::readFirstSound()
{
    constexpr std::uint64_t most = std::uint64_t{1} << 20;
    OggPage page;
    do
        if (next_ - soundStart_ > most || !nextPage(page) || !counts(page) || (page.isLast && next_ < file_.length()))
            return false;
    while (!page.endsPacket());
    return true;
}

bool OggEnds::readLastPages()
{
    FileTail tail(file_, soundStart_, file_.length());
    while (tail.grow(status_)) {
        const std::vector<OggPage> pages = lastOggPages(tail.bytes());
        if (pages.empty() || !pages.back().isLast || pages.back().granule < 0)
            return false;
        const auto last = static_cast<std::uint64_t>(pages.back().granule);
        const auto found =
            std::ranges::find_if(pages, [](const OggPage& page) { return page.granule != OggPage::kNoGranule; });
        const auto first = static_cast<std::uint64_t>(found->granule);
        if (tail.isAll() || (first < last && last - first > kProvenFrames))
            return isRun(pages, tail.isAll());
    }
    return false;
}

/// Whether the pages follow one another to the end of the stream.
bool OggEnds::isRun(std::span<const OggPage> pages, bool areAll)
{
    packets_ = {};
    coding_->leap();
    isCounted_ = areAll;
    granule_ = 0;
    for (std::size_t i = 0; i < pages.size(); ++i)
        if (pages[i].number != pages[0].number + i || pages[i].isLast != (i + 1 == pages.size()) || !counts(pages[i]))
            return false;
    end_ = granule_;
    return isCounted_ && !packets_.isInsidePacket() && end_ > coding_->primingFrames() &&
           end_ / kMostFramesPerByte <= file_.length();
}

} // namespace

std::int32_t readOggInfo(PacketFile& file, CompressedAudio& audio)
{
    return OggEnds(file).describe(audio);
}

} // namespace platform
