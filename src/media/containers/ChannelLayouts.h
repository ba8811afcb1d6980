// The tags by which CAF and MP4 name channel layouts (published: the format description of CAF, version 1.0).
#pragma once

#include <cstdint>

namespace platform {

/// The speakers of a layout's channels, as bits of extensible WAVE's channel mask, whatever the channels' order.
/// `bitmap` counts only with the tag that refers to it. 0 for layouts that are no speakers, such as "binaural", and for
/// channels that are described one by one.
std::uint32_t speakersOfLayout(std::uint32_t tag, std::uint32_t bitmap);

} // namespace platform
