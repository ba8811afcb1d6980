#include "tool/shared/waveform/Sparkline.h"

#include <algorithm>
#include <array>
#include <cmath>

std::string sparkline(const Waveform& waveform, int cells)
{
    constexpr std::array kBars{"▁", "▂", "▃", "▄", "▅", "▆", "▇", "█"};
    constexpr float kFullScale = 127;
    std::string line;
    for (const WaveformColumn& column : foldedColumns(waveform, 0, static_cast<double>(waveform.frames), cells)) {
        const float peak = std::max(-column.low, column.high) / kFullScale;
        const int eighths = static_cast<int>(std::ceil(peak * static_cast<float>(kBars.size())));
        line += kBars[static_cast<std::size_t>(std::clamp(eighths, 1, static_cast<int>(kBars.size()))) - 1];
    }
    return line;
}
