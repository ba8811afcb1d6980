// What goes wrong with a database.
#pragma once

#include "tool/shared/output/Failure.h"

struct sqlite3;

/// Says it in words; keeps SQLite's own code, such as SQLITE_FULL.
class SQLFailure : public Failure {
public:
    SQLFailure(const std::string& text, int code) : Failure(text), code_(code) {}
    int code() const { return code_; }

private:
    int code_;
};

/// Throws the SQLFailure of the last error of a connection, which may be null for want of memory.
[[noreturn]] void failForSQL(sqlite3* handle, int code);
