#include "tool/project/ProjectReport.h"

#include "tool/project/ProjectPackage.h"
#include "tool/shared/output/ClockTime.h"
#include "tool/shared/output/JsonRecords.h"

#include <charconv>
#include <filesystem>

namespace {

/// How many files of a kind an alternative uses, and how many of them are missing.
struct MediaCount {
    const ProjectMediaList* list;
    std::size_t count = 0, missing = 0;
};

struct AlternativeReport {
    std::string key; // in the dictionary of names
    std::optional<long> index;
    std::string name;
    bool isActive = false;
    std::vector<MediaCount> media;
    std::vector<ProjectBackup> backups;
    std::optional<InterruptedProjectExchange> interrupted;
};

AlternativeReport reportOf(ProjectInformation& project, const std::string& key)
{
    AlternativeReport report;
    report.key = key;
    if (const auto names = project.alternativeNames(); const auto* name = platform::find<std::string>(names, key))
        report.name = *name;
    long index = 0;
    const auto [end, problem] = std::from_chars(key.data(), key.data() + key.size(), index);
    if (problem != std::errc() || end != key.data() + key.size() || index < 0)
        return report;
    report.index = index;
    report.isActive = index == project.lastActiveVariation();
    for (const ProjectMediaList& list : kProjectMediaLists) {
        MediaCount media{.list = &list};
        for (const std::string_view file : project.filesUsedByVariantIndex(list.kind, index)) {
            std::error_code error;
            ++media.count;
            media.missing += std::filesystem::exists(file, error) ? 0U : 1U;
        }
        report.media.push_back(media);
    }
    report.backups = ProjectInformation::backupsForBundleURL(project.projectURL(), index);
    report.interrupted = ProjectInformation::interruptedExchangeForBundleURL(project.projectURL(), index);
    return report;
}

void writeJson(JsonWriter& json, ProjectInformation& project, const AlternativeReport& report)
{
    json.beginObject();
    json.member("key", report.key).knownMember("name", report.name).member("active", report.isActive);
    if (report.index) {
        json.member("index", *report.index);
        const platform::Dictionary* metaData = project.loadMetaDataForVariant(*report.index);
        if (metaData != nullptr)
            json.member("metaData", platform::Value(*metaData));
        json.key("media").beginArray();
        for (const MediaCount& media : report.media)
            json.beginObject()
                .member("key", media.list->key)
                .member("count", media.count)
                .member("missing", media.missing)
                .endObject();
        json.endArray();
        json.key("backups").beginArray();
        for (const ProjectBackup& backup : report.backups)
            json.beginObject()
                .member("name", backupName(backup.url))
                .knownMember("date", dateText(backup.date))
                .endObject();
        json.endArray();
        if (const auto& exchange = report.interrupted) {
            json.member("isExchangeInterrupted", true);
            if (exchange->backupURL)
                json.member("interruptedExchange", backupName(*exchange, project, *report.index));
        }
    }
    json.endObject();
}

/// "120 BPM, C# minor, 4/4, 24 tracks, 48 kHz", as far as known.
std::string musicOf(ProjectInformation& project, long index)
{
    std::string text;
    const auto add = [&text](const std::string& part) { text += (text.empty() ? "" : ", ") + part; };
    if (const double tempo = project.beatsPerMinute(index); tempo > 0)
        add(fmt::format("{:g} BPM", tempo));
    if (const auto key = project.songKeyAsNonLocalizedString(index); key && !key->empty())
        add(printable(*key + ' ' + project.songGenderAsNonLocalizedString(index).value_or("")));
    if (const auto upper = project.timeSignatureNumerator(index), lower = project.timeSignatureDenominator(index);
        upper > 0 && lower > 0)
        add(fmt::format("{}/{}", upper, lower));
    if (const auto tracks = project.numberOfTracks(index); tracks > 0)
        add(fmt::format("{} {}", tracks, tracks == 1 ? "track" : "tracks"));
    if (const auto rate = project.sampleRate(index); rate > 0)
        add(fmt::format("{:g} kHz", static_cast<double>(rate) / 1000));
    return text;
}

void printTable(const AlternativeReport& report, ProjectInformation& project, bool color)
{
    Output& output = Output::standard();
    output.print("{} {:>3}  {}{}{}\n", report.isActive ? '*' : ' ', printable(report.key), color ? "\x1b[1m" : "",
                 printable(report.name), color ? "\x1b[0m" : "");
    if (!report.index)
        return;
    if (const std::string music = musicOf(project, *report.index); !music.empty())
        output.print("       {}\n", music);
    for (const MediaCount& media : report.media)
        if (media.count > 0)
            output.print("       {}: {}{}\n", media.list->name, media.count,
                         media.missing > 0 ? fmt::format(", {} missing", media.missing) : "");
    for (const ProjectBackup& backup : report.backups)
        output.print("       backup {}  {}\n", printable(backupName(backup.url)), dateText(backup.date));
    if (report.interrupted)
        output.print("       an exchange with {} was cut short: project restore or project settle ends it\n",
                     report.interrupted->backupURL
                         ? "backup " + printable(backupName(*report.interrupted, project, *report.index))
                         : "an unknown backup");
}

/// A line with index, active mark, name, tempo, key, mode, signature, tracks, rate, media, missing, backups.
void printLine(const AlternativeReport& report, ProjectInformation& project)
{
    std::size_t count = 0, missing = 0;
    for (const MediaCount& media : report.media) {
        count += media.count;
        missing += media.missing;
    }
    const long index = report.index.value_or(std::numeric_limits<long>::max()); // one without metadata
    Output::standard().print("{}\t{}\t{}\t{:g}\t{}\t{}\t{}/{}\t{}\t{}\t{}\t{}\t{}\n", printable(report.key),
                             report.isActive ? "active" : "", printable(report.name), project.beatsPerMinute(index),
                             printable(project.songKeyAsNonLocalizedString(index).value_or("")),
                             printable(project.songGenderAsNonLocalizedString(index).value_or("")),
                             project.timeSignatureNumerator(index), project.timeSignatureDenominator(index),
                             project.numberOfTracks(index), project.sampleRate(index), count, missing,
                             report.backups.size());
}

} // namespace

void printProject(const std::string& path, ProjectInformation& project, const OutputOptions& options)
{
    const Form form = outputForm(options);
    Output& output = Output::standard();
    if (form == Form::none)
        return;
    JsonRecords records(options);
    JsonWriter* json = nullptr;
    if (form == Form::json) {
        json = &records.begin();
        json->beginObject().member("path", path).member("projectInfo", platform::Value(project.projectInfo()));
        json->key("alternatives").beginArray();
    } else if (form == Form::table) {
        const auto version = project.projectInfo().find(std::string_view(ProjectInfoKey::bundleVersion));
        const auto* number = version != project.projectInfo().end() ? version->second.get<std::int64_t>() : nullptr;
        const auto* savedFrom = platform::find<std::string>(project.projectInfo(), ProjectInfoKey::lastSavedFrom);
        output.print("{}  version {}{}{}, media {}\n", printable(path), number != nullptr ? *number : 0,
                     savedFrom != nullptr ? ", saved from " : "", printable(savedFrom != nullptr ? *savedFrom : ""),
                     project.hasProjectFolder() ? "in the project folder" : "in the package");
    }
    for (const std::string& key : project.variationIndexesSorted()) {
        const AlternativeReport report = reportOf(project, key);
        if (form == Form::json)
            writeJson(*json, project, report);
        else if (form == Form::table)
            printTable(report, project, usesColor(options.color));
        else
            printLine(report, project);
    }
    if (form == Form::json) {
        json->endArray().endObject();
        records.end();
        records.finish();
    }
}

void printProjectEdit(const std::string& path, const OutputOptions& options, const ProjectMembers& members,
                      const std::string& sentence)
{
    if (options.wantsJson()) {
        writeRecord(options, [&](JsonWriter& json) {
            json.beginObject().member("path", path);
            members(json);
            json.endObject();
        });
    } else if (!options.quiet) {
        Output::standard().print("{}: {}\n", printable(path), sentence);
    }
}
