// Audio files written and read with libsndfile.
#pragma once

#include <sndfile.h>

#include <gtest/gtest.h>

#include <cmath>
#include <memory>
#include <string>
#include <vector>

struct SoundFileCloser {
    void operator()(SNDFILE* file) const { sf_close(file); }
};
using SoundFile = std::unique_ptr<SNDFILE, SoundFileCloser>;

struct Sound {
    SF_INFO info{};
    std::vector<float> samples; // interleaved
};

/// Reads a file with libsndfile.
inline Sound readSound(const std::string& path)
{
    Sound sound;
    const SoundFile file(sf_open(path.c_str(), SFM_READ, &sound.info));
    if (!file) {
        ADD_FAILURE() << path << ": " << sf_strerror(nullptr);
        return sound;
    }
    sound.samples.resize(static_cast<std::size_t>(sound.info.frames * sound.info.channels));
    EXPECT_EQ(sf_readf_float(file.get(), sound.samples.data(), sound.info.frames), sound.info.frames);
    return sound;
}

/// Full-scale samples without equal neighbours.
inline std::vector<float> testWave(std::size_t count)
{
    std::vector<float> samples(count);
    for (std::size_t i = 0; i < count; ++i)
        samples[i] = static_cast<float>(std::sin(static_cast<double>(i) * 0.7) * 0.99);
    return samples;
}

/// Writes a file of `frames` frames with libsndfile.
inline void writeSound(const std::string& path, int format, int channels, int frames)
{
    SF_INFO info{};
    info.samplerate = 44100;
    info.channels = channels;
    info.format = format;
    const SoundFile file(sf_open(path.c_str(), SFM_WRITE, &info));
    ASSERT_TRUE(file != nullptr) << sf_strerror(nullptr);
    const auto samples = testWave(static_cast<std::size_t>(frames * channels));
    ASSERT_EQ(sf_writef_float(file.get(), samples.data(), frames), frames);
}

/// All kinds of linear PCM that the library must read.
inline constexpr int kSoundFormats[] = {SF_FORMAT_WAV | SF_FORMAT_PCM_U8,
                                        SF_FORMAT_WAV | SF_FORMAT_PCM_16,
                                        SF_FORMAT_WAV | SF_FORMAT_PCM_24,
                                        SF_FORMAT_WAV | SF_FORMAT_PCM_32,
                                        SF_FORMAT_WAV | SF_FORMAT_FLOAT,
                                        SF_FORMAT_WAV | SF_FORMAT_DOUBLE,
                                        SF_FORMAT_WAVEX | SF_FORMAT_PCM_24,
                                        SF_FORMAT_RF64 | SF_FORMAT_PCM_16,
                                        SF_FORMAT_AIFF | SF_FORMAT_PCM_S8,
                                        SF_FORMAT_AIFF | SF_FORMAT_PCM_16,
                                        SF_FORMAT_AIFF | SF_FORMAT_PCM_24,
                                        SF_FORMAT_AIFF | SF_FORMAT_PCM_32,
                                        SF_FORMAT_AIFF | SF_FORMAT_FLOAT,
                                        SF_FORMAT_CAF | SF_FORMAT_PCM_16,
                                        SF_FORMAT_CAF | SF_FORMAT_PCM_24,
                                        SF_FORMAT_CAF | SF_FORMAT_FLOAT,
                                        SF_FORMAT_CAF | SF_FORMAT_DOUBLE,
                                        SF_FORMAT_AIFF | SF_FORMAT_PCM_16 | SF_ENDIAN_LITTLE,
                                        SF_FORMAT_CAF | SF_FORMAT_PCM_24 | SF_ENDIAN_LITTLE};
/// In containers that are only read: big-endian WAVE, Wave64 and AU.
inline constexpr int kSoundFormatsToRead[] = {SF_FORMAT_WAV | SF_FORMAT_PCM_16 | SF_ENDIAN_BIG,
                                              SF_FORMAT_WAV | SF_FORMAT_FLOAT | SF_ENDIAN_BIG,
                                              SF_FORMAT_W64 | SF_FORMAT_PCM_U8,
                                              SF_FORMAT_W64 | SF_FORMAT_PCM_24,
                                              SF_FORMAT_W64 | SF_FORMAT_DOUBLE,
                                              SF_FORMAT_AU | SF_FORMAT_PCM_S8,
                                              SF_FORMAT_AU | SF_FORMAT_PCM_24,
                                              SF_FORMAT_AU | SF_FORMAT_FLOAT};
