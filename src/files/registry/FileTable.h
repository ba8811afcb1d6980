// The table of a CFileServer: containers by the URLs of their files.
#pragma once

#include "files/registry/TContainer.h"

#include <cstddef>
#include <list>
#include <unordered_map>

/// Containers by URL, in the order in which the files came. The table retains a container that it takes and releases
/// one that it drops, by its callbacks.
class FileTable {
public:
    /// `capacity` is a hint; the callbacks must outlive the table.
    FileTable(std::size_t capacity, const TContainerValueCallbacks& callbacks);
    ~FileTable();
    FileTable(const FileTable&) = delete;
    FileTable& operator=(const FileTable&) = delete;

    std::size_t size() const { return containers_.size(); }
    /// The container of a URL, still the table's; null when there is none.
    TContainer* find(const platform::URLRef& url) const;
    /// Stores a container, in the place of one that the URL has already.
    void set(const platform::URLRef& url, TContainer* container);
    /// Drops the container of a URL, if there is one.
    void remove(const platform::URLRef& url);

    /// In order; removing a file invalidates iterators to it.
    auto begin() const { return containers_.begin(); }
    auto end() const { return containers_.end(); }

private:
    struct Hash {
        std::size_t operator()(const platform::URLRef& url) const { return url->hash(); }
    };
    struct Equal {
        bool operator()(const platform::URLRef& a, const platform::URLRef& b) const { return a == b || *a == *b; }
    };
    using Containers = std::list<TContainer*>;

    const TContainerValueCallbacks& callbacks_;
    Containers containers_;
    std::unordered_map<platform::URLRef, Containers::iterator, Hash, Equal> byURL_;
};
