#include "audiofile/CAuFileIO.h"

#include "loops/tagging/ChunkIDs.h"
#include "media/containers/ContainerHeaders.h"
#include "platform/core/Packed.h"
#include "platform/core/Status.h"

#include <new>
#include <utility>

namespace {

using platform::AudioFile;
using platform::StreamDescription;

constexpr std::int32_t kNotLinearPCM = -208;

constexpr int kChunkFound = 1;
constexpr int kAdded = 1;
constexpr int kFileNotOpen = -1;
constexpr int kNoItem = -2;
constexpr int kItemUnreadable = -3;

StreamDescription newDataFormat(int channels, int bits, long sampleRate, FourCC fileType)
{
    const std::uint32_t kind = bits == 32 ? StreamDescription::isFloat : StreamDescription::isSignedInteger;
    const std::uint32_t order = fileType == kWAVE ? 0u : StreamDescription::isBigEndian;
    StreamDescription format;
    format.sampleRate = static_cast<double>(sampleRate);
    format.formatId = StreamDescription::linearPCM;
    format.formatFlags = kind | order | StreamDescription::isPacked;
    format.channelsPerFrame = static_cast<std::uint32_t>(channels);
    format.bitsPerChannel = static_cast<std::uint32_t>(bits);
    format.framesPerPacket = 1;
    format.bytesPerPacket = format.bytesPerFrame = format.bitsPerChannel / 8 * format.channelsPerFrame;
    return format;
}

template <class T>
void turn(FourCC fileType, T& value)
{
    value = inByteOrder(value, fileType == kWAVE ? std::endian::little : std::endian::big);
}

} // namespace

CAuFileIO::CAuFileIO()
{
    Init();
}

CAuFileIO::CAuFileIO(int& status, const CFileRef& ref, unsigned char write) : fileRef_(ref)
{
    Init();
    status = Open(write);
}

CAuFileIO::~CAuFileIO() = default;

void CAuFileIO::Init()
{
    file_.reset();
    fileType_ = 0;
    openMode_ = kClosed;
    ResetCounts();
}

void CAuFileIO::ResetCounts()
{
    dataFormat_ = {};
    audioByteCount_ = packetCount_ = 0;
}

std::int32_t CAuFileIO::Open(unsigned char write)
{
    const std::int32_t wanted = write ? kReadWrite : kReadOnly;
    if (file_ && openMode_ == wanted)
        return kStatusOK;
    Close();
    ResetCounts();
    openMode_ = wanted;
    if (!fileRef_.URL())
        return kStatusParameterError;
    std::int32_t status = kStatusOK;
    file_ = AudioFile::open(*fileRef_.URL(), write ? AudioFile::Permission::readWrite : AudioFile::Permission::read, 0,
                            &status);
    if (!file_)
        return status;
    status = ReadDescription();
    if (status != kStatusOK)
        CloseFileAndInit();
    return status;
}

std::int32_t CAuFileIO::ReadDescription()
{
    std::int32_t status = file_->dataFormat(dataFormat_);
    if (status == kStatusOK && !dataFormat_.isLinearPCM())
        status = kNotLinearPCM;
    if (status == kStatusOK)
        status = file_->audioDataByteCount(audioByteCount_);
    if (status == kStatusOK)
        status = file_->audioDataPacketCount(packetCount_);
    if (status == kStatusOK)
        fileType_ = file_->fileType();
    return status;
}

std::int32_t CAuFileIO::Open(const CFileRef& ref, unsigned char write)
{
    Close();
    fileRef_ = ref;
    return Open(write);
}

std::int32_t CAuFileIO::Open(const platform::FileHandle* handle, unsigned char write)
{
    CFileRef ref;
    ref.Set(handle);
    return Open(ref, write);
}

void CAuFileIO::Close()
{
    file_.reset();
}

void CAuFileIO::CloseFileAndInit()
{
    Init();
}

std::int32_t CAuFileIO::CreateAndOpen(const CFileRef& ref, long, int channels, int bits, long sampleRate, long fileType,
                                      const platform::FileHandle*)
{
    if (!ref.URL() || channels <= 0 || bits <= 0)
        return kStatusParameterError;
    const auto type = static_cast<FourCC>(fileType);
    const StreamDescription format = newDataFormat(channels, bits, sampleRate, type);
    std::int32_t status = kStatusOK;
    auto file = AudioFile::create(*ref.URL(), type, format, &status);
    if (!file)
        return status;
    ResetCounts();
    file_ = std::move(file);
    dataFormat_ = format;
    fileRef_ = ref;
    fileType_ = type;
    openMode_ = kReadWrite;
    return kStatusOK;
}

std::int32_t CAuFileIO::CreateAndOpen(const platform::URLRef& url, long reserved, int channels, int bits,
                                      long sampleRate, long fileType, const platform::FileHandle* handle)
{
    return CreateAndOpen(CFileRef(url), reserved, channels, bits, sampleRate, fileType, handle);
}

unsigned int CAuFileIO::SampleRate() const
{
    constexpr double limit = 4294967296.0;
    const double rate = dataFormat_.sampleRate;
    return rate >= 0 && rate < limit ? static_cast<unsigned int>(rate) : 0;
}

std::int64_t CAuFileIO::NumFrames() const
{
    return dataFormat_.isLinearPCM() ? BytesToFrames(audioByteCount_)
                                     : static_cast<std::int64_t>(dataFormat_.framesPerPacket * packetCount_);
}

std::int64_t CAuFileIO::FramesToBytes(long frames) const
{
    return BytesPerSample() * dataFormat_.channelsPerFrame * frames;
}

std::int64_t CAuFileIO::BytesToFrames(unsigned long long bytes) const
{
    const std::int64_t frame = BytesPerSample() * dataFormat_.channelsPerFrame;
    return frame > 0 ? static_cast<std::int64_t>(bytes / static_cast<unsigned long long>(frame)) : 0;
}

bool CAuFileIO::Swapped() const
{
    return dataFormat_.bitsPerChannel == 8 ? fileType_ == kWAVE
                                           : (dataFormat_.formatFlags & StreamDescription::isBigEndian) != 0;
}

// Chunks: each is the first item of user data with its id.

int CAuFileIO::FindChunk(long id, CChunkData& chunk)
{
    if (openMode_ < 0)
        return kFileNotOpen;
    const auto type = static_cast<FourCC>(id);
    std::uint32_t size = 0;
    if (!file_ || file_->userDataSize(type, 0, size) != kStatusOK || size == 0)
        return kNoItem;
    std::unique_ptr<char[]> data(new (std::nothrow) char[size]);
    const bool isRead = data && file_->userData(type, 0, size, data.get()) == kStatusOK && size != 0;
    chunk.data = isRead ? std::move(data) : nullptr;
    chunk.size = isRead ? size : 0;
    chunk.position = chunk.next = isRead ? -1 : 0;
    if (!isRead)
        return kItemUnreadable;
    chunk.id = type;
    return kChunkFound;
}

int CAuFileIO::AddChunk(CChunkData& chunk, unsigned char)
{
    if (!IsWritable() || chunk.size < 0 || chunk.size > std::int64_t{UINT32_MAX})
        return kFileNotOpen;
    const auto size = static_cast<std::uint32_t>(chunk.size);
    return file_->setUserData(chunk.id, 0, size, chunk.data.get()) == kStatusOK ? kAdded : kFileNotOpen;
}

std::int32_t CAuFileIO::RemoveChunk(long id)
{
    return IsWritable() ? file_->removeUserData(static_cast<FourCC>(id), 0) : kFileNotOpen;
}

bool CAuFileIO::IsVireoLoop()
{
    CChunkData chunk;
    return FindChunk(tagging::kBasicTagging, chunk) == kChunkFound;
}

void CAuFileIO::ByteOrder(int& value) const
{
    turn(fileType_, value);
}

void CAuFileIO::ByteOrder(short& value) const
{
    turn(fileType_, value);
}

void CAuFileIO::ByteOrder(unsigned int& value) const
{
    turn(fileType_, value);
}

void CAuFileIO::ByteOrder(unsigned short& value) const
{
    turn(fileType_, value);
}
