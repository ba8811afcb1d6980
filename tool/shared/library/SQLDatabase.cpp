#include "tool/shared/library/SQLDatabase.h"

#include "tool/shared/library/SQLFailure.h"

#include <fmt/format.h>
#include <sqlite3.h>

#include <cctype>
#include <iterator>
#include <unistd.h>

namespace {

// Each transaction of an indexer changes the schema and changes it back. SQLite follows, but fails if that happens once
// more while it opens the table of words.
constexpr int kMostSchemaChanges = 50;

int flagsOf(SQLDatabase::Mode mode)
{
    switch (mode) {
    case SQLDatabase::Mode::read:
        return SQLITE_OPEN_READONLY;
    case SQLDatabase::Mode::write:
        return SQLITE_OPEN_READWRITE;
    case SQLDatabase::Mode::create:
        break;
    }
    return SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE;
}

std::string wordsFor(sqlite3* handle, int code)
{
    switch (code & 0xff) {
    case SQLITE_FULL:
        return "the disk is full";
    case SQLITE_NOTADB:
        return "is no index: it is no SQLite database";
    case SQLITE_CORRUPT:
        return "the index is damaged; make it anew";
    case SQLITE_BUSY:
    case SQLITE_LOCKED:
        return "another program keeps it busy";
    case SQLITE_READONLY:
        return "cannot be written";
    case SQLITE_CANTOPEN:
        return "cannot be opened";
    case SQLITE_NOMEM:
        return "out of memory";
    case SQLITE_IOERR: {
        const int error = handle != nullptr ? sqlite3_system_errno(handle) : 0;
        return error != 0 ? std::string(SystemErrorText(error)) : "input/output error";
    }
    default:
        return handle != nullptr ? sqlite3_errmsg(handle) : sqlite3_errstr(code);
    }
}

// Readers of a database with a write-ahead log share files beside it, which they make. Where they cannot, and nobody
// has it open for writing, the database is read as it is.
bool cannotBeShared(const std::string& path)
{
    const std::size_t slash = path.rfind('/');
    const std::string folder = slash == path.npos ? "." : path.substr(0, slash + 1);
    return ::access(folder.c_str(), W_OK) != 0 && ::access((path + "-wal").c_str(), F_OK) != 0;
}

std::string unchangingURI(const std::string& path)
{
    std::string uri = path.starts_with('/') ? "file:" : "file:./";
    for (const char c : path)
        if (std::isalnum(static_cast<unsigned char>(c)) != 0 ||
            std::string_view("/-_.~").find(c) != std::string_view::npos)
            uri += c;
        else
            fmt::format_to(std::back_inserter(uri), "%{:02X}", static_cast<unsigned char>(c));
    return uri + "?immutable=1";
}

} // namespace

void failForSQL(sqlite3* handle, int code)
{
    throw SQLFailure(wordsFor(handle, code), code & 0xff);
}

void SQLDatabase::Closing::operator()(sqlite3* handle) const
{
    sqlite3_close_v2(handle);
}

SQLDatabase::SQLDatabase(const std::string& path, Mode mode) : path_(path)
{
    sqlite3* handle = nullptr;
    // Counting what is allocated takes a lock for each piece, and nobody asks for it.
    static const int uncounted = sqlite3_config(SQLITE_CONFIG_MEMSTATUS, 0);
    static_cast<void>(uncounted);
    const bool isStill = mode == Mode::read && cannotBeShared(path);
    // One thread uses a connection at a time, which needs no locks inside it.
    const int code = sqlite3_open_v2((isStill ? unchangingURI(path) : path).c_str(), &handle,
                                     flagsOf(mode) | SQLITE_OPEN_NOMUTEX | (isStill ? SQLITE_OPEN_URI : 0), nullptr);
    handle_.reset(handle);
    if (code != SQLITE_OK)
        failForSQL(handle, code);
    sqlite3_busy_timeout(handle, static_cast<int>(kSQLPatience.count()));
}

void SQLDatabase::run(const std::string& sql)
{
    if (const int code = sqlite3_exec(handle(), sql.c_str(), nullptr, nullptr, nullptr); code != SQLITE_OK)
        failForSQL(handle(), code);
}

std::int64_t SQLDatabase::number(const std::string& sql)
{
    SQLStatement statement(*this, sql);
    return statement.step() ? statement.number(0) : 0;
}

std::int64_t SQLDatabase::lastRow() const
{
    return sqlite3_last_insert_rowid(handle());
}

void SQLStatement::Finalizing::operator()(sqlite3_stmt* statement) const
{
    sqlite3_finalize(statement);
}

namespace {

sqlite3* databaseOf(sqlite3_stmt* statement)
{
    return sqlite3_db_handle(statement);
}

void requireBound(sqlite3_stmt* statement, int code)
{
    if (code != SQLITE_OK)
        failForSQL(databaseOf(statement), code);
}

} // namespace

SQLStatement::SQLStatement(const SQLDatabase& database, std::string_view sql)
{
    sqlite3_stmt* statement = nullptr;
    int code = SQLITE_SCHEMA;
    for (int i = 0; code == SQLITE_SCHEMA && i < kMostSchemaChanges; ++i)
        code = sqlite3_prepare_v3(database.handle(), sql.data(), static_cast<int>(sql.size()),
                                  SQLITE_PREPARE_PERSISTENT, &statement, nullptr);
    if (code != SQLITE_OK)
        failForSQL(database.handle(), code);
    statement_.reset(statement);
}

SQLStatement& SQLStatement::bind(int parameter, std::int64_t number)
{
    requireBound(statement_.get(), sqlite3_bind_int64(statement_.get(), parameter, number));
    return *this;
}

SQLStatement& SQLStatement::bind(int parameter, double number)
{
    requireBound(statement_.get(), sqlite3_bind_double(statement_.get(), parameter, number));
    return *this;
}

SQLStatement& SQLStatement::bind(int parameter, std::string_view text)
{
    requireBound(statement_.get(), sqlite3_bind_text64(statement_.get(), parameter, text.data(), text.size(),
                                                       SQLITE_STATIC, SQLITE_UTF8));
    return *this;
}

SQLStatement& SQLStatement::bindBytes(int parameter, std::string_view bytes)
{
    requireBound(statement_.get(),
                 sqlite3_bind_blob64(statement_.get(), parameter, bytes.data(), bytes.size(), SQLITE_STATIC));
    return *this;
}

SQLStatement& SQLStatement::bindNull(int parameter)
{
    requireBound(statement_.get(), sqlite3_bind_null(statement_.get(), parameter));
    return *this;
}

SQLStatement& SQLStatement::bindTest(int parameter, const SQLTest& test)
{
    // SQLite hands the pointer back as it is, to a function that reads only.
    void* const pointer = const_cast<SQLTest*>(&test);
    requireBound(statement_.get(),
                 sqlite3_bind_pointer(statement_.get(), parameter, pointer, kSQLTestPointer, nullptr));
    return *this;
}

bool SQLStatement::step()
{
    int code = sqlite3_step(statement_.get());
    for (int i = 0; code == SQLITE_SCHEMA && i < kMostSchemaChanges; ++i) {
        sqlite3_reset(statement_.get());
        code = sqlite3_step(statement_.get());
    }
    if (code == SQLITE_ROW)
        return true;
    if (code != SQLITE_DONE) {
        sqlite3* const database = databaseOf(statement_.get());
        const SQLFailure failure(wordsFor(database, code), code & 0xff);
        sqlite3_reset(statement_.get());
        throw failure;
    }
    sqlite3_reset(statement_.get());
    return false;
}

void SQLStatement::run()
{
    while (step()) {
    }
}

void SQLStatement::reset()
{
    sqlite3_reset(statement_.get());
}

bool SQLStatement::isNull(int column) const
{
    return sqlite3_column_type(statement_.get(), column) == SQLITE_NULL;
}

bool SQLStatement::isText(int column) const
{
    return sqlite3_column_type(statement_.get(), column) == SQLITE_TEXT;
}

bool SQLStatement::isReal(int column) const
{
    return sqlite3_column_type(statement_.get(), column) == SQLITE_FLOAT;
}

std::int64_t SQLStatement::number(int column) const
{
    return sqlite3_column_int64(statement_.get(), column);
}

double SQLStatement::real(int column) const
{
    return sqlite3_column_double(statement_.get(), column);
}

std::string_view SQLStatement::bytes(int column) const
{
    const void* const bytes = sqlite3_column_blob(statement_.get(), column);
    const int size = sqlite3_column_bytes(statement_.get(), column);
    return bytes == nullptr ? std::string_view()
                            : std::string_view(static_cast<const char*>(bytes), static_cast<std::size_t>(size));
}

SQLSnapshot::SQLSnapshot(SQLDatabase& database) : database_(database)
{
    database.run("BEGIN");
}

SQLSnapshot::~SQLSnapshot()
{
    sqlite3_exec(database_.handle(), "ROLLBACK", nullptr, nullptr, nullptr); // nothing was written
}

SQLTransaction::SQLTransaction(SQLDatabase& database) : database_(&database)
{
    database.run("BEGIN IMMEDIATE");
}

SQLTransaction::~SQLTransaction()
{
    if (database_ != nullptr)
        sqlite3_exec(database_->handle(), "ROLLBACK", nullptr, nullptr, nullptr);
}

void SQLTransaction::commit()
{
    database_->run("COMMIT");
    database_ = nullptr;
}
