// The folder in which a user's processes meet: empty stripe files whose bytes are locked, a file of process slots, and
// a socket for each process with presenters.
#pragma once

#include "platform/posix/Descriptor.h"

#include <atomic>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace platform {

/// Open, and checked when it was opened: a folder of the effective user, mode 0700, not reached through a link at its
/// end. Threads share it.
class CoordinationDirectory {
public:
    /// The folder in force; makes and opens it if necessary. Throws std::system_error if it is missing and cannot be
    /// made, does not belong to this user, or is open to others.
    static std::shared_ptr<CoordinationDirectory> current();
    /// All folders in which others may hold locks, the one in force last. Ahead of it comes the folder of processes
    /// that had no run-time folder. Locks in several folders are taken in this order.
    static std::vector<std::shared_ptr<CoordinationDirectory>> all();
    /// Replaces the folder for all that begins from now on; an empty path restores the system's choice.
    static void setPath(std::string path);

    explicit CoordinationDirectory(const std::string& path);

    /// A description of a stripe file for exclusive use: one of a few that are kept, or a new one.
    Descriptor takeStripe(int stripe);
    /// Returns a description that holds no lock.
    void putStripe(int stripe, Descriptor descriptor);
    /// Opens the file whose byte N is locked by the process that has slot N.
    Descriptor openSlots();

    /// False once the descriptor's file was deleted: a lock in it excludes nobody who comes later. The next `current`
    /// then opens the folder anew, as it does after an open failed because the folder is gone (ESTALE).
    bool stillThere(const Descriptor& descriptor);
    bool isCurrent() const { return !deleted_.load(std::memory_order_relaxed); }

    /// The path of a slot's socket, usable in system calls however long the folder's own path is.
    std::string socketPath(int slot) const;
    /// The folder's absolute path as the system knows it.
    std::string path() const;
    static std::string stripeName(int stripe);

private:
    Descriptor openFile(const std::string& name);

    Descriptor folder_;
    std::atomic<bool> deleted_ = false;
    std::mutex mutex_; // guards kept_
    std::vector<std::pair<int, Descriptor>> kept_;
};

} // namespace platform
