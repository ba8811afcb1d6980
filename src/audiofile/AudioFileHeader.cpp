#include "audiofile/AudioFileHeader.h"

#include "audiofile/BusFormats.h"
#include "media/containers/ContainerHeaders.h"
#include "media/containers/NewContainer.h"

#include <cstring>

long BuildAudioFileHeader(void* buffer, FourCC fileType, long long frames, long long sampleRate, int channels, int bits,
                          TAudioBusFormat busFormat, bool option)
{
    const Bytes built = MakeAudioFileHeader(fileType, frames, sampleRate, channels, bits, busFormat, option, {});
    if (!built.empty())
        std::memcpy(buffer, built.data(), built.size());
    return static_cast<long>(built.size());
}

Bytes MakeAudioFileHeader(FourCC fileType, long long frames, long long sampleRate, int channels, int bits,
                          TAudioBusFormat busFormat, bool option, Bytes chunks)
{
    const bool isFloat = bits == -32 || bits == 64;
    const bool knownBits = isFloat || bits == 8 || bits == 16 || bits == 24 || bits == 32;
    const int count = channels == 0 ? AudioBusFormatChannels(busFormat) : channels;
    if (!knownBits || frames < 0 || sampleRate < 1 || count < 1)
        return {};
    const auto order = fileType == kAIFF ? std::endian::big : std::endian::little;
    platform::NewContainer file{
        .fileType = fileType == kAIFF && isFloat ? kAIFC : fileType,
        .format = platform::StreamDescription::packedPCM(
            static_cast<double>(sampleRate), static_cast<std::uint32_t>(count),
            {.bits = bits < 0 ? -bits : bits, .isFloat = isFloat, .order = order}),
        .speakers = SpeakersOf(busFormat, count),
        .frames = static_cast<std::uint64_t>(frames),
        .hasReservation = option,
        .chunks = std::move(chunks),
    };
    return fileType != kAIFC ? headerOf(std::move(file)) : Bytes();
}
