// A connection to an SQLite database, and statements on it.
#pragma once

#include "tool/shared/library/SQLTest.h"

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

struct sqlite3;
struct sqlite3_stmt;

/// How long a connection waits for others that write. Transactions of an index are short.
inline constexpr std::chrono::milliseconds kSQLPatience{60'000};

/// Owns the connection. Operations throw SQLFailure. One thread at a time.
class SQLDatabase {
public:
    /// What may be done with the file.
    enum class Mode {
        read,  // it must exist, and nothing is written, nor are rights to write needed
        write, // it must exist
        create // it is made if it does not exist
    };

    SQLDatabase(const std::string& path, Mode mode);

    /// Runs one or more statements without results.
    void run(const std::string& sql);
    /// The integer of the first row of a query; 0 without a row.
    std::int64_t number(const std::string& sql);
    std::int64_t lastRow() const;
    const std::string& path() const { return path_; }
    sqlite3* handle() const { return handle_.get(); }

private:
    struct Closing {
        void operator()(sqlite3* handle) const;
    };
    std::string path_;
    std::unique_ptr<sqlite3, Closing> handle_;
};

/// What a parameter that holds a test is marked with.
inline constexpr const char* kSQLTestPointer = "SQLTest";

/// A prepared statement, which must not outlive its database. Parameters and columns count from 1 and from 0, as in
/// SQLite. Operations throw SQLFailure.
class SQLStatement {
public:
    SQLStatement(const SQLDatabase& database, std::string_view sql);

    SQLStatement& bind(int parameter, std::int64_t number);
    SQLStatement& bind(int parameter, double number);
    /// The text must be UTF-8 and stay until the statement was run.
    SQLStatement& bind(int parameter, std::string_view text);
    /// The bytes must stay until the statement was run.
    SQLStatement& bindBytes(int parameter, std::string_view bytes);
    SQLStatement& bindNull(int parameter);
    /// The test must stay until the statement was run.
    SQLStatement& bindTest(int parameter, const SQLTest& test);
    template <class Value>
    SQLStatement& bind(int parameter, const std::optional<Value>& value)
    {
        return value ? bind(parameter, *value) : bindNull(parameter);
    }

    /// Goes to the next row; false behind the last, after which the statement is ready to be run again.
    bool step();
    /// Runs a statement without rows.
    void run();
    /// Ends a query early.
    void reset();

    bool isNull(int column) const;
    bool isText(int column) const;
    bool isReal(int column) const;
    std::int64_t number(int column) const;
    double real(int column) const;
    /// Text or bytes, valid until the next step.
    std::string_view bytes(int column) const;
    std::string text(int column) const { return std::string(bytes(column)); }

private:
    struct Finalizing {
        void operator()(sqlite3_stmt* statement) const;
    };
    std::unique_ptr<sqlite3_stmt, Finalizing> statement_;
};

/// Questions that are answered of one state of the database. No transaction may be begun meanwhile.
class SQLSnapshot {
public:
    explicit SQLSnapshot(SQLDatabase& database);
    ~SQLSnapshot();
    SQLSnapshot(const SQLSnapshot&) = delete;
    SQLSnapshot& operator=(const SQLSnapshot&) = delete;

private:
    SQLDatabase& database_;
};

/// Work that counts as a whole: undone unless `commit` is reached.
class SQLTransaction {
public:
    /// Waits for other writers, as long as the database's timeout says.
    explicit SQLTransaction(SQLDatabase& database);
    ~SQLTransaction();
    SQLTransaction(const SQLTransaction&) = delete;
    SQLTransaction& operator=(const SQLTransaction&) = delete;
    void commit();

private:
    SQLDatabase* database_; // null after `commit`
};
