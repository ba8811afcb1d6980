#include "tool/page/WaveStream.h"

#include "platform/core/ByteWriter.h"
#include "tool/shared/input/FileLocation.h"
#include "tool/shared/output/Failure.h"

#include <algorithm>
#include <cmath>

using platform::ConvertingReader;
using platform::StreamDescription;

namespace {

// The sizes in the header have 32 bits.
constexpr std::int64_t kMostSoundBytes = 0xffff'ff00;
constexpr std::int64_t kMostFramesAtOnce = 16 * 1024;

} // namespace

WaveStream::WaveStream(const std::string& path, const WaveLimits& limits)
{
    std::int32_t status = 0;
    platform::Error error;
    reader_ = ConvertingReader::open(*fileLocation(path), &status, &error);
    if (!reader_)
        throw Failure(error.description.empty() ? "cannot be decoded" : error.description);
    setFormat(limits);
    const double most = std::min(limits.seconds * sampleRate_, static_cast<double>(kMostSoundBytes / frameSize()));
    frames_ = static_cast<std::int64_t>(std::min(static_cast<double>(reader_->clientFrameCount()), most));
}

void WaveStream::setFormat(const WaveLimits& limits)
{
    const StreamDescription own = reader_->clientFormat();
    channels_ = std::min(own.channelsPerFrame, limits.channels);
    if (!(own.sampleRate >= 1) || channels_ == 0)
        throw Failure("holds no sound");
    // Another rate may need the module of decoders, which need not be there.
    if ((own.sampleRate > limits.sampleRate && tryFormat(limits.sampleRate)) || tryFormat(own.sampleRate))
        return;
    throw Failure("cannot be converted to 16-bit samples");
}

bool WaveStream::tryFormat(double sampleRate)
{
    sampleRate_ = sampleRate;
    const platform::SampleFormat sample = {.bits = 16, .order = std::endian::little};
    return reader_->setClientFormat(StreamDescription::packedPCM(sampleRate, channels_, sample)) == 0;
}

std::string WaveStream::header() const
{
    const auto rate = static_cast<std::uint32_t>(std::clamp(std::round(sampleRate_), 1.0, 4e9));
    const auto bytes = static_cast<std::uint32_t>(frames_ * frameSize());
    ByteWriter header(std::endian::little);
    header.writeFourCC(fourCC("RIFF"));
    header.write<std::uint32_t>(bytes + kHeaderSize - 8);
    header.writeFourCC(fourCC("WAVE"));
    header.writeFourCC(fourCC("fmt "));
    header.write<std::uint32_t>(16);
    header.write<std::uint16_t>(1); // integer PCM
    header.write(static_cast<std::uint16_t>(channels_));
    header.write(rate);
    header.write(static_cast<std::uint32_t>(rate * frameSize()));
    header.write(static_cast<std::uint16_t>(frameSize()));
    header.write<std::uint16_t>(16);
    header.writeFourCC(fourCC("data"));
    header.write(bytes);
    return std::string(textOf(header.view()));
}

std::string WaveStream::read(std::int64_t offset, std::size_t wanted)
{
    if (offset < kHeaderSize)
        return header().substr(static_cast<std::size_t>(offset), wanted);
    const std::int64_t behind = offset - kHeaderSize, first = behind / frameSize(), skipped = behind % frameSize();
    const std::int64_t rounded =
        (static_cast<std::int64_t>(std::min<std::size_t>(wanted, 1 << 20)) + skipped + frameSize() - 1) / frameSize();
    const std::int64_t count = std::min({rounded, kMostFramesAtOnce, frames_ - first});
    if (count <= 0)
        return {};
    std::string bytes(static_cast<std::size_t>(count * frameSize()), '\0');
    readFrames(first, bytes);
    return bytes.substr(static_cast<std::size_t>(skipped), wanted);
}

// Fills the bytes as far as there is sound.
void WaveStream::readFrames(std::int64_t from, std::string& bytes)
{
    if (position_ != from && reader_->seek(from) != 0) {
        position_ = -1;
        return;
    }
    position_ = from;
    const auto wanted = static_cast<std::uint32_t>(bytes.size() / static_cast<std::size_t>(frameSize()));
    std::uint32_t done = 0, tried = wanted;
    // A read across the end of a damaged file fails, a shorter one gives what is there.
    while (done < wanted && tried > 0) {
        std::uint32_t frames = std::min(tried, wanted - done);
        platform::AudioBuffer buffer = {channels_, static_cast<std::uint32_t>(frames * frameSize()),
                                        bytes.data() + done * frameSize()};
        if (reader_->read(frames, {&buffer, 1}) == 0 && frames > 0)
            done += frames;
        else
            tried /= 2;
    }
    position_ = done == wanted ? from + done : -1;
}
