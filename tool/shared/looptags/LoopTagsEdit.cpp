#include "tool/shared/looptags/LoopTagsEdit.h"

#include "loops/tags/LoopTagsError.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/arguments/UsageError.h"
#include "tool/shared/input/FileLocation.h"
#include "tool/shared/looptags/LoopTagFiles.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/Terminal.h"

#include <algorithm>

using platform::Value;

namespace {

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

std::string inWords(const std::vector<LoopTagChange>& changes)
{
    std::string text;
    for (const LoopTagChange& change : changes) {
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

    void add(const std::string& path, const LoopTagsPlan& plan, const std::string& backup)
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
    std::string sentence(const std::string& path, const LoopTagsPlan& plan, const std::string& backup) const
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

    void addJson(const std::string& path, const LoopTagsPlan& plan, const std::string& backup)
    {
        JsonWriter& json = json_.begin();
        json.beginObject().member("path", path).member("action", editor_.action);
        json.key("changes").beginArray();
        for (const LoopTagChange& change : plan.changes)
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

// A requested tag that cannot be kept is a usage error; one that would be lost as a side effect makes the edit fail.
LoopTagsPlan planned(const TagsEditor& editor, const std::string& path)
{
    platform::Error error;
    auto plan = editor.plan(ownLoopTagsOf(path), fileLocation(path), &error);
    if (plan)
        return std::move(*plan);
    const bool isOurs = error.domain == kLoopTagsErrorDomain;
    if (isOurs && error.code == static_cast<std::int64_t>(LoopTagsError::cannotKeep))
        throw UsageError(printable(path) + ": " + printable(error.description));
    if (isOurs && error.code == static_cast<std::int64_t>(LoopTagsError::wouldLose))
        throw Failure(printable(error.description));
    failForTags(path, error);
}

void editFile(const std::string& path, const TagsEditor& editor, const EditOptions& options, EditReport& report)
{
    SafeEdit edit(path, options);
    const LoopTagsPlan plan = planned(editor, edit.target());
    std::string backup;
    if (!options.dryRun && !plan.changes.empty())
        backup = edit.apply(EditScope::ofLoopTags(), [&](const std::string& copy) { writeTags(copy, plan); });
    report.add(shownName(path), plan, shownName(backup));
}

} // namespace

bool editTags(const FileArguments& named, const TagsEditor& editor, EditOptions edit, const OutputOptions& output)
{
    std::vector<std::string> files;
    if (!reportingRecord(named.listName(), output, [&] { files = allNames(named); }))
        return false;
    edit.quiet = output.quiet;
    for (const std::string& path : files)
        try {
            const FileAccess access = accessForReading(path, edit.waiting());
            planned(editor, path);
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
