#include "tool/shared/indexing/LibraryWalk.h"

#include "tool/shared/threads/StartedThread.h"

#include <algorithm>
#include <cstdlib>
#include <exception>
#include <memory>

namespace {

std::string resolvedFolder(const std::string& path)
{
    const std::unique_ptr<char, decltype(&std::free)> text(::realpath(path.c_str(), nullptr), &std::free);
    const std::string resolved = text ? text.get() : "";
    return resolved.empty() || resolved.ends_with('/') ? resolved : resolved + "/";
}

} // namespace

LibraryWalk::LibraryWalk(UpdateInbox& inbox, std::vector<WalkStart> starts, unsigned threads,
                         std::function<void(const FolderListing&)> opened)
    : inbox_(inbox),
      opened_(std::move(opened))
{
    for (WalkStart& start : starts) {
        FolderListing listing;
        listing.path = start.path;
        listing.words = start.words;
        listing.isRoot = start.files.empty() && start.rootLength == 0;
        listing.rootLength = start.rootLength == 0 ? start.words.size() : start.rootLength;
        const std::string below = start.words.substr(listing.rootLength);
        if (start.files.empty() && start.path.ends_with(below))
            roots_.push_back(start.path.substr(0, start.path.size() - below.size()));
        tasks_.push_back({std::move(listing), std::move(start.files), start.isAlone});
    }
    std::ranges::reverse(tasks_);
    if (tasks_.empty()) {
        inbox_.endListings();
        return;
    }
    threads_.reserve(threads);
    for (unsigned i = 0; i < threads; ++i)
        if (std::jthread thread = startedThread([this] { work(); }); thread.joinable())
            threads_.push_back(std::move(thread));
        else
            break;
    if (threads_.empty()) {
        inbox_.makeBoundless();
        work();
    }
}

LibraryWalk::~LibraryWalk()
{
    const std::lock_guard lock(mutex_);
    isStopped_ = true;
    ready_.notify_all();
}

void LibraryWalk::work()
{
    try {
        visitAll();
    } catch (...) {
        inbox_.fail(std::current_exception());
    }
}

void LibraryWalk::visitAll()
{
    std::unique_lock lock(mutex_);
    for (;;) {
        ready_.wait(lock, [this] { return isStopped_ || !tasks_.empty() || atWork_ == 0; });
        if (isStopped_ || tasks_.empty())
            break;
        Task task = std::move(tasks_.back());
        tasks_.pop_back();
        ++atWork_;
        lock.unlock();
        const bool goesOn = visit(task);
        lock.lock();
        isStopped_ = isStopped_ || !goesOn;
        if (--atWork_ == 0 && tasks_.empty()) {
            inbox_.endListings();
            ready_.notify_all();
        }
    }
}

bool LibraryWalk::visit(Task& task)
{
    FolderListing& listing = task.listing;
    if (task.files.empty()) {
        bool isVisited = false;
        listFolder(listing, [&](const FolderListing& opened) {
            isVisited = !isNew(opened);
            if (!isVisited && opened_)
                opened_(opened);
            return !isVisited;
        });
        if (isVisited)
            return true;
        if (!task.isAlone)
            addFolders(listing);
    } else {
        for (const std::string& name : task.files)
            if (!listFile(listing, name))
                listing.missing.push_back(name);
    }
    return inbox_.leave(std::move(listing));
}

void LibraryWalk::addFolders(const FolderListing& listing)
{
    std::vector<Task> tasks;
    for (const ListedFolder& folder : listing.folders) {
        FolderListing next;
        next.path = listing.path + folder.name + "/";
        next.words = listing.words + folder.name + "/";
        next.rootLength = listing.rootLength;
        if (folder.isLink) {
            next.path = resolvedFolder(next.path);
            if (next.path.empty() || leadsInside(next.path))
                continue;
        }
        tasks.push_back({std::move(next), {}, false});
    }
    if (tasks.empty())
        return;
    const std::lock_guard lock(mutex_);
    tasks_.insert(tasks_.end(), std::make_move_iterator(tasks.rbegin()), std::make_move_iterator(tasks.rend()));
    ready_.notify_all();
}

bool LibraryWalk::isNew(const FolderListing& listing)
{
    const std::lock_guard lock(mutex_);
    return visited_.emplace(listing.device, listing.inode).second;
}

bool LibraryWalk::leadsInside(const std::string& path) const
{
    return std::ranges::any_of(roots_, [&](const std::string& root) { return path.starts_with(root); });
}
