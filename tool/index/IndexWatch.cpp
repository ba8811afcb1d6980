#include "tool/index/IndexWatch.h"

#include "tool/index/EndOfWork.h"
#include "tool/index/FolderWatch.h"
#include "tool/shared/output/Failure.h"

#include <algorithm>
#include <set>

namespace {

using WatchClock = std::chrono::steady_clock;

// Where nothing is announced, everything is looked at again: after a time that is long beside what that takes.
constexpr std::chrono::milliseconds kShortestRest{5'000}, kLongestRest{600'000}, kLookForSignal{200};
constexpr int kRestPerWork = 20;

class IndexWatching {
public:
    IndexWatching(Library& library, LibraryUpdate update, const std::function<void(const LibraryChanges&)>& told)
        : library_(library),
          update_(std::move(update)),
          told_(told),
          watch_(library.path())
    {
        update_.opened = [this](const FolderListing& folder) { watch_.add(folder); };
        // What was told, and is still so, is not told again.
        update_.tell = [this, tell = update_.tell](const std::string& path, const std::string& problem) {
            problems_.insert(path + "\n" + problem);
            if (!problemsBefore_.contains(path + "\n" + problem))
                tell(path, problem);
        };
    }

    bool run()
    {
        lookAtAll(true);
        while (!EndOfWork::isAsked()) {
            const auto changes = watch_.wait(kLookForSignal);
            const bool missesSome = watch_.missesSome() || !problemsBefore_.empty();
            if (changes.areUnknown || (missesSome && WatchClock::now() >= nextLook_))
                lookAtAll(false);
            else if (!changes.folders.empty())
                updateWith(changes.folders, false);
        }
        return isGood_;
    }

private:
    void lookAtAll(bool isFirst)
    {
        const auto start = WatchClock::now();
        updateWith({}, isFirst);
        problemsBefore_ = std::exchange(problems_, {});
        const auto took = std::chrono::duration_cast<std::chrono::milliseconds>(WatchClock::now() - start);
        nextLook_ = WatchClock::now() + std::clamp(took * kRestPerWork, kShortestRest, kLongestRest);
        if (watch_.takeLimitReached())
            reportFailure(library_.path(),
                          "the system watches no more folders (fs.inotify.max_user_watches); those left "
                          "are looked at now and then");
    }
    void updateWith(const std::vector<ChangedFolder>& folders, bool isFirst)
    {
        update_.changed = folders;
        const LibraryChanges changes = updateLibrary(library_, update_);
        isGood_ = isGood_ && changes.problems == 0;
        if (isFirst || !changes.areNone())
            told_(changes);
    }

    Library& library_;
    LibraryUpdate update_;
    const std::function<void(const LibraryChanges&)>& told_;
    FolderWatch watch_;
    WatchClock::time_point nextLook_;
    std::set<std::string> problemsBefore_, problems_; // of the last look at everything, and since
    bool isGood_ = true;
};

} // namespace

bool watchIndex(Library& library, LibraryUpdate update, const std::function<void(const LibraryChanges&)>& told)
{
    return IndexWatching(library, std::move(update), told).run();
}
