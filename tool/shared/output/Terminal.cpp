#include "tool/shared/output/Terminal.h"

#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/UnseenCharacters.h"

#include <fmt/core.h>

#include <algorithm>
#include <charconv>
#include <cstdlib>
#include <iterator>
#include <sys/ioctl.h>
#include <unistd.h>

namespace {

std::string printableText(std::string_view text, bool onTerminal)
{
    if (std::all_of(text.begin(), text.end(), [](char c) { return c >= ' ' && c <= '~'; }))
        return std::string(text); // most texts are plain
    std::string result;
    while (!text.empty()) {
        const std::string_view before = text;
        const char32_t character = takeCharacter(text);
        const std::string_view bytes = before.substr(0, before.size() - text.size());
        const bool isHidden = onTerminal && isUnseen(character);
        if (character == U'\xFFFD')
            result += "\xEF\xBF\xBD";
        else if (!isHidden && isShowable(character))
            result += bytes;
        else
            for (const char byte : bytes)
                fmt::format_to(std::back_inserter(result), "\\x{:02X}", static_cast<unsigned char>(byte));
    }
    return result;
}

} // namespace

bool isTerminal(int descriptor)
{
    return ::isatty(descriptor) == 1;
}

bool usesColor(ColorMode mode)
{
    if (mode != ColorMode::automatic)
        return mode == ColorMode::always;
    const char* const declined = std::getenv("NO_COLOR");
    const char* const terminal = std::getenv("TERM");
    return isTerminal(STDOUT_FILENO) && (declined == nullptr || *declined == '\0') && terminal != nullptr &&
           std::string_view(terminal) != "dumb";
}

int terminalColumns()
{
    constexpr int mostColumns = 10'000;
    const char* const given = std::getenv("COLUMNS");
    const std::string_view text = given != nullptr ? given : "";
    int columns = 0;
    if (std::from_chars(text.data(), text.data() + text.size(), columns).ptr == text.data() + text.size() &&
        columns > 0 && columns <= mostColumns)
        return columns;
    for (const int descriptor : {STDOUT_FILENO, STDERR_FILENO})
        if (winsize size{}; ::ioctl(descriptor, TIOCGWINSZ, &size) == 0 && size.ws_col > 0)
            return size.ws_col;
    return 80;
}

std::optional<int> columnsOfOutput()
{
    return isTerminal(STDOUT_FILENO) ? std::optional(terminalColumns()) : std::nullopt;
}

std::string printable(std::string_view text)
{
    static const bool onTerminal = isTerminal(STDOUT_FILENO);
    return printableText(text, onTerminal);
}

std::string printableOnError(std::string_view text)
{
    static const bool onTerminal = isTerminal(STDERR_FILENO);
    return printableText(text, onTerminal);
}
