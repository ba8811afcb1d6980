#include "media/containers/ChannelLayouts.h"

#include <algorithm>
#include <iterator>

namespace platform {

namespace {

struct Layout {
    std::uint32_t number; // the tag's high half; its low half counts the channels
    std::uint32_t speakers;
};

constexpr Layout kLayouts[] = {
    {100, 0x4},                                            // mono
    {101, 0x3},                                            // stereo
    {108, 0x33},                                           // quadraphonic
    {109, 0x37},                                           // pentagonal: L R Ls Rs C
    {110, 0x137},                                          // hexagonal: pentagonal, Cs
    {111, 0x737},                                          // octagonal: hexagonal, side left and right
    {113, 0x7},                                            // 3.0, A and B
    {114, 0x7},   {115, 0x107},                            // 4.0, A and B
    {116, 0x107}, {117, 0x37},                             // 5.0, A to D
    {118, 0x37},  {119, 0x37},  {120, 0x37}, {121, 0x3F},  // 5.1, A to D
    {122, 0x3F},  {123, 0x3F},  {124, 0x3F}, {125, 0x13F}, // 6.1
    {126, 0xFF},                                           // 7.1: 5.1, Lc Rc
    {127, 0xFF},  {128, 0x63F},                            // 7.1: 5.1, rear left and right
    {129, 0xFF},  {131, 0x103},                            // L R Cs
    {132, 0x33},                                           // L R Ls Rs
    {133, 0xB},                                            // L R LFE
    {134, 0x10B},                                          // L R LFE Cs
    {135, 0x3B},                                           // L R LFE Ls Rs
    {136, 0xF},                                            // L R C LFE
    {137, 0x10F},                                          // L R C LFE Cs
};

} // namespace

std::uint32_t speakersOfLayout(std::uint32_t tag, std::uint32_t bitmap)
{
    constexpr std::uint32_t byBitmap = 0x10000;
    if (tag == byBitmap)
        return bitmap;
    const auto* const found = std::ranges::find(kLayouts, tag >> 16, &Layout::number);
    return found != std::end(kLayouts) ? found->speakers : 0;
}

} // namespace platform
