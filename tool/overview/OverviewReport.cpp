#include "tool/overview/OverviewReport.h"

#include "tool/shared/input/FolderWalk.h"
#include "tool/shared/output/ClockTime.h"
#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/Terminal.h"
#include "tool/shared/waveform/Sparkline.h"

#include <algorithm>

namespace {

constexpr int kDurationWidth = 11; // "1:02:03.456"
constexpr int kGaps = 4;
constexpr int kLeastSparkline = 8;
constexpr int kSparklineInPipes = 64;

std::string withThousands(std::int64_t number)
{
    std::string digits = std::to_string(number);
    for (std::size_t i = digits.size(); i > 3; i -= 3)
        digits.insert(i - 3, ",");
    return digits;
}

OverviewPoint extremes(const Waveform& waveform)
{
    OverviewPoint extremes = waveform.points.front();
    for (const OverviewPoint& point : waveform.points) {
        extremes.minimum = std::min(extremes.minimum, point.minimum);
        extremes.maximum = std::max(extremes.maximum, point.maximum);
    }
    return extremes;
}

std::string storeText(const StoreResult& store, bool dryRun, std::size_t points)
{
    const std::string count = withThousands(static_cast<std::int64_t>(points)) + (points == 1 ? " point" : " points");
    if (store.stored)
        return store.changed ? fmt::format("{} its overview, {}", dryRun ? "would store" : "stored", count)
                             : "unchanged: its overview is stored already";
    return store.changed ? fmt::format("{} its overview, since it is silent", dryRun ? "would remove" : "removed")
                         : "unchanged: a CAF file stores no overview of silence";
}

} // namespace

OverviewReport::OverviewReport(const OutputOptions& options, const FileArguments& files)
    : form_(outputForm(options)),
      color_(usesColor(options.color)),
      columns_(terminalColumns()),
      json_(options)
{
    const int most = std::max(columns_ / 3, 8);
    for (const std::string& path : files.names)
        nameWidth_ = std::max(nameWidth_, displayWidth(printable(shownName(path))));
    const bool areKnown = files.list.empty() && std::ranges::none_of(files.names, isFolder);
    nameWidth_ = areKnown ? std::min(nameWidth_, most) : most;
}

void OverviewReport::add(const std::string& path, const FileOverview& overview, const OverviewDeeds& deeds)
{
    if (form_ == Form::json) {
        addJson(path, overview, deeds);
    } else if (form_ != Form::none && deeds.any()) {
        addDeeds(path, overview, deeds);
    } else if (form_ == Form::table) {
        addSparkline(path, overview.waveform());
    } else if (form_ == Form::lines) {
        const Waveform waveform = overview.waveform();
        const OverviewPoint range = extremes(waveform);
        output_.print("{}\t{:.6f}\t{}\t{}\t{}\t{}\n", printable(path), waveform.seconds(), waveform.frames,
                      range.minimum, range.maximum, sparkline(waveform, kSparklineInPipes));
    }
    if (form_ == Form::table)
        output_.flush(); // the next file may take a while
}

void OverviewReport::addSparkline(const std::string& path, const Waveform& waveform)
{
    const std::string name = shortened(printable(path), nameWidth_);
    const std::string padding(static_cast<std::size_t>(std::max(nameWidth_ - displayWidth(name), 0)), ' ');
    const int cells = std::max(columns_ - nameWidth_ - kDurationWidth - kGaps, kLeastSparkline);
    output_.print("{}{}  {:>{}}  {}{}{}\n", name, padding, durationText(waveform.seconds()), kDurationWidth,
                  color_ ? "\x1b[36m" : "", sparkline(waveform, cells), color_ ? "\x1b[0m" : "");
}

void OverviewReport::addDeeds(const std::string& path, const FileOverview& overview, const OverviewDeeds& deeds)
{
    for (const std::string& out : {deeds.png, deeds.svg})
        if (!out.empty() && out != "-")
            output_.print("{}: drawn to {}, {} x {}\n", printable(path), printable(out), deeds.width, deeds.height);
    if (!deeds.data.empty() && deeds.data != "-")
        output_.print("{}: written to {}\n", printable(path), printable(deeds.data));
    if (deeds.store)
        output_.print("{}: {}{}\n", printable(path),
                      storeText(*deeds.store, deeds.dryRun, overview.waveform().points.size()),
                      deeds.store->backup.empty() ? "" : "; backup " + printable(deeds.store->backup));
}

void OverviewReport::addJson(const std::string& path, const FileOverview& overview, const OverviewDeeds& deeds)
{
    const Waveform waveform = overview.waveform();
    JsonWriter& json = json_.begin();
    json.beginObject();
    json.member("path", path).member("sampleRate", overview.info().sampleRate);
    json.member("channels", overview.info().channels).member("frames", waveform.frames);
    json.member("durationSeconds", waveform.seconds()).member("framesPerPoint", kOverviewFramesPerPoint);
    json.key("points").beginArray();
    for (const OverviewPoint& point : waveform.points)
        json.beginArray().write(point.minimum).write(point.maximum).endArray();
    json.endArray();
    json.knownMember("png", deeds.png).knownMember("svg", deeds.svg).knownMember("output", deeds.data);
    json.knownMember("sheet", deeds.sheet);
    if (deeds.store) {
        json.member("stored", deeds.store->stored).member("changed", deeds.store->changed);
        json.member("dryRun", deeds.dryRun).knownMember("backup", deeds.store->backup);
    }
    json.endObject();
    json_.end();
}

void OverviewReport::addSheet(const std::string& out, std::size_t files, int width, int height)
{
    if (form_ == Form::table || form_ == Form::lines)
        output_.print("{} {} drawn to {}, {} x {}\n", withThousands(static_cast<std::int64_t>(files)),
                      files == 1 ? "file" : "files", printable(out), width, height);
}

void OverviewReport::addFailure(const std::string& path, const std::string& text)
{
    json_.addFailure(path, text);
}

void OverviewReport::finish()
{
    json_.finish();
}
