// A set of absolute paths, sized for the media of a project: the texts lie side by side, and an entry needs no
// allocation of its own.
#pragma once

#include "platform/core/Export.h"

#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <vector>

/// A set of paths in the order of insertion. Views are valid, and end in a NUL, as long as the set lives; moving it
/// moves no text.
class KT_EXPORT ProjectFileSet {
public:
    ProjectFileSet() = default;
    /// Inserts the paths in order.
    ProjectFileSet(std::initializer_list<std::string_view> paths);
    ProjectFileSet(ProjectFileSet&&) = default;
    ProjectFileSet& operator=(ProjectFileSet&&) = default;

    /// Copies a path into the set; false when it is there already.
    bool insert(std::string_view path);
    /// Inserts the paths in order. Fetches the table's memory for all of them ahead, since a large set would
    /// otherwise wait for it with every path.
    void insert(std::span<const std::string> paths);
    /// Whether the path is there, compared by its bytes.
    bool contains(std::string_view path) const;
    std::size_t size() const { return paths_.size(); }
    bool empty() const { return paths_.empty(); }
    std::vector<std::string_view>::const_iterator begin() const { return paths_.begin(); }
    std::vector<std::string_view>::const_iterator end() const { return paths_.end(); }

    /// Whether both hold the same paths.
    friend KT_EXPORT bool operator==(const ProjectFileSet& a, const ProjectFileSet& b);

private:
    struct Slot {
        std::uint32_t hash = 0;
        std::uint32_t number = 0; // of the path, from 1; 0 for a free slot
    };

    const Slot* find(std::string_view path, std::uint32_t hash) const;
    bool insert(std::string_view path, std::uint32_t hash);
    std::string_view keep(std::string_view path);

    std::vector<Slot> slots_; // a power of two, at most half of them taken
    std::vector<std::string_view> paths_;
    std::vector<std::unique_ptr<char[]>> blocks_;
    std::size_t blockLeft_ = 0;
    char* next_ = nullptr;
};
