// What a display holds of a sound: its samples, or only its overview, as pairs of lowest and highest values.
#pragma once

#include "loops/overview/OverviewBlock.h"
#include "platform/URL.h"

#include <cstdint>
#include <memory>
#include <span>
#include <vector>

/// Owns its buffers. Values are samples, full scale being 1; an overview frame stands for 256 frames of audio.
class KT_EXPORT AudioRepresentation {
public:
    /// The lowest and the highest value of each overview frame; both have overviewFrames() entries.
    struct OverviewBuffers {
        std::vector<float> minima;
        std::vector<float> maxima;
    };

    /// `audioRepresentationWithOverview:sampleRate:`. One channel, of the block's frame count. Null for a block that is
    /// none, or of 2^31 frames and more.
    static std::unique_ptr<AudioRepresentation> audioRepresentationWithOverview(const KTMem* overview,
                                                                                double sampleRate);
    /// `initWithOverview:sampleRate:`. The same.
    static std::unique_ptr<AudioRepresentation> initWithOverview(const KTMem* overview, double sampleRate);
    /// `newAudioRepresentationUsingCAudioFileIOWithFileURL:`. All samples of a file, and the overview made of them.
    /// Null when it cannot be opened, read or closed, which is logged ("AudioRepresentation Read: -39").
    static std::unique_ptr<AudioRepresentation>
    newAudioRepresentationUsingCAudioFileIOWithFileURL(const platform::URLRef& fileURL);

    /// `createOverviewFromOverviewData:`. Takes the block's points for those of the one channel.
    void createOverviewFromOverviewData(const KTMem& overview);
    /// `prepareOverviewBuffersForNumChannels:`. min(channels + 1, 3) buffers of zeros: all channels together, then the
    /// first two.
    void prepareOverviewBuffersForNumChannels(int channels);

    std::int64_t frames() const { return frames_; }
    int channels() const { return channels_; }
    double sampleRate() const { return sampleRate_; }
    const platform::URLRef& fileURL() const { return fileURL_; }
    std::size_t overviewFrames() const;
    const std::vector<OverviewBuffers>& overviewBuffers() const { return overviewBuffers_; }
    /// The samples of a channel; empty when there is only an overview.
    std::span<const float> samples(int channel) const;

private:
    AudioRepresentation() = default;
    void setSamples(std::vector<float> interleaved, int channels);
    void createOverviewFromSamples();

    std::int64_t frames_ = 0;
    int channels_ = 0;
    double sampleRate_ = 0;
    platform::URLRef fileURL_;
    std::vector<std::vector<float>> samples_; // of each channel
    std::vector<OverviewBuffers> overviewBuffers_;
};
