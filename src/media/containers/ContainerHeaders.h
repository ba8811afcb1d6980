// The headers of chunked containers (RIFF, RF64, BW64, FORM) as records in host order, with the rules by which sizes
// are stored in them. Published sources: EA IFF 85, Audio Interchange File Format AIFF/AIFC, EBU Tech 3306 (RF64),
// ITU-R BS.2088 (BW64). Page: docs/formats/containers.md.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/FourCC.h"
#include "platform/core/Packed.h"

#include <array>
#include <cstddef>
#include <cstdint>

/// Each is an id or a form in a container, by its name.
inline constexpr FourCC kRIFF = fourCC("RIFF");
inline constexpr FourCC kRF64 = fourCC("RF64");
inline constexpr FourCC kBW64 = fourCC("BW64");
inline constexpr FourCC kWAVE = fourCC("WAVE");
inline constexpr FourCC kDs64 = fourCC("ds64");
inline constexpr FourCC kJUNK = fourCC("JUNK");
inline constexpr FourCC kData = fourCC("data");
inline constexpr FourCC kFORM = fourCC("FORM");
inline constexpr FourCC kAIFF = fourCC("AIFF");
inline constexpr FourCC kAIFC = fourCC("AIFC");
inline constexpr FourCC kCAT = fourCC("CAT ");
inline constexpr FourCC kREX2 = fourCC("REX2");
inline constexpr FourCC kCaff = fourCC("caff");
inline constexpr FourCC kUuid = fourCC("uuid");
inline constexpr FourCC kFree = fourCC("free");

/// The result of a size rule when the container cannot hold the size.
inline constexpr std::int32_t kChunkSizeTooLarge = -9;

/// The 12 bytes at the start of a container.
struct KT_EXPORT ContainerChk {
    Packed<FourCC> id;          //  0  of the container or the chunk
    Packed<std::uint32_t> size; //  4  bytes from offset 8 to the end of the container
    Packed<FourCC> formType;    //  8  "WAVE", "AIFF", "AIFC"

    /// Unsigned for "WAVE", signed otherwise.
    std::int64_t Size() const;
    /// Stores `size` clamped to what the field holds.
    void SetSize(long long size);
    /// File layout to host order, and back: one routine for both. Sizes of "WAVE" are little-endian and stay.
    void ByteOrder();
};
static_assert(sizeof(ContainerChk) == 12);

/// One entry of the "ds64" table.
struct Ds64TableEntry {
    Packed<FourCC> id;          // 0  of the container or the chunk
    Packed<std::uint64_t> size; // 4  of the body, in bytes
};
static_assert(sizeof(Ds64TableEntry) == 12);

/// The container header, the first chunk's header and, in 64-bit WAVE files, the "ds64" body: the first 84 bytes.
struct KT_EXPORT ContainerChkExtended {
    static constexpr std::size_t kTableCapacity = 3;  // entries held
    static constexpr std::size_t kBodyCapacity = 64;  // bytes of the first chunk's body held, offsets 20 to 83
    static constexpr std::size_t kHeadersSize = 20;   // container header and first chunk header
    static constexpr std::size_t kDs64FixedSize = 28; // the "ds64" body ahead of its table

    Packed<FourCC> id;                                //  0  of the container or the chunk
    Packed<std::uint32_t> size;                       //  4  0xFFFFFFFF: see riffSize
    Packed<FourCC> formType;                          //  8  "WAVE", "AIFF", "AIFC"
    Packed<FourCC> firstChunkId;                      // 12  "ds64", "JUNK" or another
    Packed<std::uint32_t> firstChunkSize;             // 16  as stored, in bytes
    Packed<std::uint64_t> riffSize;                   // 20  counts when `size` is 0xFFFFFFFF
    Packed<std::uint64_t> dataSize;                   // 28  of the body of "data", counts when its size is 0xFFFFFFFF
    Packed<std::uint64_t> sampleCount;                // 36  carried, not interpreted
    Packed<std::uint32_t> tableLength;                // 44  entries that the file has
    std::array<Ds64TableEntry, kTableCapacity> table; // 48  sizes of other large chunks

    /// Whether the form is "WAVE".
    bool IsWAVE() const { return formType == kWAVE; }
    /// Whether the first chunk is a "ds64" with its 28 bytes.
    bool HasValidDs64() const;
    /// Whether the first chunk is a "JUNK" that can become a "ds64" in place.
    bool HasJunkReservation() const;
    /// The size of the container's content, from offset 8 on: from the "ds64" where the field refers to it.
    std::int64_t EffectiveSize() const;
    /// How many bytes of this record a writer puts at offset 0, with the 64-bit values where they count.
    std::size_t StoredSize() const;
    /// Stores the size of the container, and turns RIFF with a reservation into RF64 and back as the size demands. 0,
    /// or kChunkSizeTooLarge.
    std::int32_t SetSize(long long size);
    /// File layout to host order, and back.
    void ByteOrder();
};
static_assert(sizeof(ContainerChkExtended) == 84);
static_assert(offsetof(ContainerChkExtended, riffSize) == 20 && offsetof(ContainerChkExtended, table) == 48);

/// The 8 bytes ahead of each chunk's body.
struct KT_EXPORT ChkHeader {
    Packed<FourCC> id;          // 0  of the container or the chunk
    Packed<std::uint32_t> size; // 4  0xFFFFFFFF: see the "ds64"

    /// The size of the body; negative for an AIFF size of 2^31 or more.
    std::int64_t EffectiveSize(const ContainerChkExtended& header) const;
    /// Stores the size of a body, which may put a 64-bit size into `header`. 0, or kChunkSizeTooLarge.
    std::int32_t SetSize(long long size, ContainerChkExtended& header);
    /// File layout to host order, and back.
    void ByteOrder(const ContainerChkExtended& header);
};
static_assert(sizeof(ChkHeader) == 8);

/// The 12 bytes ahead of each chunk of a CAF file, big-endian (published format description, version 1.0).
struct CAFChunkHeader {
    Packed<FourCC> id;         // 0  of the container or the chunk
    Packed<std::int64_t> size; // 4  -1: to the end of the file, for the last chunk, "data"
};
static_assert(sizeof(CAFChunkHeader) == 12);
