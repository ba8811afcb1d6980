// Puts what other indexes know into an index. Of two records of one path the newer one stays, whatever the order in
// which they come.
#pragma once

#include "tool/index/IndexedFiles.h"
#include "tool/shared/library/LibraryRecordJson.h"
#include "tool/shared/library/LibraryWriter.h"

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

/// What has become of the files of the sources.
struct MergeCounts {
    std::int64_t added = 0;      // audio files of which nothing was known
    std::int64_t changed = 0;    // audio files of which something older was known
    std::int64_t same = 0;       // audio files of which the same, or something newer, was known
    std::int64_t passedOver = 0; // files that are no audio
};

/// Files count once `finish`, or a later call, has committed them: many at a time. Without it the last ones are undone.
/// Operations throw Failure.
class LibraryMerge {
public:
    explicit LibraryMerge(Library& target);

    void add(const LibraryRoot& root);
    /// A folder at which a file system was mounted.
    void addMounted(const std::string& path, const std::string& words);
    /// `words` is what a search looks at of the folder.
    void add(const LibraryRecord& record, const std::string& words);
    /// A file of another index, whose record is only read if it is needed.
    void add(const IndexedFile& file, const std::function<LibraryRecord()>& record);
    void finish();
    /// Undoes what `finish` has not committed.
    void abandon();

    const MergeCounts& counts() const { return counts_; }

private:
    void begin();
    void endOfFile();
    std::int64_t folder(const std::string& path, const std::string& words);
    void put(const LibraryRecord& record, const std::string& words, bool isNew);
    void requireDetails(const LibraryRecord& record);

    Library& target_;
    std::optional<LibraryWriter> writer_; // another one once something was undone that it remembers
    RecordReader known_;
    SQLStatement completed_, folderWords_, areDetails_;
    std::optional<SQLTransaction> transaction_;
    int filesInTransaction_ = 0;
    MergeCounts counts_;
    MergeCounts pending_; // of the transaction
};
