#include "tool/shared/library/SearchTokenizer.h"

#include "tool/shared/library/SQLDatabase.h"
#include "tool/shared/library/SQLFailure.h"

#include <sqlite3.h>

#include <algorithm>
#include <iterator>
#include <limits>
#include <new>

struct SearchTokenizer::Parts {
    fts5_tokenizer calls{};
    Fts5Tokenizer* tokenizer = nullptr;

    ~Parts()
    {
        if (tokenizer != nullptr)
            calls.xDelete(tokenizer);
    }
};

namespace {

// As SQLite hands out the interface of its full-text search.
fts5_api* searchInterface(sqlite3* database)
{
    fts5_api* result = nullptr;
    sqlite3_stmt* statement = nullptr;
    int code = sqlite3_prepare_v2(database, "SELECT fts5(?)", -1, &statement, nullptr);
    if (code == SQLITE_OK) {
        sqlite3_bind_pointer(statement, 1, static_cast<void*>(&result), "fts5_api_ptr", nullptr);
        sqlite3_step(statement);
        code = sqlite3_finalize(statement);
    }
    if (code != SQLITE_OK || result == nullptr)
        failForSQL(database, code);
    return result;
}

struct WordTaking {
    std::vector<std::string>& words;
    std::size_t count = 0;
};

int takeSearchWord(void* context, int, const char* word, int size, int, int)
{
    WordTaking& taking = *static_cast<WordTaking*>(context);
    try {
        if (taking.count == taking.words.size())
            taking.words.emplace_back();
        taking.words[taking.count++].assign(word, static_cast<std::size_t>(size));
    } catch (const std::bad_alloc&) {
        return SQLITE_NOMEM;
    }
    return SQLITE_OK;
}

} // namespace

SearchTokenizer::SearchTokenizer(SQLDatabase& database) : parts_(std::make_unique<Parts>())
{
    fts5_api* const calls = searchInterface(database.handle());
    void* data = nullptr;
    const char* arguments[] = {"remove_diacritics", "2"}; // as in the schema
    int code = calls->xFindTokenizer(calls, "unicode61", &data, &parts_->calls);
    if (code == SQLITE_OK)
        code = parts_->calls.xCreate(data, arguments, std::size(arguments), &parts_->tokenizer);
    if (code != SQLITE_OK)
        failForSQL(nullptr, code);
}

SearchTokenizer::~SearchTokenizer() = default;

void SearchTokenizer::read(std::string_view text, std::vector<std::string>& words) const
{
    WordTaking taking{words};
    const auto size = static_cast<int>(std::min<std::size_t>(text.size(), std::numeric_limits<int>::max()));
    const int code =
        parts_->calls.xTokenize(parts_->tokenizer, &taking, FTS5_TOKENIZE_DOCUMENT, text.data(), size, takeSearchWord);
    if (code != SQLITE_OK)
        failForSQL(nullptr, code);
    words.resize(taking.count);
}

std::vector<std::string> SearchTokenizer::wordsOf(std::string_view text) const
{
    std::vector<std::string> words;
    read(text, words);
    return words;
}
