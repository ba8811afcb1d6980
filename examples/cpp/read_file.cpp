// Reads an audio file in any format as floats and tells its length and the peak of each channel. Usage: read_file FILE
#include "media/decoding/ConvertingReader.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <filesystem>

using platform::ConvertingReader, platform::StreamDescription;

int main(int argc, char** argv)
{
    if (argc != 2)
        return 2;
    const std::string path = std::filesystem::absolute(argv[1]); // URLs of files are absolute
    std::int32_t status = 0;
    platform::Error error;
    const auto reader = ConvertingReader::open(*platform::URL::createWithFileSystemBytes(path, false), &status, &error);
    if (!reader) {
        std::fprintf(stderr, "%s: %s\n", argv[1], error.description.c_str());
        return 1;
    }
    // The file's own rate and channels; any others can be asked for here, and the reader converts.
    const StreamDescription& file = reader->fileFormat();
    const std::uint32_t channels = file.channelsPerFrame;
    reader->setClientFormat(StreamDescription::packedPCM(file.sampleRate, channels, {.bits = 32, .isFloat = true}));

    std::vector<float> samples(std::size_t{4096} * channels), peaks(channels);
    const auto room = static_cast<std::uint32_t>(samples.size() * sizeof(float));
    std::uint64_t frames = 0;
    for (std::uint32_t count = 4096; count > 0; frames += count) {
        platform::AudioBuffer buffer{.channels = channels, .byteSize = room, .data = samples.data()};
        status = reader->read(count, {&buffer, 1});
        if (status != kStatusOK) {
            std::fprintf(stderr, "%s: %s\n", argv[1], StatusText(status));
            return 1;
        }
        for (std::size_t i = 0; i < std::size_t{count} * channels; ++i)
            peaks[i % channels] = std::max(peaks[i % channels], std::abs(samples[i]));
    }
    std::printf("%s: %.3f s, %.0f Hz\n", argv[1], static_cast<double>(frames) / file.sampleRate, file.sampleRate);
    for (std::uint32_t channel = 0; channel < channels; ++channel)
        std::printf("  channel %u: peak %.3f\n", channel + 1, static_cast<double>(peaks[channel]));
    return reader->missingFrames() == 0 ? 0 : 1; // damaged parts were read as silence
}
