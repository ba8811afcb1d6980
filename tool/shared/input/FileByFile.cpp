#include "tool/shared/input/FileByFile.h"

#include "tool/shared/arguments/ThreadsOption.h"
#include "tool/shared/input/FolderWalk.h"
#include "tool/shared/output/FilesProgress.h"
#include "tool/shared/threads/OrderedWork.h"

#include <algorithm>
#include <exception>
#include <unistd.h>

namespace {

constexpr std::size_t kFilesPerThread = 64; // waiting, or with results waiting

/// False if no more is wanted.
using Visit = std::function<bool(FoundFile file)>;
/// Visits all files; may be called twice.
using Walk = std::function<void(const Visit& visit)>;

/// The result of the first half of the work.
struct Answer {
    FoundFile file;
    FileRest rest;
    std::exception_ptr problem;
    double parts = 0; // of the work already reported to progress
};

class FileWork {
public:
    FileWork(const FileLoop& loop, const FileStart& start, const FileFailure& fail)
        : loop_(loop),
          start_(start),
          fail_(fail),
          progress_(loop.doing, loop.quiet)
    {
    }

    void run(const Walk& walk, bool maybeSeveral)
    {
        std::jthread counter;
        if (maybeSeveral && progress_.isActive())
            counter = startedThread([this, &walk](const std::stop_token& stop) { count(walk, stop); });
        else if (!maybeSeveral)
            progress_.setTotal(1);
        const unsigned threads = maybeSeveral ? threadsFor(loop_.threads) : 1;
        if (threads == 1 || !runByThreads(walk, threads))
            walk([this](FoundFile file) { return take(answerFor(file)); });
    }
    void fail(const std::string& path, const std::string& text)
    {
        note(path, text);
        Output::standard().flush(); // so that earlier output comes first
        reportFailure(path, text);
    }
    /// Reports that there was nothing: no file to work on and none that failed.
    void tellIfNone(const std::string& folder) const
    {
        if (!hasAny_ && !loop_.quiet && !Output::standard().failed())
            reportFailure(folder, "no file for this verb is there");
    }
    bool isGood() const { return isGood_; }

private:
    /// False if no thread could be started.
    bool runByThreads(const Walk& walk, unsigned threads)
    {
        OrderedWork<FoundFile, Answer> work(threads, std::size_t{threads} * kFilesPerThread,
                                            [this](const FoundFile& file) { return answerFor(file); });
        const std::jthread walker = startedThread([&] {
            try {
                walk([&](FoundFile file) { return work.give(std::move(file)); });
                work.close();
            } catch (...) {
                work.fail(std::current_exception());
            }
        });
        if (!walker.joinable())
            return false;
        // Declared so as to run before the wait for the walker, even if memory is short.
        struct Stopping {
            decltype(work)& stopped;
            ~Stopping() { stopped.stop(); }
        } const stopping{work};
        while (auto answer = work.take())
            if (!take(std::move(*answer)))
                break;
        return true;
    }
    void count(const Walk& walk, const std::stop_token& stop)
    {
        std::int64_t files = 0;
        try {
            walk([&](const FoundFile&) {
                ++files;
                return !stop.stop_requested();
            });
        } catch (const std::exception&) { // the work meets it too, and tells
            return;
        }
        if (!stop.stop_requested())
            progress_.setTotal(files);
    }
    Answer answerFor(const FoundFile& file)
    {
        progress_.begin(file.path);
        Answer answer{file, {}, {}};
        try {
            if (!file.problem.empty())
                throw Failure(file.problem);
            answer.rest = start_(file);
        } catch (...) {
            answer.problem = std::current_exception();
        }
        answer.parts = FilesProgress::takeParts();
        return answer;
    }
    bool take(Answer answer)
    {
        const std::string& path = answer.file.path;
        try {
            if (answer.problem)
                std::rethrow_exception(answer.problem);
            answer.rest();
            hasAny_ = true;
        } catch (const ToldFailure& failure) {
            note(path, failure.what());
        } catch (const Failure& failure) {
            if (!isPassedOver(answer.file, failure))
                fail(path, failure.what());
        }
        if (sharesTerminal_)
            Output::standard().flush(); // before the next line of progress
        progress_.advance(1, answer.parts + FilesProgress::takeParts());
        return !Output::standard().failed();
    }
    void note(const std::string& path, const std::string& text)
    {
        isGood_ = false;
        hasAny_ = true;
        fail_(path, text);
    }

    const FileLoop& loop_;
    const FileStart& start_;
    const FileFailure& fail_;
    FilesProgress progress_;
    bool sharesTerminal_ = progress_.isActive() && isTerminal(STDOUT_FILENO);
    bool hasAny_ = false;
    bool isGood_ = true;
};

} // namespace

bool forEachFile(const FileArguments& files, const FileLoop& loop, const FileStart& start, const FileFailure& fail)
{
    FileWork work(loop, start, fail);
    std::vector<std::string> names;
    try {
        names = allNames(files);
    } catch (const Failure& failure) {
        work.fail(files.listName(), failure.what());
        return false;
    }
    const auto walk = [&](const Visit& visit) {
        if (files.takesFolders)
            FolderWalk(names, visit).run();
        else
            std::ranges::all_of(names, [&](const std::string& name) { return visit({name, {}}); });
    };
    work.run(walk, files.maybeSeveral());
    work.tellIfNone(names.front());
    return work.isGood();
}

bool forEachFile(const FoundFiles& found, const FileLoop& loop, const FileStart& start, const FileFailure& fail)
{
    FileWork work(loop, start, fail);
    const auto walk = [&](const Visit& visit) {
        std::ranges::all_of(found.files, [&](const FoundFile& file) { return visit(file); });
    };
    work.run(walk, found.files.size() > 1);
    work.tellIfNone(found.name);
    return work.isGood();
}
