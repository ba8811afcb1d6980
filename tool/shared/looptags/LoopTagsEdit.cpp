#include "tool/shared/looptags/LoopTagsEdit.h"

#include "tool/shared/access/FileAccess.h"
#include "tool/shared/looptags/LoopTagFields.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/Terminal.h"

#include <algorithm>

using platform::Value;

namespace {

const Value* find(const std::vector<TagValue>& tags, const std::string& name)
{
    const auto found = std::ranges::find(tags, name, &TagValue::name);
    return found != tags.end() ? &found->value : nullptr;
}

// Every member once, in the order of `after`, then what only `before` has.
void addDifferences(const std::vector<TagValue>& before, const std::vector<TagValue>& after,
                    std::vector<TagChange>& changes)
{
    for (const auto& [name, to] : after) {
        const Value* const known = find(before, name);
        const Value from = known != nullptr ? *known : Value();
        if (from != to && !(isAbsent(from) && isAbsent(to)))
            changes.push_back({name, isAbsent(from) ? Value() : from, isAbsent(to) ? Value() : to});
    }
    for (const auto& [name, from] : before)
        if (find(after, name) == nullptr && !isAbsent(from))
            changes.push_back({name, from, {}});
}

Value countOf(const std::vector<VireoLoopTransient>& transients)
{
    return transients.empty() ? Value() : Value(transients.size());
}

std::vector<TagValue> chunkSizes(const LoopTags& tags)
{
    std::vector<TagValue> sizes;
    for (const LoopTags::Chunk& chunk : tags.chunks)
        sizes.push_back({chunk.id, fmt::format("{} bytes", chunk.size)});
    return sizes;
}

std::string inWords(const Value& value)
{
    if (const auto* text = value.get<std::string>())
        return *text;
    if (const auto* number = value.get<std::int64_t>())
        return std::to_string(*number);
    if (const auto* number = value.get<double>())
        return fmt::format("{:.6g}", *number);
    std::string joined;
    if (const auto* list = value.get<platform::Array>())
        for (const Value& each : *list)
            joined += (joined.empty() ? "" : ",") + inWords(each);
    return joined;
}

std::string inWords(const std::vector<TagChange>& changes)
{
    std::string text;
    for (const TagChange& change : changes) {
        text += (text.empty() ? "" : ", ") + change.key;
        if (!change.to.isNull())
            text += "=" + inWords(change.to);
        if (!change.from.isNull() && change.from != change.to)
            text += " (was " + inWords(change.from) + ")";
    }
    return text;
}

class EditReport {
public:
    EditReport(const TagsEditor& editor, const EditOptions& edit, const OutputOptions& output)
        : editor_(editor),
          edit_(edit),
          output_(output),
          json_(output)
    {
    }

    void add(const std::string& path, const TagsPlan& plan, const std::string& backup)
    {
        if (output_.wantsJson())
            addJson(path, plan, backup);
        else if (!output_.quiet)
            Output::standard().print("{}\n", printable(sentence(path, plan, backup)));
    }

    void addFailure(const std::string& path, const std::string& text)
    {
        if (output_.wantsJson())
            json_.addFailure(path, text);
        reportFailure(path, text);
    }

    void finish()
    {
        if (output_.wantsJson())
            json_.finish();
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
        JsonWriter& json = json_.begin();
        json.beginObject().member("path", path).member("action", editor_.action);
        json.key("changes").beginArray();
        for (const TagChange& change : plan.changes)
            json.beginObject()
                .member("key", change.key)
                .knownMember("from", change.from)
                .knownMember("to", change.to)
                .endObject();
        json.endArray();
        if (!plan.notKept.empty())
            json.member("notKept", plan.notKept);
        json.member("dryRun", edit_.dryRun);
        json.knownMember("backup", backup);
        json.endObject();
        json_.end();
    }

    const TagsEditor& editor_;
    const EditOptions& edit_;
    const OutputOptions& output_;
    JsonRecords json_;
};

void editFile(const std::string& path, const TagsEditor& editor, const EditOptions& options, EditReport& report)
{
    SafeEdit edit(path, options);
    const TagsPlan plan = editor.plan(readOwnLoopTags(edit.target()), edit.target());
    std::string backup;
    if (!options.dryRun && !plan.changes.empty())
        backup = edit.apply(EditScope::ofLoopTags(), [&](const std::string& copy) { writeTags(copy, plan); });
    report.add(shownName(path), plan, shownName(backup));
}

} // namespace

std::vector<TagChange> differences(const LoopTags& before, const LoopTags& after)
{
    std::vector<TagChange> changes;
    addDifferences(tagValues(before), tagValues(after), changes);
    if (before.transients != after.transients)
        changes.push_back({"transients", countOf(before.transients), countOf(after.transients)});
    addDifferences(chunkSizes(before), chunkSizes(after), changes);
    return changes;
}

void writeTags(const std::string& path, const TagsPlan& plan)
{
    bool written = false;
    {
        VireoLoopChunksManager manager =
            openLoopFile(path, platform::AudioFile::Permission::readWrite, LoopFiles::waveToo);
        errno = 0;
        written = plan.write(manager);
    }
    if (!written)
        throw Failure(errno != 0 ? systemErrorText(errno) : "its tags cannot be written");
    VireoLoopChunksManager manager = openLoopFile(path, platform::AudioFile::Permission::read, LoopFiles::waveToo);
    if (readRawLoopTags(manager) != plan.bytes)
        throw Failure("the tags are not found as they should be after the edit");
    if (const auto wrong = differences(readOwnLoopTags(path), plan.after); !wrong.empty())
        throw Failure("the tags are not found as they should be after the edit: " + wrong.front().key);
}

bool editTags(const FileArguments& named, const TagsEditor& editor, EditOptions edit, const OutputOptions& output)
{
    std::vector<std::string> files;
    if (!reportingRecord(named.listName(), output, [&] { files = allNames(named); }))
        return false;
    edit.quiet = output.quiet;
    for (const std::string& path : files)
        try {
            const FileAccess access = accessForReading(path, edit.waiting());
            editor.plan(readOwnLoopTags(path), path);
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
