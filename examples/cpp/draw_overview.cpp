// Draws the waveform of an audio file as lines of text, one for each part of it. Usage: draw_overview FILE [LINES]
#include "audiofile/CAudioFileIO.h"
#include "loops/overview/OverviewBlock.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <filesystem>

int main(int argc, char** argv)
{
    if (argc < 2)
        return 2;
    const std::size_t lines = argc > 2 ? std::strtoul(argv[2], nullptr, 10) : 16;
    const std::string path = std::filesystem::absolute(argv[1]);
    CAudioFileIO file;
    std::int32_t status = file.Open(CFileRef(path.c_str(), false), 0);
    std::unique_ptr<KTMem> overview;
    if (status == kStatusOK)
        overview = file.CreateOverview({}, &status);
    if (!overview) {
        std::fprintf(stderr, "%s: %s\n", argv[1], StatusText(status));
        return 1;
    }
    const OverviewPoint* points = OverviewPointsOf(*overview);
    const std::size_t count = OverviewPoints(*overview);
    const std::size_t step = std::max<std::size_t>(1, count / std::max<std::size_t>(lines, 1));
    for (std::size_t first = 0; first < count; first += step) {
        int low = 0, high = 0;
        for (std::size_t i = first; i < std::min(first + step, count); ++i) {
            low = std::min<int>(low, points[i].minimum);
            high = std::max<int>(high, points[i].maximum);
        }
        const int left = 32 + low / 4, right = 32 + high / 4; // -127 to 127 on 64 columns
        std::printf("%8lld  %*s%s\n", static_cast<long long>(first) * kOverviewFramesPerPoint, left, "",
                    std::string(static_cast<std::size_t>(right - left + 1), '#').c_str());
    }
    return 0;
}
