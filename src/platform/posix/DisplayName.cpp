#include "platform/FileSystem.h"

#include "platform/SmallFile.h"
#include "platform/posix/AbsolutePath.h"

#include <algorithm>
#include <cstdlib>
#include <vector>

namespace platform {

namespace {

constexpr std::size_t kMaxDesktopEntrySize = 64 * 1024;

/// The keys under which a desktop entry (freedesktop.org, Desktop Entry 1.5) may hold the name, best first: for
/// "de_AT.UTF-8@euro" these are Name[de_AT@euro], Name[de_AT], Name[de@euro], Name[de], Name.
std::vector<std::string> nameKeys()
{
    std::string locale;
    for (const char* variable : {"LC_ALL", "LC_MESSAGES", "LANG"}) {
        const char* value = std::getenv(variable);
        if (locale.empty() && value != nullptr)
            locale = value;
    }
    std::string modifier;
    if (const std::size_t at = locale.find('@'); at != locale.npos) {
        modifier = locale.substr(at);
        locale.resize(at);
    }
    locale.resize(std::min(locale.find('.'), locale.size()));

    std::vector<std::string> keys;
    const auto add = [&](const std::string& language) {
        if (!modifier.empty())
            keys.push_back("Name[" + language + modifier + "]");
        keys.push_back("Name[" + language + "]");
    };
    add(locale);
    if (const std::size_t underscore = locale.find('_'); underscore != locale.npos)
        add(locale.substr(0, underscore));
    keys.emplace_back("Name");
    return keys;
}

std::string_view trimmed(std::string_view text)
{
    const std::size_t begin = text.find_first_not_of(" \t\r");
    return begin == text.npos ? std::string_view() : text.substr(begin, text.find_last_not_of(" \t\r") + 1 - begin);
}

/// Removes a value's escapes. Escaped line ends and tabs become spaces, because a name is one line.
std::string unescaped(std::string_view value)
{
    std::string text;
    for (std::size_t i = 0; i < value.size(); ++i) {
        if (value[i] != '\\' || i + 1 == value.size()) {
            text += value[i];
            continue;
        }
        const char escape = value[++i];
        if (escape == 's' || escape == 'n' || escape == 't' || escape == 'r')
            text += ' ';
        else
            text += escape;
    }
    return text;
}

/// The name in the entry's main group; empty if there is none.
std::string nameInDesktopEntry(std::string_view entry)
{
    const std::vector<std::string> keys = nameKeys();
    std::size_t bestRank = keys.size();
    std::string_view best;
    bool inMainGroup = false;
    while (!entry.empty()) {
        const std::size_t end = entry.find('\n');
        const std::string_view line = trimmed(entry.substr(0, end));
        entry.remove_prefix(end == entry.npos ? entry.size() : end + 1);
        if (line.starts_with('['))
            inMainGroup = line == "[Desktop Entry]";
        const std::size_t equals = line.find('=');
        if (!inMainGroup || line.starts_with('#') || equals == line.npos)
            continue;
        const std::string_view key = trimmed(line.substr(0, equals));
        for (std::size_t rank = 0; rank < bestRank; ++rank) {
            if (key == keys[rank]) {
                bestRank = rank;
                best = trimmed(line.substr(equals + 1));
            }
        }
    }
    return unescaped(best);
}

} // namespace

String displayName(const URL& url)
{
    const std::string& path = absolutePath(url);
    FileStatus status;
    if (path.empty() || !systemCalls().linkStatus(path.c_str(), &status))
        return nullptr;

    std::optional<Bytes> entry;
    if (status.kind == FileKind::directory)
        entry = readSmallFile((path + "/.directory").c_str(), kMaxDesktopEntrySize);
    else if (path.ends_with(".desktop"))
        entry = readSmallFile(path.c_str(), kMaxDesktopEntrySize);
    const String name = entry ? String::fromUTF8(nameInDesktopEntry(textOf(*entry))) : nullptr;
    return name.isEmpty() ? url.copyLastPathComponent() : name;
}

} // namespace platform
