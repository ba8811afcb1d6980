// The samples of an open audio file, read and written by packet and by byte.
#include "media/containers/ContainerSizes.h"
#include "media/userdata/AudioFileImplementation.h"
#include "platform/core/Packed.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <limits>
#include <utility>

namespace platform {

std::int32_t AudioFile::Implementation::describe()
{
    std::int32_t status = refresh();
    if (status != kStatusOK || description)
        return status;
    AudioDescription found;
    if (isWritable) { // a write may have changed what the scan read
        HeaderWindow now(bytes, layout.fileLength);
        status = describeAudio(now, layout, found);
    } else {
        status = describeAudio(*window, layout, found);
    }
    if (status == kStatusOK)
        description = found;
    return status;
}

/// Updates the sizes after a write: the chunk's, then AIFF's frame count, then the container's.
std::int32_t AudioFile::Implementation::extendAudio(std::uint64_t byteCount, std::uint64_t chunkSize)
{
    Chunk& data = layout.chunks.back();
    std::int32_t status = writeLastChunkSize(bytes, layout, chunkSize);
    data.padMissing = false;
    const std::uint64_t packets = byteCount / description->stream().bytesPerPacket;
    if (status == kStatusOK && layout.kind() == ContainerKind::iff) {
        const Chunk* common = layout.find(fourCC("COMM"));
        std::array<std::byte, 4> frames;
        storeBE(frames.data(), static_cast<std::uint32_t>(packets));
        status =
            common == nullptr ? kStatusIOError : bytes.overwrite(layout.bodyOf(*common) + kCommonFramesOffset, frames);
    }
    if (status == kStatusOK)
        status = writeContainerEnd(bytes, layout, layout.nextOf(data));
    if (status != kStatusOK)
        return status;
    layout.end = layout.nextOf(data);
    description->dataSize = byteCount;
    description->packetCount = description->frames = description->format->countedPackets = packets;
    return bytes.length(layout.fileLength);
}

std::int32_t AudioFile::Implementation::writeAudio(std::uint64_t firstByte, BytesView samples)
{
    if (std::int32_t status = describe(); status != kStatusOK)
        return status;
    if (!isWritable)
        return kStatusWritePermission;
    if (!description->stream().isLinearPCM() || firstByte > description->byteCount())
        return kStatusParameterError;
    const std::uint64_t end = firstByte + samples.size();
    const std::uint64_t position = description->dataOffset + firstByte;
    if (end <= description->byteCount())
        return bytes.write(position, samples.data(), samples.size());

    const Chunk last = layout.chunks.back();
    if (layout.find(layout.audioDataId()) != &layout.chunks.back() || hasForeignTail(bytes, layout))
        return kStatusEndOfFile;
    const std::uint64_t dataEnd = description->dataOffset + end;
    if (const std::int32_t status = checkContainerEnd(layout, dataEnd + 1); status != kStatusOK)
        return status;
    // The samples come first, behind an end that no reader passes; in an open-ended CAF file they count at once.
    const std::uint64_t formerLength = layout.fileLength;
    const std::uint64_t size = std::max(last.size, dataEnd - layout.bodyOf(last));
    const std::byte pad{0};
    std::int32_t status = bytes.write(position, samples.data(), samples.size());
    if (status == kStatusOK && layout.padOf(size) != 0)
        status = bytes.write(layout.bodyOf(last) + size, &pad, 1);
    if (status == kStatusOK)
        status = extendAudio(end, size);
    if (status != kStatusOK) {
        if (!last.sizeIsStale)
            writeLastChunkSize(bytes, layout, last.size);
        bytes.setLength(formerLength);
        isStale = true;
    }
    return status;
}

std::int32_t AudioFile::dataFormat(StreamDescription& format)
{
    const std::int32_t status = implementation_->describe();
    format = status == kStatusOK ? implementation_->description->stream() : StreamDescription{};
    return status;
}

std::int32_t AudioFile::audioDataByteCount(std::uint64_t& bytes)
{
    const std::int32_t status = implementation_->describe();
    bytes = status == kStatusOK ? implementation_->description->byteCount() : 0;
    return status;
}

std::int32_t AudioFile::audioDataPacketCount(std::uint64_t& packets)
{
    const std::int32_t status = implementation_->describe();
    packets = status == kStatusOK ? implementation_->description->packetCount : 0;
    return status;
}

std::int32_t AudioFile::audioDataOffset(std::uint64_t& offset)
{
    const std::int32_t status = implementation_->describe();
    offset = status == kStatusOK ? implementation_->description->dataOffset : 0;
    return status;
}

std::int32_t AudioFile::readPackets(std::uint64_t firstPacket, std::uint32_t& packets, void* data)
{
    const std::uint32_t wanted = std::exchange(packets, 0);
    if (const std::int32_t status = implementation_->describe(); status != kStatusOK)
        return status;
    const AudioDescription& audio = *implementation_->description;
    const std::uint64_t packetSize = audio.stream().bytesPerPacket;
    if (packetSize == 0 || (data == nullptr && wanted > 0))
        return kStatusParameterError;
    if (firstPacket >= audio.packetCount)
        return wanted == 0 ? kStatusOK : kStatusEndOfFile;
    const std::uint64_t count = std::min<std::uint64_t>(wanted, audio.packetCount - firstPacket);
    const std::int32_t status = implementation_->bytes.read(audio.dataOffset + firstPacket * packetSize, data,
                                                            static_cast<std::size_t>(count * packetSize));
    if (status == kStatusOK)
        packets = static_cast<std::uint32_t>(count);
    return status;
}

std::int32_t AudioFile::readBytes(std::uint64_t firstByte, std::uint32_t& bytes, void* data)
{
    const std::uint32_t wanted = std::exchange(bytes, 0);
    if (const std::int32_t status = implementation_->describe(); status != kStatusOK)
        return status;
    const AudioDescription& audio = *implementation_->description;
    if (data == nullptr && wanted > 0)
        return kStatusParameterError;
    if (firstByte >= audio.byteCount())
        return wanted == 0 ? kStatusOK : kStatusEndOfFile;
    const auto count = static_cast<std::uint32_t>(std::min<std::uint64_t>(wanted, audio.byteCount() - firstByte));
    const std::int32_t status = implementation_->bytes.read(audio.dataOffset + firstByte, data, count);
    if (status == kStatusOK)
        bytes = count;
    return status;
}

std::int32_t AudioFile::writePackets(std::uint64_t firstPacket, std::uint32_t& packets, const void* data)
{
    const std::uint32_t wanted = std::exchange(packets, 0);
    if (const std::int32_t status = implementation_->describe(); status != kStatusOK)
        return status;
    const AudioDescription& audio = *implementation_->description;
    const std::uint64_t packetSize = audio.stream().bytesPerPacket;
    if (firstPacket > audio.packetCount || packetSize == 0 || (data == nullptr && wanted > 0))
        return kStatusParameterError;
    const std::int32_t status = implementation_->writeAudio(
        firstPacket * packetSize, {static_cast<const std::byte*>(data), static_cast<std::size_t>(wanted * packetSize)});
    if (status == kStatusOK)
        packets = wanted;
    return status;
}

std::int32_t AudioFile::writeBytes(std::uint64_t firstByte, std::uint32_t& bytes, const void* data)
{
    const std::uint32_t wanted = std::exchange(bytes, 0);
    if (data == nullptr && wanted > 0)
        return kStatusParameterError;
    const std::int32_t status = implementation_->writeAudio(firstByte, {static_cast<const std::byte*>(data), wanted});
    if (status == kStatusOK)
        bytes = wanted;
    return status;
}

} // namespace platform
