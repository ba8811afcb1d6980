#include "files/registry/FileTable.h"

#include <algorithm>

FileTable::FileTable(std::size_t capacity, const TContainerValueCallbacks& callbacks) : callbacks_(callbacks)
{
    constexpr std::size_t reserved = 4096; // a limit of a million files does not mean a million files
    byURL_.reserve(std::min(capacity, reserved));
}

FileTable::~FileTable()
{
    for (TContainer* container : containers_)
        callbacks_.release(container);
}

TContainer* FileTable::find(const platform::URLRef& url) const
{
    const auto found = url ? byURL_.find(url) : byURL_.end();
    return found == byURL_.end() ? nullptr : *found->second;
}

void FileTable::set(const platform::URLRef& url, TContainer* container)
{
    TContainer* const retained = callbacks_.retain(container);
    try {
        const auto [entry, isNew] = byURL_.try_emplace(url);
        if (!isNew) {
            callbacks_.release(std::exchange(*entry->second, retained));
            return;
        }
        try {
            entry->second = containers_.insert(containers_.end(), retained);
        } catch (...) {
            byURL_.erase(entry);
            throw;
        }
    } catch (...) {
        callbacks_.release(retained);
        throw;
    }
}

void FileTable::remove(const platform::URLRef& url)
{
    const auto found = url ? byURL_.find(url) : byURL_.end();
    if (found == byURL_.end())
        return;
    TContainer* const container = *found->second;
    containers_.erase(found->second);
    byURL_.erase(found);
    callbacks_.release(container);
}
