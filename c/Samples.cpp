// Samples in the format that the caller wants.
#include "c/Calls.h"
#include "c/OpenFile.h"

#include <algorithm>
#include <limits>

using platform::ConvertingReader;
using platform::SampleFormat;
using platform::StreamDescription;

namespace {

bool sampleFormatOf(std::int32_t type, SampleFormat& format)
{
    switch (type) {
    case KTF_FLOAT32:
        format = {.bits = 32, .isFloat = true, .order = std::endian::native};
        return true;
    case KTF_INT16:
        format = {.bits = 16, .order = std::endian::native};
        return true;
    case KTF_INT32:
        format = {.bits = 32, .order = std::endian::native};
        return true;
    default:
        return false;
    }
}

ktf_status setFormat(const ktf_file& file, ConvertingReader& reader, SampleFormat samples, std::uint32_t rate,
                     std::uint32_t channels)
{
    const StreamDescription& own = reader.fileFormat();
    const StreamDescription wanted = StreamDescription::packedPCM(
        rate != 0 ? rate : own.sampleRate, channels != 0 ? channels : own.channelsPerFrame, samples);
    platform::Error error;
    const std::int32_t status = reader.setClientFormat(wanted, &error);
    return status == kStatusOK ? KTF_OK : failCall(file.name.c_str(), status, error.description);
}

/// Calls `work` with the file's reader.
template <class Work>
ktf_status withReader(ktf_file* file, Work work)
{
    if (file == nullptr)
        return failCallByNull(nullptr);
    return guardedCall(file->name.c_str(), [&]() -> ktf_status {
        ktf_status status = KTF_OK;
        if (!file->reader)
            file->reader = openSampleReader(*file, status);
        return status == KTF_OK ? work(*file->reader) : status;
    });
}

/// Reads what one call of the reader can.
ktf_status readPiece(ConvertingReader& reader, char* to, std::size_t frames, std::uint32_t& count)
{
    const StreamDescription& format = reader.clientFormat();
    count = static_cast<std::uint32_t>(
        std::min<std::size_t>(frames, std::numeric_limits<std::uint32_t>::max() / format.bytesPerFrame));
    platform::AudioBuffer buffer{format.channelsPerFrame, count * format.bytesPerFrame, to};
    return reader.read(count, {&buffer, 1});
}

} // namespace

std::unique_ptr<ConvertingReader> openSampleReader(const ktf_file& file, ktf_status& status)
{
    platform::Error error;
    std::unique_ptr<ConvertingReader> reader = ConvertingReader::open(*file.location, &status, &error);
    if (!reader) {
        failCall(file.name.c_str(), status, error.description);
        return nullptr;
    }
    SampleFormat floats;
    sampleFormatOf(KTF_FLOAT32, floats);
    status = setFormat(file, *reader, floats, 0, 0);
    return status == KTF_OK ? std::move(reader) : nullptr;
}

ktf_status ktf_set_format(ktf_file* file, std::int32_t sampleType, std::uint32_t sampleRate, std::uint32_t channels)
{
    return withReader(file, [&](ConvertingReader& reader) -> ktf_status {
        SampleFormat samples;
        if (!sampleFormatOf(sampleType, samples))
            return failCall(file->name.c_str(), KTF_PARAMETER_ERROR, "no sample type has that number");
        const ktf_status status = setFormat(*file, reader, samples, sampleRate, channels);
        return status == KTF_OK ? reader.seek(0) : status;
    });
}

ktf_status ktf_frame_count(ktf_file* file, std::int64_t* frames)
{
    if (frames == nullptr)
        return failCallByNull(file != nullptr ? file->name.c_str() : nullptr);
    *frames = 0;
    return withReader(file, [&](ConvertingReader& reader) -> ktf_status {
        *frames = static_cast<std::int64_t>(reader.clientFrameCount());
        return KTF_OK;
    });
}

ktf_status ktf_seek(ktf_file* file, std::int64_t frame)
{
    return withReader(file, [&](ConvertingReader& reader) -> ktf_status {
        const std::int32_t status = reader.seek(frame);
        return status == kStatusOK ? KTF_OK : failCall(file->name.c_str(), status);
    });
}

ktf_status ktf_read(ktf_file* file, void* buffer, std::size_t frames, std::size_t* framesRead)
{
    if (framesRead != nullptr)
        *framesRead = 0;
    if (buffer == nullptr || framesRead == nullptr)
        return failCallByNull(file != nullptr ? file->name.c_str() : nullptr);
    return withReader(file, [&](ConvertingReader& reader) -> ktf_status {
        char* to = static_cast<char*>(buffer);
        while (*framesRead < frames) {
            std::uint32_t count = 0;
            if (const ktf_status status = readPiece(reader, to, frames - *framesRead, count); status != KTF_OK)
                return failCall(file->name.c_str(), status);
            if (count == 0)
                break;
            *framesRead += count;
            to += std::size_t{count} * reader.clientFormat().bytesPerFrame;
        }
        return KTF_OK;
    });
}
