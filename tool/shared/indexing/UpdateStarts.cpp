#include "tool/shared/indexing/UpdateStarts.h"

#include <algorithm>
#include <filesystem>
#include <map>
#include <system_error>

namespace {

std::string withSlash(std::string path)
{
    return path.ends_with('/') ? path : path + "/";
}

// Whether a walk from the root comes by the folder.
bool isWalkedFrom(const std::string& root, const std::string& folder)
{
    return folder.starts_with(root) && !folder.substr(root.size()).starts_with('.') &&
           folder.find("/.", root.size()) == folder.npos;
}

} // namespace

std::string lastName(const std::string& folder)
{
    const std::size_t slash = folder.size() < 2 ? folder.npos : folder.rfind('/', folder.size() - 2);
    return slash == folder.npos ? folder : folder.substr(slash + 1);
}

UpdateStarts updateStarts(const std::vector<std::string>& names)
{
    namespace fs = std::filesystem;
    UpdateStarts starts;
    std::map<std::string, std::vector<std::string>> files; // by folder
    for (const std::string& name : names) {
        std::error_code error;
        const fs::path path = fs::absolute(name, error);
        const fs::path resolved = fs::weakly_canonical(path, error);
        const fs::file_status status = fs::status(path, error);
        if (fs::is_directory(status))
            starts.roots.push_back(withSlash(resolved.string()));
        else if (fs::exists(status))
            files[withSlash(fs::weakly_canonical(path.parent_path(), error).string())].push_back(
                path.filename().string());
        else
            starts.absent.push_back(withSlash(resolved.string()));
    }
    std::ranges::sort(starts.roots);
    starts.roots.erase(std::unique(starts.roots.begin(), starts.roots.end()), starts.roots.end());
    const auto isWalked = [&](const std::string& folder) {
        return std::ranges::any_of(starts.walks, [&](const WalkStart& start) {
            return start.files.empty() && isWalkedFrom(start.path, folder);
        });
    };
    for (const std::string& root : starts.roots)
        if (!isWalked(root))
            starts.walks.push_back({root, lastName(root), {}});
    for (auto& [folder, itsFiles] : files)
        if (!isWalked(folder))
            starts.walks.push_back({folder, lastName(folder), std::move(itsFiles)});
    return starts;
}
