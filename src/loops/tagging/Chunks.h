// The loop chunks of AIFF files as records. On disk every integer is big-endian; in memory the records hold host
// order, and the Swap functions convert in place. See docs/formats/loop-chunks.md.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/Packed.h"

#include <array>
#include <cstddef>
#include <cstdint>

namespace tagging {

/// AIFF "basc": the members, top to bottom, are its 82 bytes.
struct BasicTaggingChunk {
    Packed<std::uint32_t> version = 1;              //  0  1
    Packed<std::int32_t> beatCount;                 //  4  in the whole loop
    Packed<std::int16_t> midiRootNote;              //  8  the key, a MIDI note; 0 for none
    Packed<std::int16_t> keyType;                   // 10  0 none, 1 minor, 2 major, 3 neither, 4 both
    Packed<std::int16_t> signatureTop;              // 12  beats in a bar
    Packed<std::int16_t> signatureBottom;           // 14  the note that is one beat: 4, 8
    Packed<std::int16_t> fileType;                  // 16  1 = loop
    std::array<Packed<std::uint32_t>, 16> reserved; // 18  zeros
};
static_assert(sizeof(BasicTaggingChunk) == 82 && offsetof(BasicTaggingChunk, reserved) == 18);

inline constexpr std::size_t kCategoryTextSize = 50; // NUL included
/// A text, padded with NULs.
using CategoryText = std::array<char, kCategoryTextSize>;

/// AIFF "cate", version 1: these 222 bytes, then `descriptorCount` descriptors of 50 bytes.
struct CategoryChunk {
    Packed<std::uint32_t> version = 1;              //   0  1
    CategoryText instrumentType{};                  //   4  such as "Bass"
    CategoryText instrumentSubType{};               //  54  such as "Synthetic Bass"
    CategoryText genre{};                           // 104  such as "Electronic"
    std::array<Packed<std::uint32_t>, 16> reserved; // 154  zeros
    Packed<std::uint16_t> reserved2;                // 218  zero
    Packed<std::uint16_t> descriptorCount;          // 220  how many descriptors follow
};
static_assert(sizeof(CategoryChunk) == 222 && offsetof(CategoryChunk, descriptorCount) == 220);

/// Where version 2, which is read and never written, keeps its descriptors; nothing between is interpreted.
inline constexpr std::size_t kCategoryV2CountOffset = 322;
/// The first descriptor of version 2.
inline constexpr std::size_t kCategoryV2DescriptorsOffset = 324;

/// One record of "trns".
struct TransientRecord {
    Packed<std::int16_t> type;                      //  0  1
    Packed<std::uint16_t> reserved;                 //  2  zero
    Packed<std::uint32_t> frame;                    //  4  position in the sound
    std::array<Packed<std::uint32_t>, 4> reserved2; //  8  zeros
};
static_assert(sizeof(TransientRecord) == 24);

/// AIFF "trns": these 76 bytes, then `count` records.
struct TransientsChunk {
    Packed<std::int16_t> version;                    //  0  1
    Packed<std::int16_t> detectionPercentage;        //  2  of the program that found them
    Packed<std::int16_t> forceDivision;              //  4  of the program that found them
    Packed<std::uint16_t> reserved;                  //  6  zero
    Packed<std::uint32_t> writeTime;                 //  8  seconds since 1970-01-01 UTC
    std::array<Packed<std::uint32_t>, 15> reserved2; // 12  zeros
    Packed<std::int32_t> count;                      // 72  how many records follow
};
static_assert(sizeof(TransientsChunk) == 76 && offsetof(TransientsChunk, count) == 72);

/// Payload of a CAF "uuid" chunk of transients, after the UUID: these 20 bytes, then `count` records. Always
/// big-endian.
struct CAFTransientsPayload {
    Packed<std::uint32_t> reserved;            //  0  zero
    Packed<std::uint16_t> version;             //  4  1
    Packed<std::uint16_t> reserved2;           //  6  zero
    Packed<std::uint16_t> detectionPercentage; //  8  of the program that found them
    Packed<std::uint16_t> forceDivision;       // 10  of the program that found them
    Packed<std::int64_t> count;                // 12  how many records follow
};
static_assert(sizeof(CAFTransientsPayload) == 20);

/// One record of a CAFTransientsPayload.
struct CAFTransientRecord {
    Packed<std::uint16_t> type;     // 0  1
    Packed<std::uint16_t> reserved; // 2  zero
    Packed<std::uint64_t> frame;    // 4  position in the sound
};
static_assert(sizeof(CAFTransientRecord) == 12);

// Conversions in place. None checks a length: the caller makes sure that all records that a chunk counts follow it.

/// From host order to that of the file.
KT_EXPORT void SwapBasicTaggingChunkToBig(BasicTaggingChunk* chunk);
/// From the order of the file to the host's.
KT_EXPORT void SwapBasicTaggingChunkToHost(BasicTaggingChunk* chunk);
/// From host order to that of the file; version 1 only. Texts and descriptors are bytes and stay.
KT_EXPORT void SwapCategoryChunkToBig(CategoryChunk* chunk);
/// From the order of the file to the host's; version 1 only.
KT_EXPORT void SwapCategoryChunkToHost(CategoryChunk* chunk);
/// From host order to that of the file, with the records after the chunk; a count below 1 swaps none.
KT_EXPORT void SwapBasicTransientsChunkToBig(TransientsChunk* chunk);

} // namespace tagging

/// From the order of the file to the host's. Kept: the only one of the family outside the namespace, since hosts link
/// to it.
KT_EXPORT void SwapBasicTransientsChunkToHost(tagging::TransientsChunk* chunk);
