// Pictures of sound: the extremes of each channel.
#include "c/Calls.h"
#include "c/OpenFile.h"
#include "media/samples/SampleExtremes.h"

#include <algorithm>
#include <limits>
#include <vector>

using platform::ConvertingReader;

namespace {

struct Extremes {
    float lowest;
    float highest;
};

/// Adds `frames` frames of interleaved floats to the extremes of their channels.
void addFrames(const float* samples, std::size_t frames, std::size_t channels, Extremes* extremes)
{
    if (channels > 2) {
        for (std::size_t frame = 0; frame < frames; ++frame, samples += channels)
            for (std::size_t channel = 0; channel < channels; ++channel) {
                // A NaN is less than nothing, and more than nothing.
                extremes[channel].lowest = std::min(extremes[channel].lowest, samples[channel]);
                extremes[channel].highest = std::max(extremes[channel].highest, samples[channel]);
            }
        return;
    }
    const platform::SampleFormat floats{.bits = 32, .isFloat = true, .order = std::endian::native};
    platform::SampleExtremes of; // of places that are even and odd
    platform::sampleExtremes(samples, floats, frames * channels, 1, &of);
    for (std::size_t place = 0; place < 2; ++place) {
        Extremes& to = extremes[place % channels];
        to.lowest = std::min(to.lowest, of.lowest[place]);
        to.highest = std::max(to.highest, of.highest[place]);
    }
}

/// Frames of a file, a window of them at a time.
class FrameWindow {
public:
    FrameWindow(ConvertingReader& reader, std::int64_t first)
        : reader_(reader),
          channels_(reader.clientFormat().channelsPerFrame),
          start_(first),
          frames_(std::max<std::size_t>(kWindowSamples / channels_, 1)),
          samples_(frames_ * channels_)
    {
    }

    /// Makes `frame` part of the window, which goes forward only; false at the end of the file and on failure.
    bool reach(std::int64_t frame, std::int32_t& status)
    {
        while (status == kStatusOK && frame >= start_ + static_cast<std::int64_t>(count_)) {
            start_ += static_cast<std::int64_t>(count_);
            count_ = static_cast<std::uint32_t>(frames_);
            platform::AudioBuffer buffer{channels_, static_cast<std::uint32_t>(samples_.size() * sizeof(float)),
                                         samples_.data()};
            status = reader_.read(count_, {&buffer, 1});
            if (count_ == 0)
                return false;
        }
        return status == kStatusOK;
    }
    std::int64_t end() const { return start_ + static_cast<std::int64_t>(count_); }
    /// Of a frame that was reached.
    const float* at(std::int64_t frame) const
    {
        return &samples_[static_cast<std::size_t>(frame - start_) * channels_];
    }

private:
    static constexpr std::size_t kWindowSamples = 1 << 16;

    ConvertingReader& reader_;
    std::uint32_t channels_;
    std::int64_t start_;
    std::size_t frames_;
    std::uint32_t count_ = 0;
    std::vector<float> samples_;
};

/// Where each of equal pieces of so many frames begins, in numbers that cannot overflow.
std::int64_t beginOf(std::int64_t point, std::int64_t points, std::int64_t frames)
{
    return frames / points * point + frames % points * point / points;
}

ktf_status drawOverview(ktf_file& file, std::int64_t first, std::int64_t frames, std::int64_t points, float* values,
                        std::size_t room)
{
    const char* const name = file.name.c_str();
    ktf_status status = KTF_OK;
    const std::unique_ptr<ConvertingReader> reader = openSampleReader(file, status);
    if (!reader)
        return status;
    const std::size_t channels = reader->clientFormat().channelsPerFrame;
    if (room / channels / 2 < static_cast<std::size_t>(points))
        return failCall(name, KTF_NO_ROOM);
    const auto all = static_cast<std::int64_t>(reader->clientFrameCount());
    first = std::min(first, all);
    frames = std::min(frames, all - first);
    std::vector<Extremes> extremes(channels);
    FrameWindow window(*reader, first);
    status = reader->seek(first);
    for (std::int64_t point = 0; point < points && status == KTF_OK; ++point) {
        std::ranges::fill(extremes, Extremes{0, 0});
        std::int64_t at = first + beginOf(point, points, frames);
        const std::int64_t next = first + beginOf(point + 1, points, frames);
        const std::int64_t end = frames == 0 ? at : std::max(next, at + 1);
        while (at < end && window.reach(at, status)) {
            const std::int64_t there = std::min(end, window.end());
            addFrames(window.at(at), static_cast<std::size_t>(there - at), channels, extremes.data());
            at = there;
        }
        for (const Extremes& channel : extremes) {
            *values++ = channel.lowest;
            *values++ = channel.highest;
        }
    }
    return status == KTF_OK ? status : failCall(name, status);
}

} // namespace

ktf_status ktf_overview(ktf_file* file, std::int64_t first, std::int64_t frames, std::uint32_t points, float* values,
                        std::size_t room)
{
    if (file == nullptr || values == nullptr)
        return failCallByNull(file != nullptr ? file->name.c_str() : nullptr);
    const char* const name = file->name.c_str();
    return guardedCall(name, [&]() -> ktf_status {
        const bool isPart = first >= 0 && frames >= 0;
        if (!isPart || points == 0 || points > std::uint32_t{std::numeric_limits<std::int32_t>::max()})
            return failCall(name, KTF_PARAMETER_ERROR);
        return drawOverview(*file, first, frames, points, values, room);
    });
}
