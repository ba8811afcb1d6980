#include "tool/shared/edits/EndingSignals.h"

#include "files/CTemporaryFile.h"
#include "platform/SignalHold.h"
#include "tool/shared/output/ProgressLine.h"

#include <algorithm>
#include <array>
#include <atomic>
#include <csignal>
#include <ctime>
#include <mutex>
#include <unistd.h>

namespace {

std::atomic<bool> isEnding = false;
std::atomic<int> beingMade = 0; // temporary files that other threads are making

// Two buffers are written in turn, so that the handler always finds a complete one.
struct LastWords {
    std::array<char, 4096> text;
    std::size_t size = 0;
};
std::array<LastWords, 2> lastWords;
std::atomic<const LastWords*> wordsToSay = nullptr;
static_assert(std::atomic<const LastWords*>::is_always_lock_free);
static_assert(std::atomic<int>::is_always_lock_free && std::atomic<bool>::is_always_lock_free);

// Gives up after half a second: a disk that slow will not keep the file either.
void awaitThoseBeingMade()
{
    constexpr timespec moment{0, 1'000'000};
    isEnding = true;
    for (int i = 0; i < 500 && beingMade > 0; ++i)
        ::nanosleep(&moment, nullptr);
}

extern "C" void removeTemporaryFiles(int signal)
{
    progressline::clearFromSignalHandler();
    awaitThoseBeingMade();
    CTemporaryFile::RemoveAllFromSignalHandler();
    if (const LastWords* const words = wordsToSay) [[maybe_unused]]
        const ssize_t written = ::write(STDERR_FILENO, words->text.data(), words->size);
    ::signal(signal, SIG_DFL);
    ::raise(signal);
}

} // namespace

void removeTemporaryFilesAtEndingSignals()
{
    static std::once_flag installed;
    std::call_once(installed, [] {
        for (const int signal : platform::endingSignals()) {
            struct sigaction action = {};
            ::sigaction(signal, nullptr, &action);
            if (action.sa_handler != SIG_DFL) // ignored on purpose, as by nohup
                continue;
            action.sa_handler = removeTemporaryFiles;
            ::sigaction(signal, &action, nullptr);
        }
    });
}

void sayAtEndingSignals(const std::string& text)
{
    LastWords& words = lastWords[wordsToSay == lastWords.data() ? 1 : 0];
    words.size = std::min(text.size(), words.text.size());
    std::copy_n(text.data(), words.size, words.text.data());
    wordsToSay = text.empty() ? nullptr : &words;
}

BeforeTheEnd::BeforeTheEnd()
{
    ++beingMade;
    if (!isEnding)
        return;
    --beingMade;
    for (;;)
        ::pause();
}

BeforeTheEnd::~BeforeTheEnd()
{
    --beingMade;
}
