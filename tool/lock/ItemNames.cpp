#include "tool/lock/ItemNames.h"

#include <filesystem>
#include <set>
#include <string_view>
#include <system_error>

namespace {

namespace fs = std::filesystem;

// The kernel appends this to the name of a file that was replaced or removed; the item is the path's, whatever is
// there.
constexpr std::string_view kDeleted = " (deleted)";

std::set<std::string> openPaths(int process)
{
    std::set<std::string> paths;
    std::error_code ended; // processes may end meanwhile
    for (fs::directory_iterator one("/proc/" + std::to_string(process) + "/fd", ended), end; !ended && one != end;
         one.increment(ended)) {
        std::error_code closed;
        const std::string path = fs::read_symlink(one->path(), closed);
        if (!path.starts_with('/'))
            continue;
        paths.insert(path);
        if (path.ends_with(kDeleted))
            paths.insert(path.substr(0, path.size() - kDeleted.size()));
    }
    return paths;
}

} // namespace

std::map<std::uint64_t, std::string> itemNames(const std::vector<platform::CoordinationParty>& parties)
{
    std::set<int> processes;
    std::set<std::uint64_t> numbers;
    for (const platform::CoordinationParty& party : parties) {
        processes.insert(party.processID);
        numbers.insert(party.itemNumber);
    }
    std::set<std::string> paths;
    for (const int process : processes)
        paths.merge(openPaths(process));
    std::map<std::uint64_t, std::string> names;
    for (const std::string& path : paths) {
        const auto url = platform::URL::createWithFileSystemPath(
            platform::String::fromFileSystemRepresentation(path.c_str()), platform::PathStyle::posix, false);
        if (const platform::CoordinatedItem item(url); item.isValid())
            if (const auto number = platform::coordinationItemNumber(item); numbers.contains(number))
                names.try_emplace(number, path);
    }
    return names;
}
