// CAudioFileIO: opening and closing, and the header that describes the samples.
#include "audiofile/CAudioFileIO.h"

#include "audiofile/AudioFileHeader.h"
#include "audiofile/ContainerDescriptions.h"
#include "audiofile/ContainerEditor.h"
#include "audiofile/FileWindow.h"
#include "files/CFileUtil.h"
#include "media/containers/ContainerEnd.h"
#include "media/decoding/ConvertingReader.h"
#include "platform/SystemCalls.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <cstdint>
#include <cstdio>

namespace {

/// Whether the path leads to something that can be opened for writing. Opening it would answer too, but would create a
/// missing file.
bool isWritableTarget(const CFileRef& ref)
{
    const char* path = ref.GetPath();
    platform::FileStatus status;
    return path != nullptr && platform::systemCalls().pathStatus(path, &status) &&
           status.kind != platform::FileKind::directory;
}

/// Whether the file's timestamp is older than a tick of any file system's clock (two seconds on FAT). A change within
/// one tick leaves the timestamp as it is, so a younger one proves nothing.
bool wasLongAgo(const FileStamp& stamp)
{
    const auto now = std::chrono::system_clock::now().time_since_epoch();
    return now - std::chrono::nanoseconds(stamp.changed) > std::chrono::seconds(3);
}

using Header = std::array<char, kMaxAudioFileHeaderSize>;

long buildHeader(Header& header, const AudioFileInfo& info, std::int64_t frames, int sampleFormat, bool option)
{
    return BuildAudioFileHeader(header.data(), info.fileType, frames, info.sampleRate, info.channels, sampleFormat,
                                info.busFormat, option);
}

} // namespace

CAudioFileIO::CAudioFileIO() = default;

CAudioFileIO::CAudioFileIO(const CFileRef& ref, unsigned int permission)
{
    // Kept: here a memory file needs a path too when it is to be written.
    if ((permission & kFileIOReadWrite) == 0 || isWritableTarget(ref))
        Open(ref, permission);
}

CAudioFileIO::~CAudioFileIO()
{
    Close();
}

std::int32_t CAudioFileIO::Open(const CFileRef& ref, unsigned int permission)
{
    const std::int32_t status = OpenUndescribed(ref, permission);
    if (status == kStatusOK)
        Describe(permission);
    return status;
}

std::int32_t CAudioFileIO::OpenForChunks(const CFileRef& ref, unsigned int permission)
{
    const std::int32_t status = OpenUndescribed(ref, permission);
    if (status == kStatusOK && HasChunks())
        Describe(permission);
    else if (status == kStatusOK)
        infoStatus_ = kStatusParameterError;
    return status;
}

std::int32_t CAudioFileIO::OpenUndescribed(const CFileRef& ref, unsigned int permission)
{
    if (&ref == this) {
        const CFileRef copy(ref); // closing resets the base
        return OpenUndescribed(copy, permission);
    }
    Close();
    const bool createsWhatIsMissing = (permission & (kFileIOReadWrite | kFileIOMemory)) == kFileIOReadWrite;
    if (createsWhatIsMissing && !isWritableTarget(ref))
        return kStatusFileNotFound;
    return CFileIO::Open(ref, permission);
}

/// A file that is no audio file is opened all the same, and described as far as it was understood.
void CAudioFileIO::Describe(unsigned int permission)
{
    // Read after the stamp and before any byte of the file, so that every later change gets another timestamp.
    const bool changesShow = (permission & kFileIOMemory) == 0 && IsOpenForWriting() && wasLongAgo(StampAtOpen());
    auto window = std::make_unique<FileWindow>(*this, IsOpenForWriting() ? GetEOF() : LengthAtOpen());
    infoStatus_ = DescribeAudioFile(*window, IsMemoryFile() ? nullptr : URL(), info_);
    readFailure_ = window->failure();
    if ((permission & (kFileIOReadWrite | kFileIOMemory)) == 0) {
        window_ = std::move(window);
        windowStamp_ = StampAtOpen();
    } else if (changesShow && window->fileLength() == LengthAtOpen()) {
        KeepEnd(*window);
    }
    const bool singleFloats = info_.bitsPerSample == 32 && info_.floatingPoint;
    sampleFormat_ = singleFloats ? -32 : info_.bitsPerSample;
    if ((permission & kFileIOReadWrite) != 0 && info_.IsLinearPCM()) {
        // A header that was built with the reservation is built with it again; otherwise the samples would not follow
        // it.
        Header header;
        const auto length = [&](bool option) {
            return buildHeader(header, info_, info_.frames, sampleFormat_, option);
        };
        headerOption_ = length(false) != info_.dataOffset && length(true) == info_.dataOffset;
    }
}

/// Keeps the container's end, if the headers lie in the bytes that were read already.
void CAudioFileIO::KeepEnd(FileWindow& window)
{
    window.seal();
    ContainerEnd end;
    if (ContainerEditor::findEnd(window, end) == ContainerEditor::kEndFound)
        endAtOpen_ = std::make_unique<ContainerEnd>(end);
}

std::int32_t CAudioFileIO::Close()
{
    const std::int32_t updated = UpdateHeader();
    ForgetFile();
    const std::int32_t closed = CFileIO::Close();
    return updated != kStatusOK ? updated : closed;
}

void CAudioFileIO::Init()
{
    ForgetFile();
    CFileIO::Init();
}

/// Resets everything that describes the file that was open.
void CAudioFileIO::ForgetFile()
{
    decoder_.reset();
    window_.reset();
    endAtOpen_.reset();
    info_ = {};
    infoStatus_ = readFailure_ = kStatusOK;
    sampleFormat_ = 0;
    headerDirty_ = false;
    headerOption_ = false;
}

std::int32_t CAudioFileIO::CreateAndOpenCommon(const CFileRef& ref, long cacheSize, TAudioBusFormat busFormat,
                                               int channels, int bitsPerSample, long sampleRate, unsigned int fileType,
                                               bool headerOption)
{
    constexpr long kibibyte = 1024;
    if (&ref == this) {
        const CFileRef copy(ref);
        return CreateAndOpenCommon(copy, cacheSize, busFormat, channels, bitsPerSample, sampleRate, fileType,
                                   headerOption);
    }
    Header header;
    const long length =
        BuildAudioFileHeader(header.data(), fileType, 0, sampleRate, channels, bitsPerSample, busFormat, headerOption);
    if (length <= 0 || cacheSize < 0 || cacheSize > INT64_MAX / kibibyte)
        return kStatusParameterError;
    Close();
    std::int32_t status = CFileUtilCreate(ref, 0, 0, 0644);
    const bool created = status == kStatusOK;
    if (status == kStatusOK || status == kStatusDuplicateName)
        status = CFileIO::Open(ref, kFileIOReadWrite);
    if (status == kStatusOK)
        status = SetEOF(0);
    if (status == kStatusOK)
        status = Write(header.data(), 0, length);
    if (status != kStatusOK) {
        CFileIO::Close();
        if (created)
            std::remove(ref.GetPath());
        return status;
    }
    Describe(kFileIOReadWrite);
    if (busFormat != kAudioBusUndefined && AudioBusFormatChannels(busFormat) == info_.channels)
        info_.busFormat = busFormat; // the channel count alone does not determine it
    headerOption_ = headerOption;
    return cacheSize > 0 ? SetCache(cacheSize * kibibyte) : kStatusOK;
}

/// The flag stays set after a failure: the header still has to be written.
std::int32_t CAudioFileIO::UpdateHeader()
{
    if (!headerDirty_)
        return kStatusOK;
    if (!IsOpenForWriting()) {
        headerDirty_ = false;
        return kStatusOK;
    }
    Header header;
    std::int32_t status = kStatusOK;
    if (const long length = buildHeader(header, info_, info_.frames, sampleFormat_, headerOption_); length > 0)
        status = Write(header.data(), 0, length);
    const bool isPadded = info_.fileType == kWAVE || info_.fileType == kAIFF;
    if (const long long end = GetEOF(); status == kStatusOK && isPadded && (end & 1) != 0) {
        const char pad = 0;
        status = Write(&pad, end, sizeof pad);
    }
    if (status != kStatusOK)
        return status;
    info_.fileLength = GetEOF();
    headerDirty_ = false;
    return kStatusOK;
}

/// Whether the header on disk was built here, so that it can be built again; sets the option that it was built with. A
/// foreign header holds fields that a new one would lose, or is shorter, so that a new one would overwrite samples. A
/// header that was never filled in counts no frames.
bool CAudioFileIO::HasBuiltHeader()
{
    Header built;
    Header stored;
    for (const bool option : {headerOption_, !headerOption_}) {
        for (const std::int64_t frames : {info_.frames, std::int64_t{0}}) {
            const long size = buildHeader(built, info_, frames, sampleFormat_, option);
            if (size <= 0 || size != info_.dataOffset || Read(stored.data(), 0, size, nullptr) != kStatusOK)
                continue;
            // Chunks after the samples count in the container's size, and in the reservation's.
            if (info_.fileType != kCaff)
                std::copy_n(stored.begin() + 4, 4, built.begin() + 4);
            if (info_.fileType == kWAVE && option)
                std::copy_n(stored.begin() + 20, 8, built.begin() + 20);
            if (std::equal(built.begin(), built.begin() + size, stored.begin())) {
                headerOption_ = option;
                return true;
            }
        }
    }
    return false;
}

std::int32_t CAudioFileIO::SetNumFrames(long frames)
{
    if (const std::int32_t status = FlushWCache(); status != kStatusOK)
        return status;
    // Writing another header than the one that is there would lose what the file holds.
    if (!headerDirty_ && !HasBuiltHeader())
        return kStatusParameterError;
    Header header;
    const long length = buildHeader(header, info_, frames, sampleFormat_, headerOption_);
    if (length <= 0)
        return kStatusParameterError;
    const std::int64_t dataSize = std::int64_t{frames} * info_.channels * (info_.bitsPerSample / 8);
    std::int32_t status = Write(header.data(), 0, length);
    if (status == kStatusOK)
        status = SetEOF(length + dataSize);
    if (status != kStatusOK)
        return status;
    info_.dataOffset = length;
    info_.frames = frames;
    info_.dataSize = dataSize;
    info_.fileLength = length + dataSize;
    headerDirty_ = (dataSize & 1) != 0; // Kept: the file ends with its samples until UpdateHeader pads it
    return kStatusOK;
}

void CAudioFileIO::ByteOrder(int* value) const
{
    if (value != nullptr)
        *value = inByteOrder(*value, info_.fileType == kWAVE ? std::endian::little : std::endian::big);
}

void CAudioFileIO::ByteOrder(unsigned int* value) const
{
    if (value != nullptr)
        *value = inByteOrder(*value, info_.fileType == kWAVE ? std::endian::little : std::endian::big);
}

bool CAudioFileIO::IsSupportedFileType(const platform::String& contentTypeIdentifier)
{
    return IsSupportedFileType(platform::ContentType(contentTypeIdentifier));
}

bool CAudioFileIO::IsSupportedFileType(const platform::ContentType& contentType)
{
    return contentType.conformsTo(platform::ContentType::audio()) &&
           !contentType.conformsTo(platform::ContentType::flac());
}
