// The frames of a sound file as NumPy arrays.
#include "binding/Bindings.h"
#include "binding/Interpreter.h"
#include "binding/SoundReaders.h"

#include <pybind11/numpy.h>
#include <pybind11/stl.h>

#include <algorithm>
#include <atomic>
#include <limits>
#include <memory>
#include <mutex>
#include <optional>

namespace py = pybind11;

namespace {

/// Any thread may read and close; one at a time gets its turn.
class Reader {
public:
    Reader(std::string path, std::optional<double> rate, std::optional<std::uint32_t> channels, unsigned threads)
    {
        const Unlocked unlocked;
        readers_ = std::make_unique<SoundReaders>(std::move(path), rate, channels, threads);
        file_ = readers_->fileFormat();
        client_ = readers_->clientFormat();
        frames_ = framesFrom(readers_->clientFrameCount());
        fileFrames_ = framesFrom(readers_->frameCount());
    }

    py::array_t<float> read(std::int64_t start, std::optional<std::int64_t> frames)
    {
        if (start < 0)
            throw py::value_error("start is negative");
        const std::int64_t there = std::max<std::int64_t>(frames_ - start, 0);
        if (frames && *frames < 0)
            throw py::value_error("frames is negative");
        const std::int64_t wanted = std::min(frames.value_or(there), there);
        const auto channels = static_cast<py::ssize_t>(client_.channelsPerFrame);
        py::array_t<float> array({static_cast<py::ssize_t>(wanted), channels}); // not filled
        std::int64_t done = 0;
        {
            float* const to = array.mutable_data();
            const Unlocked unlocked;
            const std::lock_guard lock(mutex_);
            done = open().read(to, start, wanted);
        }
        if (done == wanted)
            return array;
        return py::array_t<float>(array[py::slice(0, static_cast<py::ssize_t>(done), 1)]);
    }

    void close()
    {
        const Unlocked unlocked;
        const std::lock_guard lock(mutex_);
        isClosed_ = true;
        readers_.reset();
    }
    bool isClosed() const { return isClosed_; }
    std::uint64_t missingFrames()
    {
        const Unlocked unlocked;
        const std::lock_guard lock(mutex_);
        return open().missingFrames();
    }

    double sampleRate() const { return client_.sampleRate; }
    std::uint32_t channels() const { return client_.channelsPerFrame; }
    std::int64_t frames() const { return frames_; }
    double fileSampleRate() const { return file_.sampleRate; }
    std::uint32_t fileChannels() const { return file_.channelsPerFrame; }
    std::int64_t fileFrames() const { return fileFrames_; }

private:
    static std::int64_t framesFrom(std::uint64_t count)
    {
        return static_cast<std::int64_t>(std::min<std::uint64_t>(count, std::numeric_limits<std::int64_t>::max()));
    }

    SoundReaders& open()
    {
        if (!readers_)
            throw py::value_error("the file is closed");
        return *readers_;
    }

    std::atomic<bool> isClosed_ = false;
    std::mutex mutex_; // taken without the interpreter's lock only
    std::unique_ptr<SoundReaders> readers_;
    platform::StreamDescription file_, client_;
    std::int64_t frames_ = 0, fileFrames_ = 0;
};

} // namespace

void bindReader(py::module_& module)
{
    py::class_<Reader>(module, "Reader")
        .def(py::init<std::string, std::optional<double>, std::optional<std::uint32_t>, unsigned>(), py::arg("path"),
             py::arg("sample_rate"), py::arg("channels"), py::arg("threads"))
        .def("read", &Reader::read, py::arg("start"), py::arg("frames"))
        .def("close", &Reader::close)
        .def_property_readonly("closed", &Reader::isClosed)
        .def_property_readonly("missing_frames", &Reader::missingFrames)
        .def_property_readonly("sample_rate", &Reader::sampleRate)
        .def_property_readonly("channels", &Reader::channels)
        .def_property_readonly("frames", &Reader::frames)
        .def_property_readonly("file_sample_rate", &Reader::fileSampleRate)
        .def_property_readonly("file_channels", &Reader::fileChannels)
        .def_property_readonly("file_frames", &Reader::fileFrames);
}
