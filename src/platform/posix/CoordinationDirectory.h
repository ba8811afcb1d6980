// The one folder in which the processes of a user meet: empty stripe files, whose bytes are locked, a file of process
// slots, and a socket per process that presents.
#pragma once

#include "platform/posix/Descriptor.h"

#include <atomic>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace platform {

/// Open, and verified when it was opened: a folder of the effective user with mode 0700, reached through no link at its
/// end. Threads share it.
class CoordinationDirectory {
public:
    /// The folder in force; opened, and made, when it has to be. Throws std::system_error when it is missing and cannot
    /// be made, is not ours, or open to others.
    static std::shared_ptr<CoordinationDirectory> current();
    /// Those in which others may have locks: the one in force last, ahead of it what processes left or made that knew
    /// no run-time folder. Whoever takes locks in several takes them in this order.
    static std::vector<std::shared_ptr<CoordinationDirectory>> all();
    /// Replaces the folder for what begins from now on; empty goes back to the system's place.
    static void setPath(std::string path);

    explicit CoordinationDirectory(const std::string& path);

    /// A description of a stripe file that nobody else uses: from a few that are kept, or newly opened.
    Descriptor takeStripe(int stripe);
    /// Gives back a description that holds no lock.
    void putStripe(int stripe, Descriptor descriptor);
    /// The file whose byte N is locked by the process that has slot N.
    Descriptor openSlots();

    /// False once the file of the descriptor was deleted: what is locked there is locked for nobody who comes now. The
    /// next `current` opens the folder anew then, as it does after a file could not be opened because the folder is
    /// gone (ESTALE).
    bool stillThere(const Descriptor& descriptor);
    bool isCurrent() const { return !deleted_.load(std::memory_order_relaxed); }

    /// The path of a slot's socket, as system calls reach it however long and wherever the folder's own path is.
    std::string socketPath(int slot) const;
    /// The folder's absolute path, as the system knows it.
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
