#include "media/ffmpeg/DecodedFileHandle.h"

#include "platform/core/Status.h"

#include <span>

namespace platform::ffmpeg {

DecodedFileHandle::DecodedFileHandle(FourCC type, const StreamDescription& format, std::uint64_t packetCount)
    : AudioHandle(Kind::file),
      type_(type),
      format_(format),
      packetCount_(packetCount)
{
    lend();
}

/// The bytes of a property; none if the file has no such property.
BytesView DecodedFileHandle::valueOf(FourCC id) const
{
    const auto bytesOf = [](const auto& value) { return std::as_bytes(std::span(&value, 1)); };
    switch (id) {
    case AudioFile::fileTypeProperty:
        return bytesOf(type_);
    case AudioFile::dataFormatProperty:
        return bytesOf(format_);
    case AudioFile::packetCountProperty:
        return packetCount_ != unknownCount ? bytesOf(packetCount_) : BytesView();
    default:
        return {};
    }
}

std::int32_t DecodedFileHandle::propertyInfo(FourCC id, std::uint32_t& size, bool& isWritable)
{
    isWritable = false;
    const BytesView value = valueOf(id);
    size = static_cast<std::uint32_t>(value.size());
    return value.empty() ? AudioFile::kUnsupportedProperty : kStatusOK;
}

std::int32_t DecodedFileHandle::property(FourCC id, std::uint32_t& size, void* data)
{
    const BytesView value = valueOf(id);
    if (value.empty())
        return AudioFile::kUnsupportedProperty;
    return give(value.data(), static_cast<std::uint32_t>(value.size()), size, data);
}

std::int32_t DecodedFileHandle::setProperty(FourCC, std::uint32_t, const void*)
{
    return AudioFile::kUnsupportedProperty;
}

} // namespace platform::ffmpeg
