#include "platform/posix/CoordinationDirectory.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <optional>
#include <system_error>

#include <fcntl.h>
#include <pwd.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

namespace platform {

namespace {

constexpr std::size_t kKeptDescriptors = 16;
constexpr mode_t kOwnerOnly = 0700;

constexpr const char* kName = "ktfiles-coordination";

[[noreturn]] void fail(int error, const std::string& what)
{
    throw std::system_error(error, std::generic_category(), what);
}

struct UserRecord {
    std::string name, home;
};

std::optional<UserRecord> userRecord(uid_t user)
{
    std::array<char, 16384> text;
    struct passwd record;
    struct passwd* found = nullptr;
    if (::getpwuid_r(user, &record, text.data(), text.size(), &found) != 0 || found == nullptr)
        return std::nullopt;
    return UserRecord{found->pw_name, found->pw_dir};
}

/// "root (user 0)"
std::string ownerText(uid_t user)
{
    const std::string number = "user " + std::to_string(user);
    const std::optional<UserRecord> record = userRecord(user);
    return record ? record->name + " (" + number + ")" : number;
}

/// The folder for state in the user's home, if the home belongs to this user and the folder exists or can be made; else
/// empty. The environment is ignored: two processes of a user must never choose differently.
std::string stateFolder(uid_t user)
{
    const std::optional<UserRecord> record = userRecord(user);
    if (!record || !record->home.starts_with('/'))
        return {};
    struct stat status;
    if (::stat(record->home.c_str(), &status) != 0 || !S_ISDIR(status.st_mode) || status.st_uid != user)
        return {};
    const std::string state = record->home + "/.local/state";
    const bool isThere = ::lstat((state + '/' + kName).c_str(), &status) == 0;
    return isThere || ::faccessat(AT_FDCWD, record->home.c_str(), W_OK, AT_EACCESS) == 0 ? state : std::string();
}

/// The folder in force, then the one that is in force while the user has no run-time folder. Only a user without a home
/// gets one in the folder for temporary files, where anybody may take the name.
std::vector<std::string> systemPaths()
{
    static const uid_t user = ::geteuid();
    static const std::string state = stateFolder(user);
    const uid_t now = ::geteuid(); // a process may change its user
    const std::string number = std::to_string(now);
    const std::string lasting = now == user ? state : stateFolder(now);
    std::vector<std::string> paths;
    const std::string runtime = "/run/user/" + number;
    struct stat status;
    if (::lstat(runtime.c_str(), &status) == 0 && S_ISDIR(status.st_mode) && status.st_uid == now)
        paths.push_back(runtime + '/' + kName);
    paths.push_back(lasting.empty() ? "/tmp/" + (kName + ('-' + number)) : lasting + '/' + kName);
    return paths;
}

/// Makes the enclosing folders, for this user alone.
void makeFoldersAround(const std::string& path)
{
    for (std::size_t end = path.find('/', 1); end != path.npos; end = path.find('/', end + 1))
        if (::mkdir(path.substr(0, end).c_str(), kOwnerOnly) != 0 && errno != EEXIST && errno != EACCES &&
            errno != EROFS)
            fail(errno, "folder " + path.substr(0, end));
}

struct Current {
    std::mutex mutex;
    std::string path; // of the directory
    std::shared_ptr<CoordinationDirectory> directory;
    std::string otherPath;
    std::shared_ptr<CoordinationDirectory> other;
};

// Unlike open descriptors, this outlives a fork. Guarded by the mutex of Current.
std::string& chosenPath()
{
    static std::string& path = *new std::string;
    return path;
}

Current& currentState()
{
    static PerProcess<Current> state;
    return state.get();
}

/// The paths in force; reopens the current folder if it changed. Called with the mutex held.
std::vector<std::string> update(Current& state)
{
    const bool isChosen = !chosenPath().empty();
    std::vector<std::string> paths = isChosen ? std::vector<std::string>{chosenPath()} : systemPaths();
    if (state.directory && state.directory->isCurrent() && state.path == paths.front())
        return paths;
    state.directory.reset();
    if (!isChosen)
        makeFoldersAround(paths.front());
    state.directory = std::make_shared<CoordinationDirectory>(paths.front());
    state.path = paths.front();
    return paths;
}

} // namespace

std::shared_ptr<CoordinationDirectory> CoordinationDirectory::current()
{
    Current& state = currentState();
    const std::lock_guard lock(state.mutex);
    update(state);
    return state.directory;
}

std::vector<std::shared_ptr<CoordinationDirectory>> CoordinationDirectory::all()
{
    Current& state = currentState();
    const std::lock_guard lock(state.mutex);
    const std::vector<std::string> paths = update(state);
    if (paths.size() == 1)
        return {state.directory};
    struct stat status;
    if (::lstat(paths[1].c_str(), &status) != 0)
        return {state.directory}; // no process ran without a run-time folder
    if (!state.other || !state.other->isCurrent() || state.otherPath != paths[1])
        try {
            state.other = std::make_shared<CoordinationDirectory>(paths[1]);
            state.otherPath = paths[1];
        } catch (const std::system_error&) { // unusable for everybody
            state.other.reset();
            return {state.directory};
        }
    return {state.other, state.directory};
}

void CoordinationDirectory::setPath(std::string path)
{
    Current& state = currentState();
    const std::lock_guard lock(state.mutex);
    chosenPath() = std::move(path);
    state.directory.reset();
    state.other.reset();
}

CoordinationDirectory::CoordinationDirectory(const std::string& path)
{
    const std::string what = "coordination folder " + path;
    if (!path.starts_with('/'))
        fail(EINVAL, what + " is no absolute path");
    const bool made = ::mkdir(path.c_str(), kOwnerOnly) == 0;
    if (!made && errno != EEXIST)
        fail(errno, what);
    struct stat status;
    folder_ = Descriptor([&] { return ::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC); });
    if (!folder_) {
        const int reason = errno; // the error does not say whose folder it is
        if (::lstat(path.c_str(), &status) != 0)
            fail(reason, what);
        if (status.st_uid != ::geteuid())
            fail(reason, what + " belongs to " + ownerText(status.st_uid));
        fail(reason, S_ISLNK(status.st_mode) ? what + " is a link" : what);
    }
    if (made)
        ::fchmod(folder_.get(), kOwnerOnly); // whatever the process's mask is
    if (::fstat(folder_.get(), &status) != 0)
        fail(errno, what);
    if (status.st_uid != ::geteuid())
        fail(EACCES, what + " is not this user's: it belongs to " + ownerText(status.st_uid));
    if ((status.st_mode & 07777) != kOwnerOnly)
        fail(EACCES, what + " is not this user's alone: others may enter it");
    ::flock(folder_.get(), LOCK_SH | LOCK_NB); // programs that clean temporary files spare locked folders
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
    Descriptor dropped; // closed after the mutex is released
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
