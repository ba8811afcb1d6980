#include "files/registry/SampleLoading.h"

#include "platform/Memory.h"

#include <algorithm>
#include <cstring>
#include <limits>

namespace {

constexpr std::uint64_t kBlockFrames = 16 * 1024;

/// Null if that much memory cannot be had. Pages that are never written cost nothing.
SampleArray allocate(std::uint64_t samples)
{
    constexpr std::uint64_t alwaysThere = 64 << 20; // asking first costs more than reading a short file
    std::uint64_t bytes = 0;
    if (__builtin_mul_overflow(samples, sizeof(float), &bytes) || bytes > std::numeric_limits<std::size_t>::max() / 2 ||
        (bytes > alwaysThere && bytes > platform::availableMemory()))
        return nullptr;
    return SampleArray(static_cast<float*>(std::malloc(static_cast<std::size_t>(bytes))));
}

bool read(CAudioFileIO& file, float* to, std::uint64_t frame, std::uint64_t count)
{
    return file.ReadFrames(to, static_cast<long long>(frame), static_cast<long>(count)) == kStatusOK;
}

bool channelsAreEqual(const float* stereo, std::uint64_t frames)
{
    for (std::uint64_t i = 0; i < frames; ++i)
        if (stereo[2 * i] != stereo[2 * i + 1])
            return false;
    return true;
}

/// Moves the left samples of `frames` frames together, within the array.
void keepLeft(float* samples, std::uint64_t frames)
{
    for (std::uint64_t i = 0; i < frames; ++i)
        samples[i] = samples[2 * i];
}

/// The reverse of keepLeft, within an array that has room for twice the frames.
void doubleUp(float* samples, std::uint64_t frames)
{
    for (std::uint64_t i = frames; i-- > 0;)
        samples[2 * i] = samples[2 * i + 1] = samples[i];
}

/// Fills an array with room for stereo, with mono for as long as both channels are equal; `channels` says which it is.
bool readStereo(CAudioFileIO& file, float* samples, std::uint64_t frames, std::uint32_t& channels)
{
    std::uint64_t done = 0;
    while (done < frames) {
        const std::uint64_t count = std::min(kBlockFrames, frames - done);
        // The block goes behind the mono samples; it fits, since they take half the room of stereo.
        float* const block = samples + done;
        if (!read(file, block, done, count))
            return false;
        if (!channelsAreEqual(block, count)) {
            std::memmove(samples + 2 * done, block, static_cast<std::size_t>(count) * 2 * sizeof(float));
            doubleUp(samples, done);
            channels = 2;
            return read(file, samples + 2 * (done + count), done + count, frames - done - count);
        }
        keepLeft(block, count);
        done += count;
    }
    channels = 1;
    return true;
}

/// Frees the memory beyond the first `samples` samples.
void shrink(SampleArray& array, std::uint64_t samples)
{
    if (void* shorter = std::realloc(array.get(), static_cast<std::size_t>(samples) * sizeof(float))) {
        static_cast<void>(array.release());
        array.reset(static_cast<float*>(shorter));
    }
}

} // namespace

bool LoadSamples(CAudioFileIO& file, LoadedSamples& loaded)
{
    const AudioFileInfo& info = file.Info();
    if (file.OpenDecoder() != kStatusOK) // the decoder of compressed data knows its length best
        return false;
    if (info.frames <= 0 || info.frames > std::numeric_limits<std::uint32_t>::max() || info.channels <= 0 ||
        info.sampleRate <= 0)
        return false;
    const auto frames = static_cast<std::uint64_t>(info.frames);
    auto channels = static_cast<std::uint32_t>(info.channels);
    std::uint64_t needed = 0;
    SampleArray samples = __builtin_mul_overflow(frames, std::uint64_t{channels}, &needed) ? nullptr : allocate(needed);
    if (!samples)
        return false;
    if (channels != 2) {
        if (!read(file, samples.get(), 0, frames))
            return false;
    } else if (!readStereo(file, samples.get(), frames, channels)) {
        return false;
    } else if (channels == 1) {
        shrink(samples, frames);
    }
    loaded = {std::move(samples), channels, static_cast<std::uint32_t>(frames)};
    return true;
}
