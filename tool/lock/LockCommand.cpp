// ktfiles lock: keeps others away from a file while a command runs, or until the end of the input.
#include "coordination/KTFileCoordinationLock.h"
#include "coordination/KTFilePresenterLock.h"
#include "platform/Log.h"
#include "platform/OwnedDescriptor.h"
#include "tool/lock/ChildProcess.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/access/Parties.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/arguments/TimeoutOption.h"
#include "tool/shared/input/FileLocation.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/ShownName.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <chrono>
#include <fcntl.h>
#include <future>
#include <mutex>
#include <optional>
#include <unistd.h>

namespace {

using Clock = std::chrono::steady_clock;
using Seconds = std::chrono::duration<double>;

struct LockArguments {
    std::string file;
    std::vector<std::string> command;
    bool read = false, write = false, presenter = false;
    std::optional<double> timeout; // seconds

    bool isWriting() const { return !read; } // acquiring a presenter lock is a coordinated write
    const char* kind() const { return read ? "read" : presenter ? "presenter" : "write"; }
};

/// Captures the reason for a refused lock, which the library tells to the log only.
class RefusalLog {
public:
    RefusalLog() { platform::setLogHandler(keep); }
    ~RefusalLog() { platform::setLogHandler(nullptr); }
    RefusalLog(const RefusalLog&) = delete;
    RefusalLog& operator=(const RefusalLog&) = delete;

    static std::string last()
    {
        const std::lock_guard guard(mutex());
        return line();
    }

private:
    static void keep(const char* text)
    {
        const std::lock_guard guard(mutex());
        line() = text;
    }
    // Never destroyed: a thread of the library may log while the process exits.
    static std::mutex& mutex()
    {
        static auto& object = *new std::mutex;
        return object;
    }
    static std::string& line()
    {
        static auto& object = *new std::string;
        return object;
    }
};

/// The only holder of a lock that is in no table; releases it on destruction.
class Holder {
public:
    Holder(const LockArguments& arguments, const platform::URLRef& url)
    {
        if (arguments.presenter)
            retain(KTFilePresenterLock::initLockWithType(KTFilePresenterLock::LockType::readersAndWriters, url));
        else if (arguments.read)
            retain(KTFileCoordinationLock::initLockForReadingAtURL(url));
        else
            retain(KTFileCoordinationLock::initLockForWritingAtURL(url));
    }
    ~Holder() { lock_->resetLock(); }
    Holder(const Holder&) = delete;
    Holder& operator=(const Holder&) = delete;

    bool isHadBy(Clock::time_point time) const { return held_.wait_until(time) == std::future_status::ready; }
    /// Waits without limit; throws Failure if the system refuses.
    void await()
    {
        try {
            held_.get();
        } catch (const std::future_error&) {
            throw Failure("it cannot be locked: " + RefusalLog::last());
        }
    }

private:
    template <class Lock>
    void retain(std::shared_ptr<Lock> lock)
    {
        // A lock that fails drops the handler and the promise with it.
        const auto promise = std::make_shared<std::promise<void>>();
        held_ = promise->get_future();
        lock_ = lock;
        lock->retainLockWithFinishedHandler([promise] { promise->set_value(); });
    }

    const RefusalLog log_;
    std::shared_ptr<KTFileLock> lock_;
    std::future<void> held_;
};

void awaitLock(Holder& holder, const LockArguments& arguments, const platform::URLRef& url, bool quiet)
{
    const auto start = Clock::now();
    const auto end =
        arguments.timeout
            ? start + std::chrono::duration_cast<Clock::duration>(Seconds(std::max(*arguments.timeout, kShortestWait)))
            : Clock::time_point::max();
    const auto notice = start + std::chrono::seconds(1);
    const platform::CoordinatedItem item(url);
    if (!quiet && notice < end && !holder.isHadBy(notice))
        printWaiting(arguments.file, blockersText(item, arguments.isWriting()));
    if (arguments.timeout && !holder.isHadBy(end))
        throw Failure(stillInUseText(blockersText(item, arguments.isWriting()), *arguments.timeout) +
                      "; nothing was run");
    holder.await();
}

void sayHeld(const LockArguments& arguments, const OutputOptions& options)
{
    Output& output = Output::standard();
    switch (outputForm(options)) {
    case Form::json:
        writeRecord(options, [&](JsonWriter& json) {
            json.beginObject().member("path", shownName(arguments.file)).member("lock", arguments.kind());
            json.member("held", true).endObject();
        });
        break;
    case Form::table:
        output.print("{}: {} lock held; end of input{} releases it\n", printable(shownName(arguments.file)),
                     arguments.kind(), isTerminal(STDIN_FILENO) ? " (Ctrl-D)" : "");
        break;
    case Form::lines:
        output.print("{}\t{}\theld\n", printable(shownName(arguments.file)), arguments.kind());
        break;
    case Form::csv: // this verb has no CSV
    case Form::none:
        break;
    }
    output.flush();
}

void awaitEndOfInput()
{
    std::array<char, 4096> dropped;
    ssize_t got = 0;
    do
        got = ::read(STDIN_FILENO, dropped.data(), dropped.size());
    while (got > 0 || (got < 0 && errno == EINTR));
}

/// Returns the exit status.
int lockAndRun(const LockArguments& arguments, const OutputOptions& options)
{
    const platform::URLRef url = fileLocation(arguments.file);
    // Refused rather than taken for held: two commands below that lock, each with a lock of its own, would not exclude
    // each other. Reading is refused too, since a writer that waits in between would block the lock that it waits for.
    if (const auto lock = lockAbove(url))
        throw Failure(fmt::format("is locked by process {} already, which waits for this command; nothing was run",
                                  lock->processID));
    // Nothing is read from it: `ktfiles locks` knows items by number only, and finds this one's name here.
    const platform::OwnedDescriptor shown(::open(arguments.file.c_str(), O_PATH | O_CLOEXEC));
    Holder holder(arguments, url);
    awaitLock(holder, arguments, url, options.quiet);
    if (!arguments.command.empty()) {
        announceLock();
        return runChild(arguments.command);
    }
    sayHeld(arguments, options);
    awaitEndOfInput();
    return kExitOK;
}

bool runLock(LockArguments& arguments, CommandLine& commandLine)
{
    if (arguments.read + arguments.write + arguments.presenter > 1)
        throw UsageError("--read, --write and --presenter exclude each other");
    int status = kExitFailed;
    reportingRecord(arguments.file, commandLine.output(),
                    [&] { status = lockAndRun(arguments, commandLine.output()); });
    commandLine.setFailureStatus(status);
    return status == kExitOK;
}

void declareLock(CommandLine& commandLine)
{
    static LockArguments arguments;
    Verb& verb =
        commandLine.addVerb("lock", "Hold others back from a file while a command runs, or until the end of input",
                            [&commandLine] { return runLock(arguments, commandLine); });
    CommandLine::addFile(verb, arguments.file).required().describe("The file, which need not exist");
    verb.addWords("COMMAND", arguments.command, "The command and its arguments, after --");
    verb.addFlag("--read", arguments.read, "Let others read, and hold writers back");
    verb.addFlag("--write", arguments.write, "Hold readers and writers back; so it is without an option");
    verb.addFlag("--presenter", arguments.presenter, "The same as a program that keeps the file open, and is asked");
    addTimeout(verb, arguments.timeout, "Give up after that long: exit status 1, nothing is run");
    verb.setFooter(
        "Exit status: the command's, 128 + N when signal N ended it, 127 when there is no such command, 126\n"
        "when it cannot be run; 1 when the lock was not had, and 2 for a mistake on the command line.");
}

const VerbRegistration lockRegistration{70, "lock", declareLock};

} // namespace
