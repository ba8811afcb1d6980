// The chunk "cart" of WAVE files: how a radio station plays the sound. Page: docs/formats/wave-metadata.md.
#pragma once

#include "audiofile/metadata/FixedText.h"
#include "audiofile/metadata/Records.h"
#include "platform/core/Export.h"

#include <cstddef>

/// A moment of the sound; 8 bytes.
struct CartTimer {
    Packed<FourCC> usage;        // 0  "SEG1", "AUDs", "INT1" …; 0 unused
    Packed<std::uint32_t> value; // 4  in frames

    /// Turns every number from `order` to the host's order, or back.
    void byteOrder(std::endian order)
    {
        turnFields(std::endian::big, usage);
        turnFields(order, value);
    }
    friend bool operator==(const CartTimer&, const CartTimer&) = default;
};

/// These members, top to bottom, are the first 2048 bytes of "cart". Texts are ASCII by the source.
struct CartFields {
    FixedText<4> version;                  //    0  "0101": 1.01
    FixedText<64> title;                   //    4  of the cut
    FixedText<64> artist;                  //   68  of the cut
    FixedText<64> cutId;                   //  132  the station's number of the cut
    FixedText<64> clientId;                //  196  of the advertiser
    FixedText<64> category;                //  260  as the station sorts its cuts
    FixedText<64> classification;          //  324  within the category
    FixedText<64> outCue;                  //  388  the last words
    FixedText<10> startDate;               //  452  yyyy-mm-dd
    FixedText<8> startTime;                //  462  hh:mm:ss
    FixedText<10> endDate;                 //  470  yyyy-mm-dd; after it the cut is not played
    FixedText<8> endTime;                  //  480  hh:mm:ss
    FixedText<64> producerAppId;           //  488  the program that made the chunk
    FixedText<64> producerAppVersion;      //  552  of that program
    FixedText<64> userDef;                 //  616  the station's own
    Packed<std::int32_t> levelReference;   //  680  the sample value of 0 dB
    std::array<CartTimer, 8> postTimers;   //  684  moments in the cut
    std::array<std::byte, 276> reserved{}; //  748  zeros; kept as they are
    FixedText<1024> url;                   // 1024  where to read more

    /// Turns every number from `order` to the host's order, or back.
    void byteOrder(std::endian order)
    {
        turnFields(order, levelReference);
        for (CartTimer& timer : postTimers)
            timer.byteOrder(order);
    }
    friend bool operator==(const CartFields&, const CartFields&) = default;
};
static_assert(sizeof(CartFields) == 2048 && offsetof(CartFields, startDate) == 452 &&
              offsetof(CartFields, levelReference) == 680 && offsetof(CartFields, url) == 1024);

/// Published source: AES46-2002.
struct KT_EXPORT CartChunk : CartFields {
    /// Null for fewer than 2048 bytes. In RIFX the order is big.
    static std::optional<CartChunk> read(BytesView body, std::endian order = std::endian::little);
    /// The body of the chunk: what was read, with the changes since.
    Bytes write(std::endian order = std::endian::little) const;
    friend bool operator==(const CartChunk&, const CartChunk&) = default;

    Bytes tagText; // what follows the 2048 bytes: a text of the station's own
};
