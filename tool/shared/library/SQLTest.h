// Conditions that statements leave to the program.
#pragma once

#include <cstdint>
#include <string_view>

class SQLDatabase;

/// Statements call it as `passes(VALUE, ?)`, with the test bound to the parameter. NULL never passes.
class SQLTest {
public:
    virtual ~SQLTest() = default;
    virtual bool passesNumber(std::int64_t) const { return false; }
    virtual bool passesText(std::string_view) const { return false; }
};

/// Makes `passes` known to a connection; may be called again.
void addTests(SQLDatabase& database);
