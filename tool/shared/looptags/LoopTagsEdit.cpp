#include "tool/shared/looptags/LoopTagsEdit.h"

#include "tool/shared/access/FileAccess.h"
#include "tool/shared/looptags/LoopTagFields.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Terminal.h"

#include <algorithm>

using nlohmann::ordered_json;
using platform::Dictionary;

namespace {

bool isNothing(const ordered_json& value)
{
    return value.is_null() || value == 0 || (value.is_string() && value.get_ref<const std::string&>().empty()) ||
           (value.is_array() && std::all_of(value.begin(), value.end(), isNothing));
}

// Every member once, in the order of `after`, then what only `before` has.
void addDifferences(const ordered_json& before, const ordered_json& after, std::vector<TagChange>& changes)
{
    for (const auto& [key, to] : after.items()) {
        const ordered_json from = before.value(key, ordered_json());
        if (from != to && !(isNothing(from) && isNothing(to)))
            changes.push_back({key, isNothing(from) ? ordered_json() : from, isNothing(to) ? ordered_json() : to});
    }
    for (const auto& [key, from] : before.items())
        if (!after.contains(key) && !isNothing(from))
            changes.push_back({key, from, {}});
}

ordered_json countOf(const std::vector<VireoLoopTransient>& transients)
{
    return transients.empty() ? ordered_json() : ordered_json(transients.size());
}

ordered_json chunkSizes(const LoopTags& tags)
{
    ordered_json sizes = ordered_json::object();
    for (const LoopTags::Chunk& chunk : tags.chunks)
        sizes[chunk.id] = fmt::format("{} bytes", chunk.size);
    return sizes;
}

std::string inWords(const ordered_json& value)
{
    if (value.is_string())
        return value.get<std::string>();
    if (value.is_number_float())
        return fmt::format("{:.6g}", value.get<double>());
    if (!value.is_array())
        return value.is_null() ? "" : value.dump();
    std::string joined;
    for (const ordered_json& each : value)
        joined += (joined.empty() ? "" : ",") + inWords(each);
    return joined;
}

std::string inWords(const std::vector<TagChange>& changes)
{
    std::string text;
    for (const TagChange& change : changes) {
        text += (text.empty() ? "" : ", ") + change.key;
        if (!change.to.is_null())
            text += "=" + inWords(change.to);
        if (!change.from.is_null() && change.from != change.to)
            text += " (was " + inWords(change.from) + ")";
    }
    return text;
}

class EditReport {
public:
    EditReport(const TagsEditor& editor, const EditOptions& edit, const OutputOptions& output)
        : editor_(editor),
          edit_(edit),
          output_(output)
    {
    }

    void add(const std::string& path, const TagsPlan& plan, const std::string& backup)
    {
        if (output_.json)
            addJson(path, plan, backup);
        else if (!output_.quiet)
            Output::standard().print("{}\n", printable(sentence(path, plan, backup)));
    }

    void addFailure(const std::string& path, const std::string& text)
    {
        if (output_.json)
            addJson({{"path", path}, {"error", text}});
        reportFailure(path, text);
    }

    void finish()
    {
        if (output_.json)
            Output::standard().print("{}]\n", first_ ? "[" : "\n");
    }

private:
    std::string sentence(const std::string& path, const TagsPlan& plan, const std::string& backup) const
    {
        std::string text = path + ": ";
        if (plan.changes.empty())
            text += "unchanged";
        else
            text += fmt::format("{} {}", edit_.dryRun ? editor_.dryRun : editor_.done, inWords(plan.changes));
        for (const std::string& lost : plan.notKept)
            text += "; " + lost;
        return text + (backup.empty() ? "" : "; backup " + backup);
    }

    void addJson(const std::string& path, const TagsPlan& plan, const std::string& backup)
    {
        ordered_json json{{"path", path}, {"action", editor_.action}, {"changes", ordered_json::array()}};
        for (const TagChange& change : plan.changes)
            json["changes"].push_back({{"key", change.key}, {"from", change.from}, {"to", change.to}});
        if (!plan.notKept.empty())
            json["notKept"] = plan.notKept;
        json["dryRun"] = edit_.dryRun;
        if (!backup.empty())
            json["backup"] = backup;
        addJson(json);
    }

    void addJson(const ordered_json& json)
    {
        Output::standard().print("{}{}", std::exchange(first_, false) ? "[\n" : ",\n", jsonText(json));
    }

    const TagsEditor& editor_;
    const EditOptions& edit_;
    const OutputOptions& output_;
    bool first_ = true;
};

void editFile(const std::string& path, const TagsEditor& editor, const EditOptions& options, EditReport& report)
{
    SafeEdit edit(path, options);
    const TagsPlan plan = editor.plan(readLoopTags(edit.target()), edit.target());
    std::string backup;
    if (!options.dryRun && !plan.changes.empty())
        backup = edit.apply(EditScope::ofLoopTags(), [&](const std::string& copy) { writeTags(copy, plan); });
    report.add(path, plan, backup);
}

} // namespace

bool isAbsent(const platform::Value& value)
{
    if (const auto* number = value.get<std::int64_t>())
        return *number == 0;
    if (const auto* text = value.get<std::string>())
        return text->empty();
    const auto* list = value.get<platform::Array>();
    return list == nullptr || std::all_of(list->begin(), list->end(), isAbsent);
}

std::vector<TagChange> differences(const LoopTags& before, const LoopTags& after)
{
    ordered_json from = tagsWithoutTransients(before);
    ordered_json to = tagsWithoutTransients(after);
    from.erase("chunks");
    to.erase("chunks");
    std::vector<TagChange> changes;
    addDifferences(from, to, changes);
    if (before.transients != after.transients)
        changes.push_back({"transients", countOf(before.transients), countOf(after.transients)});
    addDifferences(chunkSizes(before), chunkSizes(after), changes);
    return changes;
}

void writeTags(const std::string& path, const TagsPlan& plan)
{
    bool written = false;
    {
        VireoLoopChunksManager manager = openLoopFile(path, platform::AudioFile::Permission::readWrite);
        errno = 0;
        written = plan.write(manager);
    }
    if (!written)
        throw Failure(errno != 0 ? systemErrorText(errno) : "its tags cannot be written");
    VireoLoopChunksManager manager = openLoopFile(path, platform::AudioFile::Permission::read);
    if (readRawLoopTags(manager) != plan.bytes)
        throw Failure("the tags are not found as they should be after the edit");
    if (const auto wrong = differences(readLoopTags(path), plan.after); !wrong.empty())
        throw Failure("the tags are not found as they should be after the edit: " + wrong.front().key);
}

bool editTags(const std::vector<std::string>& files, const TagsEditor& editor, EditOptions edit,
              const OutputOptions& output)
{
    edit.quiet = output.quiet;
    for (const std::string& path : files)
        try {
            const FileAccess access = accessForReading(path, edit.waiting());
            editor.plan(readLoopTags(path), path);
        } catch (const Failure&) { // reported when its turn comes
        }
    EditReport report(editor, edit, output);
    bool good = true;
    for (const std::string& path : files)
        try {
            editFile(path, editor, edit, report);
        } catch (const Failure& failure) {
            good = false;
            report.addFailure(path, failure.what());
        }
    report.finish();
    return good;
}
