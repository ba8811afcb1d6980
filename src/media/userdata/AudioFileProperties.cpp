// Properties of an open audio file by four-character id.
#include "media/userdata/AudioFileService.h"
#include "platform/core/Status.h"

#include <cstring>

namespace platform {

namespace {

struct PropertyEntry {
    FourCC id;
    std::uint32_t size;
    std::int32_t (*get)(AudioFile& file, void* value);
};

template <std::int32_t (AudioFile::*query)(std::uint64_t&)>
std::int32_t number(AudioFile& file, void* value)
{
    std::uint64_t result = 0;
    const std::int32_t status = (file.*query)(result);
    std::memcpy(value, &result, sizeof result);
    return status;
}

std::int32_t fileTypeOf(AudioFile& file, void* value)
{
    const FourCC type = file.fileType();
    std::memcpy(value, &type, sizeof type);
    return kStatusOK;
}

std::int32_t dataFormatOf(AudioFile& file, void* value)
{
    StreamDescription format;
    const std::int32_t status = file.dataFormat(format);
    std::memcpy(value, &format, sizeof format);
    return status;
}

constexpr PropertyEntry entries[] = {
    {AudioFile::fileTypeProperty, sizeof(FourCC), fileTypeOf},
    {AudioFile::dataFormatProperty, sizeof(StreamDescription), dataFormatOf},
    {AudioFile::byteCountProperty, sizeof(std::uint64_t), number<&AudioFile::audioDataByteCount>},
    {AudioFile::packetCountProperty, sizeof(std::uint64_t), number<&AudioFile::audioDataPacketCount>},
    {AudioFile::dataOffsetProperty, sizeof(std::uint64_t), number<&AudioFile::audioDataOffset>},
};

const PropertyEntry* find(FourCC id)
{
    for (const PropertyEntry& entry : entries)
        if (entry.id == id)
            return &entry;
    return nullptr;
}

} // namespace

std::int32_t AudioFile::propertyInfo(FourCC id, std::uint32_t& size, bool& isWritable)
{
    const PropertyEntry* entry = find(id);
    size = entry != nullptr ? entry->size : 0;
    isWritable = false;
    return entry != nullptr ? kStatusOK : kUnsupportedProperty;
}

std::int32_t AudioFile::property(FourCC id, std::uint32_t& size, void* data)
{
    const PropertyEntry* entry = find(id);
    if (entry == nullptr)
        return kUnsupportedProperty;
    std::byte value[sizeof(StreamDescription)];
    const std::int32_t status = entry->get(*this, value);
    return status == kStatusOK ? give(value, entry->size, size, data) : status;
}

std::int32_t AudioFile::setProperty(FourCC, std::uint32_t, const void*)
{
    return kUnsupportedProperty;
}

} // namespace platform
