#include "tool/index/IndexRecords.h"

#include "tool/shared/indexing/ReadingPool.h"
#include "tool/shared/indexing/UpdateStarts.h"
#include "tool/shared/library/IndexedName.h"
#include "tool/shared/library/LibraryRecordJson.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/FilesProgress.h"
#include "tool/shared/output/JsonRecords.h"

namespace {

constexpr std::size_t kMostUnwritten = 2'000; // files that wait to be read, or to be written
constexpr unsigned kRecordWalkers = 2;
constexpr std::chrono::milliseconds kPause{20};

class RecordsRun {
public:
    RecordsRun(const LibraryUpdate& update, const OutputOptions& options)
        : update_(update),
          json_(options),
          pool_(inbox_, update.reading, update.threads)
    {
    }
    ~RecordsRun() { inbox_.close(); }

    bool run()
    {
        const UpdateStarts starts = updateStarts(update_.folders);
        for (const std::string& path : starts.absent)
            fail(path.substr(0, path.size() - 1), SystemErrorText(ENOENT));
        for (const std::string& root : starts.roots) {
            writeLibraryRoot(json_.begin(), {root, {}});
            json_.end();
        }
        walk_.emplace(inbox_, starts.walks, kRecordWalkers);
        try {
            gather();
        } catch (const Failure&) { // for want of memory: what was written stays whole
            json_.finish();
            throw;
        }
        json_.finish();
        return isGood_;
    }

private:
    void gather()
    {
        for (bool isWalkOver = false; !isWalkOver || pool_.pending() > 0;) {
            UpdateInbox::Contents found =
                inbox_.take(pool_.pending() < kMostUnwritten, std::chrono::steady_clock::now() + kPause);
            isWalkOver = isWalkOver || found.isWalkOver;
            for (FolderListing& listing : found.listings)
                give(std::move(listing));
            pool_.took(found.readings.size());
            for (const FileReading& reading : found.readings)
                take(reading);
            pool_.adjust();
            if (update_.progress != nullptr && isWalkOver)
                update_.progress->setTotal(listed_);
            if (Output::standard().failed() || (update_.isEnded && update_.isEnded()))
                return;
        }
    }

    void give(FolderListing found)
    {
        if (found.error != 0 && (found.isRoot || !found.isGone))
            fail(found.path, SystemErrorText(found.error));
        for (const std::string& name : found.missing)
            fail(found.path + name, SystemErrorText(ENOENT));
        const auto folder = std::make_shared<const FolderListing>(std::move(found));
        for (std::size_t i = 0; i < folder->files.size(); ++i)
            if (update_.shard.holds(folder->below(nameOfIndexed(folder->files[i].text)))) {
                ++listed_;
                pool_.give({folder, i, false});
            }
    }

    void take(const FileReading& reading)
    {
        if (update_.progress != nullptr) {
            update_.progress->begin(reading.job.folder->path + reading.job.listed().text);
            update_.progress->advance(1);
        }
        if (!reading.record)
            return;
        if (reading.record->state == "unreadable")
            tell(reading.record->place.path(),
                 reading.record->problems.empty() ? "cannot be read" : reading.record->problems.front().text);
        writeLibraryRecord(json_.begin(), *reading.record);
        json_.end();
    }

    /// What has a record.
    void tell(const std::string& path, const std::string& problem)
    {
        isGood_ = false;
        if (update_.tell)
            update_.tell(path, problem);
    }

    /// What has none.
    void fail(const std::string& path, const std::string& problem)
    {
        json_.addFailure(path, problem);
        tell(path, problem);
    }

    const LibraryUpdate& update_;
    JsonRecords json_;
    bool isGood_ = true;
    std::int64_t listed_ = 0;
    UpdateInbox inbox_;
    ReadingPool pool_;
    std::optional<LibraryWalk> walk_; // last: it ends before what it leaves its listings in
};

} // namespace

bool writeIndexRecords(LibraryUpdate update, OutputOptions options)
{
    FilesProgress progress("reading", options.quiet);
    update.progress = &progress;
    if (!options.wantsJson())
        options.json = JsonShape::lines;
    return RecordsRun(update, options).run();
}
