// Opening and describing files.
#include "audiofile/SoundProblem.h"
#include "c/Calls.h"
#include "c/OpenFile.h"

#include <algorithm>
#include <utility>

using platform::ConvertingReader;

static_assert(KTF_NOT_SUPPORTED == platform::AudioHandle::kFormatNotSupported);
static_assert(KTF_NO_ROOM == platform::AudioHandle::kBadPropertySize);

namespace {

constexpr std::size_t kFirstInfoSize = 88; // of the first version's ktf_info

bool isAudio(const CAudioFileIO& file)
{
    return file.InfoStatus() == kStatusOK && file.Info().fileType != 0;
}

ktf_status openFile(ktf_file& file, std::uint32_t flags)
{
    const char* const name = file.name.c_str();
    if (!file.location)
        return failCall(name, KTF_FILE_NOT_FOUND);
    const bool takesContainers = (flags & KTF_OPEN_CONTAINER) != 0;
    if (const std::int32_t status = file.file.Open(CFileRef(file.location), 0); status != kStatusOK)
        return failCall(name, status);
    if (isAudio(file.file) || (takesContainers && file.file.HasChunks()))
        return KTF_OK;
    return failForSound(file, file.file, file.file.InfoStatus());
}

std::uint32_t flagsOf(CAudioFileIO& file)
{
    const AudioFileInfo& info = file.Info();
    const std::pair<bool, std::uint32_t> flags[] = {
        {info.IsLinearPCM(), KTF_INFO_LINEAR_PCM},
        {info.IsLinearPCM() && info.sampleFormat.isFloat, KTF_INFO_FLOAT},
        {info.IsLinearPCM() && info.sampleFormat.isUnsigned, KTF_INFO_UNSIGNED},
        {info.IsLinearPCM() && info.sampleFormat.order == std::endian::big, KTF_INFO_BIG_ENDIAN},
        {info.loopCount == 1, KTF_INFO_LOOP},
        {info.framesAreStated, KTF_INFO_STATED},
        {!info.IsWhole(), KTF_INFO_INCOMPLETE},
        {file.HasChunks(), KTF_INFO_HAS_CHUNKS},
        {file.TakesChunks(), KTF_INFO_TAKES_CHUNKS},
    };
    std::uint32_t all = 0;
    for (const auto& [isSet, flag] : flags)
        all |= isSet ? flag : 0;
    return all;
}

ktf_info infoOf(CAudioFileIO& file)
{
    const AudioFileInfo& from = file.Info();
    const auto positive = [](std::int32_t number) { return static_cast<std::uint32_t>(std::max(number, 0)); };
    ktf_info info = {};
    info.file_size = file.LengthAtOpen();
    info.container = from.containerId;
    info.form = from.formType;
    info.flags = flagsOf(file);
    if (!isAudio(file)) // what stands in the rest is no more than a beginning
        return info;
    info.frames = from.frames;
    info.data_size = from.IsLinearPCM() ? from.dataSize : 0;
    info.missing_data_size = from.missingDataSize;
    info.sample_rate = from.exactSampleRate;
    info.beats = from.beatCount;
    info.tempo = from.loopValue;
    info.channels = positive(from.channels);
    info.bits_per_sample = positive(from.bitsPerSample);
    info.significant_bits = positive(from.sourceBits);
    info.coding = from.formatCode;
    info.speakers = from.speakers;
    return info;
}

} // namespace

ktf_status failForSound(const ktf_file& file, CFileIO& opened, ktf_status status)
{
    const char* const name = file.name.c_str();
    if (const ContainerProblem problem = SoundProblem(opened)) {
        const bool isStatus = problem.kind == ContainerProblem::Kind::status;
        return failCall(name, isStatus ? problem.Status() : ktf_status{KTF_NOT_SUPPORTED}, problem.Description());
    }
    platform::Error error; // what only a decoder could judge
    if (status == kStatusOK || status == kStatusParameterError || status == KTF_NOT_SUPPORTED)
        ConvertingReader::open(*file.location, &status, &error);
    return failCall(name, status == kStatusOK ? ktf_status{KTF_NOT_SUPPORTED} : status, error.description);
}

ktf_status ktf_open(const char* path, std::uint32_t flags, ktf_file** file)
{
    if (file != nullptr)
        *file = nullptr;
    if (path == nullptr || file == nullptr)
        return failCallByNull(path);
    return guardedCall(path, [&]() -> ktf_status {
        if ((flags & ~std::uint32_t{KTF_OPEN_CONTAINER}) != 0)
            return failCall(path, KTF_PARAMETER_ERROR);
        auto opened = std::make_unique<ktf_file>();
        opened->name = path;
        opened->location = locationOfPath(path);
        const ktf_status status = openFile(*opened, flags);
        if (status == KTF_OK)
            *file = opened.release();
        return status;
    });
}

void ktf_close(ktf_file** file)
{
    if (file != nullptr)
        delete std::exchange(*file, nullptr);
}

ktf_status ktf_get_info(ktf_file* file, ktf_info* info, std::size_t size)
{
    if (file == nullptr || info == nullptr)
        return failCallByNull(file != nullptr ? file->name.c_str() : nullptr);
    const char* const name = file->name.c_str();
    return guardedCall(name, [&]() -> ktf_status {
        if (size < kFirstInfoSize)
            return failCall(name, KTF_PARAMETER_ERROR);
        giveStruct(info, size, infoOf(file->file));
        return KTF_OK;
    });
}
