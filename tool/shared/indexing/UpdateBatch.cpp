#include "tool/shared/indexing/UpdateBatch.h"

#include "tool/shared/library/IndexedName.h"

#include <ctime>
#include <span>

namespace {

constexpr std::size_t kMostInBatch = 2'000;
constexpr std::chrono::milliseconds kLongestUnwritten{500};

} // namespace

UpdateBatch::UpdateBatch(Library& library, LibraryChanges& changes)
    : library_(library),
      changes_(changes),
      writer_(library),
      seen_(library.database(),
            "SELECT size, modified, changed, inode, file IS NOT NULL FROM seen WHERE folder = ? AND name = ?")
{
}

void UpdateBatch::noteWork()
{
    using Clock = std::chrono::steady_clock;
    if (readings_.size() + moves_.size() >= kMostInBatch)
        due_ = Clock::time_point::min();
    else if (due_ == Clock::time_point::max())
        due_ = Clock::now() + kLongestUnwritten;
}

void UpdateBatch::addRoots(const std::vector<std::string>& paths)
{
    if (paths.empty())
        return;
    SQLTransaction transaction(library_.database());
    writer_.begin();
    for (const std::string& path : paths)
        writer_.addRoot(path);
    writer_.commit(transaction);
}

void UpdateBatch::put(FileReading reading)
{
    readings_.push_back(std::move(reading));
    noteWork();
}

void UpdateBatch::move(VanishedFile from, ReadingJob to)
{
    moves_.push_back({std::move(from), std::move(to)});
    noteWork();
}

void UpdateBatch::noteMount(const std::string& path, const std::string& words)
{
    mounts_.emplace_back(path, words);
    noteWork();
}

std::vector<ReadingJob> UpdateBatch::write()
{
    std::vector<ReadingJob> unmoved;
    due_ = std::chrono::steady_clock::time_point::max();
    if (readings_.empty() && moves_.empty() && mounts_.empty())
        return unmoved;
    const std::vector<FileReading> readings = std::exchange(readings_, {});
    std::vector<Move> moves = std::exchange(moves_, {});
    SQLTransaction transaction(library_.database());
    writer_.begin();
    for (const auto& [path, words] : std::exchange(mounts_, {}))
        writer_.setMounted(words.empty() ? writer_.folderAt(path) : writer_.addFolder(path, words), !words.empty());
    for (Move& move : moves)
        if (!write(move)) {
            move.to.isKnown = false;
            unmoved.push_back(std::move(move.to));
        }
    for (const FileReading& reading : readings)
        write(reading);
    writer_.commit(transaction);
    return unmoved;
}

void UpdateBatch::write(const FileReading& reading)
{
    const ReadingJob& job = reading.job;
    const std::int64_t folder = folderOf(*job.folder);
    if (!reading.record) {
        writer_.passOver(folder, nameOfIndexed(job.listed().text), job.listed().stamp);
        ++changes_.passedOver;
        changes_.removed += job.isKnown ? 1 : 0;
        return;
    }
    changes_.unreadable += reading.record->state == "unreadable" ? 1 : 0;
    if (job.isKnown && isInUse(*reading.record))
        return; // with its old stamp, so that it is read next time
    writer_.put(*reading.record, folder);
    ++(job.isKnown ? changes_.changed : changes_.added);
    changes_.loops += reading.record->kind == "loop" ? 1 : 0;
}

bool UpdateBatch::write(const Move& move)
{
    const std::int64_t from = writer_.folderAt(move.from.folder);
    if (from == 0 || !isAsKnown(from, move.from) || !move.from.isGone())
        return false;
    const std::int64_t to = folderOf(*move.to.folder);
    const ListedFile& file = move.to.listed();
    if (seen_.bind(1, to).bind(2, std::string_view(file.text)).step()) {
        seen_.reset(); // another program knows the new place already
        return false;
    }
    writer_.move(from, nameOfIndexed(move.from.text), to, nameOfIndexed(file.text), file.stamp);
    ++changes_.moved;
    return true;
}

bool UpdateBatch::isAsKnown(std::int64_t folder, const VanishedFile& file)
{
    bool isSame = false;
    if (seen_.bind(1, folder).bind(2, std::string_view(file.text)).step())
        isSame =
            !file.stamp || *file.stamp == SeenStamp{seen_.number(0), seen_.number(1), seen_.number(2), seen_.number(3)};
    seen_.reset();
    return isSame;
}

void UpdateBatch::remove(std::vector<VanishedFile> files)
{
    for (std::span<const VanishedFile> rest(files); !rest.empty();) {
        const auto some = rest.first(std::min(rest.size(), kMostInBatch));
        rest = rest.subspan(some.size());
        SQLTransaction transaction(library_.database());
        writer_.begin();
        for (const VanishedFile& file : some) {
            const std::int64_t folder = writer_.folderAt(file.folder);
            if (folder == 0 || !isAsKnown(folder, file) || !file.isGone())
                continue;
            const bool wasAudio = writer_.remove(folder, nameOfIndexed(file.text));
            changes_.removed += wasAudio ? 1 : 0;
        }
        writer_.commit(transaction);
    }
}

void UpdateBatch::finish(const std::vector<std::string>& complete, const std::vector<std::string>& gone)
{
    if (complete.empty() && gone.empty() && changes_.areNone())
        return;
    SQLTransaction transaction(library_.database());
    writer_.begin();
    if (changes_.moved + changes_.removed > 0)
        writer_.removeEmptyFolders();
    for (const std::string& path : complete)
        writer_.completeRoot(writer_.addRoot(path), std::time(nullptr));
    for (const std::string& path : gone)
        writer_.removeRoot(path);
    writer_.commit(transaction);
    if (changes_.areNone())
        return;
    {
        SQLTransaction alone(library_.database()); // beside a writer, it would be refused without any wait
        library_.database().run("PRAGMA optimize");
        alone.commit();
    }
    library_.database().run("PRAGMA wal_checkpoint(PASSIVE)");
}
