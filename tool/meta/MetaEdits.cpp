#include "tool/meta/MetaEdits.h"

#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

namespace {

std::string inWords(const MetaField::Value& value)
{
    return std::visit([](const auto& each) { return fmt::format("{}", each); }, value);
}

std::string inWords(const MetaChange& change)
{
    return change.field + (change.to ? "=" + inWords(*change.to) : "") +
           (change.from ? " (was " + inWords(*change.from) + ")" : "");
}

/// Some removals change no field, for example of an empty element.
std::string inWords(const MetaPlan& plan)
{
    std::string text;
    for (const MetaChange& change : plan.changes)
        text += (text.empty() ? "" : ", ") + inWords(change);
    if (text.empty())
        for (const FourCC id : plan.ids)
            text += fmt::format("{} \"{}\"", text.empty() ? "what no field shows, in" : ",", fourCCText(id));
    return text;
}

/// The reason, followed by the fields that it concerns.
std::string inWords(const std::vector<UnmeasuredField>& unmeasured)
{
    std::map<std::string, std::string> fields;
    for (const UnmeasuredField& each : unmeasured)
        fields[each.why] += (fields[each.why].empty() ? "" : ", ") + each.field;
    std::string text;
    for (const auto& [why, names] : fields)
        text += "; " + why + ", no " + names;
    return text;
}

std::string inWords(const std::vector<std::string>& left)
{
    std::string text;
    for (const std::string& each : left)
        text += (text.empty() ? "; not copied, since there is no place for it: " : ", ") + each;
    return text;
}

} // namespace

MetaEdits::MetaEdits(const MetaEditWords& words, EditOptions options, const OutputOptions& output)
    : words_(words),
      options_(std::move(options)),
      output_(output),
      json_(output)
{
    options_.quiet = output.quiet;
}

void MetaEdits::edit(const std::string& path, const Plan& plan, const std::string& place)
{
    try {
        SafeEdit edit(path, options_);
        const MetaPlan planned = plan(edit.target());
        std::string backup;
        if (!options_.dryRun && !planned.items.empty())
            backup = edit.apply(EditScope{EditScope::Kind::chunks, planned.ids, false},
                                [&](const std::string& copy) { writeMetadata(copy, planned); });
        ++(planned.items.empty() ? unchanged_ : changed_);
        tell(shownName(path), planned, shownName(backup));
    } catch (const Failure& failure) {
        fail(path, place + failure.what());
    }
}

void MetaEdits::fail(const std::string& path, const std::string& text)
{
    ++failed_;
    json_.addFailure(path, text);
    Output::standard().flush(); // earlier output comes first
    reportFailure(path, text);
}

bool MetaEdits::finish()
{
    json_.finish();
    return failed_ == 0;
}

void MetaEdits::tell(const std::string& path, const MetaPlan& plan, const std::string& backup)
{
    if (output_.wantsJson()) {
        JsonWriter& json = json_.begin();
        json.beginObject().member("path", path).member("action", words_.action);
        json.key("changes").beginArray();
        for (const MetaChange& change : plan.changes) {
            json.beginObject().member("field", change.field);
            for (const auto& [key, value] : {std::pair{"from", &change.from}, {"to", &change.to}})
                if (*value)
                    std::visit([&, name = key](const auto& each) { json.member(name, each); }, **value);
            json.endObject();
        }
        json.endArray();
        if (!plan.unmeasured.empty()) {
            json.key("notMeasured").beginArray();
            for (const UnmeasuredField& each : plan.unmeasured)
                json.beginObject().member("field", each.field).member("why", each.why).endObject();
            json.endArray();
        }
        if (!plan.left.empty())
            json.member("notCopied", plan.left);
        json.member("dryRun", options_.dryRun).knownMember("backup", backup).endObject();
        json_.end();
    } else if (!output_.quiet) {
        const char* const done = options_.dryRun ? words_.dryRun : words_.done;
        const auto line = [&](const std::string& what) {
            return printable(fmt::format("{}: {}{}{}{}", path, what, inWords(plan.unmeasured) + inWords(plan.left),
                                         backup.empty() ? "" : "; backup ", backup));
        };
        const std::string all = line(plan.items.empty() ? "unchanged" : fmt::format("{} {}", done, inWords(plan)));
        const auto columns = columnsOfOutput();
        if (!columns || plan.changes.empty() || displayWidth(all) <= *columns)
            return Output::standard().print("{}\n", all);
        // On a terminal, one line per field if they do not fit in one.
        const std::size_t count = plan.changes.size();
        Output::standard().print("{}\n", line(fmt::format("{} {} {}", done, count, count == 1 ? "field" : "fields")));
        for (const MetaChange& change : plan.changes)
            Output::standard().print("  {}\n", shortened(printable(inWords(change)), *columns - 2));
    }
}
