#include "media/containers/ContainerHeaders.h"

#include "platform/core/ByteOrder.h"

#include <algorithm>

namespace {

constexpr long long kLargestUnsigned = 0xFFFFFFFF;
constexpr long long kLargestSigned = 0x7FFFFFFF;

long long largestField(bool isWAVE)
{
    return isWAVE ? kLargestUnsigned : kLargestSigned;
}

std::uint32_t clamped(long long size, bool isWAVE)
{
    return static_cast<std::uint32_t>(std::min(size, largestField(isWAVE)));
}

std::int64_t fieldValue(std::uint32_t size, bool isWAVE)
{
    return isWAVE ? std::int64_t{size} : std::int64_t{static_cast<std::int32_t>(size)};
}

/// Whether the form type is "WAVE", in file layout or in host order.
bool isWAVEInAnyOrder(FourCC formType)
{
    return formType == kWAVE || formType == byteSwapped(kWAVE);
}

/// Byte order of the sizes. Ids are big-endian everywhere.
std::endian orderOf(FourCC formType)
{
    return isWAVEInAnyOrder(formType) ? std::endian::little : std::endian::big;
}

/// Number of entries held here that lie in the body of a first chunk of that size.
std::size_t entriesWithin(std::uint32_t firstChunkSize)
{
    if (firstChunkSize < ContainerChkExtended::kDs64FixedSize)
        return 0;
    const std::size_t entries = (firstChunkSize - ContainerChkExtended::kDs64FixedSize) / sizeof(Ds64TableEntry);
    return std::min(entries, ContainerChkExtended::kTableCapacity);
}

} // namespace

std::int64_t ContainerChk::Size() const
{
    return fieldValue(size, formType == kWAVE);
}

void ContainerChk::SetSize(long long newSize)
{
    size = clamped(newSize, formType == kWAVE);
}

void ContainerChk::ByteOrder()
{
    turnFields(orderOf(formType), size);
    turnFields(std::endian::big, id, formType);
}

bool ContainerChkExtended::HasValidDs64() const
{
    return (id == kRF64 || id == kBW64) && IsWAVE() && firstChunkId == kDs64 && firstChunkSize >= kDs64FixedSize;
}

bool ContainerChkExtended::HasJunkReservation() const
{
    return IsWAVE() && id != kRF64 && id != kBW64 && firstChunkId == kJUNK && firstChunkSize >= kDs64FixedSize;
}

std::int64_t ContainerChkExtended::EffectiveSize() const
{
    if (size == kLargestUnsigned && HasValidDs64())
        return static_cast<std::int64_t>(std::uint64_t{riffSize});
    return fieldValue(size, IsWAVE());
}

std::size_t ContainerChkExtended::StoredSize() const
{
    if (!HasValidDs64() && !HasJunkReservation())
        return sizeof(ContainerChk);
    return kHeadersSize + std::min<std::size_t>(firstChunkSize, kBodyCapacity);
}

std::int32_t ContainerChkExtended::SetSize(long long newSize)
{
    const bool hasRoom = HasValidDs64() || HasJunkReservation();
    size = clamped(newSize, IsWAVE());
    // Kept: AIFF has the same limit, although its field is clamped at half of it.
    if (!hasRoom)
        return newSize > kLargestUnsigned ? kChunkSizeTooLarge : 0;
    riffSize = static_cast<std::uint64_t>(newSize);
    if (newSize >= 0 && newSize <= kLargestUnsigned) {
        id = kRIFF; // "BW64" becomes RIFF too
        firstChunkId = kJUNK;
    } else if (firstChunkId == kJUNK) {
        id = kRF64;
        size = static_cast<std::uint32_t>(kLargestUnsigned);
        firstChunkId = kDs64;
        tableLength = 0;
        table = {}; // the reservation's old content is no table
    }
    return 0;
}

void ContainerChkExtended::ByteOrder()
{
    const bool wasInHostOrder = formType == kWAVE;
    const bool hadDs64 = HasValidDs64();
    const std::endian order = orderOf(formType);
    turnFields(order, size, firstChunkSize);
    turnFields(std::endian::big, id, formType, firstChunkId);
    if (wasInHostOrder ? hadDs64 : HasValidDs64()) {
        for (std::size_t i = 0; i < entriesWithin(firstChunkSize); ++i)
            turnFields(std::endian::big, table[i].id);
    }
    if (order == std::endian::little) { // only little-endian containers have a "ds64" or room for one
        turnFields(order, riffSize, dataSize, sampleCount, tableLength);
        for (Ds64TableEntry& entry : table)
            turnFields(order, entry.size);
    }
}

std::int64_t ChkHeader::EffectiveSize(const ContainerChkExtended& header) const
{
    if (size == kLargestUnsigned && header.HasValidDs64()) {
        if (id == kData)
            return static_cast<std::int64_t>(std::uint64_t{header.dataSize});
        const std::size_t entries = std::min<std::size_t>(header.tableLength, ContainerChkExtended::kTableCapacity);
        for (std::size_t i = 0; i < entries; ++i) {
            if (header.table[i].id == id)
                return static_cast<std::int64_t>(std::uint64_t{header.table[i].size});
        }
    }
    return fieldValue(size, header.IsWAVE());
}

std::int32_t ChkHeader::SetSize(long long newSize, ContainerChkExtended& header)
{
    const long long largest = largestField(header.IsWAVE());
    size = clamped(newSize, header.IsWAVE());
    const std::int32_t unrepresentable = newSize > largest ? kChunkSizeTooLarge : 0;
    if (!header.HasValidDs64() && !header.HasJunkReservation())
        return unrepresentable;
    if (id == kData) {
        header.dataSize = static_cast<std::uint64_t>(newSize);
        return 0;
    }
    if (newSize < kLargestUnsigned)
        return 0;
    for (std::size_t i = 0; i < entriesWithin(header.firstChunkSize); ++i) {
        Ds64TableEntry& entry = header.table[i];
        if (entry.id != id && entry.id != 0)
            continue;
        entry.id = id;
        entry.size = static_cast<std::uint64_t>(newSize);
        header.tableLength = std::max(std::uint32_t{header.tableLength}, static_cast<std::uint32_t>(i + 1));
        return 0;
    }
    return unrepresentable;
}

void ChkHeader::ByteOrder(const ContainerChkExtended& header)
{
    turnFields(std::endian::big, id);
    turnFields(orderOf(header.formType), size);
}
