// What a display needs of a sound: its samples, or only its overview, as pairs of lowest and highest values.
#pragma once

#include "loops/overview/OverviewBlock.h"
#include "platform/URL.h"

#include <cstdint>
#include <memory>
#include <span>
#include <vector>

/// A sound to be displayed; owns its buffers. Values are samples, full scale being 1; an overview frame stands for
/// 256 frames of audio.
class KT_EXPORT AudioRepresentation {
public:
    /// The extremes of each overview frame; both have overviewFrames() entries.
    struct OverviewBuffers {
        std::vector<float> minima; // lowest values, at most 0
        std::vector<float> maxima; // highest values, at least 0
    };

    /// `audioRepresentationWithOverview:sampleRate:`: one channel, with the block's frame count. Null for bytes that
    /// are no block, and for 2^31 frames and more.
    static std::unique_ptr<AudioRepresentation> audioRepresentationWithOverview(const KTMem* overview,
                                                                                double sampleRate);
    /// `initWithOverview:sampleRate:`: the same.
    static std::unique_ptr<AudioRepresentation> initWithOverview(const KTMem* overview, double sampleRate);
    /// `newAudioRepresentationUsingCAudioFileIOWithFileURL:`: all samples of a file, and the overview made of them.
    /// Null when the file cannot be opened, read or closed, which is logged ("AudioRepresentation Read: -39").
    static std::unique_ptr<AudioRepresentation>
    newAudioRepresentationUsingCAudioFileIOWithFileURL(const platform::URLRef& fileURL);

    /// `createOverviewFromOverviewData:`: takes the block's points as those of the one channel.
    void createOverviewFromOverviewData(const KTMem& overview);
    /// `prepareOverviewBuffersForNumChannels:`: makes min(channels + 1, 3) buffers of zeros, for all channels
    /// together and for the first two.
    void prepareOverviewBuffersForNumChannels(int channels);

    /// How many frames of audio it stands for.
    std::int64_t frames() const { return frames_; }
    /// How many channels the samples have.
    int channels() const { return channels_; }
    /// In Hz.
    double sampleRate() const { return sampleRate_; }
    /// The file; null for an overview alone.
    const platform::URLRef& fileURL() const { return fileURL_; }
    /// How many overview frames there are: one for each 256 frames, the last for the rest.
    std::size_t overviewFrames() const;
    /// All channels together, then each of the first two.
    const std::vector<OverviewBuffers>& overviewBuffers() const { return overviewBuffers_; }
    /// The samples of a channel; empty for an overview alone.
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
