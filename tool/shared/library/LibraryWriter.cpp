#include "tool/shared/library/LibraryWriter.h"

#include "tool/shared/library/IndexedName.h"

#include <fmt/format.h>

namespace {

// Ahead of the columns of libraryColumns().
constexpr const char* kPlaceColumns[] = {"folder", "name", "size", "modified", "indexed"};
constexpr int kFirstColumn = std::size(kPlaceColumns) + 1; // as a parameter

std::string insertFile()
{
    std::string names, values;
    const auto add = [&](const char* name) {
        names += (names.empty() ? "" : ", ") + std::string(name);
        values += values.empty() ? "?" : ", ?";
    };
    for (const char* const name : kPlaceColumns)
        add(name);
    for (const LibraryColumn& column : libraryColumns())
        add(column.name);
    return fmt::format("INSERT INTO files({}) VALUES({})", names, values);
}

std::string updateFile()
{
    std::string settings;
    const auto add = [&](const char* name) { settings += fmt::format("{}{} = ?", settings.empty() ? "" : ", ", name); };
    for (const char* const name : kPlaceColumns)
        add(name);
    for (const LibraryColumn& column : libraryColumns())
        add(column.name);
    return fmt::format("UPDATE files SET {} WHERE id = ?", settings);
}

// Binds what a member holds; null for nothing.
struct Binding {
    SQLStatement& statement;
    const LibraryRecord& record;
    int parameter;

    void operator()(LibraryRecord::Text LibraryRecord::*member) const
    {
        if (const std::string& text = record.*member; text.empty())
            statement.bindNull(parameter);
        else
            statement.bind(parameter, std::string_view(text));
    }
    template <class Number>
    void operator()(std::optional<Number> LibraryRecord::*member) const
    {
        statement.bind(parameter, record.*member);
    }
};

} // namespace

LibraryWriter::LibraryWriter(Library& library)
    : library_(library),
      added_(library.database()),
      findFile_(library.database(), "SELECT file FROM seen WHERE folder = ? AND name = ? AND file IS NOT NULL"),
      addFile_(library.database(), insertFile()),
      changeFile_(library.database(), updateFile()),
      removeFile_(library.database(), "DELETE FROM files WHERE id = ?"),
      see_(library.database(), "INSERT OR REPLACE INTO seen(folder, name, size, modified, changed, inode, file) "
                               "VALUES(?, ?, ?, ?, ?, ?, ?)"),
      unsee_(library.database(), "DELETE FROM seen WHERE folder = ? AND name = ?"),
      dropFindings_(library.database(), "DELETE FROM findings WHERE file = ?"),
      addFinding_(library.database(), "INSERT INTO findings(file, kind, text) VALUES(?, ?, ?)"),
      putOverview_(library.database(),
                   "INSERT OR REPLACE INTO overviews(file, frames_per_point, points) VALUES(?, ?, ?)"),
      dropOverview_(library.database(), "DELETE FROM overviews WHERE file = ?"),
      putDetails_(library.database(), "INSERT OR REPLACE INTO details(file, fields, tags) VALUES(?, ?, ?)"),
      addFolder_(library.database(), "INSERT OR IGNORE INTO folders(path, words) VALUES(?, ?)"),
      findFolder_(library.database(), "SELECT id FROM folders WHERE path = ?"),
      moveFile_(library.database(), "UPDATE files SET folder = ?, name = ? WHERE id = ?")
{
}

void LibraryWriter::begin()
{
    folders_.clear();
    added_.begin();
}

void LibraryWriter::commit(SQLTransaction& transaction)
{
    added_.end();
    transaction.commit();
}

std::int64_t LibraryWriter::addRoot(const std::string& path)
{
    const std::string text = indexedName(path);
    SQLStatement(library_.database(), "INSERT OR IGNORE INTO roots(path) VALUES(?)")
        .bind(1, std::string_view(text))
        .run();
    SQLStatement find(library_.database(), "SELECT id FROM roots WHERE path = ?");
    find.bind(1, std::string_view(text)).step();
    return find.number(0);
}

void LibraryWriter::removeRoot(const std::string& path)
{
    const std::string text = indexedName(path);
    SQLStatement(library_.database(), "DELETE FROM roots WHERE path = ?").bind(1, std::string_view(text)).run();
}

void LibraryWriter::completeRoot(std::int64_t root, std::int64_t seconds)
{
    SQLStatement(library_.database(), "UPDATE roots SET completed = ? WHERE id = ?")
        .bind(1, seconds)
        .bind(2, root)
        .run();
}

std::int64_t LibraryWriter::addFolder(const std::string& path, const std::string& words)
{
    if (const auto known = folders_.find(path); known != folders_.end())
        return known->second;
    const std::string text = indexedName(path), shown = indexedName(words);
    addFolder_.bind(1, std::string_view(text)).bind(2, std::string_view(shown)).run();
    findFolder_.bind(1, std::string_view(text)).step();
    const std::int64_t folder = findFolder_.number(0);
    findFolder_.reset();
    folders_.emplace(path, folder);
    return folder;
}

std::int64_t LibraryWriter::folderAt(const std::string& path)
{
    if (const auto known = folders_.find(path); known != folders_.end())
        return known->second;
    const std::string text = indexedName(path);
    const std::int64_t folder = findFolder_.bind(1, std::string_view(text)).step() ? findFolder_.number(0) : 0;
    findFolder_.reset();
    if (folder != 0)
        folders_.emplace(path, folder);
    return folder;
}

void LibraryWriter::setMounted(std::int64_t folder, bool isMounted)
{
    SQLStatement(library_.database(), "UPDATE folders SET mounted = ? WHERE id = ?")
        .bind(1, std::int64_t{isMounted})
        .bind(2, folder)
        .run();
}

void LibraryWriter::removeEmptyFolders()
{
    library_.database().run("DELETE FROM folders WHERE mounted = 0 AND "
                            "NOT EXISTS (SELECT 1 FROM seen WHERE folder = folders.id) AND "
                            "NOT EXISTS (SELECT 1 FROM files WHERE folder = folders.id)");
    folders_.clear();
}

std::int64_t LibraryWriter::fileAt(std::int64_t folder, const std::string& name)
{
    const std::string text = indexedName(name);
    const std::int64_t file =
        findFile_.bind(1, folder).bind(2, std::string_view(text)).step() ? findFile_.number(0) : 0;
    findFile_.reset();
    return file;
}

void LibraryWriter::see(std::int64_t folder, const std::string& name, const SeenStamp& stamp, std::int64_t file)
{
    const std::string text = indexedName(name);
    see_.bind(1, folder).bind(2, std::string_view(text)).bind(3, stamp.size).bind(4, stamp.modified);
    see_.bind(5, stamp.changed).bind(6, stamp.inode);
    file != 0 ? see_.bind(7, file) : see_.bindNull(7);
    see_.run();
}

std::int64_t LibraryWriter::put(const LibraryRecord& record, std::int64_t folder)
{
    const std::string name = indexedName(record.place.name);
    std::int64_t file = fileAt(folder, record.place.name);
    const bool isNew = file == 0;
    isNew ? added_.expect() : added_.settle();
    SQLStatement& statement = isNew ? addFile_ : changeFile_;
    statement.bind(1, folder).bind(2, std::string_view(name)).bind(3, record.stamp.size);
    statement.bind(4, record.stamp.modified).bind(5, record.indexed);
    int parameter = kFirstColumn;
    for (const LibraryColumn& column : libraryColumns())
        std::visit(Binding{statement, record, parameter++}, column.member);
    if (!isNew)
        statement.bind(parameter, file);
    statement.run();
    if (isNew)
        added_.note(file = library_.database().lastRow());
    see(folder, record.place.name, record.stamp, file);
    putParts(file, record, isNew);
    return file;
}

void LibraryWriter::removeFile(std::int64_t file)
{
    added_.settle();
    removeFile_.bind(1, file).run();
}

void LibraryWriter::putParts(std::int64_t file, const LibraryRecord& record, bool isNew)
{
    if (!isNew)
        dropFindings_.bind(1, file).run();
    for (const LibraryProblem& problem : record.problems)
        addFinding_.bind(1, file).bind(2, std::string_view(problem.kind)).bind(3, std::string_view(problem.text)).run();
    if (record.overview)
        putOverview_.bind(1, file).bind(2, record.overview->framesPerPoint).bindBytes(3, record.overview->points).run();
    else if (!isNew)
        dropOverview_.bind(1, file).run();
    putDetails_.bind(1, file);
    Binding{putDetails_, record, 2}(&LibraryRecord::fields);
    Binding{putDetails_, record, 3}(&LibraryRecord::tags);
    putDetails_.run();
}

void LibraryWriter::passOver(std::int64_t folder, const std::string& name, const SeenStamp& stamp)
{
    if (const std::int64_t file = fileAt(folder, name); file != 0)
        removeFile(file);
    see(folder, name, stamp, 0);
}

void LibraryWriter::move(std::int64_t folder, const std::string& name, std::int64_t newFolder,
                         const std::string& newName, const SeenStamp& stamp)
{
    const std::string text = indexedName(name), newText = indexedName(newName);
    const std::int64_t file = fileAt(folder, name);
    unsee_.bind(1, folder).bind(2, std::string_view(text)).run();
    added_.settle();
    if (file != 0)
        moveFile_.bind(1, newFolder).bind(2, std::string_view(newText)).bind(3, file).run();
    see(newFolder, newName, stamp, file);
}

bool LibraryWriter::remove(std::int64_t folder, const std::string& name)
{
    const std::string text = indexedName(name);
    const std::int64_t file = fileAt(folder, name);
    if (file != 0)
        removeFile(file);
    unsee_.bind(1, folder).bind(2, std::string_view(text)).run();
    return file != 0;
}

void LibraryWriter::moveFolder(std::int64_t folder, const std::string& path, const std::string& words)
{
    const std::string text = indexedName(path), shown = indexedName(words);
    added_.settle();
    SQLStatement(library_.database(), "UPDATE folders SET path = ?, words = ? WHERE id = ?")
        .bind(1, std::string_view(text))
        .bind(2, std::string_view(shown))
        .bind(3, folder)
        .run();
    folders_.clear();
}
