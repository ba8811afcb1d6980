#include "Parties.h"

#include "Terminal.h"

#include <fmt/format.h>

#include <cstdio>
#include <fstream>
#include <map>
#include <set>
#include <unistd.h>
#include <vector>

namespace {

// Readers let each other in, and a presenter holds back whom it is asked for.
bool isInTheWay(const platform::CoordinationParty& party, bool isWriting)
{
    using Role = platform::CoordinationParty::Role;
    if (party.processID == ::getpid() || party.role == Role::waits)
        return false;
    return party.role == Role::presents ? party.isWriting == isWriting : party.isWriting || isWriting;
}

/// The process that started this one; 0 when the process is gone.
int parentOf(int processID)
{
    std::ifstream file(fmt::format("/proc/{}/stat", processID));
    std::string text;
    std::getline(file, text);
    const std::size_t name = text.rfind(')'); // which may hold anything
    int parent = 0;
    char state = 0;
    return name != std::string::npos && std::sscanf(text.c_str() + name + 1, " %c %d", &state, &parent) == 2 ? parent
                                                                                                             : 0;
}

/// Processes above this one that run this command. The only verb of it that runs others is `lock`.
const std::set<int>& locksAbove()
{
    static const std::set<int> found = [] {
        std::set<int> processes;
        const std::string name = processName(::getpid());
        for (int process = ::getppid(); process > 1; process = parentOf(process))
            if (processName(process) == name)
                processes.insert(process);
        return processes;
    }();
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
    std::map<int, std::string> blockers; // each process once
    for (const platform::CoordinationParty& party : platform::coordinationParties(item))
        if (isInTheWay(party, isWriting))
            blockers[party.processID] =
                fmt::format("{} ({})", party.processID, printable(processName(party.processID)));
    if (blockers.empty())
        return "another process";
    std::string text = blockers.size() == 1 ? "process " : "processes ";
    for (std::size_t number = 0; const auto& [id, words] : blockers) {
        text += number == 0 ? "" : number + 1 == blockers.size() ? " and " : ", ";
        text += words;
        ++number;
    }
    return text;
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
