#include "audiofile/AudioFileLimits.h"

#include "media/containers/ContainerHeaders.h"

#include <algorithm>

namespace {

constexpr FourCC kOldWAVE = fourCC(".WAV");
constexpr std::int64_t kAIFFLimit = 0x7F000000;
constexpr std::int64_t kWAVELimit = 0xFE000000;
constexpr std::int64_t kLimit = 0x7F00000000;

} // namespace

std::int64_t MaxAudioFileSize(unsigned int fileType, bool flag)
{
    if (fileType == kAIFF)
        return kAIFFLimit;
    return fileType == kWAVE && !flag ? kWAVELimit : kLimit;
}

std::uint64_t MaxNumberOfFramesInAudioFile(int fileType, int bitsPerSample, int busFormat)
{
    constexpr std::int64_t mostFrames = 0x7FFFFFFF;
    const std::int64_t bytesPerFrame = std::int64_t{bitsPerSample / 8} * AudioBusFormatChannels(busFormat);
    if (bytesPerFrame < 1)
        return 0;
    // Kept: the limit of WAVE files is not applied here.
    const std::int64_t limit = static_cast<FourCC>(fileType) == kAIFF ? kAIFFLimit : kLimit;
    return static_cast<std::uint64_t>(std::min(limit / bytesPerFrame, mostFrames));
}

bool AudioFileDataNeedsSwap(unsigned int fileType, int bitsPerSample, unsigned int formatCode)
{
    const bool isWAVE = fileType == kWAVE || fileType == kOldWAVE;
    if (formatCode == fourCC("COMP"))
        return false;
    if (bitsPerSample == 8)
        return isWAVE;
    if (formatCode == fourCC("sowt") && fileType == kAIFF)
        return false;
    if (isWAVE)
        return false;
    // Kept: these two codes arrive with their bytes reversed and are compared that way.
    const bool reversedCode = formatCode == fourCC("mcpl") || formatCode == fourCC("23lf");
    return !(fileType == kCaff && reversedCode);
}

float CalculateBeatCountForFile(const AudioFileInfo* info, int count, int)
{
    constexpr double slowest = 70.0;
    constexpr double fastest = 140.5;
    if (info->beatCount > 0 || info->timingFlag != 0)
        return 0;
    const std::int64_t rate = info->sampleRate;
    const std::int64_t frames = info->frames;
    // A sound shorter than 12/7 s or longer than a minute is not taken for a loop. 128 bits keep any rate from
    // overflowing.
    const __int128 wideRate = rate;
    if (frames < wideRate * 240 / 140 || frames > wideRate * 60)
        return 0;
    std::int64_t beats = std::int64_t{count} * 8;
    double tempo = static_cast<double>(beats) * 60.0 * static_cast<double>(rate) / static_cast<double>(frames);
    if (!(tempo > 0)) // else the loop below would never end
        return 0;
    for (; tempo < slowest; tempo *= 2)
        beats *= 2;
    for (; tempo > fastest; tempo *= 0.5)
        beats >>= 1;
    return static_cast<float>(beats * 2);
}
