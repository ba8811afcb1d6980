// CAudioFileIO: opening and closing, and the header that goes with the samples.
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

/// Whether there is something that can be opened for writing. Opening it would tell as well, but creates what is
/// missing.
bool isWritableTarget(const CFileRef& ref)
{
    const char* path = ref.GetPath();
    platform::FileStatus status;
    return path != nullptr && platform::systemCalls().pathStatus(path, &status) &&
           status.kind != platform::FileKind::directory;
}

/// A change within one tick of a file system's clock leaves the time of the one before. The coarsest ticks, those of
/// FAT, are two seconds.
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

/// A file that is no audio file is open all the same, and described as far as it was understood.
void CAudioFileIO::Describe(unsigned int permission)
{
    // Asked behind the stamp, ahead of all that is read: what changes from now on has another time.
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
        // A header with the reservation must be built with it again, or the samples would not stand behind it.
        Header header;
        const auto length = [&](bool option) {
            return buildHeader(header, info_, info_.frames, sampleFormat_, option);
        };
        headerOption_ = length(false) != info_.dataOffset && length(true) == info_.dataOffset;
    }
}

/// Where the headers lie in what was read already.
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

/// All that is known of the file that was open.
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
        info_.busFormat = busFormat; // the channel count alone does not tell
    headerOption_ = headerOption;
    return cacheSize > 0 ? SetCache(cacheSize * kibibyte) : kStatusOK;
}

/// The flag outlives a failure: what did not get into the file still has to.
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

/// Whether the header on disk is one of ours, which may be built anew: then the option is the one that it was built
/// with. Others hold what a new one would lose, or are shorter, so that it would go over the samples. One that was
/// never filled in counts no frames.
bool CAudioFileIO::HasBuiltHeader()
{
    Header built;
    Header stored;
    for (const bool option : {headerOption_, !headerOption_}) {
        for (const std::int64_t frames : {info_.frames, std::int64_t{0}}) {
            const long size = buildHeader(built, info_, frames, sampleFormat_, option);
            if (size <= 0 || size != info_.dataOffset || Read(stored.data(), 0, size, nullptr) != kStatusOK)
                continue;
            // Chunks behind the samples are counted in the container's size, and in the reservation for it.
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
    // Building no header, or another one than that which is there, would lose what the file holds.
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
    headerDirty_ = (dataSize & 1) != 0; // Kept: the file is as long as its samples until UpdateHeader pads it
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
