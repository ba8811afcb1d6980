#include "media/ffmpeg/DecodedFileHandle.h"

#include "platform/core/Status.h"

namespace platform::ffmpeg {

DecodedFileHandle::DecodedFileHandle(FourCC type, const StreamDescription& format, std::uint64_t packetCount)
    : AudioHandle(Kind::file),
      type_(type),
      format_(format),
      packetCount_(packetCount)
{
    lend();
}

std::int32_t DecodedFileHandle::propertyInfo(FourCC id, std::uint32_t& size, bool& isWritable)
{
    isWritable = false;
    size = id == AudioFile::fileTypeProperty                                      ? sizeof type_
           : id == AudioFile::dataFormatProperty                                  ? sizeof format_
           : id == AudioFile::packetCountProperty && packetCount_ != unknownCount ? sizeof packetCount_
                                                                                  : 0;
    return size > 0 ? kStatusOK : AudioFile::kUnsupportedProperty;
}

std::int32_t DecodedFileHandle::property(FourCC id, std::uint32_t& size, void* data)
{
    std::uint32_t have = 0;
    bool isWritable;
    if (const std::int32_t status = propertyInfo(id, have, isWritable); status != kStatusOK)
        return status;
    const void* const value = id == AudioFile::fileTypeProperty     ? static_cast<const void*>(&type_)
                              : id == AudioFile::dataFormatProperty ? static_cast<const void*>(&format_)
                                                                    : &packetCount_;
    return give(value, have, size, data);
}

std::int32_t DecodedFileHandle::setProperty(FourCC, std::uint32_t, const void*)
{
    return AudioFile::kUnsupportedProperty;
}

} // namespace platform::ffmpeg
