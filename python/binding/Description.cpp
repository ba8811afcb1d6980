// What a file is, under the names that `ktfiles info --json` has.
#include "binding/Bindings.h"
#include "binding/Interpreter.h"
#include "binding/Location.h"
#include "binding/Problem.h"
#include "binding/Values.h"

#include "audiofile/CAudioFileIO.h"
#include "audiofile/SoundProblem.h"
#include "media/containers/AudioHandle.h"

namespace py = pybind11;

namespace {

AudioFileInfo describe(const std::string& path)
{
    CAudioFileIO file;
    require(path, file.Open(referenceTo(path), 0));
    std::int32_t status = file.InfoStatus();
    platform::Error error;
    if (status == platform::AudioHandle::kFormatNotSupported || (status == kStatusOK && file.Info().framesAreStated)) {
        const std::int32_t decoding = file.OpenDecoder(&error); // which counts
        if (status != kStatusOK || decoding == kStatusIOError)
            status = decoding;
    }
    if (status == kStatusParameterError || status == kStatusEndOfFile)
        require(path, SoundProblem(file));
    if (status != kStatusOK)
        throw Problem(path, status, error.description.empty() ? StatusText(status) : error.description);
    return file.Info();
}

/// Members whose value is not known are left out.
class Members {
public:
    template <class T>
    void add(const char* name, const T& value)
    {
        members_[name] = value;
    }
    void addPositive(const char* name, std::int64_t value)
    {
        if (value > 0)
            members_[name] = value;
    }
    py::dict take() { return std::move(members_); }

private:
    py::dict members_;
};

py::dict dictFrom(const AudioFileInfo& info)
{
    Members members;
    members.add("container", fourCCText(info.containerId));
    members.add("fileType", fourCCText(info.fileType));
    members.add("formatCode", fourCCText(info.formatCode));
    members.addPositive("sampleRate", info.sampleRate);
    members.addPositive("bitsPerSample", info.bitsPerSample);
    members.addPositive("sourceBits", info.sourceBits);
    if (!info.compressed)
        members.add("floatingPoint", info.floatingPoint);
    members.addPositive("dsdRate", info.dsdRate);
    members.add("channels", info.channels);
    if (info.audioTracks > 1)
        members.add("audioTracks", info.audioTracks);
    members.add("frames", info.frames);
    if (info.exactSampleRate > 0)
        members.add("durationSeconds", static_cast<double>(info.frames) / info.exactSampleRate);
    members.add("isWhole", info.IsWhole());
    members.addPositive("missingBytes", info.missingDataSize);
    members.addPositive("dataOffset", info.dataOffset);
    members.add("fileLength", info.fileLength);
    if (info.framesAreStated)
        members.add("framesAreStated", true);
    return members.take();
}

py::dict describeFile(const std::string& path)
{
    AudioFileInfo info;
    {
        const Unlocked unlocked;
        info = describe(path);
    }
    return dictFrom(info);
}

} // namespace

void bindDescription(py::module_& module)
{
    module.def("describe", &describeFile, py::arg("path"));
}
