#include "loops/overview/AudioRepresentation.h"

#include "audiofile/CAudioFileIO.h"
#include "media/samples/SampleExtremes.h"
#include "platform/Log.h"

#include <algorithm>
#include <limits>
#include <new>
#include <string>
#include <utility>

namespace {

constexpr platform::SampleFormat kFloats{32, true, false, std::endian::native};

bool isOK(const char* step, std::int32_t status)
{
    if (status != kStatusOK)
        platform::logLine("AudioRepresentation " + std::string(step) + ": " + std::to_string(status));
    return status == kStatusOK;
}

std::int32_t readSamples(CAudioFileIO& file, std::vector<float>& samples)
{
    if (const std::int32_t status = file.OpenDecoder(); status != kStatusOK)
        return status;
    const AudioFileInfo& info = file.Info();
    if (!info.compressed && !info.IsLinearPCM())
        return kStatusParameterError;
    try {
        samples.resize(static_cast<std::size_t>(info.frames) * static_cast<std::size_t>(info.channels));
    } catch (const std::bad_alloc&) {
        return kStatusOutOfMemory;
    } catch (const std::length_error&) {
        return kStatusOutOfMemory;
    }
    return file.ReadFrames(samples.data(), 0, static_cast<long>(info.frames));
}

} // namespace

std::unique_ptr<AudioRepresentation> AudioRepresentation::audioRepresentationWithOverview(const KTMem* overview,
                                                                                          double sampleRate)
{
    return initWithOverview(overview, sampleRate);
}

std::unique_ptr<AudioRepresentation> AudioRepresentation::initWithOverview(const KTMem* overview, double sampleRate)
{
    constexpr std::uint32_t most = std::numeric_limits<std::int32_t>::max();
    if (overview == nullptr || !IsOverviewBlock(*overview) || OverviewFrames(*overview) > most)
        return nullptr;
    std::unique_ptr<AudioRepresentation> representation(new AudioRepresentation);
    representation->frames_ = OverviewFrames(*overview);
    representation->sampleRate_ = sampleRate;
    representation->channels_ = 1;
    representation->createOverviewFromOverviewData(*overview);
    return representation;
}

std::unique_ptr<AudioRepresentation>
AudioRepresentation::newAudioRepresentationUsingCAudioFileIOWithFileURL(const platform::URLRef& fileURL)
{
    CAudioFileIO file;
    if (!isOK("Open", file.Open(CFileRef(fileURL), 0)))
        return nullptr;
    std::vector<float> samples;
    const std::int32_t read = readSamples(file, samples);
    const AudioFileInfo info = file.Info();
    const std::int32_t closed = file.Close();
    if (!isOK("Read", read) || !isOK("Close", closed))
        return nullptr;
    std::unique_ptr<AudioRepresentation> representation(new AudioRepresentation);
    representation->frames_ = info.frames;
    representation->setSamples(std::move(samples), info.channels);
    representation->createOverviewFromSamples();
    representation->fileURL_ = fileURL;
    representation->sampleRate_ = info.exactSampleRate;
    return representation;
}

void AudioRepresentation::createOverviewFromOverviewData(const KTMem& overview)
{
    constexpr float fullScale = 128;
    overviewBuffers_.clear();
    prepareOverviewBuffersForNumChannels(1);
    const std::size_t count = std::min(OverviewPoints(overview), overviewFrames());
    const OverviewPoint* points = OverviewPointsOf(overview);
    for (OverviewBuffers& buffers : overviewBuffers_)
        for (std::size_t i = 0; i < count; ++i) {
            buffers.minima[i] = points[i].minimum / fullScale;
            buffers.maxima[i] = points[i].maximum / fullScale;
        }
}

void AudioRepresentation::prepareOverviewBuffersForNumChannels(int channels)
{
    const std::vector<float> zeros(overviewFrames());
    overviewBuffers_.assign(static_cast<std::size_t>(std::clamp(channels, 0, 2)) + 1, {zeros, zeros});
}

std::size_t AudioRepresentation::overviewFrames() const
{
    return static_cast<std::size_t>(OverviewPointCount(frames_));
}

std::span<const float> AudioRepresentation::samples(int channel) const
{
    const auto index = static_cast<std::size_t>(channel);
    return channel >= 0 && index < samples_.size() ? std::span<const float>(samples_[index]) : std::span<const float>();
}

/// Moves the samples of one channel; copies those of several out, channel by channel.
void AudioRepresentation::setSamples(std::vector<float> interleaved, int channels)
{
    channels_ = channels;
    samples_.clear();
    if (channels == 1) {
        samples_.push_back(std::move(interleaved));
        return;
    }
    const auto stride = static_cast<std::size_t>(channels);
    for (std::size_t channel = 0; channel < stride; ++channel) {
        std::vector<float>& samples = samples_.emplace_back(interleaved.size() / stride);
        for (std::size_t i = 0; i < samples.size(); ++i)
            samples[i] = interleaved[i * stride + channel];
    }
}

void AudioRepresentation::createOverviewFromSamples()
{
    prepareOverviewBuffersForNumChannels(channels_);
    OverviewBuffers& together = overviewBuffers_.front();
    for (std::size_t channel = 0; channel < samples_.size(); ++channel) {
        const std::vector<float>& samples = samples_[channel];
        for (std::size_t i = 0; i < overviewFrames(); ++i) {
            const std::size_t start = i * std::size_t{kOverviewFramesPerPoint};
            const std::size_t count = std::min(samples.size() - start, std::size_t{kOverviewFramesPerPoint});
            platform::SampleExtremes extremes;
            platform::sampleExtremes(samples.data() + start, kFloats, count, 1, &extremes);
            const float lowest = std::min(extremes.lowest[0], extremes.lowest[1]);
            const float highest = std::max(extremes.highest[0], extremes.highest[1]);
            together.minima[i] = std::min(together.minima[i], lowest);
            together.maxima[i] = std::max(together.maxima[i], highest);
            if (channel + 1 < overviewBuffers_.size()) {
                overviewBuffers_[channel + 1].minima[i] = lowest;
                overviewBuffers_[channel + 1].maxima[i] = highest;
            }
        }
    }
}
