#include "tool/decode/DecodeSource.h"

#include "audiofile/BusFormats.h"
#include "media/samples/SampleExtremes.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/input/FileLocation.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/ClockTime.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>
#include <charconv>
#include <cmath>
#include <filesystem>

using platform::ConvertingReader;
using platform::StreamDescription;

namespace {

constexpr std::int64_t kBlockFrames = 64 * 1024;
constexpr std::int64_t kBlockBytes = 1 << 20; // with many channels a block has fewer frames
constexpr double kMostFrames = 9e18;

std::int64_t countBeyondFullScale(const float* samples, std::size_t count)
{
    std::int64_t beyond = 0;
    for (std::size_t i = 0; i < count; ++i)
        beyond += std::fabs(samples[i]) > 1.0F ? 1 : 0;
    return beyond;
}

} // namespace

DecodeSource::DecodeSource(const std::string& path, const DecodeWishes& wishes)
{
    open(path);
    setFormats(wishes);
    lookInto(path);
    setRange(wishes);
    blockFrames_ =
        static_cast<std::uint32_t>(std::clamp<std::int64_t>(kBlockBytes / sound_.bytesPerFrame(), 1, kBlockFrames));
    block_.resize(blockFrames_ * std::size_t{stream_.bytesPerFrame});
    if (!(reader_->clientFormat() == stream_))
        floats_.resize(blockFrames_ * std::size_t{sound_.channels});
}

void DecodeSource::open(const std::string& path)
{
    requireRegularFile(path);
    std::int32_t status = kStatusOK;
    platform::Error error;
    reader_ = ConvertingReader::open(*fileLocation(path), &status, &error);
    if (!reader_) {
        CAudioFileIO file; // knows best what is wrong with it
        openAudio(file, path);
        requireDecoder(file);
        throw OtherKind(error.description, OtherKind::Kind::unknown);
    }
    reader_->compareChecksum();
    sourceRate_ = reader_->clientFormat().sampleRate;
}

void DecodeSource::setFormats(const DecodeWishes& wishes)
{
    const StreamDescription& own = reader_->clientFormat();
    const platform::SampleFormat sample = own.sampleFormat();
    sound_.sampleRate = wishes.sampleRate.value_or(own.sampleRate);
    sound_.channels = wishes.channels.value_or(own.channelsPerFrame);
    sound_.depth = wishes.depth.value_or(SampleDepth{sample.bits, sample.isFloat});
    stream_ = streamOf(sound_, *wishes.format);
    // Samples that may exceed full scale are read as floats, so that they can be counted.
    const bool mayClip = !sound_.depth.isFloat && (sample.isFloat || sound_.sampleRate != own.sampleRate);
    StreamDescription client = stream_;
    if (mayClip)
        client = StreamDescription::packedPCM(sound_.sampleRate, sound_.channels,
                                              {.bits = 32, .isFloat = true, .order = std::endian::native});
    platform::Error error;
    if (reader_->setClientFormat(client, &error) != kStatusOK)
        throw Failure(!error.description.empty() ? error.description
                      : sound_.sampleRate != sourceRate_
                          ? fmt::format("its {} channels at {:.10g} Hz cannot be converted to {:.10g} Hz",
                                        sound_.channels, sourceRate_, sound_.sampleRate)
                          : "cannot be converted to such samples");
    if (sound_.sampleRate != std::round(sound_.sampleRate) && wishes.format->fileType != 0)
        notes_.push_back(fmt::format("its sample rate of {:.10g} Hz is written as {:.0f} Hz", sound_.sampleRate,
                                     std::round(sound_.sampleRate)));
}

// Reads which speakers the channels feed, and facts that only containers of linear PCM state.
void DecodeSource::lookInto(const std::string& path)
{
    if (reader_->fileFormat().channelsPerFrame == sound_.channels)
        sound_.busFormat = BusFormatOf(reader_->facts().speakers, static_cast<int>(sound_.channels));
    CAudioFileIO file;
    if (file.Open(referenceTo(path), 0) != kStatusOK || !file.Info().IsLinearPCM())
        return;
    if (file.Info().missingDataSize > 0)
        notes_.push_back(fmt::format("ends ahead of its sound, {} bytes of which are missing; what is there is decoded",
                                     file.Info().missingDataSize));
    if (static_cast<std::uint32_t>(file.Info().channels) == sound_.channels)
        sound_.busFormat = file.Info().busFormat;
}

void DecodeSource::setRange(const DecodeWishes& wishes)
{
    const std::uint64_t all = std::min(reader_->clientFrameCount(), static_cast<std::uint64_t>(kMostFrames));
    const std::uint64_t start = start_ = wishes.start.at(sound_.sampleRate);
    if (start > 0 && start >= all)
        throw Failure(fmt::format("has {} frames, and none at {}", all, start));
    const std::uint64_t end = wishes.end ? wishes.end->at(sound_.sampleRate) : all;
    if (end < start)
        throw Failure("--end is ahead of --start");
    const std::uint64_t wanted = wishes.frames ? wishes.frames->at(sound_.sampleRate) : end - start;
    if (wanted > all - start)
        notes_.push_back(fmt::format("only {} of {} frames are there", all - start, wanted));
    left_ = sound_.frames = static_cast<std::int64_t>(std::min(wanted, all - start));
    isWhole_ = sound_.frames == static_cast<std::int64_t>(all);
    requireOK(reader_->seek(static_cast<std::int64_t>(start)));
}

std::string_view DecodeSource::read()
{
    const bool clips = !floats_.empty();
    void* const to = clips ? static_cast<void*>(floats_.data()) : block_.data();
    auto wanted = static_cast<std::uint32_t>(std::min<std::int64_t>(left_, blockFrames_));
    // A damaged file may end before the length that it promises. A read across its end fails, a shorter one returns
    // what there is.
    std::uint32_t frames = 0;
    while (wanted > 0 && (frames = readFrames(to, wanted)) == 0)
        wanted /= 2;
    left_ -= frames;
    if (clips)
        clip(frames * std::size_t{sound_.channels});
    return {reinterpret_cast<const char*>(block_.data()), frames * std::size_t{stream_.bytesPerFrame}};
}

std::uint32_t DecodeSource::readFrames(void* to, std::uint32_t frames)
{
    platform::AudioBuffer buffer;
    buffer.channels = sound_.channels;
    buffer.data = to;
    buffer.byteSize = frames * reader_->clientFormat().bytesPerFrame;
    const std::int32_t status = reader_->read(frames, {&buffer, 1});
    if (status != kStatusEndOfFile)
        requireOK(status);
    return frames;
}

void DecodeSource::clip(std::size_t samples)
{
    platform::SampleExtremes extremes;
    platform::sampleExtremes(floats_.data(), reader_->clientFormat().sampleFormat(), samples, 1, &extremes);
    const auto [lowest, highest] =
        std::pair(std::min(extremes.lowest[0], extremes.lowest[1]), std::max(extremes.highest[0], extremes.highest[1]));
    if (lowest < -1.0F || highest > 1.0F)
        clipped_ += countBeyondFullScale(floats_.data(), samples);
    platform::floatToSamples(floats_.data(), stream_.sampleFormat(), block_.data(), samples);
}
