#include "platform/Places.h"

#include "platform/FileSystem.h"
#include "platform/SmallFile.h"
#include "platform/posix/MountTable.h"

#include <array>
#include <cstdlib>
#include <string_view>

#include <unistd.h>

namespace platform {

namespace {

std::string executablePath()
{
    std::array<char, 4096> path;
    const ssize_t length = ::readlink("/proc/self/exe", path.data(), path.size());
    return length > 0 && static_cast<std::size_t>(length) < path.size()
               ? std::string(path.data(), static_cast<std::size_t>(length))
               : std::string();
}

Places findPlaces()
{
    Places found;
    found.home = homeDirectory("").utf8();
    const char* dataHome = std::getenv("XDG_DATA_HOME"); // the rules ignore a relative path
    found.dataHome = dataHome != nullptr && *dataHome == '/' ? dataHome : found.home + "/.local/share";
    found.executable = executablePath();
    found.user = ::getuid();
    return found;
}

std::string_view folderOf(std::string_view path)
{
    return path.substr(0, path.rfind('/') == path.npos ? 0 : path.rfind('/'));
}

std::string_view nameOf(std::string_view path)
{
    return path.substr(path.rfind('/') + 1);
}

bool isInside(std::string_view path, const std::string& folder)
{
    return path.size() > folder.size() + 1 && path.starts_with(folder) && path[folder.size()] == '/';
}

std::string resolved(const std::string& path)
{
    return resolvingSymbolicLinksInPath(String::fromUTF8(path)).utf8();
}

} // namespace

Places& places()
{
    static Places found = findPlaces();
    return found;
}

std::vector<std::string> libraryFolders()
{
    const Places& now = places();
    return {now.home + "/Library", now.root + "/Library", now.root + "/Network/Library", now.root + "/System/Library"};
}

bool isInTrash(const String& path)
{
    // Resolves links of the folder but not of the item: a link in the trash is in the trash wherever it leads.
    const std::string_view text = path.utf8();
    if (text.empty())
        return false;
    const std::string folder = resolved(std::string(folderOf(text)) + '/');
    const std::string item = (folder == "/" ? "" : folder) + '/' + std::string(nameOf(text));
    if (isInside(item, resolved(places().dataHome + "/Trash/files")))
        return true;
    const auto mount = mountOf(folder.c_str());
    if (!mount)
        return false;
    const std::string top = mount->folder == "/" ? "" : mount->folder;
    const std::string user = std::to_string(places().user);
    return isInside(item, top + "/.Trash/" + user + "/files") || isInside(item, top + "/.Trash-" + user + "/files");
}

bool isInvisible(const String& path)
{
    constexpr std::size_t limit = 1 << 20;
    const std::string_view name = nameOf(path.utf8());
    if (name.empty() || name.starts_with('.'))
        return !name.empty();
    const auto list = readSmallFile((std::string(folderOf(path.utf8())) + "/.hidden").c_str(), limit);
    if (!list)
        return false;
    std::string_view names(reinterpret_cast<const char*>(list->data()), list->size());
    while (!names.empty()) {
        const std::size_t end = std::min(names.find('\n'), names.size());
        if (names.substr(0, end) == name)
            return true;
        names.remove_prefix(std::min(end + 1, names.size()));
    }
    return false;
}

std::string applicationBundle()
{
    const std::string_view own = folderOf(places().executable);
    for (std::string_view folder = own; !folder.empty(); folder = folderOf(folder))
        if (folder.ends_with(".app") || folder.ends_with(".AppDir"))
            return std::string(folder);
    return std::string(own);
}

} // namespace platform
