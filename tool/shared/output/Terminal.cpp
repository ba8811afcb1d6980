#include "tool/shared/output/Terminal.h"

#include "tool/shared/output/UnseenCharacters.h"

#include <fmt/core.h>

#include <algorithm>
#include <clocale>
#include <cstdlib>
#include <cwchar>
#include <iterator>
#include <sys/ioctl.h>
#include <unistd.h>

namespace {

// The next character of `text`, which is shortened by it; 0xFFFD for a byte that begins none.
wchar_t takeCharacter(std::string_view& text)
{
    constexpr unsigned char firstBeyondASCII = 0x80;
    if (const auto ascii = static_cast<unsigned char>(text.front()); ascii < firstBeyondASCII) {
        text.remove_prefix(1);
        return ascii;
    }
    // Not the user's locale: file names are UTF-8 whatever that says, and widths must not depend on it.
    static const bool located = std::setlocale(LC_CTYPE, "C.UTF-8") != nullptr;
    wchar_t character = 0;
    std::mbstate_t state{};
    const std::size_t length = located ? std::mbrtowc(&character, text.data(), text.size(), &state) : 1;
    if (!located)
        character = static_cast<unsigned char>(text.front());
    const bool good = length <= text.size();
    text.remove_prefix(good ? length : 1);
    return good ? character : L'\xFFFD';
}

std::string printableText(std::string_view text, bool onTerminal)
{
    if (std::all_of(text.begin(), text.end(), [](char c) { return c >= ' ' && c <= '~'; }))
        return std::string(text); // most are
    std::string result;
    while (!text.empty()) {
        const std::string_view before = text;
        const wchar_t character = takeCharacter(text);
        const std::string_view bytes = before.substr(0, before.size() - text.size());
        const bool isHidden = onTerminal && isUnseen(static_cast<char32_t>(character));
        if (character == L'\xFFFD')
            result += "\xEF\xBF\xBD";
        else if (!isHidden && ::wcwidth(character) >= 0 && character != 0)
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
    winsize size{};
    return ::ioctl(STDERR_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0 ? size.ws_col : 80;
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

int displayWidth(std::string_view text)
{
    int width = 0;
    while (!text.empty())
        if (const int columns = ::wcwidth(takeCharacter(text)); columns > 0)
            width += columns;
    return width;
}
