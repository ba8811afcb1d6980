#include "tool/shared/arguments/ThreadsOption.h"

#include "tool/shared/arguments/Verb.h"

#include <algorithm>
#include <thread>

namespace {

constexpr unsigned kMostThreads = 256;

} // namespace

void addThreads(Verb& verb, unsigned& threads)
{
    verb.addNumber("-j,--threads", threads, {1, kMostThreads},
                   "How many files are worked on at once; else one per core");
}

unsigned threadsFor(unsigned asked)
{
    return std::clamp(asked != 0 ? asked : std::thread::hardware_concurrency(), 1U, kMostThreads);
}
