#include "tool/page/PageWave.h"

#include <algorithm>
#include <cstdint>

std::string pageWave(std::string_view points)
{
    const std::size_t count = points.size() / 2, columns = std::min(count, kPageWaveColumns);
    std::string folded;
    folded.reserve(columns * 2);
    for (std::size_t column = 0; column < columns; ++column) {
        const std::size_t first = column * count / columns, end = (column + 1) * count / columns;
        int low = 127, high = -127;
        for (std::size_t point = first; point < end; ++point) {
            low = std::min(low, int{static_cast<signed char>(points[point * 2])});
            high = std::max(high, int{static_cast<signed char>(points[point * 2 + 1])});
        }
        folded += static_cast<char>(std::clamp(std::min(low, high), -127, 127) + 128);
        folded += static_cast<char>(std::clamp(std::max(low, high), -127, 127) + 128);
    }
    return base64(folded);
}

std::string base64(std::string_view bytes)
{
    constexpr char digits[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
    std::string text;
    text.reserve((bytes.size() + 2) / 3 * 4);
    for (std::size_t at = 0; at < bytes.size(); at += 3) {
        std::uint32_t group = 0;
        for (std::size_t i = 0; i < 3; ++i)
            group = group << 8 | (at + i < bytes.size() ? static_cast<unsigned char>(bytes[at + i]) : 0U);
        for (std::size_t i = 0; i < 4; ++i)
            text += at + i <= bytes.size() ? digits[group >> (18 - 6 * i) & 63] : '=';
    }
    return text;
}
