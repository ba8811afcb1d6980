// Files of linear PCM written by a test, and what a converting reader reads of them.
#pragma once

#include "media/decoding/ConvertingReader.h"
#include "media/userdata/AudioFileService.h"
#include "platform/core/Status.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

inline std::unique_ptr<platform::ConvertingReader> openReader(const std::string& path, std::int32_t* status = nullptr,
                                                              platform::Error* error = nullptr)
{
    return platform::ConvertingReader::open(
        *platform::URL::createWithFileSystemPath(platform::String::fromUTF8(path), platform::PathStyle::posix, false),
        status, error);
}

/// Reads values of `T` from `frame` on, up to `frames` frames.
template <class T>
std::vector<T> readFrom(platform::ConvertingReader& reader, std::int64_t frame, std::uint32_t frames)
{
    EXPECT_EQ(reader.seek(frame), 0);
    const platform::StreamDescription& client = reader.clientFormat();
    std::vector<T> values(std::size_t{frames} * client.bytesPerFrame / sizeof(T));
    platform::AudioBuffer buffer{client.channelsPerFrame, frames * client.bytesPerFrame, values.data()};
    EXPECT_EQ(reader.read(frames, {&buffer, 1}), 0);
    EXPECT_EQ(buffer.byteSize, frames * client.bytesPerFrame);
    values.resize(buffer.byteSize / sizeof(T));
    return values;
}

/// A file of `samples`, which are in the file's own format.
template <class T>
std::string writeAudio(const TemporaryFolder& folder, FourCC type, const platform::StreamDescription& format,
                       const std::vector<T>& samples)
{
    const std::string path = folder / "audio";
    std::int32_t status = 0;
    const auto file = platform::AudioFile::create(
        *platform::URL::createWithFileSystemPath(platform::String::fromUTF8(path), platform::PathStyle::posix, false),
        type, format, &status, platform::AudioFile::eraseExisting);
    EXPECT_EQ(status, 0);
    auto packets = static_cast<std::uint32_t>(samples.size() * sizeof(T) / format.bytesPerFrame);
    std::vector<T> stored = samples;
    if (format.sampleFormat().order != std::endian::native)
        platform::swapSamples(stored.data(), sizeof(T), stored.size());
    EXPECT_EQ(file->writePackets(0, packets, stored.data()), 0);
    return path;
}
