#include "files/CTemporaryFile.h"

#include "platform/FileLock.h"
#include "platform/SignalHold.h"

#include <algorithm>
#include <array>
#include <atomic>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <string_view>

using platform::FileLockResult;
using platform::FileStatus;
using platform::OwnedDescriptor;
using platform::SignalHold;
using platform::systemCalls;
using Kind = FileProblem::Kind;

namespace {

constexpr std::size_t kLongestName = 255; // of a component of a path, in bytes

// Names to remove when a signal ends the process. Plain memory, because a signal handler may use nothing else.
struct Slot {
    enum State : int { free, beingFilled, used };
    std::atomic<int> state = free;
    int folder = -1;
    char name[kLongestName + 1] = {};
};
static_assert(std::atomic<int>::is_always_lock_free);
std::array<Slot, 16> slots;

// Called for a file that is still empty, with signals held.
int takeSlot(int folder, const std::string& name)
{
    for (std::size_t i = 0; i < slots.size(); ++i) {
        Slot& slot = slots[i];
        int expected = Slot::free;
        if (!slot.state.compare_exchange_strong(expected, Slot::beingFilled))
            continue;
        slot.folder = folder;
        std::memcpy(slot.name, name.c_str(), name.size() + 1);
        slot.state = Slot::used;
        return static_cast<int>(i);
    }
    return -1;
}

constexpr int kMostNames = 100;
// More than one edit takes at a time, so nearly every leftover has one of these.
constexpr int kFirstNames = 4;

// Names of all temporary files for a target follow one rule, so leftovers are found without listing the folder. A long
// name is cut to make room for the rest, between two characters, because the library opens only names in UTF-8.
std::string temporaryName(const std::string& target, int number)
{
    constexpr std::size_t kRoom = kLongestName - std::string_view("..ktfiles-99").size();
    std::size_t length = std::min(target.size(), kRoom);
    while (length < target.size() && length > 0 && (static_cast<unsigned char>(target[length]) & 0xC0) == 0x80)
        --length;
    return "." + target.substr(0, length) + ".ktfiles-" + std::to_string(number);
}

bool statusOf(int folder, const std::string& name, FileStatus& status)
{
    return systemCalls().statusIn(folder, name.c_str(), &status);
}

// Removes the file only if nobody holds its lock, because its process is then gone. The name is checked again under the
// lock, since it may have passed to another file before.
void removeIfAbandoned(int folder, const std::string& name)
{
    FileStatus named, opened;
    if (!statusOf(folder, name, named) || named.kind != platform::FileKind::file)
        return;
    const OwnedDescriptor file(systemCalls().openFileIn(folder, name.c_str()));
    if (file && platform::tryToLockFile(file.get()) == FileLockResult::locked &&
        systemCalls().status(file.get(), &opened) && statusOf(folder, name, named) && opened.isSameItem(named))
        systemCalls().removeFileIn(folder, name.c_str());
}

} // namespace

FileProblem CTemporaryFile::Create(const std::string& target)
{
    const std::filesystem::path path(target);
    targetName_ = path.filename().string();
    folder_ = OwnedDescriptor(systemCalls().openFolder(path.has_parent_path() ? path.parent_path().c_str() : "."));
    if (!folder_)
        return FileProblem::ofSystem(Kind::folder);
    for (int number = 0; number < kFirstNames; ++number)
        removeIfAbandoned(folder_.get(), temporaryName(targetName_, number));
    FileProblem problem;
    for (int number = 0; number < kMostNames && !problem; ++number)
        if (createAs(temporaryName(targetName_, number), problem))
            return {};
    return problem ? problem : FileProblem{Kind::noFreeName};
}

bool CTemporaryFile::createAs(const std::string& name, FileProblem& problem)
{
    const SignalHold hold;
    OwnedDescriptor file(systemCalls().createFileIn(folder_.get(), name.c_str(), 0600));
    if (!file && errno == EEXIST) {
        removeIfAbandoned(folder_.get(), name); // so that the next edit may take it
        return false;
    }
    if (!file) {
        problem = FileProblem::ofSystem(Kind::creation);
        return false;
    }
    FileStatus status;
    // Another process may have locked the new file first, taking it for an abandoned one.
    if (platform::tryToLockFile(file.get()) == FileLockResult::busy || !systemCalls().status(file.get(), &status) ||
        status.links == 0)
        return false;
    descriptor_ = std::move(file);
    name_ = name;
    slot_ = takeSlot(folder_.get(), name);
    return true;
}

CTemporaryFile::~CTemporaryFile()
{
    const SignalHold hold;
    if (!name_.empty() && requireItsName().kind != Kind::givenAway)
        systemCalls().removeFileIn(folder_.get(), name_.c_str());
    forget();
}

void CTemporaryFile::forget()
{
    if (slot_ >= 0)
        slots[static_cast<std::size_t>(slot_)].state = Slot::free;
    slot_ = -1;
    name_.clear();
}

void CTemporaryFile::RemoveAllFromSignalHandler()
{
    for (const Slot& slot : slots)
        if (slot.state == Slot::used)
            systemCalls().removeFileIn(slot.folder, slot.name);
}

bool CTemporaryFile::TargetIs(const FileStatus& status) const
{
    FileStatus named;
    return statusOf(folder_.get(), targetName_, named) && named.isSameItem(status);
}

FileProblem CTemporaryFile::Commit() const
{
    return systemCalls().fsync(descriptor_.get()) == 0 ? FileProblem() : FileProblem::ofSystem();
}

// In a folder that others may write to, the name may have passed to another file.
FileProblem CTemporaryFile::requireItsName() const
{
    FileStatus named, own;
    if (!systemCalls().status(descriptor_.get(), &own))
        return FileProblem::ofSystem();
    if (!statusOf(folder_.get(), name_, named) || !named.isSameItem(own))
        return {Kind::givenAway};
    return {};
}

FileProblem CTemporaryFile::Replace()
{
    const SignalHold hold;
    if (FileProblem problem = requireItsName())
        return problem;
    if (systemCalls().renameIn(folder_.get(), name_.c_str(), targetName_.c_str()) != 0)
        return FileProblem::ofSystem();
    forget();
    return {};
}

FileProblem CTemporaryFile::Publish(const std::string& name)
{
    const SignalHold hold;
    if (FileProblem problem = requireItsName())
        return problem;
    const std::string last = std::filesystem::path(name).filename().string();
    if (systemCalls().renameInWithoutReplacing(folder_.get(), name_.c_str(), last.c_str()) != 0)
        return FileProblem::ofSystem();
    forget();
    return {};
}

// File systems that cannot commit folders keep their own promises.
FileProblem CTemporaryFile::CommitFolder() const
{
    if (systemCalls().fsync(folder_.get()) == 0 || errno == EINVAL || errno == EBADF)
        return {};
    return FileProblem::ofSystem(Kind::uncommitted);
}
