#include "tool/shared/library/QueryConditions.h"

#include "tool/shared/library/IndexedName.h"
#include "tool/shared/library/SearchTerm.h"

#include <fmt/format.h>

#include <algorithm>
#include <charconv>
#include <cmath>
#include <utility>

namespace {

// As the index `files_by_form` has it.
constexpr const char* kForm = "coalesce(kind, '') || char(9) || coalesce(container_name, '') || char(9) || "
                              "coalesce(channels, '') || char(9) || coalesce(sample_rate, '')";

/// The words of a text are those of another.
class SameWords : public SQLTest {
public:
    SameWords(const SearchTokenizer& tokenizer, const std::string& text)
        : tokenizer_(tokenizer),
          text_(text),
          term_(tokenizer, text)
    {
    }
    bool passesText(std::string_view text) const override
    {
        tokenizer_.read(text, read_);
        return term_.forms.empty() ? text == text_ : term_.equals(read_);
    }

private:
    const SearchTokenizer& tokenizer_;
    std::string text_;
    SearchTerm term_;
    mutable std::vector<std::string> read_;
};

class IsInSet : public SQLTest {
public:
    bool passesNumber(std::int64_t row) const override { return rows.holds(row); }

    RowSet rows;
};

bool isWithin(const std::optional<NumberRange>& range, std::string_view text)
{
    if (!range)
        return true;
    double number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    return error == std::errc() && number >= range->least && number <= range->most;
}

/// A form is a kind, a container, a number of channels and a rate, with tabs between them.
class IsForm : public SQLTest {
public:
    explicit IsForm(const LibraryQuery& query) : query_(query) {}
    bool passesText(std::string_view form) const override
    {
        const auto take = [&form] {
            const std::size_t tab = std::min(form.find('\t'), form.size());
            const std::string_view part = form.substr(0, tab);
            form.remove_prefix(std::min(tab + 1, form.size()));
            return part;
        };
        const std::string_view kind = take(), container = take(), channels = take(), rate = take();
        const auto& containers = query_.containers;
        const bool isAnyContainer = containers.empty() || !query_.codings.empty();
        return (query_.kind.empty() || kind == query_.kind) &&
               (isAnyContainer || std::ranges::find(containers, container) != containers.end()) &&
               isWithin(query_.channels, channels) && isWithin(query_.sampleRate, rate);
    }

private:
    const LibraryQuery query_;
};

SQLText within(const char* column, const NumberRange& range)
{
    SQLText text;
    if (std::isfinite(range.least))
        text = {fmt::format("{} >= ?", column), {range.least}};
    if (std::isfinite(range.most))
        text.append({fmt::format("{} <= ?", column), {range.most}}, " AND ");
    return text;
}

SQLText isKey(const KeyChoice& key)
{
    SQLText text = key.note ? SQLText{"key_note = ?", {*key.note}}
                            : SQLText{"key_note IN (0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11)", {}};
    if (!key.mode.empty())
        text.append({"mode IN (?, 'both')", {key.mode}}, " AND ");
    return text;
}

// A string in the language of the search is in quotation marks, and is never an operator.
std::string quotedForSearch(std::string_view text)
{
    std::string result = "\"";
    for (const char c : text)
        result.append(c == '"' ? 2 : 1, c);
    return result + '"';
}

// In the language of the search, `mark` behind each form.
std::string eitherForm(const SearchTerm& term, const char* mark)
{
    std::string match;
    for (const SearchTerm::Form& form : term.forms)
        match += (match.empty() ? "" : " OR ") + quotedForSearch(form.text) + mark;
    return match;
}

// The words of the index that the first word of the term stands in, or ends; none for more than are worth it.
std::optional<std::vector<std::string>> wordsWith(SQLDatabase& database, const SearchTerm::Words& words)
{
    constexpr std::size_t kMostWords = 500;
    database.run("CREATE VIRTUAL TABLE IF NOT EXISTS temp.search_words USING fts5vocab(main, search, row)");
    SQLStatement statement(database, "SELECT term FROM temp.search_words WHERE instr(term, ?)");
    std::vector<std::string> found;
    for (statement.bind(1, std::string_view(words.front())); statement.step();) {
        const std::string word = statement.text(0);
        if (words.size() > 1 && !word.ends_with(words.front()))
            continue;
        if (found.size() == kMostWords)
            return std::nullopt;
        found.push_back(word);
    }
    return found;
}

// The search knows beginnings of words only, so that whole ones stand in place of the first of the term. Empty if there
// are none; none for more than are worth it.
std::optional<std::string> withinWords(SQLDatabase& database, const SearchTerm& term)
{
    std::string match;
    for (const SearchTerm::Form& form : term.forms) {
        const auto found = wordsWith(database, form.words);
        if (!found)
            return std::nullopt;
        for (std::string phrase : *found) {
            for (std::size_t i = 1; i < form.words.size(); ++i)
                phrase += " " + form.words[i];
            match += (match.empty() ? "" : " OR ") + quotedForSearch(phrase) + (form.words.size() > 1 ? " *" : "");
        }
    }
    return match;
}

} // namespace

int SQLText::bindTo(SQLStatement& statement, int first) const
{
    struct Binder {
        SQLStatement& statement;
        int parameter;

        void operator()(std::int64_t number) const { statement.bind(parameter, number); }
        void operator()(double number) const { statement.bind(parameter, number); }
        void operator()(const std::string& text) const { statement.bind(parameter, std::string_view(text)); }
        void operator()(const SQLTest* test) const { statement.bindTest(parameter, *test); }
    };
    for (const Parameter& parameter : parameters)
        std::visit(Binder{statement, first++}, parameter);
    return first;
}

void SQLText::append(const SQLText& text, const char* between)
{
    sql += (sql.empty() ? "" : between) + text.sql;
    parameters.insert(parameters.end(), text.parameters.begin(), text.parameters.end());
}

QueryConditions::QueryConditions(SQLDatabase& database, const SearchTokenizer& tokenizer, const LibraryQuery& query)
    : tokenizer_(tokenizer)
{
    addTests(database);
    addScopes(database, query);
    addMusic(query);
    if (query.seconds)
        require(within("f.duration_seconds", *query.seconds));
    if (query.modifiedSince)
        addIndexed({{"modified >= ?", {*query.modifiedSince}}});
    addForms(query);
    addProblems(query);
    if (query.takesDuplicates) {
        require({"f.copied = 1", {}});
        selections_.push_back({"SELECT id FROM files INDEXED BY copied_files WHERE copied = 1", {}});
    }
    addCategory(query.category);
    addText("f.genre", query.genre);
    addText("f.artist", query.artist);
    addText("f.title", query.title);
    addText("f.album", query.album);
    addTextSelections(database, query);
}

// The index by keys goes on with tempos, so that both together select few rows.
void QueryConditions::addMusic(const LibraryQuery& query)
{
    std::vector<SQLText> keys, tempos, both;
    for (const NumberRange& tempo : wantedTempos(query))
        tempos.push_back(within("tempo", tempo));
    for (const KeyChoice& key : wantedKeys(query))
        keys.push_back(isKey(key));
    for (const SQLText& key : keys)
        for (const SQLText& tempo : tempos) {
            SQLText pair = key;
            pair.append(tempo, " AND ");
            both.push_back(std::move(pair));
        }
    addIndexed(!both.empty() ? both : keys.empty() ? tempos : keys);
}

void QueryConditions::addTextSelections(SQLDatabase& database, const LibraryQuery& query)
{
    std::string words, letters;
    const auto add = [](std::string& match, const std::string& further) {
        match += (match.empty() ? "(" : " AND (") + further + ")";
    };
    for (const std::string* const text : {&query.category, &query.genre, &query.artist, &query.title, &query.album})
        if (const SearchTerm term(tokenizer_, *text); !term.forms.empty())
            add(words, eitherForm(term, ""));
    for (const std::string& typed : query.terms) {
        const SearchTerm term(tokenizer_, indexedName(typed));
        if (term.isWithinWords) {
            const auto match = withinWords(database, term);
            selectsAllTerms_ = selectsAllTerms_ && match;
            if (match && match->empty())
                return addIndexed({{"0", {}}});
            if (match)
                add(words, *match);
            continue;
        }
        if (term.forms.empty()) // a dash beyond ASCII is no word
            return addIndexed({{"0", {}}});
        const SearchTerm::Words& first = term.forms.front().words;
        const bool isLetter = first.size() == 1 && first.front().size() == 1;
        add(isLetter ? letters : words, eitherForm(term, " *")); // the last word may be begun only
    }
    for (const std::string& match : {words, letters})
        if (!match.empty())
            textSelections_.push_back({"SELECT rowid FROM search WHERE search MATCH ?", {match}});
}

const SQLTest* QueryConditions::keep(std::unique_ptr<SQLTest> test)
{
    return tests_.emplace_back(std::move(test)).get();
}

void QueryConditions::addIndexed(const std::vector<SQLText>& choices)
{
    SQLText either, rows;
    for (const SQLText& choice : choices) {
        either.append({"(" + choice.sql + ")", choice.parameters}, " OR ");
        rows.append({"SELECT id FROM files WHERE " + choice.sql, choice.parameters}, " UNION ALL ");
    }
    if (choices.empty())
        return;
    require({"(" + either.sql + ")", either.parameters});
    selections_.push_back(rows);
}

void QueryConditions::addText(const char* column, const std::string& text)
{
    if (!text.empty())
        require({fmt::format("passes({}, ?)", column), {keep(std::make_unique<SameWords>(tokenizer_, text))}});
}

void QueryConditions::addCategory(const std::string& category)
{
    if (category.empty())
        return;
    const SQLTest* const test = keep(std::make_unique<SameWords>(tokenizer_, category));
    require({"(passes(f.category, ?) OR passes(f.sub_category, ?))", {test, test}});
}

void QueryConditions::addScopes(SQLDatabase& database, const LibraryQuery& query)
{
    if (query.scopes.empty())
        return;
    SQLText selection;
    auto folders = std::make_unique<IsInSet>();
    for (const LibraryQuery::Scope& scope : query.scopes) {
        const std::string first = indexedName(scope.path);
        std::string behind = first;
        ++behind.back(); // the slash becomes the character behind it
        const SQLText ofFolder{"d.path >= ? AND d.path < ?", {first, behind}};
        SQLStatement statement(database, "SELECT id FROM folders d WHERE " + ofFolder.sql);
        for (ofFolder.bindTo(statement); statement.step();)
            folders->rows.add(statement.number(0));
        selection.append({"SELECT f.id FROM folders d CROSS JOIN files f ON f.folder = d.id WHERE " + ofFolder.sql,
                          ofFolder.parameters},
                         " UNION ALL ");
        if (query.scopes.size() == 1)
            ofFolder_ = ofFolder;
    }
    require({"passes(f.folder, ?)", {keep(std::move(folders))}});
    selections_.push_back(selection);
}

// Goes from form to form along the index, which goes on with durations, and takes the rows of those that pass. Codings
// are no part of a form.
void QueryConditions::addForms(const LibraryQuery& query)
{
    const bool asksForForm = !query.kind.empty() || !query.containers.empty() || query.channels || query.sampleRate;
    if (!query.kind.empty())
        require({"f.kind = ?", {query.kind}});
    SQLText formats;
    for (const std::string& name : query.containers)
        formats.append({"f.container_name = ?", {name}}, " OR ");
    for (const std::string& name : query.codings)
        formats.append({"f.coding = ?", {name}}, " OR ");
    if (!formats.sql.empty())
        require({"(" + formats.sql + ")", formats.parameters});
    if (query.channels)
        require(within("f.channels", *query.channels));
    if (query.sampleRate)
        require(within("f.sample_rate", *query.sampleRate));
    const SQLText seconds = query.seconds ? within("duration_seconds", *query.seconds) : SQLText();
    SQLText selection{"SELECT id FROM files", {}};
    if (asksForForm)
        selection = {
            fmt::format("WITH RECURSIVE forms(form) AS (SELECT min({0}) FROM files UNION ALL SELECT (SELECT {0} FROM "
                        "files WHERE {0} > form ORDER BY {0} LIMIT 1) FROM forms WHERE form IS NOT NULL) "
                        "SELECT id FROM forms CROSS JOIN files INDEXED BY files_by_form ON {0} = form "
                        "WHERE passes(form, ?)",
                        kForm),
            {keep(std::make_unique<IsForm>(query))}};
    if (query.seconds)
        selection.append(seconds, asksForForm ? " AND " : " WHERE ");
    if (asksForForm || query.seconds)
        selections_.push_back(selection);
}

void QueryConditions::addProblems(const LibraryQuery& query)
{
    if (query.takesAnyProblem) {
        require({"(f.state <> 'whole' OR EXISTS (SELECT 1 FROM findings p WHERE p.file = f.id))", {}});
        selections_.push_back({"SELECT file FROM findings UNION ALL "
                               "SELECT id FROM files INDEXED BY files_by_state WHERE state <> 'whole'",
                               {}});
        return;
    }
    SQLText either, rows;
    for (const std::string& kind : query.problems) {
        either.append({"EXISTS (SELECT 1 FROM findings p WHERE p.file = f.id AND p.kind = ?)", {kind}}, " OR ");
        rows.append({"SELECT file FROM findings WHERE kind = ?", {kind}}, " UNION ALL ");
    }
    if (query.problems.empty())
        return;
    require({"(" + either.sql + ")", either.parameters});
    selections_.push_back(rows);
}
