#include "tool/shared/input/FolderWalk.h"

#include "tool/shared/input/StandardInput.h"
#include "tool/shared/output/Failure.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <dirent.h>
#include <memory>
#include <sys/stat.h>

namespace {

std::string resolved(const std::string& path)
{
    const std::unique_ptr<char, decltype(&std::free)> text(::realpath(path.c_str(), nullptr), &std::free);
    return text ? text.get() : "";
}

std::string joined(const std::string& folder, const std::string& name)
{
    return folder.ends_with('/') ? folder + name : folder + "/" + name;
}

} // namespace

bool isFolder(const std::string& path)
{
    struct stat status = {};
    return path != kStandardInput && ::stat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode);
}

FolderWalk::FolderWalk(std::vector<std::string> roots, Visit visit) : roots_(std::move(roots)), visit_(std::move(visit))
{
    for (const std::string& root : roots_)
        if (isFolder(root))
            if (const std::string path = resolved(root); !path.empty())
                resolvedRoots_.push_back(path.ends_with('/') ? path : path + "/");
}

bool FolderWalk::run()
{
    return std::all_of(roots_.begin(), roots_.end(), [this](const std::string& root) {
        struct stat status = {};
        if (root == kStandardInput)
            return visit_({root, {}});
        if (::stat(root.c_str(), &status) != 0)
            return visit_({root, SystemErrorText(errno)});
        if (!S_ISDIR(status.st_mode))
            return visit_({root, {}});
        rootLength_ = root.size();
        return walk(root);
    });
}

bool FolderWalk::visit(std::string path, std::string problem) const
{
    return visit_({std::move(path), std::move(problem), rootLength_});
}

std::vector<FolderWalk::Entry> FolderWalk::entriesOf(const std::string& folder, int& error)
{
    std::vector<Entry> entries;
    error = 0;
    struct Closing {
        void operator()(DIR* open) const { ::closedir(open); }
    };
    const std::unique_ptr<DIR, Closing> directory(::opendir(folder.c_str()));
    if (!directory) {
        error = errno;
        return entries;
    }
    errno = 0;
    while (const dirent* const entry = ::readdir(directory.get())) {
        if (entry->d_name[0] != '.')
            entries.push_back({entry->d_name, entry->d_type});
        errno = 0;
    }
    error = errno;
    std::sort(entries.begin(), entries.end(), [](const Entry& a, const Entry& b) { return a.name < b.name; });
    return entries;
}

bool FolderWalk::walk(const std::string& folder)
{
    if (!isNew(folder))
        return true;
    int error = 0;
    const std::vector<Entry> entries = entriesOf(folder, error);
    if (error != 0 && !visit(folder, SystemErrorText(error)))
        return false;
    return std::all_of(entries.begin(), entries.end(),
                       [&](const Entry& entry) { return visitEntry(joined(folder, entry.name), entry); });
}

bool FolderWalk::visitEntry(std::string path, const Entry& entry)
{
    if (entry.type == DT_REG)
        return visit(std::move(path));
    if (entry.type == DT_DIR)
        return walk(path);
    if (entry.type != DT_LNK && entry.type != DT_UNKNOWN)
        return true;
    struct stat status = {}, link = {};
    if (::lstat(path.c_str(), &link) != 0 || ::stat(path.c_str(), &status) != 0)
        return visit(std::move(path)); // opening it will report the problem, if it matters
    if (S_ISDIR(status.st_mode))
        return (S_ISLNK(link.st_mode) && leadsInside(path)) || walk(path);
    return !S_ISREG(status.st_mode) || visit(std::move(path));
}

bool FolderWalk::isNew(const std::string& folder)
{
    struct stat status = {};
    return ::stat(folder.c_str(), &status) != 0 || seen_.emplace(status.st_dev, status.st_ino).second;
}

bool FolderWalk::leadsInside(const std::string& link) const
{
    const std::string target = resolved(link) + "/";
    return std::any_of(resolvedRoots_.begin(), resolvedRoots_.end(),
                       [&](const std::string& root) { return target.starts_with(root); });
}
