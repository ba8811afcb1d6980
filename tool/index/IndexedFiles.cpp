#include "tool/index/IndexedFiles.h"

#include "tool/shared/library/IndexedName.h"

namespace {

// The order of the names below is that of `fileOf`.
constexpr const char* kFile = "d.path, d.words, s.name, s.size, s.modified, s.changed, s.inode, f.id, f.indexed";

IndexedFile fileOf(const SQLStatement& row)
{
    IndexedFile file;
    file.place.folder = nameOfIndexed(row.bytes(0));
    file.folderWords = nameOfIndexed(row.bytes(1));
    file.place.name = nameOfIndexed(row.bytes(2));
    file.stamp = {row.number(3), row.number(4), row.number(5), row.number(6)};
    file.row = row.number(7);
    file.indexed = row.number(8);
    return file;
}

// The folders come in the order of their paths, by the index on these, and in each the names, by the key of `seen`:
// nothing is sorted, and the first file comes at once. By bytes, "a/b/" and "a/c" are in another order than as paths.
std::string filesOf(IndexedFiles::Which which)
{
    return std::string("SELECT ") + kFile + " FROM folders d CROSS JOIN seen s ON s.folder = d.id " +
           (which == IndexedFiles::Which::all ? "LEFT " : "") + "JOIN files f ON f.id = s.file ORDER BY d.path, s.name";
}

} // namespace

IndexedFiles::IndexedFiles(Library& library, Which which) : files_(library.database(), filesOf(which))
{
}

std::optional<IndexedFile> IndexedFiles::next()
{
    return files_.step() ? std::optional(fileOf(files_)) : std::nullopt;
}

RecordReader::RecordReader(Library& library)
    : record_(library.database(), "SELECT o.frames_per_point, o.points, x.fields, x.tags, " + libraryColumnNames() +
                                      " FROM files f LEFT JOIN overviews o ON o.file = f.id"
                                      " LEFT JOIN details x ON x.file = f.id WHERE f.id = ?"),
      findings_(library.database(), "SELECT kind, text FROM findings WHERE file = ? ORDER BY rowid"),
      place_(library.database(), std::string("SELECT ") + kFile +
                                     " FROM folders d JOIN seen s ON s.folder = d.id LEFT JOIN files f ON f.id = s.file"
                                     " WHERE d.path = ? AND s.name = ?")
{
}

LibraryRecord RecordReader::record(const IndexedFile& file)
{
    LibraryRecord record;
    record.place = file.place;
    record.stamp = file.stamp;
    record.indexed = file.indexed;
    if (record_.bind(1, file.row).step()) {
        if (!record_.isNull(1))
            record.overview = {record_.number(0), record_.text(1)};
        record.fields = record_.text(2);
        record.tags = record_.text(3);
        readLibraryColumns(record, record_, 4);
    }
    record_.reset();
    for (findings_.bind(1, file.row); findings_.step();)
        record.problems.push_back({findings_.text(0), findings_.text(1)});
    return record;
}

std::optional<IndexedFile> RecordReader::find(const FilePlace& place)
{
    const std::string folder = indexedName(place.folder), name = indexedName(place.name);
    std::optional<IndexedFile> found;
    if (place_.bind(1, std::string_view(folder)).bind(2, std::string_view(name)).step())
        found = fileOf(place_);
    place_.reset();
    return found;
}
