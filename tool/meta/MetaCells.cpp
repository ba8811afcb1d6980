#include "tool/meta/MetaCells.h"

#include "platform/core/FourCC.h"
#include "tool/shared/arguments/QuotedText.h"
#include "tool/shared/arguments/UsageError.h"
#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Terminal.h"
#include "tool/shared/output/UnseenCharacters.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <compare>
#include <numeric>
#include <set>
#include <tuple>

namespace {

constexpr std::string_view kHistory = "codingHistory";

bool isHistory(const MetaName& name)
{
    return name.group() == "bext" && name.parts.size() == 2 && name.parts[1].name == kHistory;
}

std::string cellTextOf(const MetaField& field)
{
    return std::visit([](const auto& value) { return fmt::format("{}", value); }, field.value);
}

MetaName parsedName(const std::string& text)
{
    return metaNameFromText(text).value_or(MetaName());
}

/// Texts of "strg" with ids of markers are the markers' names.
void eraseNamesOfMarkers(std::vector<MetaCell>& cells, const std::vector<MetaField>& fields)
{
    std::set<std::string> markers, names;
    for (const MetaField& field : fields)
        if (field.group == "mark" && field.name.ends_with("].id"))
            markers.insert(cellTextOf(field));
    for (const MetaField& field : fields)
        if (field.group == "strg" && field.name.ends_with("].id") && markers.contains(cellTextOf(field)))
            names.insert(field.fullName().substr(0, field.fullName().find('.')) + ".text");
    std::erase_if(cells, [&](const MetaCell& cell) { return names.contains(cell.name.text); });
}

/// Position of the name's rules among all rules.
std::ptrdiff_t ruleOrder(const MetaName& name)
{
    for (const FourCC container : {fourCC("RIFF"), fourCC("FORM"), fourCC("caff")})
        if (const MetaRule* const rule = ruleFor(name, container)) {
            std::ptrdiff_t order = 0;
            for (const auto& rules :
                 {bextRules(), infoRules(), waveRules(), cueRules(), aiffRules(), cafRules(), xmlRules()}) {
                if (std::less_equal<>()(rules.data(), rule) && std::less<>()(rule, rules.data() + rules.size()))
                    return order + (rule - rules.data());
                order += std::ssize(rules);
            }
        }
    return std::numeric_limits<std::ptrdiff_t>::max();
}

bool isOpen(const MetaName& name) // accepts any name
{
    return name.group() == "info" || name.group() == "ixml";
}

std::size_t numberOf(const MetaName::Part& part)
{
    return part.index.empty() ? 0 : part.number().value_or(std::numeric_limits<std::size_t>::max() - 1) + 1;
}

/// Sort key of a column, most significant part first.
struct ColumnKey {
    std::ptrdiff_t group;
    std::size_t place, item; // by their indices
    std::ptrdiff_t rule;
    std::vector<std::tuple<std::string_view, std::size_t, std::string_view>> parts;
    friend auto operator<=>(const ColumnKey&, const ColumnKey&) = default;
};

ColumnKey keyOf(const MetaName& name)
{
    // Comments follow the markers to which they refer.
    constexpr std::array<std::string_view, 14> groups{"bext", "info", "NAME", "AUTH", "(c)",  "ANNO", "cart",
                                                      "acid", "smpl", "cue",  "mark", "comt", "strg", "ixml"};
    const std::size_t item = isOpen(name) || name.parts.size() < 2 ? 0 : numberOf(name.parts[1]);
    // A marker's id determines which text is its name.
    const bool isId = !isOpen(name) && name.parts.back().name == "id";
    ColumnKey key{std::ranges::find(groups, name.group()) - groups.begin(),
                  numberOf(name.parts[0]),
                  item,
                  isId ? -1 : ruleOrder(name),
                  {}};
    for (const MetaName::Part& part : name.parts)
        key.parts.emplace_back(part.name, numberOf(part), part.index);
    return key;
}

std::string withoutReturns(std::string_view text)
{
    std::string lines;
    for (std::size_t i = 0; i < text.size(); ++i)
        if (text[i] != '\r')
            lines += text[i];
        else if (!text.substr(i + 1).starts_with('\n'))
            lines += '\n';
    return lines;
}

/// Uses the line ends of the text that is replaced.
std::string withLineEndsOf(const std::string& before, const std::string& text)
{
    if (before.find("\r\n") == std::string::npos || text.find('\r') != std::string::npos)
        return text;
    std::string lines;
    for (const char c : text)
        lines.append(c == '\n' ? "\r\n" : std::string(1, c));
    return lines;
}

std::vector<std::string> linesOf(std::string_view text)
{
    std::vector<std::string> lines;
    for (std::size_t begin = 0; begin < text.size();) {
        const std::size_t end = std::min(text.find_first_of("\r\n", begin), text.size());
        if (end != begin)
            lines.emplace_back(text.substr(begin, end - begin));
        begin = end + 1;
    }
    return lines;
}

bool isBelow(const MetaName& name, const std::string& item)
{
    return name.text.starts_with(item) && name.text.size() > item.size() && name.text[item.size()] == '.';
}

class Steps {
public:
    Steps(const std::vector<MetaCell>& cells, const HeldMetadata& held, bool emptyRemoves, bool isLenient)
        : cells_(cells),
          held_(held),
          emptyRemoves_(emptyRemoves),
          isLenient_(isLenient)
    {
        for (MetaCell& cell : cellsOf(held))
            there_.emplace(cell.name.text, std::move(cell));
    }

    std::vector<MetaStep> take()
    {
        if (emptyRemoves_)
            removeItems();
        for (const MetaCell& cell : cells_)
            if (isHistory(cell.name) && cell.name.parts[1].index.empty())
                addHistory(cell);
            else
                add(cell);
        return std::move(steps_);
    }

private:
    const std::string* before(const std::string& name) const
    {
        const auto found = there_.find(name);
        return found != there_.end() ? &found->second.text : nullptr;
    }

    /// Raises the version of "bext" if another cell requires it.
    std::string textFor(const MetaCell& cell) const
    {
        if (cell.name.group() != "bext" || cell.name.rest != "version" || cell.text.size() != 1)
            return cell.text;
        char version = cell.text.front();
        for (const MetaCell& other : cells_) {
            if (other.text.empty() || other.name.upTo(0) != cell.name.upTo(0))
                continue;
            const std::string_view rest = other.name.rest;
            const bool isLoudness = rest.starts_with("loudness") || rest.starts_with("max");
            version = std::max(version, isLoudness ? '2' : rest == "umid" ? '1' : '0');
        }
        return std::string(1, version);
    }

    void add(const MetaCell& cell)
    {
        const std::string* const old = before(cell.name.text);
        const std::string text = textFor(cell);
        if (text.empty()) {
            const bool goes =
                emptyRemoves_ && old != nullptr && std::ranges::none_of(steps_, [&](const MetaStep& step) {
                    return step.isRemoval() && isBelow(cell.name, step.name.text);
                });
            if (goes)
                addStep(cell.name.text, std::nullopt);
        } else if (old == nullptr) {
            addStep(cell.name.text, text);
        } else if (withoutReturns(*old) != withoutReturns(text)) {
            addStep(cell.name.text, withLineEndsOf(*old, text));
        }
    }

    /// Goes line by line, so that unchanged lines keep their ends.
    void addHistory(const MetaCell& cell)
    {
        if (cell.text.empty())
            return add(cell);
        const std::string* const old = before(cell.name.text);
        const std::vector<std::string> lines = linesOf(cell.text), were = linesOf(old != nullptr ? *old : "");
        const auto name = [&](std::size_t line) { return fmt::format("{}[{}]", cell.name.text, line); };
        for (std::size_t i = 0; i < lines.size(); ++i)
            if (i >= were.size() || were[i] != lines[i])
                addStep(name(i), lines[i]);
        for (std::size_t i = lines.size(); i < were.size(); ++i)
            addStep(name(i), std::nullopt);
    }

    /// Removes chunks and items whose fields are all empty cells.
    void removeItems()
    {
        std::set<std::string, std::less<>> empty, items;
        for (const MetaCell& cell : cells_)
            if (cell.text.empty())
                empty.insert(cell.name.text);
        for (const auto& [name, cell] : there_)
            for (std::size_t part = 0; part + 1 < cell.name.parts.size(); ++part)
                items.insert(cell.name.upTo(part)); // a chunk before its items
        const std::vector<MetaField> fields = MetadataFieldsOf(held_);
        for (const std::string& item : items) {
            const MetaRule* const rule = ruleFor(parsedName(item), held_.container);
            const bool goes =
                rule != nullptr && rule->kind == MetaKind::none &&
                std::ranges::all_of(
                    there_,
                    [&](const auto& each) { return !isBelow(each.second.name, item) || empty.contains(each.first); }) &&
                std::ranges::none_of(fields,
                                     [&](const MetaField& field) {
                                         return field.byteSize && isBelow(parsedName(field.fullName()), item);
                                     }) &&
                std::ranges::none_of(steps_,
                                     [&](const MetaStep& step) { return isBelow(parsedName(item), step.name.text); });
            if (goes)
                addStep(item, std::nullopt);
        }
    }

    void addStep(const std::string& name, const std::optional<std::string>& text)
    {
        try {
            steps_.push_back(metaStep(name, text, isLenient_));
        } catch (const UsageError& error) {
            throw Failure(error.what());
        }
    }

    const std::vector<MetaCell>& cells_;
    const HeldMetadata& held_;
    bool emptyRemoves_, isLenient_;
    std::map<std::string, MetaCell, std::less<>> there_;
    std::vector<MetaStep> steps_;
};

} // namespace

std::vector<MetaCell> cellsOf(const HeldMetadata& held, const MetaGroups& groups)
{
    std::vector<MetaCell> cells;
    const std::vector<MetaField> fields = MetadataFieldsOf(held, groups);
    for (const MetaField& field : fields) {
        auto name = metaNameFromText(field.fullName());
        const MetaRule* const rule = name && !field.byteSize ? ruleFor(*name, held.container) : nullptr;
        if (rule == nullptr || rule->kind == MetaKind::none)
            continue;
        if (!isHistory(*name)) {
            cells.push_back({std::move(*name), cellTextOf(field)});
            continue;
        }
        const std::string whole = name->upTo(0) + "." + std::string(kHistory);
        if (!cells.empty() && cells.back().name.text == whole)
            cells.back().text += "\n" + cellTextOf(field);
        else
            cells.push_back({parsedName(whole), cellTextOf(field)});
    }
    if (held.container == fourCC("caff"))
        eraseNamesOfMarkers(cells, fields);
    return cells;
}

std::vector<std::size_t> inOrder(const std::vector<MetaName>& names)
{
    std::vector<ColumnKey> keys;
    std::vector<std::size_t> order(names.size());
    std::ranges::transform(names, std::back_inserter(keys), keyOf);
    std::iota(order.begin(), order.end(), std::size_t{0});
    std::ranges::sort(order, std::ranges::less(), [&](std::size_t index) -> const ColumnKey& { return keys[index]; });
    return order;
}

std::string writtenCell(std::string_view text)
{
    bool isPlain = !isQuoted(text);
    for (std::string_view rest = text; !rest.empty() && isPlain;) {
        const char32_t c = takeCharacter(rest);
        isPlain = !isLateControl(c) && (c >= 0x20 || c == '\t' || c == '\n' || c == '\r') && c != 0xFFFE && c != 0xFFFF;
    }
    return isPlain ? std::string(text) : quotedText(text);
}

std::string meantCell(std::string_view cell)
{
    if (!isQuoted(cell))
        return std::string(cell);
    std::string meant = takeQuotedText(cell);
    if (!cell.empty())
        throw UsageError("\"" + printable(cell) + "\" follows a value in $'…'");
    return meant;
}

std::vector<MetaStep> stepsTo(const std::vector<MetaCell>& cells, const HeldMetadata& held, bool emptyRemoves,
                              bool isLenient)
{
    return Steps(cells, held, emptyRemoves, isLenient).take();
}

std::string problemOf(const MetaCell& cell, bool isLenient)
{
    if (cell.text.empty())
        return {};
    const MetaRule* const rule = ruleFor(cell.name, fourCC("RIFF"));
    const bool isDate = rule != nullptr && (rule->kind == MetaKind::date || rule->kind == MetaKind::clock);
    try {
        metaStep(cell.name.text, cell.text, isLenient && !isDate);
        return {};
    } catch (const UsageError& error) {
        std::string why = error.what();
        if (isDate)
            why.resize(std::min(why.rfind("; --lenient"), why.size()));
        if (isDate || (rule != nullptr && rule->kind == MetaKind::time))
            why += "; a spreadsheet that rewrites it needs the column to be text";
        return why;
    }
}

bool stands(const MetaCell& cell, const HeldMetadata& held)
{
    return std::ranges::any_of(cellsOf(held), [&](const MetaCell& there) {
        return there.name.text == cell.name.text && withoutReturns(there.text) == withoutReturns(cell.text);
    });
}
