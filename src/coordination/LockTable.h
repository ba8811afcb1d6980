// The process-wide table of a class of locks: from a file's key to the lock that all its users share.
#pragma once

#include "platform/FileCoordination.h"

#include <map>
#include <memory>
#include <mutex>
#include <vector>

/// All locks of a class. Any thread may use it.
template <class Lock>
class LockTable {
public:
    /// The registered lock; null for none.
    std::shared_ptr<Lock> find(const platform::CoordinatedItem& item)
    {
        const std::lock_guard guard(mutex_);
        const auto found = entries_.find(item.key());
        return !item.isValid() || found == entries_.end() ? nullptr : found->second.lock;
    }

    /// The registered lock, or a new one by `make`, which is registered; null, and nothing registered, when `make`
    /// gives null.
    template <class Make>
    std::shared_ptr<Lock> findOrAdd(const platform::CoordinatedItem& item, const Make& make)
    {
        const std::lock_guard guard(mutex_);
        const Entry* entry = entryFor(item, make);
        return entry != nullptr ? entry->lock : nullptr;
    }

    /// The same, then calls `use` with the lock, which cannot be removed meanwhile.
    template <class Make, class Use>
    void findOrAddAndUse(const platform::CoordinatedItem& item, const Make& make, const Use& use)
    {
        const User user(*this, item, make);
        if (user.lock)
            use(*user.lock);
    }

    /// Removes the file's lock unless it is in use. The removed lock, or null.
    std::shared_ptr<Lock> removeUnused(const platform::CoordinatedItem& item)
    {
        const std::lock_guard guard(mutex_);
        const auto found = entries_.find(item.key());
        if (!item.isValid() || found == entries_.end() || !found->second.isUnused())
            return nullptr;
        std::shared_ptr<Lock> removed = std::move(found->second.lock);
        entries_.erase(found);
        return removed;
    }

    /// Removes all locks that are not in use, and returns them.
    std::vector<std::shared_ptr<Lock>> removeAllUnused()
    {
        std::vector<std::shared_ptr<Lock>> removed;
        const std::lock_guard guard(mutex_);
        std::erase_if(entries_, [&](auto& entry) {
            const bool isUnused = entry.second.isUnused();
            if (isUnused)
                removed.push_back(std::move(entry.second.lock));
            return isUnused;
        });
        return removed;
    }

    /// The registered locks, in the order of their keys.
    std::vector<std::shared_ptr<Lock>> all()
    {
        std::vector<std::shared_ptr<Lock>> locks;
        const std::lock_guard guard(mutex_);
        for (const auto& [key, entry] : entries_)
            locks.push_back(entry.lock);
        return locks;
    }

private:
    struct Entry {
        std::shared_ptr<Lock> lock;
        int users = 0;

        bool isUnused() const { return users == 0 && !lock->isInUse(); }
    };

    /// A user of the item's entry, for as long as it lives, even if an exception of the host ends its work.
    struct User {
        LockTable& table;
        const platform::SHA256Digest key;
        std::shared_ptr<Lock> lock; // null when there is no entry

        template <class Make>
        User(LockTable& owner, const platform::CoordinatedItem& item, const Make& make) : table(owner),
                                                                                          key(item.key())
        {
            const std::lock_guard guard(table.mutex_);
            if (Entry* entry = table.entryFor(item, make)) {
                ++entry->users;
                lock = entry->lock;
            }
        }
        ~User()
        {
            const std::lock_guard guard(table.mutex_);
            if (lock)
                --table.entries_.find(key)->second.users;
        }
        User(const User&) = delete;
        User& operator=(const User&) = delete;
    };

    template <class Make>
    Entry* entryFor(const platform::CoordinatedItem& item, const Make& make)
    {
        if (!item.isValid())
            return nullptr;
        const auto found = entries_.find(item.key());
        if (found != entries_.end())
            return &found->second;
        std::shared_ptr<Lock> made = make();
        return made ? &entries_.emplace(item.key(), Entry{std::move(made), 0}).first->second : nullptr;
    }

    std::mutex mutex_;
    std::map<platform::SHA256Digest, Entry> entries_;
};
