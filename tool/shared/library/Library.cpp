#include "tool/shared/library/Library.h"

#include "platform/Places.h"
#include "tool/shared/library/LibrarySchema.h"
#include "tool/shared/library/SQLFailure.h"

#include <chrono>
#include <filesystem>
#include <sqlite3.h>
#include <system_error>
#include <thread>
#include <unistd.h>

namespace {

constexpr std::chrono::milliseconds kPause{5}; // between two tries

// Only the user may look into the folder, as with other data of the desktop. A folder that the user names is not made:
// it may be misspelled, or a volume that is not mounted.
void prepareFolderOf(const std::string& path)
{
    namespace fs = std::filesystem;
    const fs::path folder = fs::path(path).parent_path();
    std::error_code error;
    if (folder.empty() || fs::exists(folder, error))
        return;
    if (path != defaultLibrary())
        throw Failure("there is no folder for it");
    fs::create_directories(folder, error);
    if (error)
        throw Failure("its folder cannot be made: " + SystemErrorText(error.value()));
    fs::permissions(folder, fs::perms::owner_all, error);
}

SQLDatabase opened(const std::string& path, SQLDatabase::Mode mode)
{
    if (mode == SQLDatabase::Mode::create)
        prepareFolderOf(path);
    else if (::access(path.c_str(), F_OK) != 0)
        throw Failure("there is no index; ktfiles index FOLDER makes one");
    return SQLDatabase(path, mode);
}

// Of programs that begin at once, SQLite tells one without patience that another is busy, lest both wait for each
// other.
void useWriteAheadLog(SQLDatabase& database)
{
    const auto end = std::chrono::steady_clock::now() + kSQLPatience;
    for (;;) {
        try {
            return database.run("PRAGMA journal_mode = WAL");
        } catch (const SQLFailure& failure) {
            if (failure.code() != SQLITE_BUSY || std::chrono::steady_clock::now() > end)
                throw;
        }
        std::this_thread::sleep_for(kPause);
    }
}

} // namespace

std::string defaultLibrary()
{
    return platform::places().dataHome + "/ktfiles/library.db";
}

Library::Library(const std::string& path, SQLDatabase::Mode mode) : database_(opened(path, mode))
{
    if (mode == SQLDatabase::Mode::read) {
        requireLibrary(database_);
    } else {
        prepareLibrary(database_); // looks at the version before anything is written
        useWriteAheadLog(database_);
        database_.run("PRAGMA synchronous = NORMAL; PRAGMA foreign_keys = ON");
    }
    if (mode == SQLDatabase::Mode::read) // pages come from the system's cache without a copy; two gigabytes at most
        database_.run("PRAGMA mmap_size = 2147483648");
    database_.run("PRAGMA cache_size = -65536; PRAGMA temp_store = MEMORY");
}

std::string libraryColumnNames()
{
    std::string names;
    for (const LibraryColumn& column : libraryColumns())
        names += std::string(names.empty() ? "f." : ", f.") + column.name;
    return names;
}

void readLibraryColumns(LibraryRecord& record, const SQLStatement& row, int first)
{
    struct Reading {
        LibraryRecord& record;
        const SQLStatement& row;
        int column;

        void operator()(LibraryRecord::Text LibraryRecord::*member) const { record.*member = row.text(column); }
        void operator()(LibraryRecord::Whole LibraryRecord::*member) const
        {
            if (!row.isNull(column))
                record.*member = row.number(column);
        }
        void operator()(LibraryRecord::Real LibraryRecord::*member) const
        {
            if (!row.isNull(column))
                record.*member = row.real(column);
        }
    };
    for (const LibraryColumn& column : libraryColumns())
        std::visit(Reading{record, row, first++}, column.member);
}
