#include "Sounds.h"

#include "media/userdata/AudioFileService.h"
#include "support/URLs.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <numbers>

using namespace platform;

std::vector<float> sound(std::uint32_t frames, std::uint32_t channels, double sampleRate)
{
    std::vector<float> samples(std::size_t{frames} * channels);
    std::uint32_t noise = 1;
    for (std::uint32_t i = 0; i < frames; ++i)
        for (std::uint32_t c = 0; c < channels; ++c) {
            const double t = 2 * std::numbers::pi * i / sampleRate;
            const double swell = 0.6 + 0.4 * std::sin(t * 0.7 + c);
            double value = swell * (0.25 * std::sin(t * 220) + 0.2 * std::sin(t * (554.37 + 3 * c)) +
                                    0.15 * std::sin(t * 1318.5) + 0.05 * std::sin(t * 4186));
            noise = noise * 1664525 + 1013904223;
            if (i / 3000 % 4 == 1) // the bursts
                value += 0.2 * (static_cast<double>(noise >> 8) / (1 << 23) - 1);
            samples[std::size_t{i} * channels + c] = static_cast<float>(value);
        }
    return samples;
}

std::vector<float> roughSound(std::uint32_t frames, std::uint32_t channels, double sampleRate)
{
    std::vector<float> samples(std::size_t{frames} * channels);
    std::uint32_t noise = 1;
    for (std::uint32_t i = 0; i < frames; ++i)
        for (std::uint32_t c = 0; c < channels; ++c) {
            noise = noise * 1664525 + 1013904223;
            const double white = static_cast<double>(noise >> 8) / (1 << 23) - 1;
            const double t = 2 * std::numbers::pi * i / sampleRate;
            const std::uint32_t since = i % 5300; // the last attack
            double value = 0.25 * std::sin(t * (220 + 37 * c)) + 0.1 * std::sin(t * 1318.5);
            value += 0.7 * white * std::exp(-static_cast<double>(since) / 200);
            switch (i / 7001 % 7) {
            case 1:
                value = 0;
                break;
            case 3:
                value = white;
                break;
            case 5:
                value = std::sin(t * (100 + c)) < 0 ? -1 : 1;
                break;
            default:
                break;
            }
            samples[std::size_t{i} * channels + c] = static_cast<float>(std::clamp(value, -1.0, 1.0));
        }
    return samples;
}

namespace {

void write(const std::string& path, const std::vector<float>& samples, std::uint32_t channels, double sampleRate,
           int bits)
{
    const auto format = StreamDescription::packedPCM(sampleRate, channels, {.bits = bits});
    Bytes bytes(samples.size() * static_cast<std::size_t>(bits / 8));
    floatToSamples(samples.data(), format.sampleFormat(), bytes.data(), samples.size());
    std::int32_t status = 0;
    const auto file = AudioFile::create(*urlOf(path), fourCC("WAVE"), format, &status, AudioFile::eraseExisting);
    ASSERT_TRUE(file) << status;
    auto packets = static_cast<std::uint32_t>(samples.size() / channels);
    ASSERT_EQ(file->writePackets(0, packets, bytes.data()), 0);
}

} // namespace

void writeSound(const std::string& path, std::uint32_t frames, std::uint32_t channels, double sampleRate, int bits)
{
    write(path, sound(frames, channels, sampleRate), channels, sampleRate, bits);
}

void writeRoughSound(const std::string& path, std::uint32_t frames, std::uint32_t channels, double sampleRate, int bits)
{
    write(path, roughSound(frames, channels, sampleRate), channels, sampleRate, bits);
}

std::unique_ptr<ConvertingReader> openReader(const std::string& path, std::int32_t* status, Error* error)
{
    return ConvertingReader::open(*urlOf(path), status, error);
}

Bytes framesOf(ConvertingReader& reader, std::uint64_t frame, std::uint32_t frames)
{
    const std::uint32_t frameSize = reader.clientFormat().bytesPerFrame;
    Bytes bytes(std::size_t{frames} * frameSize);
    AudioBuffer buffer{reader.clientFormat().channelsPerFrame, frames * frameSize, bytes.data()};
    EXPECT_EQ(reader.seek(static_cast<std::int64_t>(frame)), 0);
    EXPECT_EQ(reader.read(frames, {&buffer, 1}), 0) << "at " << frame;
    bytes.resize(std::size_t{frames} * frameSize);
    return bytes;
}

Bytes allFramesOf(ConvertingReader& reader, std::uint32_t block)
{
    Bytes all;
    const std::uint32_t frameSize = reader.clientFormat().bytesPerFrame;
    for (Bytes piece; !(piece = framesOf(reader, all.size() / frameSize, block)).empty();)
        all.insert(all.end(), piece.begin(), piece.end());
    return all;
}
