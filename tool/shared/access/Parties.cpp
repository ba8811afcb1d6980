#include "tool/shared/access/Parties.h"

#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <map>
#include <set>
#include <sstream>
#include <sys/stat.h>
#include <unistd.h>
#include <vector>

namespace {

// Readers let each other pass, and a presenter delays those that must ask it.
bool isInTheWay(const platform::CoordinationParty& party, bool isWriting)
{
    using Role = platform::CoordinationParty::Role;
    if (party.processID == ::getpid() || party.role == Role::waits)
        return false;
    return party.role == Role::presents ? party.isWriting == isWriting : party.isWriting || isWriting;
}

/// The process that started this one; 0 if that is gone.
int parentOf(int processID)
{
    std::ifstream file(fmt::format("/proc/{}/stat", processID));
    std::string text;
    std::getline(file, text);
    const std::size_t name = text.rfind(')'); // the name may contain anything
    int parent = 0;
    char state = 0;
    return name != std::string::npos && std::sscanf(text.c_str() + name + 1, " %c %d", &state, &parent) == 2 ? parent
                                                                                                             : 0;
}

// "12:34:", the processes that wait for a command run in this environment.
constexpr const char* kLocksVariable = "KTFILES_LOCKS";

/// Whether a process runs the same program file as this one.
bool isSameProgram(int processID)
{
    struct stat own = {}, other = {};
    return ::stat("/proc/self/exe", &own) == 0 && ::stat(fmt::format("/proc/{}/exe", processID).c_str(), &other) == 0 &&
           own.st_dev == other.st_dev && own.st_ino == other.st_ino;
}

/// Ancestors of this process that run this command. Only its verb `lock` runs other commands, and it announces itself
/// in the environment, which also works for another copy or version of the command. If the environment was cleared on
/// the way, the ancestor's program file shows it.
const std::set<int>& locksAbove()
{
    static const std::set<int> found = [] {
        std::set<int> announced;
        const char* const variable = std::getenv(kLocksVariable);
        std::istringstream words(variable != nullptr ? variable : "");
        for (std::string word; std::getline(words, word, ':');)
            announced.insert(std::atoi(word.c_str()));
        std::set<int> processes;
        for (int process = ::getppid(); process > 1; process = parentOf(process))
            if (announced.contains(process) || isSameProgram(process))
                processes.insert(process);
        return processes;
    }();
    return found;
}

using Processes = std::map<int, std::string>; // each process once, with a description

void addTo(Processes& processes, int id)
{
    processes.try_emplace(id, fmt::format("{} ({})", id, printable(processName(id))));
}

std::string wordsFor(const Processes& processes)
{
    if (processes.empty())
        return "another process";
    std::string text = processes.size() == 1 ? "process " : "processes ";
    for (std::size_t number = 0; const auto& [id, words] : processes) {
        text += number == 0 ? "" : number + 1 == processes.size() ? " and " : ", ";
        text += words;
        ++number;
    }
    return text;
}

enum class FileLockKind { none, read, write };

/// Parses "lock:   1: POSIX  ADVISORY  READ 17 fe:01:1234 0 EOF"; OFDLCK stands for a lock of the open file. These two
/// kinds exclude each other.
FileLockKind lockIn(const std::filesystem::path& descriptorInformation)
{
    FileLockKind found = FileLockKind::none;
    std::ifstream file(descriptorInformation);
    for (std::string line; std::getline(file, line);) {
        std::istringstream words(line);
        std::string label, number, kind, advisory, access;
        if (words >> label >> number >> kind >> advisory >> access && label == "lock:" &&
            (kind == "POSIX" || kind == "OFDLCK"))
            found = access == "WRITE" ? FileLockKind::write : std::max(found, FileLockKind::read);
    }
    return found;
}

struct OpenFile {
    int processID;
    std::filesystem::path descriptorInformation;
};

/// Descriptors of the file in other processes that this one may examine.
std::vector<OpenFile> othersWith(int descriptor)
{
    // Cached attributes are enough: a server that does not respond must not be waited for here.
    constexpr int kAsKnown = AT_STATX_DONT_SYNC | AT_NO_AUTOMOUNT;
    std::vector<OpenFile> found;
    struct statx wanted = {};
    if (::statx(descriptor, "", AT_EMPTY_PATH | kAsKnown, STATX_INO, &wanted) != 0)
        return found;
    std::error_code ignored; // processes may end meanwhile
    for (const auto& process : std::filesystem::directory_iterator("/proc", ignored)) {
        const int id = std::atoi(process.path().filename().c_str());
        if (id <= 0 || id == ::getpid())
            continue;
        std::error_code notOurs;
        for (std::filesystem::directory_iterator one(process.path() / "fd", notOurs), end; !notOurs && one != end;
             one.increment(notOurs)) {
            struct statx open = {};
            if (::statx(AT_FDCWD, one->path().c_str(), kAsKnown, STATX_INO, &open) == 0 &&
                open.stx_ino == wanted.stx_ino && open.stx_dev_major == wanted.stx_dev_major &&
                open.stx_dev_minor == wanted.stx_dev_minor)
                found.push_back({id, process.path() / "fdinfo" / one->path().filename()});
        }
    }
    return found;
}

} // namespace

std::string processName(int processID)
{
    std::ifstream file(fmt::format("/proc/{}/comm", processID));
    std::string name;
    std::getline(file, name);
    return name;
}

std::string blockersText(const platform::CoordinatedItem& item, bool isWriting)
{
    Processes blockers;
    for (const platform::CoordinationParty& party : platform::coordinationParties(item))
        if (isInTheWay(party, isWriting))
            addTo(blockers, party.processID);
    return wordsFor(blockers);
}

std::string lockersText(int descriptor)
{
    Processes lockers;
    FileLockKind kind = FileLockKind::none;
    for (const OpenFile& open : othersWith(descriptor))
        if (const FileLockKind one = lockIn(open.descriptorInformation); one != FileLockKind::none) {
            addTo(lockers, open.processID);
            kind = std::max(kind, one);
        }
    const char* const verb = lockers.size() > 1 ? "have" : "has";
    return fmt::format("{}, which {} locked it{}", wordsFor(lockers), verb,
                       kind == FileLockKind::read ? " for reading" : "");
}

void announceLock()
{
    const char* const before = std::getenv(kLocksVariable);
    ::setenv(kLocksVariable, fmt::format("{}{}:", before != nullptr ? before : "", ::getpid()).c_str(), 1);
}

std::optional<platform::CoordinationParty> lockAbove(const platform::CoordinatedItem& item)
{
    using Role = platform::CoordinationParty::Role;
    std::optional<platform::CoordinationParty> found;
    if (locksAbove().empty())
        return found;
    for (const platform::CoordinationParty& party : platform::coordinationParties(item))
        if (party.role != Role::waits && locksAbove().contains(party.processID) && !(found && found->isWriting))
            found = party;
    return found;
}
