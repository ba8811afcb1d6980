#include "tool/shared/library/SQLTest.h"

#include "tool/shared/library/SQLDatabase.h"
#include "tool/shared/library/SQLFailure.h"

#include <sqlite3.h>

namespace {

void callTest(sqlite3_context* context, int, sqlite3_value** values)
{
    const auto* const test = static_cast<const SQLTest*>(sqlite3_value_pointer(values[1], kSQLTestPointer));
    bool isGood = false;
    if (test != nullptr && sqlite3_value_type(values[0]) == SQLITE_INTEGER) {
        isGood = test->passesNumber(std::int64_t{sqlite3_value_int64(values[0])});
    } else if (test != nullptr && sqlite3_value_type(values[0]) == SQLITE_TEXT) {
        const void* const text = sqlite3_value_text(values[0]);
        const int size = sqlite3_value_bytes(values[0]);
        isGood = text != nullptr && test->passesText({static_cast<const char*>(text), static_cast<std::size_t>(size)});
    }
    sqlite3_result_int(context, isGood ? 1 : 0);
}

} // namespace

void addTests(SQLDatabase& database)
{
    constexpr int flags = SQLITE_UTF8 | SQLITE_DIRECTONLY; // views and triggers of a stranger's index do not call it
    const int code =
        sqlite3_create_function_v2(database.handle(), "passes", 2, flags, nullptr, callTest, nullptr, nullptr, nullptr);
    if (code != SQLITE_OK)
        failForSQL(database.handle(), code);
}
