#include "tool/shared/input/SoundReader.h"

#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>

namespace {

constexpr std::int64_t kPieceSamples = 32 * 1024; // stays in the processor's cache
constexpr double kLowestRate = 0.001, kHighestRate = 1e9;

void requireSound(const AudioFileInfo& info)
{
    if (!info.compressed && !info.IsLinearPCM())
        throw Failure("holds samples of a kind that is not read");
    if (info.frames == 0)
        throw Failure("holds no sound");
}

} // namespace

SoundReader::SoundReader(const std::string& path)
{
    openAudio(file_, path);
    requireDecoder(file_);
    requireSound(info());
}

std::string SoundReader::note() const
{
    return info().missingDataSize > 0
               ? fmt::format("ends ahead of its sound, {} bytes of which are missing; what is there is shown",
                             info().missingDataSize)
               : std::string();
}

void SoundReader::read(std::int64_t from, std::int64_t to, const Visit& visit)
{
    const std::int64_t channels = info().channels;
    const std::int64_t most = std::max<std::int64_t>(kPieceSamples / channels, 1);
    piece_.resize(static_cast<std::size_t>(most * channels));
    while (from < to) {
        const std::int64_t count = std::min(most, to - from);
        requireOK(file_.ReadFrames(piece_.data(), from, count));
        visit(piece_.data(), count);
        from += count;
    }
}

// A CAF file may claim any rate that a 64-bit float can hold.
double sampleRateOf(const AudioFileInfo& info)
{
    if (!(info.exactSampleRate >= kLowestRate && info.exactSampleRate <= kHighestRate))
        throw Failure(fmt::format("has a sample rate of {:g} Hz", info.exactSampleRate));
    return info.exactSampleRate;
}
