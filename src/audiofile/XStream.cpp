#include "audiofile/XStream.h"

#include "audiofile/ContainerDescriptions.h"
#include "files/CFileRef.h"
#include "media/decoding/ConvertingReader.h"
#include "media/userdata/AudioFileService.h"
#include "platform/core/Status.h"

#include <bit>
#include <cstddef>
#include <cstring>
#include <limits>
#include <memory>
#include <new>

static_assert(sizeof(XStreamDescription) == sizeof(platform::StreamDescription));
static_assert(offsetof(XStreamDescription, formatId) == 8 && offsetof(XStreamDescription, reserved) == 36);
static_assert(sizeof(XStreamChannelLayout) == sizeof(platform::ChannelLayout));
static_assert(offsetof(XStreamReadRequest, position) == 8 && offsetof(XStreamReadRequest, completion) == 24);
static_assert(offsetof(XStreamReadRequest, completionState) == 40 && offsetof(XStreamReadRequest, bytesRead) == 48);
static_assert(offsetof(XStreamReadRequest, buffer) == 56 && sizeof(XStreamReadRequest) == 64);

namespace {

using platform::AudioFile;
using platform::AudioHandle;
using platform::ConvertingReader;
using platform::StreamDescription;

constexpr std::int32_t kNotOffered = -4;
constexpr FourCC kFileTypeQuery = fourCC("#fmt");
constexpr std::uint32_t kSkipPacketCheck = 1;
constexpr std::size_t kMaxPath = 1023;

AudioHandle* readerOf(XStreamRef stream)
{
    return platform::audioHandle(stream, AudioHandle::Kind::reader);
}

AudioHandle* fileOf(void* handle)
{
    return platform::audioHandle(handle, AudioHandle::Kind::file);
}

/// Turns a failed allocation into a status, for callers without exceptions.
template <class Work>
std::int32_t guarded(Work work)
{
    try {
        return work();
    } catch (const std::bad_alloc&) {
        return kStatusOutOfMemory;
    }
}

std::int32_t fileFormatOf(AudioHandle& reader, StreamDescription& format)
{
    std::uint32_t size = sizeof format;
    return reader.property(ConvertingReader::fileFormatProperty, size, &format);
}

std::int32_t underlyingFileOf(AudioHandle& reader, AudioHandle*& file)
{
    file = nullptr;
    std::uint32_t size = sizeof file;
    return reader.property(ConvertingReader::audioFileProperty, size, &file);
}

std::int32_t setClient(AudioHandle& reader, const XStreamDescription* format, const XStreamChannelLayout* layout)
{
    if (format == nullptr)
        return kStatusOK;
    const std::int32_t status = reader.setProperty(ConvertingReader::clientFormatProperty, sizeof *format, format);
    return status == kStatusOK && layout != nullptr
               ? reader.setProperty(ConvertingReader::clientLayoutProperty, sizeof *layout, layout)
               : status;
}

/// Refuses an MP3 file whose packet table counts no frame; a file without a table is accepted.
std::int32_t checkPackets(AudioHandle& reader)
{
    StreamDescription format;
    if (const std::int32_t status = fileFormatOf(reader, format); status != kStatusOK)
        return status;
    platform::PacketTable table;
    std::uint32_t size = sizeof table;
    const bool isEmpty = format.formatId == fourCC(".mp3") &&
                         reader.property(ConvertingReader::packetTableProperty, size, &table) == kStatusOK &&
                         table.validFrames == 0;
    return isEmpty ? ConvertingReader::kInvalidDataFormat : kStatusOK;
}

/// Checks whether the file's format and the client's wishes allow opening.
std::int32_t prepare(AudioHandle& reader, std::uint32_t flags, const XStreamDescription* clientFormat,
                     const XStreamChannelLayout* clientLayout)
{
    StreamDescription format;
    std::int32_t status = fileFormatOf(reader, format);
    if (status == kStatusOK && (format.formatId == fourCC("sac1") || format.formatId == fourCC("sal1")))
        status = AudioHandle::kFormatNotSupported;
    if (status == kStatusOK)
        status = setClient(reader, clientFormat, clientLayout);
    if (status == kStatusOK && !(flags & kSkipPacketCheck))
        status = checkPackets(reader);
    return status;
}

std::int32_t readFrames(XStreamRef stream, std::int64_t position, std::uint32_t& frames, void* buffer,
                        std::uint32_t& bytes)
{
    auto* reader = static_cast<ConvertingReader*>(readerOf(stream));
    if (reader == nullptr)
        return kStatusParameterError;
    if (const std::int32_t status = reader->seek(position); status != kStatusOK)
        return status;
    const StreamDescription& client = reader->clientFormat();
    const std::uint64_t size = std::uint64_t{frames} * client.bytesPerFrame;
    if (size > std::numeric_limits<std::uint32_t>::max())
        return kStatusParameterError;
    platform::AudioBuffer destination{client.channelsPerFrame, static_cast<std::uint32_t>(size), buffer};
    const std::int32_t status = reader->read(frames, {&destination, 1});
    bytes = frames * client.bytesPerFrame;
    return status;
}

std::int32_t fileTypeProperty(AudioHandle& reader, std::uint32_t& size, void* data)
{
    FourCC type = 0;
    if (size != sizeof type)
        return AudioHandle::kBadPropertySize;
    AudioHandle* file = nullptr;
    if (underlyingFileOf(reader, file) == kStatusOK && file != nullptr) {
        std::uint32_t typeSize = sizeof type;
        if (file->property(AudioFile::fileTypeProperty, typeSize, &type) != kStatusOK)
            type = 0;
    }
    type = HostFileType(type);
    std::memcpy(data, &type, sizeof type);
    return kStatusOK;
}

} // namespace

std::int32_t XStreamCreateWithFileRef(const CFileRef* folder, const char* name, std::uint32_t flags, std::uint32_t,
                                      std::uint32_t fileType, const XStreamDescription* format, std::uint32_t,
                                      std::uint32_t, XStreamFileRef* outFile)
{
    if (outFile != nullptr)
        *outFile = nullptr;
    if (folder == nullptr || name == nullptr || format == nullptr || outFile == nullptr)
        return kStatusParameterError;
    return guarded([&]() -> std::int32_t {
        CFileRef ref(*folder);
        if (!ref.AddToPath(name, false))
            return kStatusParameterError;
        const auto dataFormat = std::bit_cast<StreamDescription>(*format);
        std::int32_t status = kStatusOK;
        AudioHandle* file = AudioFile::create(*ref.URL(), fileType, dataFormat, &status, flags & 0xFF).release();
        *outFile = file;
        return status;
    });
}

std::int32_t XStreamCloseFile(XStreamFileRef handle)
{
    AudioHandle* file = fileOf(handle);
    if (file == nullptr || file->isLent())
        return kStatusParameterError;
    delete file;
    return kStatusOK;
}

std::int32_t XStreamOpenWithFileRef(const CFileRef* ref, std::uint32_t flags, std::uint32_t, std::uint32_t,
                                    const XStreamDescription* clientFormat, const XStreamChannelLayout* clientLayout,
                                    XStreamRef* outStream)
{
    if (outStream != nullptr)
        *outStream = nullptr;
    const char* path = ref != nullptr && ref->IsValid() ? ref->GetPath() : nullptr;
    if (outStream == nullptr || path == nullptr || std::strlen(path) > kMaxPath)
        return kStatusParameterError;
    return XStreamOpen(path, flags & 0xFF, 0, 0, clientFormat, clientLayout, outStream);
}

std::int32_t XStreamOpen(const char* path, std::uint32_t flags, std::uint32_t, std::uint32_t,
                         const XStreamDescription* clientFormat, const XStreamChannelLayout* clientLayout,
                         XStreamRef* outStream)
{
    if (outStream != nullptr)
        *outStream = nullptr;
    if (path == nullptr || outStream == nullptr)
        return kStatusParameterError;
    return guarded([&]() -> std::int32_t {
        const platform::URLRef url = platform::URL::createWithFileSystemPath(
            platform::String::fromFileSystemRepresentation(path), platform::PathStyle::posix, false);
        if (!url)
            return kStatusParameterError;
        std::int32_t status = kStatusOK;
        std::unique_ptr<AudioHandle> reader = ConvertingReader::open(*url, &status);
        if (reader)
            status = prepare(*reader, flags, clientFormat, clientLayout);
        if (status == kStatusOK)
            *outStream = reader.release();
        return status;
    });
}

std::int32_t XStreamClose(XStreamRef stream)
{
    AudioHandle* reader = readerOf(stream);
    if (reader == nullptr)
        return kStatusParameterError;
    delete reader;
    return kStatusOK;
}

std::int32_t XStreamReadFramesSync(XStreamRef stream, std::int64_t position, std::uint32_t frames,
                                   std::uint32_t* outFramesRead, void* buffer, std::uint32_t* outBytesRead)
{
    std::uint32_t bytes = 0;
    const std::int32_t status = readFrames(stream, position, frames, buffer, bytes);
    if (outFramesRead != nullptr)
        *outFramesRead = status == kStatusOK ? frames : 0;
    if (outBytesRead != nullptr)
        *outBytesRead = status == kStatusOK ? bytes : 0;
    return status;
}

std::int32_t XStreamReadFrames(XStreamRef stream, XStreamReadRequest* request)
{
    if (request == nullptr)
        return kStatusParameterError;
    std::uint32_t frames = request->framesRequested, bytes = 0;
    const std::int32_t status = readFrames(stream, request->position, frames, request->buffer, bytes);
    if (status != kStatusOK)
        return status;
    request->framesRead = frames;
    request->bytesRead = bytes;
    if (request->completion != nullptr) {
        request->completion(request->userPointer);
        request->completionState = nullptr;
    }
    return kStatusOK;
}

std::int32_t XStreamWriteFrames(XStreamRef, XStreamReadRequest*)
{
    return kNotOffered;
}

std::int32_t XStreamReadPackets(XStreamRef, XStreamReadRequest*)
{
    return kNotOffered;
}

std::int32_t XStreamWritePackets(XStreamRef, XStreamReadRequest*)
{
    return kNotOffered;
}

std::int32_t XStreamGetPropertyInfo(XStreamRef stream, std::uint32_t id, std::uint32_t* outSize,
                                    std::uint32_t* outWritable)
{
    AudioHandle* file = fileOf(stream); // Kept: the stream's own handle is passed to the file service
    std::uint32_t size = 0;
    bool isWritable = false;
    const std::int32_t status = file != nullptr ? file->propertyInfo(id, size, isWritable) : kStatusParameterError;
    if (outSize != nullptr)
        *outSize = size;
    if (outWritable != nullptr)
        *outWritable = isWritable;
    return status;
}

std::int32_t XStreamGetProperty(XStreamRef stream, std::uint32_t id, std::uint32_t* ioSize, void* outData)
{
    AudioHandle* reader = readerOf(stream);
    if (reader == nullptr || ioSize == nullptr || outData == nullptr)
        return kStatusParameterError;
    if (id == kFileTypeQuery)
        return fileTypeProperty(*reader, *ioSize, outData);
    const std::int32_t status = reader->property(id, *ioSize, outData);
    if (status != ConvertingReader::kPropertyNotSupported)
        return status;
    AudioHandle* file = nullptr;
    if (underlyingFileOf(*reader, file) != kStatusOK || file == nullptr)
        return kStatusParameterError;
    return file->property(id, *ioSize, outData);
}

std::int32_t XStreamSetProperty(XStreamRef stream, std::uint32_t id, std::uint32_t size, const void* data)
{
    AudioHandle* reader = readerOf(stream);
    if (reader == nullptr)
        return kStatusParameterError;
    return guarded([&]() -> std::int32_t {
        const std::int32_t status = reader->setProperty(id, size, data);
        if (status != ConvertingReader::kPropertyNotSupported)
            return status;
        AudioHandle* file = nullptr;
        if (underlyingFileOf(*reader, file) != kStatusOK || file == nullptr)
            return kStatusParameterError;
        // Kept: not the underlying file but the stream's own handle, which the service refuses.
        file = fileOf(stream);
        return file != nullptr ? file->setProperty(id, size, data) : kStatusParameterError;
    });
}
