// The tags by which CAF and MP4 name channel layouts (published: the format description of CAF, version 1.0).
#pragma once

#include <cstdint>

namespace platform {

/// The speakers that a layout's channels feed, as bits of the channel mask of extensible WAVE, whatever the channels'
/// order; `bitmap` counts with the tag that says so. 0 of a layout that is not one of speakers, as "binaural", or whose
/// channels are described one by one.
std::uint32_t speakersOfLayout(std::uint32_t tag, std::uint32_t bitmap);

} // namespace platform
