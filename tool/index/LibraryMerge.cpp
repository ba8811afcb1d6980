#include "tool/index/LibraryMerge.h"

#include "tool/shared/library/IndexedName.h"
#include "tool/shared/library/LibraryRecordCheck.h"
#include "tool/shared/output/Failure.h"

#include <tuple>
#include <utility>

namespace {

// Short enough that an indexer beside this one waits little, long enough that commits cost little.
constexpr int kFilesPerTransaction = 1'000;

constexpr std::int64_t kNanoseconds = 1'000'000'000;

// Whether fields and tags are JSON as SQLite reads it, in which they are nested less deep than elsewhere, of the shape
// that the views of the index take apart.
constexpr const char* kAreDetails = R"(SELECT
    CASE WHEN ?1 = '' THEN 1
         WHEN NOT json_valid(?1) OR json_type(?1) <> 'array' THEN 0
         ELSE NOT EXISTS (SELECT 1 FROM json_each(?1) WHERE type <> 'object'
                          OR json_type(value, '$.name') IS NOT 'text' OR json_type(value, '$.value') IS NULL) END,
    CASE WHEN ?2 = '' THEN 1
         WHEN NOT json_valid(?2) THEN 0
         ELSE json_type(?2) = 'object' END)";

// How new something is. A file that is no audio has no time of reading: it was looked at after it changed.
auto ageOf(const SeenStamp& stamp, std::int64_t indexed, bool isAudio)
{
    return std::tuple(isAudio ? indexed : stamp.changed / kNanoseconds, stamp.changed, stamp.modified, stamp.size,
                      stamp.inode, isAudio);
}

auto ageOf(const IndexedFile& file)
{
    return ageOf(file.stamp, file.indexed, file.row != 0);
}

bool areMore(const std::string& words, const std::string& than)
{
    return std::tuple(words.size(), words) > std::tuple(than.size(), than);
}

// Of two records of one age the one that says more, and of these the later one in the order of their bytes, so that
// the order of the sources decides nothing.
bool saysMore(const LibraryRecord& record, const LibraryRecord& than)
{
    JsonWriter text, other;
    writeLibraryRecord(text, record);
    writeLibraryRecord(other, than);
    return std::tuple(text.text().size(), text.text()) > std::tuple(other.text().size(), other.text());
}

} // namespace

LibraryMerge::LibraryMerge(Library& target)
    : target_(target),
      writer_(std::in_place, target),
      known_(target),
      completed_(target.database(), "UPDATE roots SET completed = ?1 WHERE id = ?2 AND coalesce(completed, 0) < ?1"),
      folderWords_(target.database(), "SELECT words FROM folders WHERE id = ?"),
      areDetails_(target.database(), kAreDetails)
{
}

void LibraryMerge::begin()
{
    if (transaction_)
        return;
    transaction_.emplace(target_.database());
    writer_->begin();
}

void LibraryMerge::endOfFile()
{
    if (++filesInTransaction_ >= kFilesPerTransaction)
        finish();
}

void LibraryMerge::finish()
{
    if (!transaction_)
        return;
    writer_->commit(*transaction_);
    transaction_.reset();
    filesInTransaction_ = 0;
    counts_.added += pending_.added;
    counts_.changed += pending_.changed;
    counts_.same += pending_.same;
    counts_.passedOver += pending_.passedOver;
    pending_ = {};
}

void LibraryMerge::abandon()
{
    if (!transaction_)
        return;
    transaction_.reset();
    writer_.emplace(target_);
    filesInTransaction_ = 0;
    pending_ = {};
}

void LibraryMerge::add(const LibraryRoot& root)
{
    requireFolderPath(root.path);
    begin();
    const std::int64_t row = writer_->addRoot(root.path);
    if (root.completed)
        completed_.bind(1, *root.completed).bind(2, row).run();
}

void LibraryMerge::addMounted(const std::string& path, const std::string& words)
{
    requireFolderPath(path);
    begin();
    writer_->setMounted(folder(path, words), true);
}

// Words of folders begin with the name of a root, or of a link in one that leads to the folder. Of several, the longest
// say the most, and the order of the sources decides nothing.
std::int64_t LibraryMerge::folder(const std::string& path, const std::string& words)
{
    requireFolderPath("/" + words);
    const std::int64_t row = writer_->addFolder(path, words);
    folderWords_.bind(1, row).step();
    const std::string known = nameOfIndexed(folderWords_.bytes(0));
    folderWords_.reset();
    if (areMore(words, known))
        writer_->moveFolder(row, path, words);
    return row;
}

void LibraryMerge::requireDetails(const LibraryRecord& record)
{
    constexpr std::string_view ends("\n\0", 2); // of a line of an export, and of what SQLite looks at
    if (record.fields.find_first_of(ends) != std::string::npos || record.tags.find_first_of(ends) != std::string::npos)
        throw Failure("fields and tags stand on more than one line");
    areDetails_.bind(1, std::string_view(record.fields)).bind(2, std::string_view(record.tags)).step();
    const bool areFields = areDetails_.number(0) != 0, areTags = areDetails_.number(1) != 0;
    areDetails_.reset();
    if (!areFields || !areTags)
        throw Failure(areFields ? "tags cannot be what it says" : "fields cannot be what it says");
}

void LibraryMerge::put(const LibraryRecord& record, const std::string& words, bool isNew)
{
    requireSound(record);
    requireDetails(record);
    writer_->put(record, folder(record.place.folder, words));
    ++(isNew ? pending_.added : pending_.changed);
}

void LibraryMerge::add(const LibraryRecord& record, const std::string& words)
{
    add({record.place, record.stamp, 1, record.indexed, words}, [&] { return record; });
}

void LibraryMerge::add(const IndexedFile& file, const std::function<LibraryRecord()>& record)
{
    begin();
    const std::optional<IndexedFile> known = known_.find(file.place);
    const bool isAudio = file.row != 0;
    if (known && areMore(file.folderWords, known->folderWords))
        folder(file.place.folder, file.folderWords);
    const bool isNewer = !known || ageOf(*known) < ageOf(file);
    if (isAudio) {
        const bool isSameAge = known && ageOf(*known) == ageOf(file);
        const std::optional<LibraryRecord> read = isNewer || isSameAge ? std::optional(record()) : std::nullopt;
        if (isNewer || (isSameAge && saysMore(*read, known_.record(*known))))
            put(*read, file.folderWords, !known || known->row == 0);
        else
            ++pending_.same;
    } else {
        requireFolderPath(file.place.folder);
        requireFileName(file.place.name);
        if (isNewer)
            writer_->passOver(folder(file.place.folder, file.folderWords), file.place.name, file.stamp);
        ++pending_.passedOver;
    }
    endOfFile();
}
