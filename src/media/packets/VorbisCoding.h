// Vorbis in Ogg streams (Vorbis I by Xiph.Org, chapters 1 and 4).
#pragma once

#include "media/packets/OggCoding.h"

#include <array>

namespace platform {

/// A packet yields a quarter of the sum of its block size and the one before; the first yields nothing.
class VorbisCoding final : public OggCoding {
public:
    /// Null if the packet is no identification header.
    static std::unique_ptr<OggCoding> of(BytesView first);

    bool hasHeaders() const override { return headers_ == 3; }
    bool takeHeader(BytesView packet) override;
    std::optional<std::uint32_t> framesOf(BytesView packet) override;
    void leap() override { previous_ = 0; }

private:
    bool readModes(BytesView setup);

    int headers_ = 1;
    std::array<std::uint32_t, 2> blockSizes_{}; // short and long
    std::array<bool, 2> isLong_{};              // indexed by mode
    bool hasTwoModes_ = false;
    std::uint32_t previous_ = 0; // size of the last packet's block; 0 if unknown
};

/// The speakers of up to 8 channels in Vorbis and Opus; 0 for more.
std::uint32_t speakersOfVorbis(std::uint32_t channels);

} // namespace platform
