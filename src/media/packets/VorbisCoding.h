// Vorbis in Ogg streams (Vorbis I by Xiph.Org, chapters 1 and 4).
#pragma once

#include "media/packets/OggCoding.h"

#include <array>

namespace platform {

/// A packet gives a quarter of the two block sizes, of its own block and of the one ahead; the first gives nothing.
class VorbisCoding final : public OggCoding {
public:
    /// Null when the packet is no identification header.
    static std::unique_ptr<OggCoding> of(BytesView first);

    bool hasHeaders() const override { return headers_ == 3; }
    bool takeHeader(BytesView packet) override;
    std::optional<std::uint32_t> framesOf(BytesView packet) override;
    void leap() override { previous_ = 0; }

private:
    bool readModes(BytesView setup);

    int headers_ = 1;
    std::array<std::uint32_t, 2> blockSizes_{}; // short and long
    std::array<bool, 2> isLong_{};              // by mode
    bool hasTwoModes_ = false;
    std::uint32_t previous_ = 0; // the size of the last packet's block; 0 when it is not known
};

/// The speakers of so many channels, up to 8, in Vorbis and Opus; 0 for more.
std::uint32_t speakersOfVorbis(std::uint32_t channels);

} // namespace platform
