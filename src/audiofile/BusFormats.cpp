#include "audiofile/BusFormats.h"

#include <algorithm>
#include <array>
#include <bit>

namespace {

// The speakers of each bus format, from format 1 on.
constexpr std::array<std::uint32_t, 14> kSpeakers{
    0x00004, // mono: C
    0x00003, // stereo: L R
    0x00033, // quad: L R Ls Rs
    0x00107, // LCRS: L R C S
    0x0003F, // 5.1: L R C LFE Ls Rs
    0x0070F, // 6.1: L R C LFE Cs Lss Rss
    0x0063F, // 7.1: L R C LFE Lrs Rrs Lss Rss
    0x000FF, // 7.1 SDDS: L R C LFE Ls Rs Lc Rc
    0x0503F, // 5.1.2: 5.1, Tfl Tfr
    0x2D033, // 4.0.4: quad, Tfl Tfr Tbl Tbr
    0x2D03F, // 5.1.4: 5.1, Tfl Tfr Tbl Tbr
    0x0563F, // 7.1.2: 7.1, Tfl Tfr
    0x2D63F, // 7.1.4: 7.1, Tfl Tfr Tbl Tbr
    0x2D6FF, // 9.1.4: 7.1, Lc Rc, Tfl Tfr Tbl Tbr
};
constexpr std::array<std::uint8_t, 14> kChannels{1, 2, 4, 4, 6, 7, 8, 8, 8, 8, 10, 10, 12, 14};

constexpr bool speakersAndChannelsAgree()
{
    for (std::size_t i = 0; i < kSpeakers.size(); ++i)
        if (std::popcount(kSpeakers[i]) != kChannels[i])
            return false;
    return true;
}
static_assert(speakersAndChannelsAgree());

template <class Table, class T>
TAudioBusFormat formatOf(const Table& table, T value)
{
    const auto found = std::find(table.begin(), table.end(), value);
    return found == table.end() ? kAudioBusUndefined : static_cast<TAudioBusFormat>(found - table.begin() + 1);
}

} // namespace

int AudioBusFormatChannels(int busFormat)
{
    const bool known = busFormat >= 1 && busFormat <= int{kChannels.size()};
    return known ? kChannels[static_cast<std::size_t>(busFormat - 1)] : 0;
}

TAudioBusFormat AudioBusFormatForChannels(int channels)
{
    return formatOf(kChannels, channels);
}

std::uint32_t SpeakersOf(TAudioBusFormat busFormat, int channels)
{
    // Where several formats have the same number of channels, none is guessed.
    const TAudioBusFormat format = channels <= 2 ? AudioBusFormatForChannels(channels) : busFormat;
    return AudioBusFormatChannels(format) == channels && channels > 0 ? kSpeakers[static_cast<std::size_t>(format - 1)]
                                                                      : 0;
}

TAudioBusFormat BusFormatOf(std::uint32_t speakers, int channels)
{
    if (speakers == 0 && channels > 2)
        return kAudioBusUndefined;
    const TAudioBusFormat format = formatOf(kSpeakers, speakers);
    return AudioBusFormatChannels(format) == channels ? format : AudioBusFormatForChannels(channels);
}
