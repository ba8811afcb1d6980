#include "tool/shared/library/LibraryQuery.h"

#include <algorithm>

namespace {

constexpr std::int64_t kNotes = 12;

void addKeyOnce(std::vector<KeyChoice>& keys, KeyChoice key)
{
    if (std::ranges::find(keys, key) == keys.end())
        keys.push_back(std::move(key));
}

} // namespace

LibraryQuery::Order LibraryQuery::settledOrder() const
{
    if (order)
        return *order;
    return takesDuplicates ? Order::sound : terms.empty() ? Order::path : Order::relevance;
}

std::vector<NumberRange> wantedTempos(const LibraryQuery& query)
{
    std::vector<NumberRange> tempos = query.tempos;
    if (query.takesRelated)
        for (const NumberRange& tempo : query.tempos) {
            tempos.push_back({tempo.least / 2, tempo.most / 2});
            tempos.push_back({tempo.least * 2, tempo.most * 2});
        }
    return tempos;
}

std::vector<KeyChoice> wantedKeys(const LibraryQuery& query)
{
    constexpr std::int64_t minorThird = 3;
    std::vector<KeyChoice> keys;
    for (const KeyChoice& key : query.keys)
        addKeyOnce(keys, key);
    if (!query.takesRelated)
        return keys;
    for (const KeyChoice& key : query.keys) {
        if (!key.note)
            continue;
        if (!key.mode.empty())
            addKeyOnce(keys, {key.note, key.mode == "minor" ? "major" : "minor"});
        if (key.mode != "major")
            addKeyOnce(keys, {(*key.note + minorThird) % kNotes, "major"});
        if (key.mode != "minor")
            addKeyOnce(keys, {(*key.note + kNotes - minorThird) % kNotes, "minor"});
    }
    return keys;
}
