#include "platform/posix/CoordinationDirectory.h"

#include <algorithm>
#include <cerrno>
#include <system_error>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

namespace platform {

namespace {

constexpr std::size_t kKeptDescriptors = 16;
constexpr mode_t kOwnerOnly = 0700;

[[noreturn]] void fail(int error, const std::string& what)
{
    throw std::system_error(error, std::generic_category(), what);
}

/// The user's run-time folder where the system keeps one, else a folder in the place for temporary files. The
/// environment has no say: two processes of a user must never choose differently.
std::string systemPath()
{
    const std::string user = std::to_string(::geteuid());
    const std::string runtime = "/run/user/" + user;
    struct stat status;
    if (::lstat(runtime.c_str(), &status) == 0 && S_ISDIR(status.st_mode) && status.st_uid == ::geteuid())
        return runtime + "/ktfiles-coordination";
    return "/tmp/ktfiles-coordination-" + user;
}

struct Current {
    std::mutex mutex;
    std::string path;
    std::shared_ptr<CoordinationDirectory> directory;
};

std::string& chosenPath() // outlives forks, unlike what was opened; guarded by the mutex of Current
{
    static std::string& path = *new std::string;
    return path;
}

Current& currentState()
{
    static PerProcess<Current> state;
    return state.get();
}

} // namespace

std::shared_ptr<CoordinationDirectory> CoordinationDirectory::current()
{
    Current& state = currentState();
    const std::lock_guard lock(state.mutex);
    if (!state.directory || !state.directory->isCurrent())
        state.directory = std::make_shared<CoordinationDirectory>(chosenPath().empty() ? systemPath() : chosenPath());
    return state.directory;
}

void CoordinationDirectory::setPath(std::string path)
{
    Current& state = currentState();
    const std::lock_guard lock(state.mutex);
    chosenPath() = std::move(path);
    state.directory.reset();
}

CoordinationDirectory::CoordinationDirectory(const std::string& path)
{
    const bool made = ::mkdir(path.c_str(), kOwnerOnly) == 0;
    if (!made && errno != EEXIST)
        fail(errno, "coordination folder " + path);
    folder_ = Descriptor([&] { return ::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC); });
    if (!folder_)
        fail(errno, "coordination folder " + path);
    if (made)
        ::fchmod(folder_.get(), kOwnerOnly); // whatever the process's mask
    struct stat status;
    if (::fstat(folder_.get(), &status) != 0)
        fail(errno, "coordination folder " + path);
    if (status.st_uid != ::geteuid() || (status.st_mode & 07777) != kOwnerOnly)
        fail(EACCES, "coordination folder " + path + " is not this user's alone");
    ::flock(folder_.get(), LOCK_SH | LOCK_NB); // whoever cleans temporary files leaves locked folders alone
}

Descriptor CoordinationDirectory::openFile(const std::string& name)
{
    Descriptor file(
        [&] { return ::openat(folder_.get(), name.c_str(), O_RDWR | O_CREAT | O_NOFOLLOW | O_CLOEXEC, 0600); });
    struct stat status;
    if (!file && errno == ENOENT && ::fstat(folder_.get(), &status) == 0 && status.st_nlink == 0) {
        deleted_.store(true, std::memory_order_relaxed);
        errno = ESTALE;
    }
    if (!file || ::fstat(file.get(), &status) != 0)
        fail(errno, "coordination file " + name);
    if (!S_ISREG(status.st_mode) || status.st_uid != ::geteuid())
        fail(EACCES, "coordination file " + name + " is not this user's");
    return file;
}

Descriptor CoordinationDirectory::takeStripe(int stripe)
{
    {
        const std::lock_guard lock(mutex_);
        const auto found = std::find_if(kept_.rbegin(), kept_.rend(), [&](auto& one) { return one.first == stripe; });
        if (found != kept_.rend()) {
            Descriptor descriptor = std::move(found->second);
            kept_.erase(std::next(found).base());
            return descriptor;
        }
    }
    return openFile(stripeName(stripe));
}

void CoordinationDirectory::putStripe(int stripe, Descriptor descriptor)
{
    Descriptor dropped; // closed without the mutex
    const std::lock_guard lock(mutex_);
    if (kept_.size() == kKeptDescriptors) {
        dropped = std::move(kept_.front().second);
        kept_.erase(kept_.begin());
    }
    kept_.emplace_back(stripe, std::move(descriptor));
}

Descriptor CoordinationDirectory::openSlots()
{
    return openFile("slots");
}

bool CoordinationDirectory::stillThere(const Descriptor& descriptor)
{
    struct stat status;
    if (::fstat(descriptor.get(), &status) == 0 && status.st_nlink > 0)
        return true;
    deleted_.store(true, std::memory_order_relaxed);
    return false;
}

std::string CoordinationDirectory::socketPath(int slot) const
{
    return "/proc/self/fd/" + std::to_string(folder_.get()) + "/socket-" + std::to_string(slot);
}

std::string CoordinationDirectory::path() const
{
    char target[4096];
    const ssize_t length =
        ::readlink(("/proc/self/fd/" + std::to_string(folder_.get())).c_str(), target, sizeof target);
    return length < 0 ? std::string() : std::string(target, static_cast<std::size_t>(length));
}

std::string CoordinationDirectory::stripeName(int stripe)
{
    return "stripe-" + std::to_string(stripe);
}

} // namespace platform
