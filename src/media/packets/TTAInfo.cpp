#include "media/packets/TTAInfo.h"

#include "media/packets/TagExtents.h"
#include "platform/core/CRC32.h"
#include "platform/core/Packed.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>
#include <optional>

namespace platform {

namespace {

constexpr std::size_t kCRCSize = 4;

/// Whether the last bytes are the checksum of the others.
bool isRight(BytesView bytes)
{
    if (bytes.size() <= kCRCSize)
        return false;
    const std::size_t size = bytes.size() - kCRCSize;
    return ECCRC32(0, bytes.data(), size) == loadLE<std::uint32_t>(bytes.data() + size);
}

class TTAEnds {
public:
    explicit TTAEnds(PacketFile& file) : file_(file) {}

    /// 0, or as describeByEnds.
    std::int32_t describe(CompressedAudio& audio)
    {
        audio = {};
        audio.fileType = audio.format.formatId = fourCC("tta ");
        if (readHeader(audio) && findFrames(audio.frames) && areFramesRight())
            return kStatusOK;
        return status_ != kStatusOK && status_ != kStatusEndOfFile ? status_ : file_.takeStatus(false);
    }

private:
    bool readHeader(CompressedAudio& audio);
    bool findFrames(std::uint64_t count);
    bool areFramesRight();
    /// Reads bytes that end with their checksum, and compares it.
    bool readRight(std::uint64_t position, std::uint64_t size)
    {
        if (size > PacketFile::kLargestPacket)
            return false;
        status_ = file_.read(position, size, bytes_);
        return status_ == kStatusOK && isRight(bytes_);
    }

    PacketFile& file_;
    std::int32_t status_ = kStatusOK;
    Bytes bytes_;
    std::uint64_t framesInOne_ = 0;
    std::uint64_t next_ = 0;
    std::vector<std::uint64_t> ends_; // ends of TTA's frames; the first entry is the start of the first
};

bool TTAEnds::readHeader(CompressedAudio& audio)
{
    // "TTA1", coding 2, channels 2, bits 2, rate 4, frames 4, checksum 4
    constexpr std::size_t size = 22;
    constexpr std::uint32_t mostRate = 1000000;
    // Indexed by channels; 0 for one channel, whose speaker decoders do not name, and for five, which they do not
    // accept.
    constexpr std::array<std::uint32_t, 9> speakers{0, 0, 0x3, 0xB, 0x33, 0, 0x3F, 0x13F, 0x6CF};
    next_ = endOfLeadingTags(file_);
    if (!readRight(next_, size) || textOf(BytesView(bytes_).first(4)) != "TTA1")
        return false;
    const auto number = [&](std::size_t at) { return std::uint32_t{loadLE<std::uint16_t>(bytes_.data() + at)}; };
    const auto rate = loadLE<std::uint32_t>(bytes_.data() + 10);
    audio.format.sampleRate = rate;
    audio.format.channelsPerFrame = number(6);
    audio.format.bitsPerChannel = number(8);
    audio.frames = loadLE<std::uint32_t>(bytes_.data() + 14);
    next_ += size;
    framesInOne_ = std::uint64_t{rate} * 256 / 245;
    const std::uint32_t bits = number(8);
    const bool isUsual = number(4) == 1 && number(6) > 0 && number(6) < speakers.size() && number(6) != 5 &&
                         rate <= mostRate && framesInOne_ > 0 && (bits == 8 || bits == 16 || bits == 24) &&
                         audio.frames > 0;
    if (isUsual)
        audio.facts.speakers = speakers[number(6)];
    return isUsual;
}

/// Reads the table of frame sizes.
bool TTAEnds::findFrames(std::uint64_t count)
{
    const std::uint64_t frames = (count + framesInOne_ - 1) / framesInOne_;
    const std::uint64_t size = frames * 4 + kCRCSize;
    if (!readRight(next_, size))
        return false;
    next_ += size;
    ends_.push_back(next_);
    for (std::size_t at = 0; at + kCRCSize < size; at += 4)
        ends_.push_back(ends_.back() + loadLE<std::uint32_t>(bytes_.data() + at));
    return ends_.back() == startOfTrailingTags(file_, next_);
}

bool TTAEnds::areFramesRight()
{
    const std::size_t frames = ends_.size() - 1;
    const std::uint64_t wanted = kProvenFrames / framesInOne_ + 2; // the last frame may be short
    for (std::size_t i = 0; i < frames; ++i)
        if ((i == 0 || i + wanted >= frames) && !readRight(ends_[i], ends_[i + 1] - ends_[i]))
            return false;
    return true;
}

} // namespace

std::int32_t readTTAInfo(PacketFile& file, CompressedAudio& audio)
{
    return TTAEnds(file).describe(audio);
}

} // namespace platform
