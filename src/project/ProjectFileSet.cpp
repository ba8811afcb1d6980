#include "project/ProjectFileSet.h"

#include "platform/core/HashSlots.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <functional>

namespace {

constexpr std::size_t kBlockSize = 256 * 1024;

std::uint32_t hashOf(std::string_view path)
{
    const std::size_t hash = std::hash<std::string_view>()(path);
    return static_cast<std::uint32_t>(hash ^ hash >> 32);
}

} // namespace

ProjectFileSet::ProjectFileSet(std::initializer_list<std::string_view> paths)
{
    for (const std::string_view path : paths)
        insert(path);
}

/// The slot of the path, or the free slot that it would take.
const ProjectFileSet::Slot* ProjectFileSet::find(std::string_view path, std::uint32_t hash) const
{
    for (std::size_t i = hash;; ++i) {
        const Slot& slot = slots_[i & (slots_.size() - 1)];
        if (slot.number == 0 || (slot.hash == hash && paths_[slot.number - 1] == path))
            return &slot;
    }
}

bool ProjectFileSet::insert(std::string_view path)
{
    return insert(path, hashOf(path));
}

void ProjectFileSet::insert(std::span<const std::string> paths)
{
    constexpr std::size_t most = 32; // reads in flight at a time
    for (; !paths.empty(); paths = paths.subspan(std::min(most, paths.size()))) {
        const auto some = paths.first(std::min(most, paths.size()));
        std::array<std::uint32_t, most> hashes;
        for (std::size_t i = 0; i < some.size(); ++i) {
            hashes[i] = hashOf(some[i]);
            if (!slots_.empty())
                __builtin_prefetch(&slots_[hashes[i] & (slots_.size() - 1)]);
        }
        for (std::size_t i = 0; i < some.size(); ++i)
            insert(some[i], hashes[i]);
    }
}

bool ProjectFileSet::insert(std::string_view path, std::uint32_t hash)
{
    if (2 * (paths_.size() + 1) > slots_.size())
        growHashSlots(slots_);
    const auto at = static_cast<std::size_t>(find(path, hash) - slots_.data());
    if (slots_[at].number != 0)
        return false;
    paths_.push_back(keep(path));
    slots_[at] = {hash, static_cast<std::uint32_t>(paths_.size())};
    return true;
}

bool ProjectFileSet::contains(std::string_view path) const
{
    return !slots_.empty() && find(path, hashOf(path))->number != 0;
}

std::string_view ProjectFileSet::keep(std::string_view path)
{
    const std::size_t size = path.size() + 1;
    if (size > blockLeft_) {
        blockLeft_ = std::max(size, kBlockSize);
        blocks_.push_back(std::make_unique_for_overwrite<char[]>(blockLeft_));
        next_ = blocks_.back().get();
    }
    char* const kept = next_;
    std::memcpy(kept, path.data(), path.size());
    kept[path.size()] = '\0';
    next_ += size;
    blockLeft_ -= size;
    return {kept, path.size()};
}

bool operator==(const ProjectFileSet& a, const ProjectFileSet& b)
{
    return a.size() == b.size() &&
           std::all_of(a.begin(), a.end(), [&b](std::string_view path) { return b.contains(path); });
}
