// The loop chunks of AIFF files as records. On disk every integer is big-endian; in memory the records hold host order,
// and the Swap functions convert in place. Page: docs/formats/loop-chunks.md.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/Packed.h"

#include <array>
#include <cstddef>
#include <cstdint>

namespace tagging {

/// AIFF "basc": these members, top to bottom, are its 82 bytes.
struct BasicTaggingChunk {
    Packed<std::uint32_t> version = 1;              //  0
    Packed<std::int32_t> beatCount;                 //  4
    Packed<std::int16_t> midiRootNote;              //  8
    Packed<std::int16_t> keyType;                   // 10  0 none, 1 minor, 2 major, 3 neither, 4 both
    Packed<std::int16_t> signatureTop;              // 12
    Packed<std::int16_t> signatureBottom;           // 14
    Packed<std::int16_t> fileType;                  // 16  1 = loop
    std::array<Packed<std::uint32_t>, 16> reserved; // 18
};
static_assert(sizeof(BasicTaggingChunk) == 82 && offsetof(BasicTaggingChunk, reserved) == 18);

inline constexpr std::size_t kCategoryTextSize = 50; // NUL included
using CategoryText = std::array<char, kCategoryTextSize>;

/// AIFF "cate", version 1: these 222 bytes, then `descriptorCount` descriptors of 50 bytes.
struct CategoryChunk {
    Packed<std::uint32_t> version = 1;              //   0
    CategoryText instrumentType{};                  //   4
    CategoryText instrumentSubType{};               //  54
    CategoryText genre{};                           // 104
    std::array<Packed<std::uint32_t>, 16> reserved; // 154
    Packed<std::uint16_t> reserved2;                // 218
    Packed<std::uint16_t> descriptorCount;          // 220
};
static_assert(sizeof(CategoryChunk) == 222 && offsetof(CategoryChunk, descriptorCount) == 220);

/// Where version 2, which is read and never written, keeps its descriptors; what lies between is not interpreted.
inline constexpr std::size_t kCategoryV2CountOffset = 322;
inline constexpr std::size_t kCategoryV2DescriptorsOffset = 324;

/// One record of "trns".
struct TransientRecord {
    Packed<std::int16_t> type;                      //  0
    Packed<std::uint16_t> reserved;                 //  2
    Packed<std::uint32_t> frame;                    //  4
    std::array<Packed<std::uint32_t>, 4> reserved2; //  8
};
static_assert(sizeof(TransientRecord) == 24);

/// AIFF "trns": these 76 bytes, then `count` records.
struct TransientsChunk {
    Packed<std::int16_t> version;                    //  0
    Packed<std::int16_t> detectionPercentage;        //  2
    Packed<std::int16_t> forceDivision;              //  4
    Packed<std::uint16_t> reserved;                  //  6
    Packed<std::uint32_t> writeTime;                 //  8  seconds since 1970-01-01 UTC
    std::array<Packed<std::uint32_t>, 15> reserved2; // 12
    Packed<std::int32_t> count;                      // 72
};
static_assert(sizeof(TransientsChunk) == 76 && offsetof(TransientsChunk, count) == 72);

/// Payload of a CAF "uuid" chunk of transients, behind the UUID: these 20 bytes, then `count` records. Always
/// big-endian.
struct CAFTransientsPayload {
    Packed<std::uint32_t> reserved;            //  0
    Packed<std::uint16_t> version;             //  4
    Packed<std::uint16_t> reserved2;           //  6
    Packed<std::uint16_t> detectionPercentage; //  8
    Packed<std::uint16_t> forceDivision;       // 10
    Packed<std::int64_t> count;                // 12
};
static_assert(sizeof(CAFTransientsPayload) == 20);

struct CAFTransientRecord {
    Packed<std::uint16_t> type;     // 0
    Packed<std::uint16_t> reserved; // 2
    Packed<std::uint64_t> frame;    // 4
};
static_assert(sizeof(CAFTransientRecord) == 12);

// Conversions in place. None checks a length: the bytes behind a chunk must be those of all the records that it counts.

KT_EXPORT void SwapBasicTaggingChunkToBig(BasicTaggingChunk* chunk);
KT_EXPORT void SwapBasicTaggingChunkToHost(BasicTaggingChunk* chunk);
/// Version 1 only; texts and descriptors are bytes and stay.
KT_EXPORT void SwapCategoryChunkToBig(CategoryChunk* chunk);
KT_EXPORT void SwapCategoryChunkToHost(CategoryChunk* chunk);
/// The records behind the chunk too; a count below 1 swaps none.
KT_EXPORT void SwapBasicTransientsChunkToBig(TransientsChunk* chunk);

} // namespace tagging

/// The way back. Kept: the one of the family outside the namespace, as hosts link to it.
KT_EXPORT void SwapBasicTransientsChunkToHost(tagging::TransientsChunk* chunk);
