#include "tool/shared/indexing/LibraryUpdate.h"

#include "platform/core/CRC32.h"
#include "tool/shared/indexing/IndexedFolders.h"
#include "tool/shared/indexing/ReadingPool.h"
#include "tool/shared/indexing/StorageKind.h"
#include "tool/shared/indexing/UpdateBatch.h"
#include "tool/shared/indexing/UpdateStarts.h"
#include "tool/shared/input/FoundFile.h"
#include "tool/shared/library/IndexedName.h"
#include "tool/shared/output/FilesProgress.h"

#include <algorithm>
#include <ctime>
#include <optional>
#include <unordered_set>

namespace {

using UpdateClock = std::chrono::steady_clock;

// What is read ahead of the writer.
constexpr std::size_t kMostPending = 4'000;
// Folders that are gone through at once; where each question takes its time, more.
constexpr unsigned kWalkers = 2, kNetworkWalkers = 16;
constexpr std::chrono::milliseconds kLookAround{20};

// An index that has hashes keeps them of files that change.
LibraryReading settledReading(Library& library, LibraryReading reading)
{
    const char* const anyHash = "SELECT EXISTS (SELECT 1 FROM files WHERE sound_hash IS NOT NULL)";
    reading.hash = reading.hash || library.database().number(anyHash) != 0;
    return reading;
}

class LibraryUpdating {
public:
    LibraryUpdating(Library& library, const LibraryUpdate& update);
    ~LibraryUpdating() { inbox_.close(); }
    LibraryChanges run();

private:
    void begin();
    void beginWithChanged();
    void gather();
    void compare(FolderListing listing);
    void compareNew(const std::shared_ptr<const FolderListing>& folder, std::size_t file);
    void take(FileReading reading);
    bool isMine(const FolderListing& folder, const std::string& text) const;
    void noteVanished(const std::string& folder, KnownFile file);
    void noteVanishedBelow(const std::string& path);
    void tellUncertain(const FolderListing& folder, const std::string& text);
    bool isKept(const std::string& path) const;
    void tellAbsent();
    void tellUnmounted();
    void keep(const std::string& path, const std::string& problem);
    void tell(const std::string& path, const std::string& problem);
    void finish();

    Library& library_;
    const LibraryUpdate& update_;
    LibraryChanges changes_;
    IndexedFolders known_;
    UpdateBatch batch_;
    UpdateStarts starts_;
    std::vector<std::string> whole_;          // what is known below these and not met is gone
    std::unordered_set<std::string> visited_; // folders
    std::vector<std::string> kept_;           // folders that could not be looked into: what is below them stays
    std::vector<VanishedFile> vanished_;
    std::int64_t listed_ = 0;
    bool knowsAudio_; // the index does, from the start
    UpdateInbox inbox_;
    ReadingPool pool_;
    std::optional<LibraryWalk> walk_;
};

LibraryUpdating::LibraryUpdating(Library& library, const LibraryUpdate& update)
    : library_(library),
      update_(update),
      known_(library.database()),
      batch_(library, changes_),
      knowsAudio_(library.database().number("SELECT EXISTS (SELECT 1 FROM files)") != 0),
      pool_(inbox_, settledReading(library, update.reading), update.threads)
{
}

LibraryChanges LibraryUpdating::run()
{
    begin();
    gather();
    batch_.write();
    if (!changes_.wasEnded)
        finish();
    return changes_;
}

void LibraryUpdating::begin()
{
    if (!update_.changed.empty()) {
        beginWithChanged();
    } else {
        starts_ = updateStarts(update_.folders.empty() ? known_.roots() : update_.folders);
        tellAbsent();
        whole_ = starts_.roots;
        if (update_.prunes)
            whole_.insert(whole_.end(), starts_.absent.begin(), starts_.absent.end());
        batch_.addRoots(starts_.roots);
    }
    tellUnmounted();
    const bool isSlow =
        std::ranges::any_of(starts_.walks, [](const WalkStart& start) { return isOnNetwork(start.path); });
    walk_.emplace(inbox_, starts_.walks, isSlow ? kNetworkWalkers : kWalkers, update_.opened);
}

void LibraryUpdating::beginWithChanged()
{
    for (const ChangedFolder& folder : update_.changed) {
        starts_.walks.push_back({folder.path, folder.words, {}, folder.rootLength, !folder.isWhole});
        if (folder.isWhole)
            whole_.push_back(folder.path);
    }
}

// The walk, the readers and this thread work at once. This one compares what is found with what is known, and writes.
void LibraryUpdating::gather()
{
    for (bool isWalkOver = false; !isWalkOver || pool_.pending() > 0;) {
        const auto soon = UpdateClock::now() + kLookAround;
        UpdateInbox::Contents found = inbox_.take(pool_.pending() < kMostPending, std::min(soon, batch_.due()));
        isWalkOver = isWalkOver || found.isWalkOver;
        if (!found.listings.empty()) {
            const SQLSnapshot snapshot(library_.database()); // rather than one for each question
            for (FolderListing& listing : found.listings)
                compare(std::move(listing));
        }
        pool_.took(found.readings.size());
        for (FileReading& reading : found.readings)
            take(std::move(reading));
        if (batch_.due() <= UpdateClock::now())
            for (ReadingJob& job : batch_.write())
                pool_.give(std::move(job));
        pool_.adjust();
        if (update_.progress != nullptr && isWalkOver)
            update_.progress->setTotal(listed_);
        if (update_.isEnded && update_.isEnded()) {
            changes_.wasEnded = true;
            return;
        }
    }
    for (ReadingJob& job : batch_.write()) // that seemed to have moved, and have not
        pool_.give(std::move(job));
    if (pool_.pending() > 0)
        gather();
}

void LibraryUpdating::compare(FolderListing found)
{
    if (found.isGone && !found.isRoot)
        return;
    if (found.error != 0)
        keep(found.path, SystemErrorText(found.error));
    if (found.isMount && !known_.isMount(found.path))
        batch_.noteMount(found.path, found.words);
    if (found.isRoot && found.isWhole && !isKept(found.path) && found.files.empty() && found.folders.empty() &&
        known_.knowsBelow(found.path) && !update_.prunes)
        return keep(found.path, "is empty, as where a volume is not mounted; what the index knows of it is kept");
    if (found.isWhole)
        visited_.insert(found.path);
    listed_ += std::ssize(found.files);
    const auto folder = std::make_shared<const FolderListing>(std::move(found));
    const std::vector<KnownFile> known = known_.filesOf(folder->path);
    auto row = known.begin();
    const auto passRow = [&] {
        const bool isUncertain = std::ranges::binary_search(folder->uncertain, row->text);
        if (isUncertain)
            tellUncertain(*folder, row->text);
        else if (folder->isWhole && isMine(*folder, row->text))
            noteVanished(folder->path, *row);
        ++row;
    };
    std::optional<bool> areInodesLasting;
    const auto isSame = [&](SeenStamp before, const SeenStamp& now) {
        if (before == now)
            return true;
        before.inode = now.inode;
        if (before != now)
            return false;
        if (!areInodesLasting)
            areInodesLasting = haveLastingInodes(folder->path);
        return !*areInodesLasting;
    };
    std::int64_t same = 0;
    for (std::size_t i = 0; i < folder->files.size(); ++i) {
        const ListedFile& file = folder->files[i];
        while (row != known.end() && row->text < file.text)
            passRow();
        const bool isKnown = row != known.end() && row->text == file.text;
        if (!isMine(*folder, file.text) || known_.isItself(*folder, file)) {
            row += isKnown ? 1 : 0;
        } else if (!isKnown) {
            compareNew(folder, i);
        } else {
            if (isSame(row->stamp, file.stamp)) {
                ++(row->isAudio ? changes_.same : changes_.passedOver);
                ++same;
            } else {
                pool_.give({folder, i, row->isAudio});
            }
            ++row;
        }
    }
    while (row != known.end())
        passRow();
    for (const std::string& text : folder->uncertain) // a dangling link matters only if its name is that of sound
        if (isCalledAudio(text) && !std::ranges::binary_search(known, text, {}, &KnownFile::text))
            tellUncertain(*folder, text);
    for (const std::string& name : folder->missing)
        if (const auto lost = known_.fileAt(folder->path, name))
            noteVanished(folder->path, *lost);
        else
            tell(folder->path + name, SystemErrorText(ENOENT));
    if (update_.progress != nullptr)
        update_.progress->advance(same);
}

void LibraryUpdating::compareNew(const std::shared_ptr<const FolderListing>& folder, std::size_t file)
{
    for (VanishedFile& old : knowsAudio_ ? known_.withInodeOf(folder->files[file]) : std::vector<VanishedFile>())
        if (!isKept(old.folder) && old.isGone() && deviceOfNearest(old.folder) == folder->device)
            return batch_.move(std::move(old), {folder, file, true});
    pool_.give({folder, file, false});
}

void LibraryUpdating::take(FileReading reading)
{
    const ReadingJob& job = reading.job;
    if (update_.progress != nullptr) {
        update_.progress->begin(job.folder->path + job.listed().text);
        update_.progress->advance(1);
    }
    if (reading.record && reading.record->state == "unreadable")
        tell(job.folder->path + nameOfIndexed(job.listed().text),
             reading.record->problems.empty() ? "cannot be read" : reading.record->problems.front().text);
    if (reading.isThere)
        batch_.put(std::move(reading));
    else if (job.isKnown) // gone, unless it has changed and is read the next time
        vanished_.push_back({job.folder->path, job.listed().text, std::nullopt});
}

bool LibraryUpdating::isMine(const FolderListing& folder, const std::string& text) const
{
    return update_.shard.count == 1 || update_.shard.holds(folder.below(nameOfIndexed(text)));
}

void LibraryUpdating::noteVanished(const std::string& folder, KnownFile file)
{
    if (isKept(folder))
        return;
    vanished_.push_back({folder, std::move(file.text), file.stamp});
}

bool LibraryUpdating::isKept(const std::string& path) const
{
    return std::ranges::any_of(kept_, [&](const std::string& folder) { return path.starts_with(folder); });
}

void LibraryUpdating::tell(const std::string& path, const std::string& problem)
{
    ++changes_.problems;
    if (update_.tell)
        update_.tell(path, problem);
}

void LibraryUpdating::keep(const std::string& path, const std::string& problem)
{
    kept_.push_back(path);
    tell(path.size() > 1 && path.ends_with('/') ? path.substr(0, path.size() - 1) : path, problem);
}

void LibraryUpdating::tellAbsent()
{
    for (const std::string& path : starts_.absent) {
        const std::string name = path.substr(0, path.size() - 1);
        const std::size_t slash = name.rfind('/');
        if (const auto file = known_.fileAt(name.substr(0, slash + 1), name.substr(slash + 1)))
            noteVanished(name.substr(0, slash + 1), *file);
        else if (!known_.knowsBelow(path) && !known_.isRoot(path))
            tell(name, SystemErrorText(ENOENT));
        else if (!update_.prunes)
            keep(path, "is not there; what the index knows of it is kept (--prune removes it)");
    }
}

// Where a file system was mounted, and none is, its files may come back.
void LibraryUpdating::tellUnmounted()
{
    for (const std::string& whole : whole_)
        for (const std::string& path : known_.mountsBelow(whole)) {
            if (isMountPoint(path) || isKept(path))
                continue;
            if (update_.prunes)
                batch_.noteMount(path, {});
            else
                keep(path, "is not mounted; what the index knows of it is kept (--prune removes it)");
        }
}

void LibraryUpdating::tellUncertain(const FolderListing& folder, const std::string& text)
{
    tell(folder.path + nameOfIndexed(text), "cannot be looked at, or is a link that leads nowhere");
}

// Folders that the index knows, and that the walk did not come by.
void LibraryUpdating::noteVanishedBelow(const std::string& path)
{
    for (const std::string& folder : known_.foldersBelow(path)) {
        if (visited_.contains(folder) || isKept(folder))
            continue;
        for (KnownFile& file : known_.filesOf(folder))
            if (update_.shard.count == 1 || update_.shard.holds(folder.substr(path.size()) + nameOfIndexed(file.text)))
                noteVanished(folder, std::move(file));
    }
}

void LibraryUpdating::finish()
{
    for (const std::string& folder : whole_)
        noteVanishedBelow(folder);
    batch_.remove(std::move(vanished_));
    std::vector<std::string> complete, absent;
    for (const std::string& root : starts_.roots)
        if (!isKept(root))
            complete.push_back(root);
    if (update_.prunes)
        absent = starts_.absent;
    batch_.finish(complete, absent);
}

} // namespace

bool LibraryShard::holds(const std::string& pathBelowRoot) const
{
    return count == 1 || ECCRC32(0, pathBelowRoot.data(), pathBelowRoot.size()) % count + 1 == number;
}

LibraryChanges updateLibrary(Library& library, const LibraryUpdate& update)
{
    return LibraryUpdating(library, update).run();
}
