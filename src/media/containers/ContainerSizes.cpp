#include "media/containers/ContainerSizes.h"

#include "platform/core/Packed.h"
#include "platform/core/Status.h"

#include <algorithm>

namespace platform {

namespace {

constexpr std::uint64_t kRiffSizeOffset = 20;
constexpr std::uint64_t kDataSizeOffset = 28;

template <class T>
std::int32_t overwriteNumber(const FileBytes& file, std::uint64_t position, T value, std::endian order)
{
    std::array<std::byte, sizeof(T)> bytes;
    store(bytes.data(), value, order);
    return file.overwrite(position, bytes);
}

/// Turns the reservation into a "ds64", and RIFF into RF64.
std::int32_t becomeRF64(const FileBytes& file, const ContainerLayout& layout, std::uint64_t riffSize)
{
    std::array<std::byte, 48> start;
    if (const std::int32_t status = file.read(0, start.data(), start.size()); status != kStatusOK)
        return status;
    const Chunk* data = layout.find(layout.audioDataId());
    storeBE(start.data(), fourCC("RF64"));
    storeLE(start.data() + 4, std::uint32_t{0xFFFFFFFF});
    storeBE(start.data() + 12, fourCC("ds64"));
    storeLE(start.data() + kRiffSizeOffset, riffSize);
    storeLE(start.data() + kDataSizeOffset, data != nullptr ? data->size : 0);
    storeLE(start.data() + 36, std::uint64_t{0}); // sample count: only for compressed data
    storeLE(start.data() + 44, std::uint32_t{0}); // table length
    return file.overwrite(0, start);
}

} // namespace

std::int32_t checkContainerEnd(const ContainerLayout& layout, std::uint64_t end)
{
    if (layout.kind() == ContainerKind::caf)
        return kStatusOK;
    const bool sizes64 = layout.hasSizes64() || layout.hasReservation();
    return end - 8 <= layout.largestChunk() || sizes64 ? kStatusOK : kStatusFileTooBig;
}

std::int32_t writeContainerEnd(const FileBytes& file, const ContainerLayout& layout, std::uint64_t end)
{
    if (layout.kind() == ContainerKind::caf)
        return kStatusOK;
    if (const std::int32_t status = checkContainerEnd(layout, end); status != kStatusOK)
        return status;
    const std::uint64_t size = end - 8;
    std::array<std::byte, 4> field;
    if (const std::int32_t status = file.read(4, field.data(), field.size()); status != kStatusOK)
        return status;
    if (layout.hasSizes64() && loadLE<std::uint32_t>(field.data()) == 0xFFFFFFFF)
        return overwriteNumber(file, kRiffSizeOffset, size, std::endian::little);
    if (size <= layout.largestChunk())
        return overwriteNumber(file, 4, static_cast<std::uint32_t>(size), layout.container.traits->order);
    if (layout.hasReservation())
        return becomeRF64(file, layout, size);
    if (const std::int32_t status = overwriteNumber(file, kRiffSizeOffset, size, std::endian::little);
        status != kStatusOK)
        return status;
    return overwriteNumber(file, 4, std::uint32_t{0xFFFFFFFF}, std::endian::little);
}

std::int32_t writeLastChunkSize(const FileBytes& file, ContainerLayout& layout, std::uint64_t size)
{
    Chunk& chunk = layout.chunks.back();
    const std::uint64_t position = chunk.position + 4;
    // The "ds64" describes only the first "data"; others keep their 32-bit sizes.
    const bool isData = layout.find(layout.audioDataId()) == &chunk;
    std::int32_t status = kStatusOK;
    if (layout.kind() == ContainerKind::caf) {
        status = overwriteNumber(file, position, size, std::endian::big);
    } else if (layout.kind() == ContainerKind::riff && isData && layout.hasSizes64()) {
        // The 32-bit field is in force until it is 0xFFFFFFFF, so it changes last.
        status = overwriteNumber(file, kDataSizeOffset, size, std::endian::little);
        if (status == kStatusOK)
            status = overwriteNumber(file, position, std::uint32_t{0xFFFFFFFF}, std::endian::little);
    } else if (size <= layout.largestChunk()) {
        status = overwriteNumber(file, position, static_cast<std::uint32_t>(size), layout.container.traits->order);
    } else if (isData && layout.hasReservation()) {
        status = overwriteNumber(file, position, std::uint32_t{0xFFFFFFFF}, std::endian::little);
    } else {
        status = kStatusFileTooBig;
    }
    if (status == kStatusOK) {
        chunk.size = size;
        chunk.sizeIsStale = false;
    }
    return status;
}

std::int32_t settleLastChunk(const FileBytes& file, ContainerLayout& layout)
{
    if (layout.chunks.empty())
        return kStatusOK;
    Chunk& last = layout.chunks.back();
    if (last.sizeIsStale)
        if (const std::int32_t status = writeLastChunkSize(file, layout, last.size); status != kStatusOK)
            return status;
    if (last.padMissing) {
        const std::uint64_t position = layout.nextOf(last);
        const std::byte pad{0};
        if (const std::int32_t status = file.write(position, &pad, 1); status != kStatusOK)
            return status;
        last.padMissing = false;
        layout.fileLength = std::max(layout.fileLength, position + 1);
    }
    layout.end = layout.nextOf(last);
    return kStatusOK;
}

bool hasForeignTail(const FileBytes& file, const ContainerLayout& layout)
{
    if (layout.kind() == ContainerKind::caf || layout.fileLength <= layout.end)
        return false;
    std::array<std::byte, 4> id{};
    return file.read(layout.end, id.data(), id.size()) != kStatusOK ||
           loadBE<FourCC>(id.data()) != ContainerLayout::filler;
}

} // namespace platform
