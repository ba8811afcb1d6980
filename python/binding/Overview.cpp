// Waveform overviews with every channel for itself: of each 256 frames the lowest and the highest sample.
#include "binding/Bindings.h"
#include "binding/Interpreter.h"
#include "binding/Location.h"
#include "binding/Problem.h"

#include "audiofile/CAudioFileIO.h"
#include "loops/overview/OverviewBlock.h"
#include "media/samples/SampleExtremes.h"

#include <pybind11/numpy.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <vector>

namespace py = pybind11;

namespace {

using platform::SampleExtremes;
using platform::SampleFormat;

constexpr long kPieceSize = 256 * 1024;  // stays in the processor's cache between the read and the fold
constexpr long long kPiecesPerLook = 64; // at the signals
constexpr std::size_t kPointFrames = kOverviewFramesPerPoint;

/// Folds frames of one file, as they are stored or decoded, into points.
class ChannelFold {
public:
    ChannelFold(SampleFormat format, std::size_t channels, std::size_t mostFrames)
        : format_(format),
          channels_(channels),
          sampleSize_(static_cast<std::size_t>(format.bytesPerSample())),
          extremes_((mostFrames + kPointFrames - 1) / kPointFrames),
          rounded_(extremes_.size())
    {
        if (channels > 2)
            channel_.resize(mostFrames * sampleSize_);
    }

    /// `frames` from the start of a point on; the points go to `to`.
    void add(const std::byte* samples, std::size_t frames, OverviewPoint* to)
    {
        if (channels_ == 1) {
            fold(samples, frames, 1);
            give(frames, [&](std::size_t point, const Rounded& one) { to[point] = joined(one); });
        } else if (channels_ == 2) {
            fold(samples, frames, 2);
            give(frames, [&](std::size_t point, const Rounded& both) {
                to[2 * point] = clamped(both.lowest[0], both.highest[0]);
                to[2 * point + 1] = clamped(both.lowest[1], both.highest[1]);
            });
        } else {
            for (std::size_t channel = 0; channel < channels_; ++channel) {
                takeChannel(samples + channel * sampleSize_, frames);
                fold(channel_.data(), frames, 1);
                give(frames,
                     [&](std::size_t point, const Rounded& one) { to[point * channels_ + channel] = joined(one); });
            }
        }
    }

private:
    struct Rounded {
        std::array<std::int8_t, 2> lowest, highest; // of samples at even and at odd places
    };
    static_assert(sizeof(SampleExtremes) == 4 * sizeof(float) && sizeof(Rounded) == 4);

    static OverviewPoint clamped(std::int8_t lowest, std::int8_t highest)
    {
        return {std::max<std::int8_t>(lowest, -127), std::max<std::int8_t>(highest, 0)};
    }
    static OverviewPoint joined(const Rounded& one)
    {
        return clamped(std::min(one.lowest[0], one.lowest[1]), std::max(one.highest[0], one.highest[1]));
    }

    void fold(const std::byte* samples, std::size_t frames, std::size_t channels)
    {
        constexpr SampleFormat bytes{8, false, false, std::endian::native};
        const std::size_t whole = frames / kPointFrames, rest = frames % kPointFrames;
        platform::sampleExtremes(samples, format_, kPointFrames * channels, whole, extremes_.data());
        if (rest > 0)
            platform::sampleExtremes(samples + whole * kPointFrames * channels * sampleSize_, format_, rest * channels,
                                     1, &extremes_[whole]);
        platform::floatToSamples(extremes_.front().lowest, bytes, rounded_.data(), 4 * (whole + (rest > 0 ? 1 : 0)));
    }

    template <class Give>
    void give(std::size_t frames, Give give) const
    {
        for (std::size_t point = 0; point * kPointFrames < frames; ++point)
            give(point, rounded_[point]);
    }

    template <std::size_t size>
    void takeSamples(const std::byte* from, std::size_t frames)
    {
        std::byte* to = channel_.data();
        for (std::size_t i = 0; i < frames; ++i, from += channels_ * size, to += size)
            std::memcpy(to, from, size);
    }
    void takeChannel(const std::byte* from, std::size_t frames)
    {
        switch (sampleSize_) {
        case 1:
            return takeSamples<1>(from, frames);
        case 2:
            return takeSamples<2>(from, frames);
        case 3:
            return takeSamples<3>(from, frames);
        case 4:
            return takeSamples<4>(from, frames);
        default:
            return takeSamples<8>(from, frames);
        }
    }

    SampleFormat format_;
    std::size_t channels_;
    std::size_t sampleSize_;
    std::vector<SampleExtremes> extremes_;
    std::vector<Rounded> rounded_;
    std::vector<std::byte> channel_; // one of many, its samples side by side
};

void openSound(const std::string& path, CAudioFileIO& file)
{
    require(path, file.Open(referenceTo(path), 0));
    platform::Error error;
    if (const std::int32_t status = file.OpenDecoder(&error); status != kStatusOK)
        throw Problem(path, status, error.description.empty() ? StatusText(status) : error.description);
    require(path, file.InfoStatus());
    const AudioFileInfo& info = file.Info();
    if ((!info.compressed && !info.IsLinearPCM()) || info.channels < 1)
        throw Problem(path, kStatusParameterError, "no sound that can be read");
}

/// How many frames were there.
long long foldFile(const std::string& path, CAudioFileIO& file, OverviewPoint* points)
{
    const AudioFileInfo& info = file.Info();
    const SampleFormat format =
        info.compressed ? SampleFormat{32, true, false, std::endian::native} : info.sampleFormat;
    const auto channels = static_cast<std::size_t>(info.channels);
    const std::size_t frameSize = channels * static_cast<std::size_t>(format.bytesPerSample());
    const auto most = static_cast<long>(std::max<std::size_t>(kPieceSize / frameSize / kPointFrames, 1) * kPointFrames);
    std::vector<std::byte> piece(static_cast<std::size_t>(most) * frameSize);
    ChannelFold fold(format, channels, static_cast<std::size_t>(most));
    for (long long frame = 0; frame < info.frames; frame += most) {
        if (frame / most % kPiecesPerLook == kPiecesPerLook - 1)
            heedSignals();
        const long wanted = std::min<long long>(most, info.frames - frame);
        long frames = wanted;
        std::int32_t status = kStatusOK;
        if (info.compressed)
            status = file.ReadFrames(reinterpret_cast<float*>(piece.data()), frame, wanted, &frames);
        else
            status = file.Read(piece.data(), info.dataOffset + frame * info.bytesPerFrame, wanted * info.bytesPerFrame,
                               nullptr);
        if (status != kStatusEndOfFile)
            require(path, status);
        fold.add(piece.data(), static_cast<std::size_t>(frames),
                 points + static_cast<std::size_t>(frame) / kPointFrames * channels);
        if (frames < wanted)
            return frame + frames;
    }
    return info.frames;
}

/// The points, the rate, the frames.
py::tuple makeOverview(const std::string& path)
{
    CAudioFileIO file;
    {
        const Unlocked unlocked;
        openSound(path, file);
    }
    const AudioFileInfo& info = file.Info();
    const auto points = static_cast<py::ssize_t>(OverviewPointCount(info.frames));
    py::array_t<std::int8_t> array({points, static_cast<py::ssize_t>(info.channels), py::ssize_t{2}});
    static_assert(sizeof(OverviewPoint) == 2);
    auto* const to = reinterpret_cast<OverviewPoint*>(array.mutable_data());
    long long frames = 0;
    {
        const Unlocked unlocked;
        frames = foldFile(path, file, to);
    }
    py::object there = std::move(array);
    if (frames < info.frames)
        there = there[py::slice(0, static_cast<py::ssize_t>(OverviewPointCount(frames)), 1)];
    return py::make_tuple(there, info.exactSampleRate, frames);
}

} // namespace

void bindOverview(py::module_& module)
{
    module.def("overview", &makeOverview, py::arg("path"));
    module.attr("FRAMES_PER_POINT") = kOverviewFramesPerPoint;
}
