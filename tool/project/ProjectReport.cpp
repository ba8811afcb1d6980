#include "tool/project/ProjectReport.h"

#include "tool/project/ProjectPackage.h"

#include <nlohmann/json.hpp>

#include <charconv>
#include <ctime>
#include <filesystem>

using nlohmann::ordered_json;

namespace {

constexpr double kUnixTimeOf2001 = 978307200;

/// How many files of a kind an alternative uses, and how many of them are not there.
struct MediaCount {
    const ProjectMediaList* list;
    std::size_t count = 0, missing = 0;
};

struct AlternativeReport {
    std::string key; // of the dictionary of names
    std::optional<long> index;
    std::string name;
    bool isActive = false;
    std::vector<MediaCount> media;
    std::vector<ProjectBackup> backups;
    std::optional<InterruptedProjectExchange> interrupted;
};

std::string base64(const Bytes& bytes)
{
    constexpr char digits[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
    std::string text;
    for (std::size_t i = 0; i < bytes.size(); i += 3) {
        unsigned group = 0;
        for (std::size_t j = 0; j < 3; ++j)
            group = group << 8 | (i + j < bytes.size() ? std::to_integer<unsigned>(bytes[i + j]) : 0);
        for (std::size_t j = 0; j < 4; ++j)
            text += i + j > bytes.size() ? '=' : digits[group >> (18 - 6 * j) & 63];
    }
    return text;
}

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

ordered_json jsonOf(ProjectInformation& project, const AlternativeReport& report)
{
    ordered_json object{{"key", report.key}, {"name", report.name}, {"active", report.isActive}};
    if (!report.index)
        return object;
    object["index"] = *report.index;
    const platform::Dictionary* metaData = project.loadMetaDataForVariant(*report.index);
    object["metaData"] = metaData != nullptr ? projectJson(*metaData) : ordered_json();
    object["media"] = ordered_json::array();
    for (const MediaCount& media : report.media)
        object["media"].push_back({{"key", media.list->key}, {"count", media.count}, {"missing", media.missing}});
    object["backups"] = ordered_json::array();
    for (const ProjectBackup& backup : report.backups)
        object["backups"].push_back({{"name", backupName(backup.url)}, {"date", dateText(backup.date)}});
    if (report.interrupted)
        object["interruptedExchange"] = report.interrupted->backupURL
                                            ? ordered_json(backupName(*report.interrupted, project, *report.index))
                                            : ordered_json();
    return object;
}

/// "120 BPM, C# minor, 4/4, 24 tracks, 48 kHz", as far as it is known.
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

/// By line: index, whether it is active, name, tempo, key, mode, signature, tracks, rate, media, missing, backups.
void printLine(const AlternativeReport& report, ProjectInformation& project)
{
    std::size_t count = 0, missing = 0;
    for (const MediaCount& media : report.media) {
        count += media.count;
        missing += media.missing;
    }
    const long index = report.index.value_or(std::numeric_limits<long>::max()); // one that has no metadata
    Output::standard().print("{}\t{}\t{}\t{:g}\t{}\t{}\t{}/{}\t{}\t{}\t{}\t{}\t{}\n", printable(report.key),
                             report.isActive ? "active" : "", printable(report.name), project.beatsPerMinute(index),
                             printable(project.songKeyAsNonLocalizedString(index).value_or("")),
                             printable(project.songGenderAsNonLocalizedString(index).value_or("")),
                             project.timeSignatureNumerator(index), project.timeSignatureDenominator(index),
                             project.numberOfTracks(index), project.sampleRate(index), count, missing,
                             report.backups.size());
}

} // namespace

std::string dateText(platform::Date date)
{
    const double seconds = date.secondsSince2001 + kUnixTimeOf2001;
    std::tm parts = {};
    char text[32];
    const auto time = static_cast<std::time_t>(std::abs(seconds) < 1e12 ? std::floor(seconds) : 0);
    if (::gmtime_r(&time, &parts) == nullptr || std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%SZ", &parts) == 0)
        return {};
    return text;
}

ordered_json projectJson(const platform::Value& value)
{
    const auto one = [](const auto& content) -> ordered_json {
        using Content = std::decay_t<decltype(content)>;
        if constexpr (std::is_same_v<Content, std::monostate>) {
            return nullptr;
        } else if constexpr (std::is_same_v<Content, Bytes>) {
            return base64(content);
        } else if constexpr (std::is_same_v<Content, platform::Date>) {
            return dateText(content);
        } else if constexpr (std::is_same_v<Content, platform::Array>) {
            ordered_json array = ordered_json::array();
            for (const platform::Value& element : content)
                array.push_back(projectJson(element));
            return array;
        } else if constexpr (std::is_same_v<Content, platform::Dictionary>) {
            ordered_json object = ordered_json::object();
            for (const auto& [key, element] : content)
                object[key] = projectJson(element);
            return object;
        } else {
            return content;
        }
    };
    return std::visit(one, value.variant());
}

void printProject(const std::string& path, ProjectInformation& project, const OutputOptions& options)
{
    const Form form = outputForm(options);
    Output& output = Output::standard();
    if (form == Form::none)
        return;
    ordered_json alternatives = ordered_json::array();
    if (form == Form::table) {
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
            alternatives.push_back(jsonOf(project, report));
        else if (form == Form::table)
            printTable(report, project, usesColor(options.color));
        else
            printLine(report, project);
    }
    if (form == Form::json)
        output.print("{}\n", jsonText({{"path", path},
                                       {"projectInfo", projectJson(project.projectInfo())},
                                       {"alternatives", std::move(alternatives)}}));
}

void printProjectEdit(const std::string& path, const OutputOptions& options, const ordered_json& json,
                      const std::string& sentence)
{
    if (options.json) {
        ordered_json object{{"path", path}};
        object.update(json);
        Output::standard().print("{}\n", jsonText(object));
    } else if (!options.quiet) {
        Output::standard().print("{}: {}\n", printable(path), sentence);
    }
}
