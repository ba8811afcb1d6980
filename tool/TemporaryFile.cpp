#include "TemporaryFile.h"

#include "Failure.h"
#include "FileLock.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <random>
#include <string_view>
#include <sys/stat.h>
#include <unistd.h>

namespace {

constexpr std::array kEndingSignals{SIGINT, SIGTERM, SIGHUP, SIGQUIT, SIGPIPE, SIGALRM, SIGXCPU};

// The names to remove when a signal ends the process: plain memory, since a handler may use nothing else.
struct Slot {
    volatile sig_atomic_t used = 0;
    char path[PATH_MAX] = {};
};
std::array<Slot, 4> slots;

extern "C" void removeTemporaryFiles(int signal)
{
    for (const Slot& slot : slots)
        if (slot.used != 0)
            ::unlink(slot.path);
    ::signal(signal, SIG_DFL);
    ::raise(signal);
}

void installHandlers()
{
    static bool installed = false;
    if (std::exchange(installed, true))
        return;
    for (const int signal : kEndingSignals) {
        struct sigaction action = {};
        ::sigaction(signal, nullptr, &action);
        if (action.sa_handler != SIG_DFL) // ignored on purpose, as by nohup
            continue;
        action.sa_handler = removeTemporaryFiles;
        ::sigaction(signal, &action, nullptr);
    }
}

// The file exists already and is empty; called with the signals held.
int takeSlot(const std::string& path)
{
    for (std::size_t i = 0; i < slots.size(); ++i)
        if (slots[i].used == 0 && path.size() < sizeof slots[i].path) {
            std::memcpy(slots[i].path, path.c_str(), path.size() + 1);
            slots[i].used = 1;
            return static_cast<int>(i);
        }
    return -1;
}

// What the names of all temporary files for `target` begin with. A long name is cut so that the rest has room, at the
// start of a character: the library opens only names that are UTF-8.
std::string prefixFor(const std::filesystem::path& target)
{
    constexpr std::size_t kRoom = NAME_MAX - std::string_view("..ktfiles-4194304-01234567").size();
    std::string name = target.filename().string();
    std::size_t length = std::min(name.size(), kRoom);
    while (length < name.size() && length > 0 && (static_cast<unsigned char>(name[length]) & 0xC0) == 0x80)
        --length;
    return "." + name.substr(0, length) + ".ktfiles-";
}

std::filesystem::path folderOf(const std::filesystem::path& target)
{
    return target.has_parent_path() ? target.parent_path() : std::filesystem::path(".");
}

// Only a file that nobody holds locked goes: its process is gone.
void removeIfAbandoned(const std::filesystem::path& path)
{
    struct stat status = {};
    if (::lstat(path.c_str(), &status) != 0 || !S_ISREG(status.st_mode))
        return;
    const Descriptor file(::open(path.c_str(), O_RDWR | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    if (file && tryLock(file.get()) == LockResult::locked)
        ::unlink(path.c_str());
}

void removeAbandoned(const std::filesystem::path& target)
{
    const std::string prefix = prefixFor(target);
    std::error_code error;
    std::filesystem::directory_iterator entries(folderOf(target), error);
    for (; !error && entries != std::filesystem::directory_iterator(); entries.increment(error))
        if (entries->path().filename().string().starts_with(prefix))
            removeIfAbandoned(entries->path());
}

} // namespace

TemporaryFile::TemporaryFile(const std::string& target)
{
    installHandlers();
    removeAbandoned(target);
    std::random_device random;
    for (int attempt = 0; attempt < 100; ++attempt) {
        path_ = folderOf(target) / fmt::format("{}{}-{:08x}", prefixFor(target), ::getpid(), random());
        const SignalHold hold;
        descriptor_ = Descriptor(::open(path_.c_str(), O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0600));
        if (!descriptor_ && errno == EEXIST)
            continue;
        if (!descriptor_)
            throw Failure("no file can be made in its folder: " + systemErrorText(errno));
        struct stat status = {};
        // Another run may have taken it for an abandoned one before it was locked.
        if (tryLock(descriptor_.get()) == LockResult::busy || ::fstat(descriptor_.get(), &status) != 0 ||
            status.st_nlink == 0)
            continue;
        slot_ = takeSlot(path_);
        return;
    }
    throw Failure("no temporary file can be made in its folder");
}

TemporaryFile::~TemporaryFile()
{
    const SignalHold hold;
    if (!path_.empty())
        ::unlink(path_.c_str());
    forget();
}

void TemporaryFile::forget()
{
    if (slot_ >= 0)
        slots[static_cast<std::size_t>(slot_)].used = 0;
    slot_ = -1;
    path_.clear();
}

void TemporaryFile::replace(const std::string& target)
{
    const SignalHold hold;
    if (::rename(path_.c_str(), target.c_str()) != 0)
        throw Failure(systemErrorText(errno));
    forget();
}

bool TemporaryFile::publish(const std::string& target)
{
    const SignalHold hold;
    if (::renameat2(AT_FDCWD, path_.c_str(), AT_FDCWD, target.c_str(), RENAME_NOREPLACE) == 0) {
        forget();
        return true;
    }
    if (errno == EEXIST)
        return false;
    // A file system without that call: a second name, then the first goes, in the destructor.
    if (::link(path_.c_str(), target.c_str()) == 0)
        return true;
    if (errno == EEXIST)
        return false;
    throw Failure(systemErrorText(errno));
}

SignalHold::SignalHold()
{
    sigset_t ending;
    sigemptyset(&ending);
    for (const int signal : kEndingSignals)
        sigaddset(&ending, signal);
    ::sigprocmask(SIG_BLOCK, &ending, &before_);
}

SignalHold::~SignalHold()
{
    ::sigprocmask(SIG_SETMASK, &before_, nullptr);
}
