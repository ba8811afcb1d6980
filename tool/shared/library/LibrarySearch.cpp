#include "tool/shared/library/LibrarySearch.h"

#include "tool/shared/library/IndexedName.h"

#include <fmt/format.h>

#include <cmath>
#include <variant>

namespace {

using Order = LibraryQuery::Order;
using Parameter = std::variant<std::int64_t, double, std::string>;

// A text of SQL with the values of its parameters.
struct Condition {
    std::string sql;
    std::vector<Parameter> parameters;
};

std::string doubled(std::string_view text)
{
    std::string result;
    for (const char c : text)
        result.append(c == '"' ? 2 : 1, c);
    return result;
}

// All terms, each as a string whose last word is only begun; a string is never an operator.
std::string matchText(const std::vector<std::string>& terms)
{
    std::string text;
    for (const std::string& term : terms)
        text += fmt::format("{}\"{}\" *", text.empty() ? "" : " AND ", doubled(indexedName(term)));
    return text;
}

class Conditions {
public:
    explicit Conditions(const LibraryQuery& query)
    {
        addScopes(query);
        if (!query.terms.empty())
            add("f.id IN (SELECT rowid FROM search WHERE search MATCH ?)", matchText(query.terms));
        addEither(wantedTempos(query), [&](const NumberRange& range) { return within("f.tempo", range); });
        addEither(wantedKeys(query), [&](const KeyChoice& key) { return isKey(key); });
        if (!query.category.empty())
            add("(f.category = ? COLLATE NOCASE OR f.sub_category = ? COLLATE NOCASE)", query.category, query.category);
        addText("f.genre", query.genre);
        addText("f.artist", query.artist);
        addText("f.title", query.title);
        addText("f.album", query.album);
        addText("f.kind", query.kind);
        addEither(query.containers, [&](const std::string& name) { return take("f.container_name = ?", name); });
        addRange("f.duration_seconds", query.seconds);
        addRange("f.sample_rate", query.sampleRate);
        addRange("f.channels", query.channels);
        if (query.takesAnyProblem)
            add("(f.state <> 'whole' OR EXISTS (SELECT 1 FROM findings p WHERE p.file = f.id))");
        else
            addEither(query.problems, [&](const std::string& kind) {
                return take("EXISTS (SELECT 1 FROM findings p WHERE p.file = f.id AND p.kind = ?)", kind);
            });
        if (query.takesDuplicates)
            add("EXISTS (SELECT 1 FROM files o WHERE o.sound_hash = f.sound_hash AND o.id <> f.id)");
        if (query.modifiedSince)
            add("f.modified >= ?", *query.modifiedSince);
    }

    const std::string& sql() const { return sql_; }
    const std::vector<Parameter>& parameters() const { return parameters_; }

private:
    template <class... Values>
    std::string take(std::string sql, const Values&... values)
    {
        (parameters_.emplace_back(values), ...);
        return sql;
    }
    template <class... Values>
    void add(const std::string& sql, const Values&... values)
    {
        sql_ += (sql_.empty() ? " WHERE " : " AND ") + take(sql, values...);
    }
    template <class Each, class Text>
    void addEither(const std::vector<Each>& choices, Text text)
    {
        std::string either;
        for (const Each& choice : choices)
            either += (either.empty() ? "" : " OR ") + text(choice);
        if (!either.empty())
            add("(" + either + ")");
    }
    std::string within(const std::string& column, const NumberRange& range)
    {
        std::string text;
        if (std::isfinite(range.least))
            text = take(column + " >= ?", range.least);
        if (std::isfinite(range.most))
            text += (text.empty() ? "" : " AND ") + take(column + " <= ?", range.most);
        return "(" + text + ")";
    }
    void addRange(const std::string& column, const std::optional<NumberRange>& range)
    {
        if (range)
            add(within(column, *range));
    }
    void addText(const std::string& column, const std::string& text)
    {
        if (!text.empty())
            add(column + " = ? COLLATE NOCASE", text);
    }
    std::string isKey(const KeyChoice& key)
    {
        std::string text = key.note ? take("f.key_note = ?", *key.note) : "f.key_note IS NOT NULL";
        if (!key.mode.empty())
            text += " AND " + take("(f.mode = ? OR f.mode = 'both')", key.mode);
        return "(" + text + ")";
    }
    void addScopes(const LibraryQuery& query)
    {
        addEither(query.scopes, [&](const LibraryQuery::Scope& scope) {
            std::string after = indexedName(scope.path);
            const std::string first = after;
            ++after.back(); // the slash becomes the character behind it
            return take("(d.path >= ? AND d.path < ?)", first, after);
        });
    }

    std::string sql_;
    std::vector<Parameter> parameters_;
};

// Files without the value come last in either direction.
std::string orderText(const LibraryQuery& query)
{
    const char* const direction = query.isReversed ? " DESC" : "";
    const auto by = [&](const char* column) { return fmt::format("{0} IS NULL, {0}{1}, ", column, direction); };
    std::string text = query.takesDuplicates && !query.order ? "f.sound_hash, " : "";
    switch (query.settledOrder()) {
    case Order::relevance:
    case Order::path:
        break;
    case Order::name:
        text += by("f.name");
        break;
    case Order::tempo:
        text += by("f.tempo");
        break;
    case Order::key:
        text += by("f.key_note") + by("f.mode");
        break;
    case Order::duration:
        text += by("f.duration_seconds");
        break;
    case Order::size:
        text += by("f.size");
        break;
    case Order::modified:
        text += by("f.modified");
        break;
    case Order::category:
        text += by("f.category");
        break;
    case Order::rate:
        text += by("f.sample_rate");
        break;
    }
    return fmt::format(" ORDER BY {0}d.path{1}, f.name{1}", text, direction);
}

} // namespace

class LibrarySearch::Answer {
public:
    Answer(Library& library, const LibraryQuery& query, LibraryParts parts)
        : conditions_(query),
          parts_(parts),
          limit_(query.limit.value_or(0)),
          files_(
              library.database(),
              fmt::format("SELECT f.id, d.path, f.name, f.size, f.modified, f.indexed, {} FROM files f JOIN folders d "
                          "ON d.id = f.folder{}{}",
                          libraryColumnNames(), conditions_.sql(), orderText(query))),
          overview_(library.database(), "SELECT frames_per_point, points FROM overviews WHERE file = ?"),
          details_(library.database(), "SELECT fields, tags FROM details WHERE file = ?"),
          problems_(library.database(), "SELECT kind, text FROM findings WHERE file = ? ORDER BY rowid")
    {
        int parameter = 0;
        for (const Parameter& value : conditions_.parameters())
            std::visit([&](const auto& each) { bind(++parameter, each); }, value);
    }

    bool next(LibraryRecord& record)
    {
        if (hasEnded_)
            return false;
        hasEnded_ = !files_.step();
        if (!hasEnded_ && limit_ != 0 && given_ == limit_) {
            hasEnded_ = hasMore_ = true;
            files_.reset();
        }
        if (hasEnded_)
            return false;
        ++given_;
        fill(record);
        return true;
    }
    bool hasMore() const { return hasMore_; }

private:
    void bind(int parameter, const std::string& text) { files_.bind(parameter, std::string_view(text)); }
    void bind(int parameter, double number) { files_.bind(parameter, number); }
    void bind(int parameter, std::int64_t number) { files_.bind(parameter, number); }

    void fill(LibraryRecord& record)
    {
        constexpr int kFirstColumn = 6;
        const std::int64_t file = files_.number(0);
        record = {};
        record.place = {nameOfIndexed(files_.bytes(1)), nameOfIndexed(files_.bytes(2))};
        record.stamp.size = files_.number(3);
        record.stamp.modified = files_.number(4);
        record.indexed = files_.number(5);
        readLibraryColumns(record, files_, kFirstColumn);
        if (parts_.overview && overview_.bind(1, file).step()) {
            record.overview = LibraryOverview{overview_.number(0), overview_.text(1)};
            overview_.reset();
        }
        if ((parts_.fields || parts_.tags) && details_.bind(1, file).step()) {
            if (parts_.fields)
                record.fields = details_.text(0);
            if (parts_.tags)
                record.tags = details_.text(1);
            details_.reset();
        }
        if (parts_.problems)
            for (problems_.bind(1, file); problems_.step();)
                record.problems.push_back({problems_.text(0), problems_.text(1)});
    }

    Conditions conditions_;
    LibraryParts parts_;
    std::int64_t limit_, given_ = 0;
    bool hasEnded_ = false, hasMore_ = false;
    SQLStatement files_, overview_, details_, problems_;
};

LibrarySearch::LibrarySearch(Library& library, const LibraryQuery& query, LibraryParts parts)
    : answer_(std::make_unique<Answer>(library, query, parts))
{
}

LibrarySearch::~LibrarySearch() = default;

bool LibrarySearch::next(LibraryRecord& record)
{
    return answer_->next(record);
}

bool LibrarySearch::hasMore() const
{
    return answer_->hasMore();
}
