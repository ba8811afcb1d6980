// The table of a CFileServer: containers by the URLs of their files.
#pragma once

#include "files/registry/TContainer.h"

#include <cstddef>
#include <list>
#include <unordered_map>

/// Enumerates in the order in which the files came. Retains a container that it takes and releases one that it drops,
/// by its callbacks.
class FileTable {
public:
    /// `capacity` is a hint.
    FileTable(std::size_t capacity, const TContainerValueCallbacks& callbacks);
    ~FileTable();
    FileTable(const FileTable&) = delete;
    FileTable& operator=(const FileTable&) = delete;

    std::size_t size() const { return containers_.size(); }
    /// Null when there is none; the table's still.
    TContainer* find(const platform::URLRef& url) const;
    /// In the place of the one that the URL has already.
    void set(const platform::URLRef& url, TContainer* container);
    void remove(const platform::URLRef& url);

    /// In order. What is removed meanwhile makes them invalid.
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
