#include "tool/shared/edits/TemporaryFile.h"

#include "tool/shared/access/FileLock.h"
#include "tool/shared/output/Failure.h"

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
#include <string_view>
#include <unistd.h>

namespace {

constexpr std::array kEndingSignals{SIGINT, SIGTERM, SIGHUP, SIGQUIT, SIGPIPE, SIGALRM, SIGXCPU};

// The names to remove when a signal ends the process: plain memory, since a handler may use nothing else.
struct Slot {
    volatile sig_atomic_t used = 0;
    int folder = -1;
    char name[NAME_MAX + 1] = {};
};
std::array<Slot, 4> slots;

extern "C" void removeTemporaryFiles(int signal)
{
    for (const Slot& slot : slots)
        if (slot.used != 0)
            ::unlinkat(slot.folder, slot.name, 0);
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
int takeSlot(int folder, const std::string& name)
{
    for (std::size_t i = 0; i < slots.size(); ++i)
        if (slots[i].used == 0) {
            slots[i].folder = folder;
            std::memcpy(slots[i].name, name.c_str(), name.size() + 1);
            slots[i].used = 1;
            return static_cast<int>(i);
        }
    return -1;
}

constexpr int kMostNames = 100;
constexpr int kFirstNames = 4; // more than one edit takes at a time: what was left has one of these, nearly always

// The names of all temporary files for a target, by a rule, so that those that were left are found without a look at
// every name in the folder. A long name is cut so that the rest has room, at the start of a character: the library
// opens only names that are UTF-8.
std::string temporaryName(const std::string& target, int number)
{
    constexpr std::size_t kRoom = NAME_MAX - std::string_view("..ktfiles-99").size();
    std::size_t length = std::min(target.size(), kRoom);
    while (length < target.size() && length > 0 && (static_cast<unsigned char>(target[length]) & 0xC0) == 0x80)
        --length;
    return fmt::format(".{}.ktfiles-{}", target.substr(0, length), number);
}

bool isSame(const struct stat& a, const struct stat& b)
{
    return a.st_dev == b.st_dev && a.st_ino == b.st_ino;
}

// Only a file that nobody holds locked goes: its process is gone. Its name is compared once it is locked, since until
// then it may have been given to another.
void removeIfAbandoned(int folder, const std::string& name)
{
    struct stat named = {}, opened = {};
    if (::fstatat(folder, name.c_str(), &named, AT_SYMLINK_NOFOLLOW) != 0 || !S_ISREG(named.st_mode))
        return;
    const Descriptor file(::openat(folder, name.c_str(), O_RDWR | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    if (file && tryLock(file.get()) == LockResult::locked && ::fstat(file.get(), &opened) == 0 &&
        ::fstatat(folder, name.c_str(), &named, AT_SYMLINK_NOFOLLOW) == 0 && isSame(opened, named))
        ::unlinkat(folder, name.c_str(), 0);
}

// A folder that may be written but not read serves too; it cannot be committed to storage.
Descriptor openFolder(const std::string& path)
{
    Descriptor folder(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    return folder ? std::move(folder) : Descriptor(::open(path.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
}

} // namespace

TemporaryFile::TemporaryFile(const std::string& target)
{
    const std::filesystem::path path(target);
    targetName_ = path.filename().string();
    folder_ = openFolder(path.has_parent_path() ? path.parent_path().string() : ".");
    if (!folder_)
        throw Failure("its folder: " + systemErrorText(errno));
    installHandlers();
    for (int number = 0; number < kFirstNames; ++number)
        removeIfAbandoned(folder_.get(), temporaryName(targetName_, number));
    for (int number = 0; number < kMostNames; ++number)
        if (create(temporaryName(targetName_, number)))
            return;
    throw Failure("no temporary file can be made in its folder");
}

bool TemporaryFile::create(const std::string& name)
{
    const SignalHold hold;
    Descriptor file(::openat(folder_.get(), name.c_str(), O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0600));
    if (!file && errno == EEXIST) {
        removeIfAbandoned(folder_.get(), name); // for the next run
        return false;
    }
    if (!file)
        throw Failure("no file can be made in its folder: " + systemErrorText(errno));
    struct stat status = {};
    // Another run may have taken it for an abandoned one before it was locked.
    if (tryLock(file.get()) == LockResult::busy || ::fstat(file.get(), &status) != 0 || status.st_nlink == 0)
        return false;
    descriptor_ = std::move(file);
    name_ = name;
    slot_ = takeSlot(folder_.get(), name);
    return true;
}

TemporaryFile::~TemporaryFile()
{
    const SignalHold hold;
    if (!name_.empty())
        ::unlinkat(folder_.get(), name_.c_str(), 0);
    forget();
}

void TemporaryFile::forget()
{
    if (slot_ >= 0)
        slots[static_cast<std::size_t>(slot_)].used = 0;
    slot_ = -1;
    name_.clear();
}

bool TemporaryFile::targetIs(const struct stat& status) const
{
    struct stat named = {};
    return ::fstatat(folder_.get(), targetName_.c_str(), &named, AT_SYMLINK_NOFOLLOW) == 0 && isSame(named, status);
}

// In a folder of somebody else's the name may have been given to another file.
void TemporaryFile::requireItsName() const
{
    struct stat named = {}, own = {};
    if (::fstat(descriptor_.get(), &own) != 0)
        throw Failure(systemErrorText(errno));
    if (::fstatat(folder_.get(), name_.c_str(), &named, AT_SYMLINK_NOFOLLOW) != 0 || !isSame(named, own))
        throw Failure("its temporary file was moved by another program; nothing was done");
}

void TemporaryFile::replace()
{
    const SignalHold hold;
    requireItsName();
    if (::renameat(folder_.get(), name_.c_str(), folder_.get(), targetName_.c_str()) != 0)
        throw Failure(systemErrorText(errno));
    forget();
}

bool TemporaryFile::publish(const std::string& name)
{
    const SignalHold hold;
    requireItsName();
    const std::string last = std::filesystem::path(name).filename().string();
    if (::renameat2(folder_.get(), name_.c_str(), folder_.get(), last.c_str(), RENAME_NOREPLACE) == 0) {
        forget();
        return true;
    }
    if (errno == EEXIST)
        return false;
    // A file system without that call: a second name, then the first goes, in the destructor.
    if (::linkat(folder_.get(), name_.c_str(), folder_.get(), last.c_str(), 0) == 0)
        return true;
    if (errno == EEXIST)
        return false;
    throw Failure(systemErrorText(errno));
}

// File systems that cannot commit folders keep their own promises.
bool TemporaryFile::synchronizeFolder() const
{
    return ::fsync(folder_.get()) == 0 || errno == EINVAL || errno == EBADF;
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
